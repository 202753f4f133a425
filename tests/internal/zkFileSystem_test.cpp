// Replacing a user's file: the INI save and the overwriting copy share one
// path, and every case here runs against both. A failed replace leaves the
// old bytes, mode and link and no other file; a successful one leaves the
// new bytes under the old mode.
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/inotify.h>
#include <sys/wait.h>

#include "internal/zkFileSystem.h"
#include "support/zkTempDir.h"
#include "zkFileManager.h"
#include "zkMappedINIFile.h"

const std::string kOld = "[old]\nk=v\n\n", kValue(3000, 'n'), kNew = "[s]\nk=" + kValue + "\n\n";

// The overwriting copy of source over target, or the INI save of target.
static int replace(bool copy, const std::string& source, const std::string& target) {
    zkStringBase from(source.c_str()), to(target.c_str());
    if (copy) return zkFileManager::CopyFile(from, to, 0, 0, 1, 0, 0, nullptr, nullptr);
    zkMappedINIFile ini(target.c_str());
    ini.SetVal(zkStringBase("s"), zkStringBase("k"), zkStringBase(kValue.c_str()));
    return ini.Close(1);
}

// What lstat says of path, its mode cut to the permission bits (set-id and
// sticky bits included); all zero when there is no such file.
static struct stat statOf(const std::string& path) {
    struct stat st = {};
    st.st_mode = lstat(path.c_str(), &st) == 0 ? st.st_mode & 07777 : 0;
    return st;
}

// A target: its name and mode, whether it is reached through a symbolic
// link, and the mode of its directory (0: left alone). A directory that is
// not the replacing user's to write in, or whose sticky bit guards the old
// file, sends the replace to the in-place way. In the set-group-ID
// directory the old file is root's, in nobody's group: nobody may give the
// new file that group, though not that owner.
// clang-format off
struct Target { const char* label; std::string name; mode_t mode; bool throughLink; mode_t dirMode; };
const Target kTargets[] = {
    {"private", "a.ini", 0600, false, 0},  {"set-user-ID and set-group-ID", "a.ini", 06775, false, 0},
    {"250-byte name, set-group-ID directory", std::string(246, 'n') + ".ini", 0640, false, 02777},
    {"symbolic link", "link.ini", 0644, true, 0},  {"unwritable directory", "a.ini", 0666, false, 0555},
    {"sticky directory", "a.ini", 0666, false, 01777}};
// clang-format on

// A temporary directory holding the copy's source and the target.
struct Sandbox {
    explicit Sandbox(const Target& t) : target(t), real(dir.file(t.throughLink ? "real.ini" : t.name)) {
        EXPECT_TRUE(zkWriteFile(dir.file("source"), kNew));
        EXPECT_TRUE(zkWriteFile(real, kOld));
        EXPECT_EQ(0, t.throughLink ? symlink("real.ini", dir.file(t.name).c_str()) : 0);
        EXPECT_EQ(0, chmod(real.c_str(), t.mode));
        EXPECT_EQ(0, t.dirMode ? chmod(dir.path().c_str(), t.dirMode) : 0);
        EXPECT_EQ(0, t.dirMode == 02777 && geteuid() == 0 ? chown(real.c_str(), 0, 65534) : 0);
    }
    ~Sandbox() { chmod(dir.path().c_str(), 0700); }

    // Runs the replace in a child, from inside the directory (whatever its
    // parents allow) with umask 000 and writes past limit failing, as another
    // user (nobody) where the directory stops only others: permission bits do
    // not stop root. Meanwhile each new file (a child makes one at a time)
    // that grants more than the old one when the kernel reports it goes into
    // opened. The child's result; 100 when the user or the limit could not be
    // set, 101 when the replace left a descriptor open.
    int replaceInChild(bool copy, unsigned long long limit, const char* source = "source") {
        struct pollfd w = {inotify_init1(IN_CLOEXEC | IN_NONBLOCK), POLLIN, 0};  // what is made in dir
        EXPECT_NE(-1, inotify_add_watch(w.fd, dir.path().c_str(), IN_CREATE));
        const pid_t pid = fork();
        if (pid == 0) {
            int result = 100;
            const std::set<std::string> open = zkDirEntries("/proc/self/fd");
            umask(0);
            if (!chdir(dir.path().c_str()) && (!target.dirMode || geteuid() != 0 || (!setgid(65534) && !setuid(65534))))
                zkWithFileSizeLimit(limit, [&] { result = replace(copy, source, target.name); });
            _exit(zkDirEntries("/proc/self/fd") == open ? result : 101);
        }
        int status = -1;
        alignas(struct inotify_event) char buf[4096];
        const auto* e = reinterpret_cast<const struct inotify_event*>(buf);
        while (waitpid(pid, &status, WNOHANG) == 0)
            if (poll(&w, 1, 1) && read(w.fd, buf, sizeof buf) > 0 && (statOf(dir.file(e->name)).st_mode & ~target.mode))
                opened.insert(e->name);
        close(w.fd);
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

    zkTempDir dir;
    const Target& target;
    const std::string real;
    std::set<std::string> opened;
};

// A write may fail at any offset (every one near the ends and a stride
// between, for the private file and in place), beside the file or in place:
// the old bytes, mode and group stay, and nothing else is left in the
// directory. A whole write leaves the new bytes under the old mode and
// group, in the file a link leads to (so the link stays). With umask 000, no
// new file grants more than the old one from the moment it appears.
TEST(SafeReplace, FailedReplaceKeepsTheOldFile) {
    for (bool copy : {false, true}) {
        for (const Target& t : kTargets) {
            SCOPED_TRACE(std::string(copy ? "overwriting CopyFile, " : "INI Close(1), ") + t.label);
            Sandbox box(t);
            const std::set<std::string> before = zkDirEntries(box.dir.path());
            const gid_t group = statOf(box.real).st_gid;
            const size_t step = t.dirMode == 0555 || t.mode == 0600 ? 61 : kNew.size() - 1000;
            for (size_t limit = step == 61 ? 1 : 1000; limit <= kNew.size();
                 limit += limit < 16 || limit + 16 > kNew.size() ? 1 : step) {
                ASSERT_EQ(limit == kNew.size() ? 0 : 1, box.replaceInChild(copy, limit)) << limit;
                ASSERT_EQ(limit == kNew.size() ? kNew : kOld, zkReadFile(box.real)) << limit;
                ASSERT_EQ(t.mode, statOf(box.real).st_mode) << limit;
                ASSERT_EQ(group, statOf(box.real).st_gid) << limit;
                ASSERT_EQ(before, zkDirEntries(box.dir.path())) << limit;
            }
            EXPECT_EQ(std::set<std::string>(), box.opened);
        }
    }
}

// In place, where the size the source claims is reserved first: a copy of
// an empty source leaves an empty file, and a source that holds less than
// its size says fails the copy after some bytes are written, and the old
// bytes and length (one byte here) come back.
TEST(SafeReplace, InPlaceCopyOfAnEmptyOrShortSource) {
    Sandbox box(kTargets[4]);
    ASSERT_TRUE(zkWriteFile(box.dir.file("source"), ""));
    EXPECT_EQ(0, box.replaceInChild(true, RLIM_INFINITY));
    EXPECT_EQ("", zkReadFile(box.real));
    const char* const shortFile = "/sys/devices/system/cpu/online";
    if (!std::filesystem::exists(shortFile) || zkReadFile(shortFile).size() >= std::filesystem::file_size(shortFile))
        GTEST_SKIP() << "no file here holds less than its size";
    ASSERT_TRUE(zkWriteFile(box.real, "x"));
    EXPECT_EQ(1, box.replaceInChild(true, RLIM_INFINITY, shortFile));
    EXPECT_EQ("x", zkReadFile(box.real));
}

// Relative targets are relative to the link's directory; a chain longer
// than the kernel follows fails with ELOOP.
TEST(FileSystem, ResolveLinksFollowsToTheFileItself) {
    zkTempDir dir;
    const std::string d = dir.path() + "/", longest = std::string(4095 - d.size() - 5, '/') + d + "plain";
    ASSERT_EQ(0, mkdir((d + "sub").c_str(), 0755));
    for (int i = 1; i <= 40; ++i) ASSERT_EQ(0, symlink(std::to_string(i - 1).c_str(), (d + std::to_string(i)).c_str()));
    // A name, the target of the link it becomes (none: no link), and the name
    // it leads to, in the order made.
    const std::string rows[][3] = {{"plain", "", d + "plain"},      {"rel", "sub/b", d + "sub/b"},
                                   {"abs", d + "rel", d + "sub/b"}, {"sub/up", "../abs", d + "sub/b"},
                                   {"long", longest, longest},      {"39", "", d + "0"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row[0]);
        std::string path = d + row[0];
        ASSERT_EQ(0, row[1].empty() ? 0 : symlink(row[1].c_str(), path.c_str()));
        EXPECT_TRUE(zkResolveLinks(path));
        EXPECT_EQ(row[2], path);
    }
    std::string path = d + "40";
    EXPECT_FALSE(zkResolveLinks(path));
    EXPECT_EQ(ELOOP, errno);
}

// Every failure gives 1, with the first failure's errno, and leaves the
// directory as it was.
TEST(FileSystem, FailuresGiveOne) {
    zkTempDir dir;
    ASSERT_EQ(0, symlink("loop", dir.file("loop").c_str()));
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    const zkContentWriter fails = [](int) { return (errno = EIO) == 0; };
    for (const std::string& path : {std::string(), dir.file("f/x"), dir.file("none/x")})
        EXPECT_EQ(1, zkReplaceFile(path.c_str(), 0644, 0, fails)) << path;
    EXPECT_EQ(1, zkReplaceFile(nullptr, 0644, 0, fails));
    EXPECT_EQ(1, zkWriteAll(-1, "y", 1));
    EXPECT_EQ(1, zkReplaceFile(dir.file("loop").c_str(), 0644, 0, fails));
    EXPECT_EQ(ELOOP, errno);
    EXPECT_EQ(1, zkReplaceFile(dir.file("f").c_str(), 0644, 0, fails));
    EXPECT_EQ(EIO, errno);
    EXPECT_EQ(1, zkCreateNewFile(dir.file("f").c_str(), 0644, false, fails));
    EXPECT_EQ(1, zkCreateNewFile(dir.file("n").c_str(), 0644, true, fails));
    EXPECT_EQ(EIO, errno);
    EXPECT_EQ("x", zkReadFile(dir.file("f")));
    EXPECT_EQ((std::set<std::string>{"f", "loop"}), zkDirEntries(dir.path()));
}

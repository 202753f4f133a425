// Replacing a user's file: the INI save and the overwriting copy share one
// path, and every case here runs against both. A failed replace leaves the
// old bytes, mode and link and no other file; a successful one leaves the
// new bytes under the old mode.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/inotify.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <set>
#include <string>

#include "internal/zkFileSystem.h"
#include "support/zkTempDir.h"
#include "zkFileManager.h"
#include "zkMappedINIFile.h"

namespace {

constexpr uid_t kOtherUser = 65534;
const std::string kOld = "[old]\nk=v\n\n";
const std::string kValue(3000, 'n');
const std::string kNew = "[s]\nk=" + kValue + "\n\n";

int saveIni(const zkTempDir&, const std::string& target) {
    zkMappedINIFile ini(target.c_str());
    ini.SetVal(zkStringBase("s"), zkStringBase("k"), zkStringBase(kValue.c_str()));
    return ini.Close(1);
}

int copyOver(const zkTempDir& dir, const std::string& target) {
    zkStringBase from(dir.file("source").c_str()), to(target.c_str());
    return zkFileManager::CopyFile(from, to, 0, 0, 1, 0, 0, nullptr, nullptr);
}

const struct Caller {
    const char* name;
    int (*replace)(const zkTempDir&, const std::string&);
} kCallers[] = {{"INI Close(1)", saveIni}, {"overwriting CopyFile", copyOver}};

mode_t modeOf(const std::string& path) {
    struct stat st = {};
    lstat(path.c_str(), &st);
    return st.st_mode;
}

bool root() {
    return geteuid() == 0;
}

// Runs the replace in a child, as another user when asked (permission bits
// do not stop root), with writes past limit failing. Its result, or -1 when
// the child could not run it.
int replaceInChild(const Caller& caller, const zkTempDir& dir, const std::string& target, bool otherUser,
                   unsigned long long limit) {
    pid_t pid = fork();
    if (pid == 0) {
        if (otherUser && (setgid(kOtherUser) != 0 || setuid(kOtherUser) != 0)) _exit(100);
        int result = 100;
        zkWithFileSizeLimit(limit, [&] { result = caller.replace(dir, target); });
        _exit(result);
    }
    int status = 0;
    if (pid == -1 || waitpid(pid, &status, 0) != pid || !WIFEXITED(status) || WEXITSTATUS(status) == 100) return -1;
    return WEXITSTATUS(status);
}

// A target: its name and mode, whether it is reached through a symbolic
// link, and the mode of its directory (0: left alone). A directory that is
// not the replacing user's to write in, or whose sticky bit guards the old
// file, sends the replace to the in-place way.
struct Target {
    const char* name;
    std::string file;
    mode_t mode;
    bool throughLink;
    mode_t dirMode;
};

const Target kTargets[] = {
    {"plain", "a.ini", 0644, false, 0},
    {"set-user-ID", "a.ini", 04755, false, 0},
    {"set-group-ID", "a.ini", 02775, false, 0},
    {"250-byte name", std::string(246, 'n') + ".ini", 0640, false, 0},
    {"symbolic link", "link.ini", 0600, true, 0},
    {"unwritable directory", "a.ini", 0666, false, 0555},
    {"sticky directory", "a.ini", 0666, false, 01777},
};

// A temporary directory holding the copy's source and the target.
struct Sandbox {
    explicit Sandbox(const Target& t) : target(t), real(dir.file(t.throughLink ? "real.ini" : t.file)) {
        EXPECT_TRUE(zkWriteFile(dir.file("source"), kNew));
        EXPECT_TRUE(zkWriteFile(real, kOld));
        EXPECT_EQ(0, t.throughLink ? symlink("real.ini", dir.file(t.file).c_str()) : 0);
        EXPECT_EQ(0, chmod(real.c_str(), t.mode));
        EXPECT_EQ(0, t.dirMode ? chmod(dir.path().c_str(), t.dirMode) : 0);
    }
    ~Sandbox() { chmod(dir.path().c_str(), 0700); }
    // As another user where the directory stops only others.
    int replace(const Caller& caller, unsigned long long limit) const {
        return replaceInChild(caller, dir, dir.file(target.file), target.dirMode && root(), limit);
    }

    zkTempDir dir;
    const Target& target;
    const std::string real;
};

}  // namespace

// A write may fail at any offset (every one near the ends and a stride
// between, for a plain file and in place), beside the file or in place: the
// old bytes, mode and link stay, and nothing else is left in the directory.
// A whole write leaves the new bytes under the old mode.
TEST(SafeReplace, FailedReplaceKeepsTheOldFile) {
    for (const Caller& caller : kCallers) {
        for (const Target& t : kTargets) {
            SCOPED_TRACE(std::string(caller.name) + ", " + t.name);
            Sandbox box(t);
            const std::set<std::string> before = zkDirEntries(box.dir.path());
            const mode_t mode = modeOf(box.real);
            const bool every = t.dirMode == 0555 || t.mode == 0644;
            for (size_t limit = every ? 1 : 1000; limit < kNew.size(); limit += !every ? kNew.size()
                                                                                : limit < 16 || limit + 16 > kNew.size()
                                                                                    ? 1
                                                                                    : 61) {
                ASSERT_EQ(1, box.replace(caller, limit)) << limit;
                ASSERT_EQ(kOld, zkReadFile(box.real)) << limit;
                ASSERT_EQ(mode, modeOf(box.real)) << limit;
                ASSERT_EQ(before, zkDirEntries(box.dir.path())) << limit;
            }
            EXPECT_EQ(0, box.replace(caller, kNew.size()));
            EXPECT_EQ(kNew, zkReadFile(box.real));
            EXPECT_EQ(mode, modeOf(box.real));
            EXPECT_EQ(before, zkDirEntries(box.dir.path()));
            EXPECT_EQ(t.throughLink, S_ISLNK(modeOf(box.dir.file(t.file))));
        }
    }
}

// A source that holds less than its size says fails the copy after some
// bytes are written, beside the file or in place (which reserves the size
// the source claims first): the old bytes and length come back.
TEST(SafeReplace, CopyOfAShortSourceKeepsTheOldFile) {
    static const char* const shortFile = "/sys/devices/system/cpu/online";
    struct stat st;
    if (stat(shortFile, &st) != 0 || zkReadFile(shortFile).size() >= static_cast<size_t>(st.st_size))
        GTEST_SKIP() << "no file here holds less than its size";
    const Caller shortCopy = {"copy of a short source", [](const zkTempDir&, const std::string& target) {
                                  zkStringBase from(shortFile), to(target.c_str());
                                  return zkFileManager::CopyFile(from, to, 0, 0, 1, 0, 0, nullptr, nullptr);
                              }};
    for (const Target& t : {kTargets[0], kTargets[5]}) {
        SCOPED_TRACE(t.name);
        Sandbox box(t);
        EXPECT_EQ(1, box.replace(shortCopy, RLIM_INFINITY));
        EXPECT_EQ(kOld, zkReadFile(box.real));
    }
}

// With umask 000, a 0600 file's replacement is never open to another user:
// a child of another user tries to open every file that appears in the
// directory while saves and copies run.
TEST(SafeReplace, NoOtherUserCanOpenTheNewFile) {
    if (!root()) GTEST_SKIP() << "needs a second user";
    const Target secret = {"secret", "secret.ini", 0600, false, 0755};
    Sandbox box(secret);
    int ready[2];
    ASSERT_EQ(0, pipe(ready));
    const pid_t snooper = fork();
    ASSERT_NE(-1, snooper);
    if (snooper == 0) {
        const int watch = inotify_init1(IN_CLOEXEC);
        if (watch == -1 || inotify_add_watch(watch, box.dir.path().c_str(), IN_CREATE) == -1) _exit(2);
        // Ends with the test, however it ends.
        if (setgid(kOtherUser) != 0 || setuid(kOtherUser) != 0 || prctl(PR_SET_PDEATHSIG, SIGKILL) != 0) _exit(2);
        if (getppid() == 1 || write(ready[1], "r", 1) != 1) _exit(2);
        alignas(struct inotify_event) char events[4096];
        for (;;) {
            ssize_t n = read(watch, events, sizeof events);
            for (ssize_t at = 0; at < n;) {
                const struct inotify_event* event = reinterpret_cast<const struct inotify_event*>(events + at);
                if (event->len != 0 && open(box.dir.file(event->name).c_str(), O_RDONLY | O_CLOEXEC) != -1) _exit(1);
                at += static_cast<ssize_t>(sizeof *event + event->len);
            }
        }
    }
    // A snooper that cannot watch ends, and the read then sees the pipe's end.
    close(ready[1]);
    struct Reaper {
        pid_t pid;
        ~Reaper() {
            kill(pid, SIGKILL);
            waitpid(pid, nullptr, 0);
        }
    } reaper{snooper};
    char byte = 0;
    ASSERT_EQ(1, read(ready[0], &byte, 1)) << "the snooper could not watch the directory";
    const mode_t mask = umask(0);
    int failed = 0;
    for (int round = 0; round < 100; ++round)
        for (const Caller& caller : kCallers) failed += caller.replace(box.dir, box.real);
    umask(mask);
    EXPECT_EQ(0, failed);
    int status = 0;
    EXPECT_EQ(0, waitpid(snooper, &status, WNOHANG)) << "the other user opened a new file";
    EXPECT_EQ(0600u, modeOf(box.real) & 07777u);
    close(ready[0]);
}

TEST(FileSystem, WriteAllGoesOnAfterShortWrites) {
    if (zkUnderEmulator()) GTEST_SKIP() << "the emulator cannot interrupt a blocking write as the kernel does";
    std::string data((1 << 19) + 1000, '\0');  // not a whole number of blocks
    for (size_t i = 0; i < data.size(); ++i) data[i] = static_cast<char>(i % 251);
    int result = 1;
    EXPECT_EQ(data, zkReadFromShortWrites([&](int fd) { result = zkWriteAll(fd, data.data(), data.size()); }));
    EXPECT_EQ(0, result);
}

// Relative targets are relative to the link's directory; a loop or a chain
// longer than the kernel follows fails with ELOOP.
TEST(FileSystem, ResolveLinksFollowsToTheFileItself) {
    zkTempDir dir;
    const std::string d = dir.path() + "/", longest = std::string(4095 - d.size() - 5, '/') + d + "plain";
    ASSERT_EQ(0, mkdir((d + "sub").c_str(), 0755));
    const std::string links[][2] = {
        {"sub/b", "rel"}, {d + "rel", "abs"}, {"loop", "loop"}, {"../abs", "sub/up"}, {longest, "long"}};
    for (const auto& l : links) ASSERT_EQ(0, symlink(l[0].c_str(), (d + l[1]).c_str())) << l[1];
    for (int i = 1; i <= 40; ++i)
        ASSERT_EQ(0, symlink(("a" + std::to_string(i - 1)).c_str(), (d + "a" + std::to_string(i)).c_str()));
    const std::string rows[][2] = {
        {"plain", d + "plain"},  {"rel", d + "sub/b"}, {"abs", d + "sub/b"},
        {"sub/up", d + "sub/b"}, {"a39", d + "a0"},    {"long", longest},
    };
    for (const auto& row : rows) {
        std::string path = d + row[0];
        EXPECT_TRUE(zkResolveLinks(path)) << row[0];
        EXPECT_EQ(row[1], path);
    }
    for (const char* name : {"a40", "loop"}) {
        std::string path = d + name;
        EXPECT_FALSE(zkResolveLinks(path)) << name;
        EXPECT_EQ(ELOOP, errno) << name;
    }
}

// Every failure gives 1, with the first failure's errno, and leaves the
// directory as it was.
TEST(FileSystem, FailuresGiveOne) {
    zkTempDir dir;
    ASSERT_EQ(0, symlink("loop", dir.file("loop").c_str()));
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    const zkContentWriter writes = [](int fd) { return zkWriteAll(fd, "y", 1) == 0; };
    const zkContentWriter fails = [](int) {
        errno = EIO;
        return false;
    };
    for (const std::string& path : {std::string(), dir.file("loop"), dir.file("f/x"), dir.file("none/x")})
        EXPECT_EQ(1, zkReplaceFile(path.c_str(), 0644, 0, writes)) << path;
    EXPECT_EQ(1, zkReplaceFile(nullptr, 0644, 0, writes));
    EXPECT_EQ(1, zkReplaceFile(dir.file("f").c_str(), 0644, 0, fails));
    EXPECT_EQ(EIO, errno);
    EXPECT_EQ(1, zkCreateNewFile(dir.file("f").c_str(), 0644, false, writes));
    EXPECT_EQ(1, zkCreateNewFile(dir.file("n").c_str(), 0644, true, fails));
    EXPECT_EQ(EIO, errno);
    EXPECT_EQ("x", zkReadFile(dir.file("f")));
    EXPECT_EQ((std::set<std::string>{"f", "loop"}), zkDirEntries(dir.path()));
}

// Replacing a user's file: the INI save and the overwriting copy share one
// path, and every case here runs against both. A failed replace leaves the
// old bytes, mode and link and no other file; a successful one leaves the
// new bytes under the old mode.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <set>
#include <string>

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

struct stat statOf(const std::string& path) {
    struct stat st = {};
    lstat(path.c_str(), &st);
    return st;
}

// Runs the replace in a child, as another user when asked (permission bits
// do not stop root), under a file size limit when limit is not 0. Returns
// its result, or -1 when the child could not run it.
int replaceInChild(const Caller& caller, const zkTempDir& dir, const std::string& target, bool otherUser,
                   unsigned long long limit) {
    pid_t pid = fork();
    if (pid == 0) {
        if (otherUser && (setgid(kOtherUser) != 0 || setuid(kOtherUser) != 0)) _exit(100);
        int result = 100;
        if (limit == 0)
            result = caller.replace(dir, target);
        else if (!zkWithFileSizeLimit(limit, [&] { result = caller.replace(dir, target); }))
            _exit(100);
        _exit(result);
    }
    int status = 0;
    if (pid == -1 || waitpid(pid, &status, 0) != pid || !WIFEXITED(status) || WEXITSTATUS(status) == 100) return -1;
    return WEXITSTATUS(status);
}

// One target: its name, mode, whether it is reached through a symbolic link
// and whether its directory admits no new file.
struct Target {
    const char* name;
    std::string file;
    mode_t mode;
    bool throughLink;
    bool lockedDirectory;
};

bool root() {
    return geteuid() == 0;
}

// A temporary directory holding the copy's source, opened up again before
// it removes itself.
struct Sandbox {
    Sandbox() { EXPECT_TRUE(zkWriteFile(dir.file("source"), kNew)); }
    ~Sandbox() { chmod(dir.path().c_str(), 0700); }

    // Makes the target and returns the path that the callers are given.
    std::string make(const Target& t) {
        const std::string real = dir.file(t.throughLink ? "real.ini" : t.file);
        EXPECT_TRUE(zkWriteFile(real, kOld));
        EXPECT_EQ(0, t.throughLink ? symlink("real.ini", dir.file(t.file).c_str()) : 0);
        EXPECT_EQ(0, t.lockedDirectory && root() ? chown(real.c_str(), kOtherUser, kOtherUser) : 0);
        EXPECT_EQ(0, t.lockedDirectory ? chmod(dir.path().c_str(), root() ? 0755 : 0555) : 0);
        EXPECT_EQ(0, chmod(real.c_str(), t.mode));
        return dir.file(t.file);
    }
    std::string real(const Target& t) const { return dir.file(t.throughLink ? "real.ini" : t.file); }

    zkTempDir dir;
};

const Target kTargets[] = {
    {"plain", "a.ini", 0644, false, false},
    {"set-user-ID", "a.ini", 04755, false, false},
    {"set-group-ID", "a.ini", 02775, false, false},
    {"250-byte name", std::string(246, 'n') + ".ini", 0640, false, false},
    {"symbolic link", "link.ini", 0600, true, false},
    {"unwritable directory", "a.ini", 0664, false, true},
};

}  // namespace

TEST(SafeReplace, FailureKeepsTheOldFileAndSuccessTheOldMode) {
    for (const Caller& caller : kCallers) {
        for (const Target& t : kTargets) {
            for (bool failing : {true, false}) {
                SCOPED_TRACE(std::string(caller.name) + ", " + t.name + (failing ? ", write fails" : ", succeeds"));
                Sandbox box;
                const std::string path = box.make(t);
                const std::set<std::string> before = zkDirEntries(box.dir.path());
                const mode_t mode = statOf(box.real(t)).st_mode;

                const int result =
                    replaceInChild(caller, box.dir, path, t.lockedDirectory && root(), failing ? 1000 : 0);
                EXPECT_EQ(failing ? 1 : 0, result);
                EXPECT_EQ(failing ? kOld : kNew, zkReadFile(box.real(t)));
                EXPECT_EQ(mode, statOf(box.real(t)).st_mode);
                EXPECT_EQ(before, zkDirEntries(box.dir.path()));
                EXPECT_EQ(t.throughLink, S_ISLNK(statOf(path).st_mode));
            }
        }
    }
}

// A write may fail at any offset, beside the file or in place: the old bytes
// stay, and nothing else is left in the directory.
TEST(SafeReplace, FileSizeLimitAtEveryOffsetKeepsTheOldFile) {
    for (const Caller& caller : kCallers) {
        for (bool inPlace : {false, true}) {
            SCOPED_TRACE(std::string(caller.name) + (inPlace ? ", in place" : ", beside"));
            Sandbox box;
            const std::string path = box.make({"", "a.ini", 0644, false, inPlace});
            const std::set<std::string> before = zkDirEntries(box.dir.path());
            const bool otherUser = inPlace && root();
            for (size_t limit = 1; limit < kNew.size(); limit += limit < 16 || limit + 16 > kNew.size() ? 1 : 61) {
                ASSERT_EQ(1, replaceInChild(caller, box.dir, path, otherUser, limit)) << limit;
                ASSERT_EQ(kOld, zkReadFile(path)) << limit;
                ASSERT_EQ(before, zkDirEntries(box.dir.path())) << limit;
            }
            EXPECT_EQ(0, replaceInChild(caller, box.dir, path, otherUser, kNew.size()));
            EXPECT_EQ(kNew, zkReadFile(path));
        }
    }
}

// With umask 000, a 0600 file's replacement is never open to another user:
// a child of another user tries to open every file that appears in the
// directory while saves and copies run.
TEST(SafeReplace, NoOtherUserCanOpenTheNewFile) {
    constexpr int kRounds = 100;
    if (!root()) GTEST_SKIP() << "needs a second user";
    Sandbox box;
    const zkTempDir& dir = box.dir;
    const std::string path = box.make({"", "secret.ini", 0600, false, false});
    ASSERT_EQ(0, chmod(dir.path().c_str(), 0755));
    int ready[2];
    ASSERT_EQ(0, pipe(ready));
    const pid_t snooper = fork();
    ASSERT_NE(-1, snooper);
    if (snooper == 0) {
        const int watch = inotify_init1(IN_CLOEXEC);
        if (watch == -1 || inotify_add_watch(watch, dir.path().c_str(), IN_CREATE) == -1) _exit(2);
        if (setgid(kOtherUser) != 0 || setuid(kOtherUser) != 0) _exit(2);
        if (write(ready[1], "r", 1) != 1) _exit(2);
        alignas(struct inotify_event) char events[4096];
        for (;;) {
            ssize_t n = read(watch, events, sizeof events);
            for (ssize_t at = 0; at < n;) {
                const struct inotify_event* event = reinterpret_cast<const struct inotify_event*>(events + at);
                if (event->len != 0 && open(dir.file(event->name).c_str(), O_RDONLY | O_CLOEXEC) != -1) _exit(1);
                at += static_cast<ssize_t>(sizeof *event + event->len);
            }
        }
    }
    char byte = 0;
    ASSERT_EQ(1, read(ready[0], &byte, 1));
    const mode_t mask = umask(0);
    for (int round = 0; round < kRounds; ++round)
        for (const Caller& caller : kCallers) ASSERT_EQ(0, caller.replace(dir, path)) << caller.name;
    umask(mask);
    kill(snooper, SIGKILL);
    int status = 0;
    ASSERT_EQ(snooper, waitpid(snooper, &status, 0));
    EXPECT_TRUE(WIFSIGNALED(status)) << "the other user opened a new file";
    EXPECT_EQ(0600u, statOf(path).st_mode & 07777u);
    close(ready[0]);
    close(ready[1]);
}

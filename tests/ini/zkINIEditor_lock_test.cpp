// The editor's lock: held from Open to Close, across saves and through
// links, bounded in its wait, and gone with a killed holder.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "ini/zkIniTestSupport.h"
#include "zkINIEditor.h"

namespace {

// Waits for pid: its exit status, or -1 when it did not exit normally.
int exitStatusOf(pid_t pid) {
    int status = 0;
    if (waitpid(pid, &status, 0) != pid || !WIFEXITED(status)) return -1;
    return WEXITSTATUS(status);
}

// Open with the lock and a short wait: the result and errno.
std::pair<int, int> tryLock(zkINIEditor& editor) {
    constexpr unsigned kShortWaitMs = 30;
    errno = 0;
    const int result = editor.Open(false, true, kShortWaitMs);
    return {result, errno};
}

}  // namespace

// Processes started at once, each setting its own key, all land.
TEST(IniEditorLock, ConcurrentEditorsKeepEveryKey) {
    constexpr int kWriters = 12;
    zkTempDir dir;
    const std::string path = dir.file("shared.ini");
    ASSERT_TRUE(zkWriteFile(path, "; shared\n[s]\n"));
    int start[2];
    ASSERT_EQ(0, pipe(start));
    pid_t pids[kWriters];
    for (int i = 0; i < kWriters; ++i) {
        pids[i] = fork();
        ASSERT_NE(-1, pids[i]);
        if (pids[i] == 0) {
            char byte;
            close(start[1]);
            (void)read(start[0], &byte, 1);
            zkINIEditor editor(path.c_str());
            const std::string key = "k" + std::to_string(i);
            bool ok = editor.Open(false, true) == zkINIEditor::Done &&
                      editor.SetVal(zkStr("s"), zkStr(key.c_str()), zkStr("v")) == zkINIEditor::Missing &&
                      editor.Save() == zkINIEditor::Done;
            _exit(ok ? 0 : 1);
        }
    }
    close(start[0]);
    close(start[1]);
    for (pid_t pid : pids) EXPECT_EQ(0, exitStatusOf(pid));

    zkMappedINIFile ini(path.c_str());
    ASSERT_EQ(0, ini.Open(0));
    for (int i = 0; i < kWriters; ++i) {
        SCOPED_TRACE(i);
        EXPECT_EQ("v", zkText(ini.GetVal(zkStr("s"), zkStr(("k" + std::to_string(i)).c_str()))));
    }
}

TEST(IniEditorLock, KilledHolderDoesNotBlockTheNext) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    ASSERT_TRUE(zkWriteFile(path, "[s]\n"));
    int locked[2];
    ASSERT_EQ(0, pipe(locked));
    const pid_t holder = fork();
    ASSERT_NE(-1, holder);
    if (holder == 0) {
        zkINIEditor editor(path.c_str());
        if (editor.Open(false, true) == zkINIEditor::Done) (void)write(locked[1], "x", 1);
        pause();
        _exit(0);
    }
    char byte = 0;
    EXPECT_EQ(1, read(locked[0], &byte, 1));
    close(locked[0]);
    close(locked[1]);
    zkINIEditor waiting(path.c_str());
    EXPECT_EQ(std::make_pair(int(zkINIEditor::FileError), EWOULDBLOCK), tryLock(waiting));
    kill(holder, SIGKILL);
    EXPECT_EQ(-1, exitStatusOf(holder));
    EXPECT_EQ(zkINIEditor::Done, tryLock(waiting).first);
}

// Another editor cannot take the lock while one holds it: not after the
// holder's save replaced the file, not through a link; it can after Close.
TEST(IniEditorLock, LockIsHeldFromOpenUntilClose) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    const std::string link = dir.file("link.ini");
    ASSERT_TRUE(zkWriteFile(path, "[s]\nk=1\n"));
    ASSERT_EQ(0, symlink("a.ini", link.c_str()));
    zkINIEditor holder(link.c_str()), direct(path.c_str()), throughLink(link.c_str());
    ASSERT_EQ(zkINIEditor::Done, holder.Open(false, true));
    const auto blocked = std::make_pair(int(zkINIEditor::FileError), EWOULDBLOCK);
    EXPECT_EQ(blocked, tryLock(direct));

    EXPECT_EQ(zkINIEditor::Done, holder.SetVal(zkStr("s"), zkStr("k"), zkStr("2")));
    EXPECT_EQ(zkINIEditor::Done, holder.Save());
    EXPECT_EQ(blocked, tryLock(direct));
    EXPECT_EQ(blocked, tryLock(throughLink));

    holder.Close();
    ASSERT_EQ(zkINIEditor::Done, tryLock(throughLink).first);
    zkStringBase value;
    EXPECT_EQ(zkINIEditor::Done, throughLink.GetVal(zkStr("s"), zkStr("k"), value));
    EXPECT_EQ("2", zkText(value));
    EXPECT_EQ(blocked, tryLock(direct));
}

// A missing file: create reads it as empty, and the lock makes it; without
// create it is an error. A failed Open holds no lock, so a second one fails
// the same way.
TEST(IniEditorLock, OpenFailures) {
    const struct {
        const char* name;
        bool create, lock;
        int result, error;
        bool made;
    } rows[] = {
        {"new.ini", false, false, zkINIEditor::FileError, ENOENT, false},
        {"new.ini", false, true, zkINIEditor::FileError, ENOENT, false},
        {"new.ini", true, false, zkINIEditor::Done, 0, false},
        {"new.ini", true, true, zkINIEditor::Done, 0, true},
        {"", false, true, zkINIEditor::FileError, EISDIR, true},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.name) + std::to_string(row.create) + std::to_string(row.lock));
        zkTempDir dir;
        const std::string path = dir.file(row.name);
        for (int attempt = 0; attempt < 2; ++attempt) {
            zkINIEditor editor(path.c_str());
            errno = 0;
            const int result = editor.Open(row.create, row.lock, 0);
            const int error = errno;
            EXPECT_EQ(row.result, result);
            EXPECT_EQ(row.error, result == zkINIEditor::Done ? 0 : error);
            EXPECT_EQ(row.made, access(path.c_str(), F_OK) == 0);
        }
    }
}

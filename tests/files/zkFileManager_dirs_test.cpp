// Deletion, the current and module directories and disk space.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/statfs.h>
#include <unistd.h>

#include <set>
#include <string>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

static std::string current(void (*get)(zkStringBase&)) {
    zkStringBase path("stale");
    get(path);
    return path.data();
}

TEST(FileManagerDirs, DeleteFileRemovesADirectoryOnlyWithTheFlag) {
    zkTempDir dir;
    zkStringBase sub(dir.file("d").c_str());
    zkFilename link(dir.file("link").c_str());
    ASSERT_EQ(0, mkdir(sub.data(), 0777));
    ASSERT_EQ(0, symlink(sub.data(), link.GetFullPath()));
    EXPECT_EQ(0, zkFileManager::DeleteFile(sub, 0));
    EXPECT_EQ(1, zkFileManager::DeleteFile(link, 0));
    EXPECT_EQ(1, zkFileManager::DeleteFile(sub, 1));
    EXPECT_EQ(0, zkFileManager::DeleteFile(sub, 1));
    EXPECT_EQ(0, zkUnlink(nullptr, 0));
}

TEST(FileManagerDirs, DirectoryNamesOfAnyLength) {
    const std::string saved = current(zkFileManager::GetCurrentDirectory);
    ASSERT_EQ(0, chdir("/"));
    EXPECT_EQ("/", current(zkFileManager::GetModuleDirectory));
    zkTempDir dir;
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    std::string deep = current(zkFileManager::GetCurrentDirectory);
    // Far longer than any first guess at a buffer.
    for (int i = 0; i < 6; ++i) ASSERT_EQ(0, mkdir((deep += "/" + std::string(200, 'c')).c_str(), 0777));
    ASSERT_EQ(0, chdir(deep.c_str()));
    EXPECT_EQ(deep, current(zkFileManager::GetCurrentDirectory));
    EXPECT_EQ(deep.substr(0, deep.size() - 200), current(zkFileManager::GetModuleDirectory));
    // A current directory that was removed has no name.
    ASSERT_EQ(0, rmdir(deep.c_str()));
    EXPECT_EQ("", current(zkFileManager::GetCurrentDirectory));
    EXPECT_EQ("", current(zkFileManager::GetModuleDirectory));
    EXPECT_EQ(0, chdir(saved.c_str()));
}

TEST(FileManagerDirs, FreeDiskSpaceIsBlockSizeTimesAvailableBlocks) {
    zkTempDir dir;
    EXPECT_EQ(0, zkFileManager::GetFreeDiskSpace(dir.file("none").c_str()));
    struct statfs before, after;
    long long space = 0;
    do {  // again when another program wrote meanwhile
        ASSERT_EQ(0, statfs(dir.path().c_str(), &before));
        space = zkFileManager::GetFreeDiskSpace(dir.path().c_str());
        ASSERT_EQ(0, statfs(dir.path().c_str(), &after));
    } while (before.f_bavail != after.f_bavail);
    EXPECT_EQ(static_cast<long long>(static_cast<unsigned long long>(before.f_bsize) * before.f_bavail), space);
}

TEST(FileManagerDirs, CreateDirectoryMakesTheMissingPartsOfAnyPath) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "x"));
    const int home = open(".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    EXPECT_NE(0, zkFileManager::CreateDirectory("a//b/c/", nullptr));
    EXPECT_NE(0, zkFileManager::CreateDirectory("a/b/c", nullptr));  // already there
    EXPECT_NE(0, zkFileManager::CreateDirectory((dir.path() + "/a/x/y").c_str(), nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory("plain/a/b", nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory("", nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory(nullptr, nullptr));
    ASSERT_EQ(0, fchdir(home));
    close(home);
    EXPECT_EQ((std::set<std::string>{"b", "x"}), zkDirEntries(dir.file("a")));
    EXPECT_EQ((std::set<std::string>{"c"}), zkDirEntries(dir.file("a/b")));
    EXPECT_EQ((std::set<std::string>{"y"}), zkDirEntries(dir.file("a/x")));
    EXPECT_EQ("x", zkReadFile(dir.file("plain")));
}

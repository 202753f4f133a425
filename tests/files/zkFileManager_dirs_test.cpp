// Directories, deletion, the current and module directories and disk space.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/statfs.h>
#include <unistd.h>

#include <string>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

namespace {

std::string current(void (*get)(zkStringBase&)) {
    zkStringBase path("stale");
    get(path);
    return path.data();
}

}  // namespace

TEST(FileManagerDirs, CreateDirectoryAndBothFormsOfDeleteFile) {
    zkTempDir dir;
    std::string deep = dir.file("new/sub");
    EXPECT_NE(0, zkFileManager::CreateDirectory(deep.c_str(), nullptr));
    EXPECT_NE(0, zkFileManager::CreateDirectory(deep.c_str(), nullptr));
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    EXPECT_EQ(0, zkFileManager::CreateDirectory(dir.file("f/sub").c_str(), nullptr));

    zkStringBase text(dir.file("f").c_str());
    zkFilename name(dir.file("f").c_str());
    EXPECT_NE(0, zkFileManager::DeleteFile(text, 0));
    EXPECT_EQ(0, zkFileManager::DeleteFile(name, 0));
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    EXPECT_NE(0, zkFileManager::DeleteFile(name, 0));
    EXPECT_EQ(0, zkFileManager::DeleteFile(text, 0));
    EXPECT_FALSE(name.FileExists(1));

    zkStringBase subdir(deep.c_str());
    EXPECT_EQ(0, zkFileManager::DeleteFile(subdir, 0));
    EXPECT_NE(0, zkFileManager::DeleteFile(subdir, 1));
    EXPECT_EQ(0, zkFilename::IsDirectory(deep.c_str()));
}

TEST(FileManagerDirs, CurrentAndModuleDirectoryOfAnyLength) {
    std::string saved = current(zkFileManager::GetCurrentDirectory);
    ASSERT_EQ(0, chdir("/"));
    EXPECT_EQ("/", current(zkFileManager::GetCurrentDirectory));
    EXPECT_EQ("/", current(zkFileManager::GetModuleDirectory));
    {
        zkTempDir dir;
        std::string deep = dir.path();
        ASSERT_EQ(0, chdir(deep.c_str()));
        deep = current(zkFileManager::GetCurrentDirectory);
        // Far longer than any first guess at a buffer.
        std::string component(200, 'c');
        for (int i = 0; i < 6; ++i) {
            deep += "/" + component;
            ASSERT_EQ(0, mkdir(deep.c_str(), 0777));
        }
        ASSERT_EQ(0, mkdir((deep + "/bin").c_str(), 0777));
        ASSERT_EQ(0, chdir((deep + "/bin").c_str()));
        EXPECT_EQ(deep + "/bin", current(zkFileManager::GetCurrentDirectory));
        EXPECT_EQ(deep + "/", current(zkFileManager::GetModuleDirectory));

        // A current directory that was removed has no name.
        ASSERT_EQ(0, rmdir((deep + "/bin").c_str()));
        EXPECT_EQ("", current(zkFileManager::GetCurrentDirectory));
        EXPECT_EQ("", current(zkFileManager::GetModuleDirectory));
    }
    EXPECT_EQ(0, chdir(saved.c_str()));
}

TEST(FileManagerDirs, FreeDiskSpaceIsBlockSizeTimesAvailableBlocks) {
    zkTempDir dir;
    EXPECT_EQ(0, zkFileManager::GetFreeDiskSpace(dir.file("none").c_str()));
    EXPECT_EQ(0, zkFileManager::GetFreeDiskSpace(nullptr));
    // Other programs may write in between: compare when the file system held
    // still around the call.
    for (int attempt = 0;; ++attempt) {
        ASSERT_LT(attempt, 10);
        struct statfs before, after;
        ASSERT_EQ(0, statfs(dir.path().c_str(), &before));
        long long space = zkFileManager::GetFreeDiskSpace(dir.path().c_str());
        ASSERT_EQ(0, statfs(dir.path().c_str(), &after));
        if (before.f_bavail != after.f_bavail) continue;
        EXPECT_EQ(static_cast<long long>(static_cast<unsigned long long>(before.f_bsize) * before.f_bavail), space);
        break;
    }
}

// Copies and listings under failing writes and on trees deeper than any path
// can name: a failed copy leaves no partial file and keeps the source, and
// deep trees give a result rather than a crash.
#include <dirent.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <list>
#include <set>
#include <string>

#include "support/zkTempDir.h"
#include "zkBasicFile.h"
#include "zkFileManager.h"

namespace {

int copyFile(const std::string& from, const std::string& to, unsigned recursive, unsigned overwrite,
             unsigned deleteSource) {
    zkStringBase source(from.c_str()), destination(to.c_str());
    return zkFileManager::CopyFile(source, destination, recursive, 0, overwrite, 0, deleteSource, nullptr, nullptr);
}

// Makes a chain of `depth` folders named "d" below path, working from the
// current directory so no path grows past the system's limit.
void makeChain(const std::string& path, int depth) {
    const int home = open(".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_EQ(0, chdir(path.c_str()));
    for (int i = 0; i < depth; ++i) ASSERT_TRUE(mkdir("d", 0755) == 0 && chdir("d") == 0) << i;
    ASSERT_EQ(0, fchdir(home));
    close(home);
}

// Removes everything below path, one level at a time through the current
// directory, for trees whose paths are too long to name.
void removeBelow(const std::string& path) {
    const int home = open(".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    int depth = 0;
    if (chdir(path.c_str()) == 0) {
        for (;;) {
            std::string next;
            for (const std::string& name : zkDirEntries(".")) {
                struct stat st;
                if (lstat(name.c_str(), &st) == 0 && S_ISDIR(st.st_mode) && rmdir(name.c_str()) != 0)
                    next = name;
                else if (!S_ISDIR(st.st_mode))
                    unlink(name.c_str());
            }
            if (!next.empty() && chdir(next.c_str()) == 0) {
                ++depth;
            } else if (depth > 0 && chdir("..") == 0) {
                --depth;
            } else {
                break;
            }
        }
    }
    fchdir(home);
    close(home);
}

}  // namespace

// A new copy or a move that fails at any offset leaves no partial file and
// keeps the source; overwriting copies are covered with the other replaces.
TEST(FileFault, CopyUnderAFileSizeLimitAtEveryOffsetLeavesNoPartialFile) {
    zkTempDir dir;
    const std::string source = dir.file("a.bin"), destination = dir.file("b.bin");
    std::string bytes;
    for (int i = 0; i < 3000; ++i) bytes += static_cast<char>('a' + i % 26);
    ASSERT_TRUE(zkWriteFile(source, bytes));
    const std::set<std::string> before = zkDirEntries(dir.path());

    // Every offset near the ends and the block boundaries, a stride between.
    for (size_t limit = 0; limit < bytes.size(); limit += limit < 16 || limit + 16 > bytes.size() ? 1 : 61) {
        int copied = 0, moved = 0;
        ASSERT_TRUE(zkWithFileSizeLimit(limit, [&] {
            copied = copyFile(source, destination, 0, 0, 0);
            moved = copyFile(source, dir.file("moved.bin"), 0, 0, 1);
        }));
        ASSERT_NE(0, copied) << limit;
        ASSERT_NE(0, moved) << limit;
        ASSERT_EQ(bytes, zkReadFile(source)) << limit;
        ASSERT_EQ(before, zkDirEntries(dir.path())) << limit;
    }
    int copied = 1;
    ASSERT_TRUE(zkWithFileSizeLimit(bytes.size(), [&] { copied = copyFile(source, destination, 0, 0, 0); }));
    EXPECT_EQ(0, copied);
    EXPECT_EQ(bytes, zkReadFile(destination));
}

TEST(FileFault, BasicFileWritesThatFailGiveFailureResults) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "x"));
    zkBasicFile under(dir.file("plain/a").c_str(), O_CREAT, O_WRONLY, 0);
    EXPECT_EQ(1, under.Open());
    unsigned long count = 0;
    EXPECT_EQ(1, under.Write("abc", 3, &count));

    zkBasicFile full("/dev/full", 0, O_WRONLY, 0);
    if (full.Open() == 0) {
        EXPECT_EQ(1, full.Write("abc", 3, &count));
        EXPECT_EQ(static_cast<unsigned long>(-1), count);
    }
    zkBasicFile limited(dir.file("limited").c_str(), O_CREAT, O_WRONLY, 0);
    ASSERT_EQ(0, limited.Open());
    int first = 1, second = 0;
    ASSERT_TRUE(zkWithFileSizeLimit(2, [&] {
        first = limited.Write("abc", 3, &count);
        second = limited.Write("d", 1, nullptr);
    }));
    EXPECT_EQ(0, first);  // a short write
    EXPECT_EQ(2u, count);
    EXPECT_EQ(1, second);
    EXPECT_EQ(0, limited.Close());
    EXPECT_EQ("ab", zkReadFile(dir.file("limited")));
}

TEST(FileFault, TreesDeeperThanAnyPathAreListedAndCopiedWithoutCrashing) {
    constexpr int kDepth = 2100;
    zkTempDir dir;
    ASSERT_EQ(0, mkdir(dir.file("deep").c_str(), 0755));
    makeChain(dir.file("deep"), kDepth);

    std::list<zkStringBase> folders;
    EXPECT_EQ(0, zkFileManager::GetFolderList(dir.file("deep").c_str(), "", folders, 1, 0));
    ASSERT_FALSE(folders.empty());
    EXPECT_STREQ("/d/", folders.front().data());
    unsigned longest = 0;
    for (const zkStringBase& name : folders) longest = name.length() > longest ? name.length() : longest;
    EXPECT_EQ(folders.back().length(), longest);

    std::list<zkStringBase> full;
    EXPECT_EQ(0, zkFileManager::GetFolderList(dir.file("deep").c_str(), "", full, 1, 1));
    EXPECT_FALSE(full.empty());

    // Paths past the system's limit cannot be copied: the copy says so.
    EXPECT_NE(0, copyFile(dir.file("deep"), dir.file("copy"), 1, 0, 0));
    EXPECT_EQ(1u, zkDirEntries(dir.file("deep")).size());
    removeBelow(dir.path());
    EXPECT_TRUE(zkDirEntries(dir.path()).empty());
}

TEST(FileFault, CreateDirectoryMakesTheMissingPartsOfAnyPath) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "x"));
    const int home = open(".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    EXPECT_NE(0, zkFileManager::CreateDirectory("a//b/c/", nullptr));
    EXPECT_NE(0, zkFileManager::CreateDirectory("a/b/c", nullptr));  // already there
    EXPECT_NE(0, zkFileManager::CreateDirectory((dir.path() + "/a/x/y").c_str(), nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory("plain/a/b", nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory("", nullptr));
    ASSERT_EQ(0, fchdir(home));
    close(home);
    EXPECT_EQ((std::set<std::string>{"b", "x"}), zkDirEntries(dir.file("a")));
    EXPECT_EQ((std::set<std::string>{"c"}), zkDirEntries(dir.file("a/b")));
    EXPECT_EQ((std::set<std::string>{"y"}), zkDirEntries(dir.file("a/x")));
    EXPECT_EQ("x", zkReadFile(dir.file("plain")));
}

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
#include <vector>

#include "support/zkTempDir.h"
#include "zkBasicFile.h"
#include "zkFileManager.h"

namespace {

int copyFile(const std::string& from, const std::string& to, unsigned recursive, unsigned overwrite,
             unsigned deleteSource) {
    zkStringBase source(from.c_str()), destination(to.c_str());
    return zkFileManager::CopyFile(source, destination, recursive, 0, overwrite, 0, deleteSource, nullptr, nullptr);
}

// Names for a chain of folders below top whose deepest path is exactly
// 4095 bytes, the longest a path may be: a folder "d" below it is past the
// limit, whatever the length of top.
std::vector<std::string> chainTo4095(const std::string& top) {
    std::vector<std::string> names;
    for (size_t left = 4095 - top.size(); left != 0; left -= names.back().size() + 1)
        names.emplace_back(left > 256 ? 200 : left - 1, static_cast<char>('a' + names.size()));
    return names;
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
    ASSERT_EQ(0, full.Open());
    EXPECT_EQ(1, full.Write("abc", 3, &count));
    EXPECT_EQ(static_cast<unsigned long>(-1), count);
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

// The chain is made and removed through descriptors, as no path names its end.
TEST(FileFault, TreesPastThePathLimit) {
    zkTempDir dir;
    const std::string top = dir.file("deep");
    const std::vector<std::string> names = chainTo4095(top);
    ASSERT_EQ(0, mkdir(top.c_str(), 0755));
    int fd = open(top.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    std::string relative = "/", full = top;
    for (const std::string& name : names) {
        ASSERT_EQ(0, mkdirat(fd, name.c_str(), 0755)) << name;
        const int next = openat(fd, name.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
        close(fd);
        fd = next;
        relative += name + "/";
        full += "/" + name;
    }
    ASSERT_EQ(4095u, full.size());
    ASSERT_EQ(0, mkdirat(fd, "d", 0755));

    // Listed to the end; the copy fails at the deepest nameable folder.
    std::list<zkStringBase> folders, fullPaths;
    EXPECT_EQ(0, zkFileManager::GetFolderList(top.c_str(), "", folders, 1, 0));
    EXPECT_EQ(0, zkFileManager::GetFolderList(top.c_str(), "", fullPaths, 1, 1));
    EXPECT_EQ(names.size() + 1, folders.size());
    EXPECT_EQ(relative + "d/", folders.back().data());
    EXPECT_EQ(full + "/d", fullPaths.back().data());
    EXPECT_EQ(1, copyFile(top, dir.file("copy"), 1, 0, 0));

    EXPECT_EQ(0, unlinkat(fd, "d", AT_REMOVEDIR));
    close(fd);
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
    EXPECT_EQ(0, zkFileManager::CreateDirectory(nullptr, nullptr));
    ASSERT_EQ(0, fchdir(home));
    close(home);
    EXPECT_EQ((std::set<std::string>{"b", "x"}), zkDirEntries(dir.file("a")));
    EXPECT_EQ((std::set<std::string>{"c"}), zkDirEntries(dir.file("a/b")));
    EXPECT_EQ((std::set<std::string>{"y"}), zkDirEntries(dir.file("a/x")));
    EXPECT_EQ("x", zkReadFile(dir.file("plain")));
}

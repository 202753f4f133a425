// zkFileManager::CopyFile: single files, trees, links, and the paths on
// which a copy could lose data.
#include <sys/mman.h>

#include <utility>

#include "zkFilesTest.h"

// Arguments in the order of CopyFile without makeDir and symLink, which come last.
static int copyFile(const std::string& from, const std::string& to, unsigned recursive = 0, unsigned overwrite = 0,
                    unsigned deleteSource = 0, unsigned makeDir = 0, unsigned symLink = 0) {
    zkStringBase source(from.c_str()), target(to.c_str());
    return zkFileManager::CopyFile(source, target, recursive, makeDir, overwrite, symLink, deleteSource, 0, 0);
}

TEST(FileManagerCopy, SingleFile) {
    zkRunSteps("files_copy_single.txt");
}

TEST(FileManagerCopy, RefusedCopies) {
    zkRunSteps("files_copy_refused.txt");
}

TEST(FileManagerCopy, DirectoryCopies) {
    zkRunSteps("files_copy_tree.txt");
}

TEST(FileManagerCopy, SymbolicLinkInsteadOfACopy) {
    zkRunSteps("files_copy_links.txt");
}

// The kernel will not copy from a memory file to another file system, so
// this source goes through the block loop.
TEST(FileManagerCopy, BlockLoopCopiesWhatTheKernelWillNot) {
    zkTempDir dir;
    // Two blocks of the copy loop and one byte.
    const std::string big = std::string(20000, 'b') + std::string(12769, 'm');
    const int memory = memfd_create("source", MFD_CLOEXEC);
    ASSERT_EQ(static_cast<ssize_t>(big.size()), write(memory, big.data(), big.size()));
    const int probe = open(dir.file("m").c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, 0666);
    EXPECT_EQ(-1, copy_file_range(memory, nullptr, probe, nullptr, 1, 0));
    close(probe);
    EXPECT_EQ(0, copyFile("/proc/self/fd/" + std::to_string(memory), dir.file("m"), 0, 1));
    EXPECT_EQ(big, zkReadFile(dir.file("m")));
    close(memory);
}

// A move whose source cannot be removed fails, and the copy stays.
TEST(FileManagerCopy, MoveFailsWhenTheSourceCannotGo) {
    zkTempDir from, to;
    ASSERT_TRUE(zkWriteFile(from.file("a"), "x"));
    int result = 0;
    ASSERT_TRUE(zkSave(from, true, RLIM_INFINITY, [&] { result = copyFile(from.file("a"), to.file("a"), 0, 0, 1); }));
    EXPECT_EQ(1, result);
    EXPECT_EQ("x", zkReadFile(from.file("a")));
    EXPECT_EQ("x", zkReadFile(to.file("a")));
}

// Folders of 200 bytes and one to make up the rest reach a deepest path of
// exactly 4095 bytes, the longest a path may be, from any temporary
// directory; a folder "d" below it is past the limit. The chain is made and
// removed through descriptors, as no path names its end.
TEST(FileManagerCopy, TreesPastThePathLimit) {
    zkTempDir dir;
    const std::string top = dir.file("deep");
    std::string full = top;
    ASSERT_EQ(0, mkdir(top.c_str(), 0755));
    int fd = open(top.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    size_t count = 0;
    for (size_t left = 4095 - top.size(); left != 0; left = 4095 - full.size()) {
        const std::string name(left > 256 ? 200 : left - 1, static_cast<char>('a' + count++));
        ASSERT_EQ(0, mkdirat(fd, name.c_str(), 0755)) << name;
        close(std::exchange(fd, openat(fd, name.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)));  // one level down
        full += "/" + name;
    }
    ASSERT_EQ(0, mkdirat(fd, "d", 0755));

    // Listed to the end; the copy fails at the deepest nameable folder.
    std::list<zkStringBase> folders, fullPaths;
    EXPECT_EQ(0, zkFileManager::GetFolderList(top.c_str(), "", folders, 1, 0));
    EXPECT_EQ(0, zkFileManager::GetFolderList(top.c_str(), "", fullPaths, 1, 1));
    EXPECT_EQ(count + 1, folders.size());
    EXPECT_EQ(full.substr(top.size()) + "/d/", folders.back().data());
    EXPECT_EQ(full + "/d", fullPaths.back().data());
    EXPECT_EQ(1, copyFile(top, dir.file("copy"), 1));

    EXPECT_EQ(0, unlinkat(fd, "d", AT_REMOVEDIR));
    close(fd);
}

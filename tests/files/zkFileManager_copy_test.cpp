// zkFileManager::CopyFile: single files, trees, links, and the paths on
// which a copy could lose data.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

// Arguments in the order of CopyFile without symLink, makeDir last.
static int copyFile(const std::string& from, const std::string& to, unsigned recursive = 0, unsigned overwrite = 0,
                    unsigned deleteSource = 0, unsigned makeDir = 0) {
    zkStringBase source(from.c_str()), target(to.c_str());
    return zkFileManager::CopyFile(source, target, recursive, makeDir, overwrite, 0, deleteSource, nullptr, nullptr);
}

static bool exists(const std::string& path) {
    return zkFilename(path.c_str()).FileExists(1) != 0;
}

// The entries below dir in byte order: "name=content", "name/" followed by
// the directory's entries, or "name->target".
static std::string tree(const std::string& dir, const std::string& prefix = "") {
    std::string out;
    for (zkDirIterator it((dir + "/*").c_str()); it != zkDirIterator(); ++it) {
        const std::string name = it.GetName(), path = dir + "/" + name;
        char target[512] = {};
        if (name == "." || name == "..") continue;
        if (readlink(path.c_str(), target, sizeof target - 1) >= 0)
            out += prefix + name + "->" + target + " ";
        else if (zkFilename::IsDirectory(path.c_str()))
            out += prefix + name + "/ " + tree(path, prefix + name + "/");
        else
            out += prefix + name + "=" + zkReadFile(path) + " ";
    }
    return out;
}

TEST(FileManagerCopy, SingleFileNamesOverwriteSameFileAndMove) {
    zkTempDir dir;
    // More than two blocks of the copy loop, and not a whole number of them.
    std::string a = dir.file("a.txt"), old = dir.file("old"), big(40000, 'b');
    big[20000] = 'm';
    ASSERT_TRUE(zkWriteFile(a, big) && zkWriteFile(dir.file("z.tar.gz"), "") && zkWriteFile(old, big + "old"));
    EXPECT_EQ(1, copyFile(dir.file("none"), dir.file("n")));
    EXPECT_EQ(0, copyFile(dir.file("z.tar.gz"), dir.file("e/"), 0, 0, 0, 1));
    EXPECT_EQ(1, copyFile(a, old));
    EXPECT_EQ(big + "old", zkReadFile(old));
    EXPECT_EQ(0, copyFile(a, old, 0, 1));  // a longer file is cut to the copy
    EXPECT_EQ(big, zkReadFile(old));
    EXPECT_EQ(1, copyFile(a, dir.file("A.TXT"), 0, 1));
    // The same file under another name, even through links, is never truncated.
    ASSERT_EQ(0, symlink(a.c_str(), dir.file("soft").c_str()));
    ASSERT_EQ(0, link(a.c_str(), dir.file("hard").c_str()));
    for (const std::string& same :
         {dir.file("soft"), dir.file("hard"), dir.file("./a.txt"), dir.file("e/../a.txt"), dir.file("")}) {
        EXPECT_EQ(1, copyFile(a, same, 0, 1, 1)) << same;
        EXPECT_EQ(1, copyFile(same, a, 0, 1, 1)) << same;
        EXPECT_EQ(big, zkReadFile(a)) << same;
    }
    EXPECT_EQ(0, copyFile(a, dir.file("e/*.bak"), 0, 0, 1));
    EXPECT_EQ("a.bak=" + big + " z.tar.gz= ", tree(dir.file("e")));
    EXPECT_FALSE(exists(a) || exists(dir.file("A.TXT")) || exists(dir.file("n")));
}

// A new copy is never more open than its source.
TEST(FileManagerCopy, NewCopyTakesTheSourcesPermissionsAtMost) {
    zkTempDir dir;
    const mode_t mask = umask(0);
    for (mode_t mode : {0600u, 0755u, 0666u}) {
        SCOPED_TRACE(mode);
        const std::string source = dir.file("s" + std::to_string(mode)), copy = source + ".copy";
        ASSERT_TRUE(zkWriteFile(source, "x"));
        ASSERT_EQ(0, chmod(source.c_str(), mode));
        EXPECT_EQ(0, copyFile(source, copy));
        struct stat st;
        ASSERT_EQ(0, stat(copy.c_str(), &st));
        EXPECT_EQ(mode & 0664u, st.st_mode & 07777u);
    }
    umask(mask);
}

TEST(FileManagerCopy, FailedCopyKeepsTheSourceAndLeavesNoPartialDestination) {
    zkTempDir dir;
    std::string a = dir.file("a.txt"), big(40000, 'b');
    ASSERT_TRUE(zkWriteFile(a, big));
    // The kernel will not copy from a memory file to another file system, so
    // this source goes through the block loop.
    const int memory = memfd_create("source", MFD_CLOEXEC);
    ASSERT_EQ(static_cast<ssize_t>(big.size()), write(memory, big.data(), big.size()));
    const std::string fromMemory = "/proc/self/fd/" + std::to_string(memory);
    const int probe = open(dir.file("m").c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, 0666);
    EXPECT_EQ(-1, copy_file_range(memory, nullptr, probe, nullptr, 1, 0));
    close(probe);
    EXPECT_EQ(0, copyFile(fromMemory, dir.file("m"), 0, 1));
    EXPECT_EQ(big, zkReadFile(dir.file("m")));

    // Both loops stop at a write error and remove what they wrote; the file
    // being overwritten keeps its old content.
    int results[2] = {0, 0};
    ASSERT_TRUE(zkWithFileSizeLimit(big.size() / 2, [&] {
        results[0] = copyFile(a, dir.file("moved"), 0, 0, 1);
        results[1] = copyFile(fromMemory, dir.file("m"), 0, 1);
    }));
    close(memory);
    EXPECT_TRUE(results[0] == 1 && results[1] == 1);
    EXPECT_EQ("a.txt=" + big + " m=" + big + " ", tree(dir.path()));

    // A file that holds less than its size says ends the copy early.
    const char* shortFile = "/sys/devices/system/cpu/online";
    struct stat st;
    if (stat(shortFile, &st) == 0 && static_cast<size_t>(st.st_size) > zkReadFile(shortFile).size()) {
        EXPECT_EQ(1, copyFile(shortFile, dir.file("online")));
        EXPECT_FALSE(exists(dir.file("online")));
    }
    // A device that fails every write is kept, and so is the source.
    const std::string full = dir.file("full");
    if (mknod(full.c_str(), S_IFCHR | 0666, makedev(1, 7)) == 0 && !zkWriteFile(full, "x")) {
        EXPECT_EQ(1, copyFile(a, full, 0, 1, 1));
        EXPECT_TRUE(exists(full) && exists(a));
    }
    // Opening a FIFO at either end would wait for the other side.
    ASSERT_EQ(0, mkfifo(dir.file("fifo").c_str(), 0666));
    EXPECT_EQ(2, copyFile(dir.file("fifo"), dir.file("x")) + copyFile(a, dir.file("fifo"), 0, 1));
}

TEST(FileManagerCopy, DirectoryCopiesTheirResultsAndLoops) {
    zkTempDir dir;
    const std::string src = dir.file("src");
    ASSERT_NE(0, zkFileManager::CreateDirectory((src + "/sub").c_str(), nullptr));
    ASSERT_TRUE(zkWriteFile(src + "/a.txt", "A") && zkWriteFile(src + "/b.log", "B"));
    ASSERT_TRUE(zkWriteFile(src + "/.h", "H") && zkWriteFile(src + "/sub/c.txt", "C"));
    EXPECT_EQ(0, copyFile(src + "/*.txt", dir.file("p/")));
    EXPECT_EQ("a.txt=A ", tree(dir.file("p")));
    EXPECT_EQ(0, copyFile(src, dir.file("flat")));
    EXPECT_EQ(".h=H a.txt=A b.log=B ", tree(dir.file("flat")));
    EXPECT_EQ(0, copyFile(src + "/", dir.file("whole"), 1));
    // An existing destination without the separator is filled, not passed by.
    EXPECT_EQ(4, copyFile(src, dir.file("whole"), 1));
    EXPECT_EQ(0, copyFile(src, dir.file("whole"), 1, 1));
    EXPECT_EQ(".h=H a.txt=A b.log=B sub/ sub/c.txt=C ", tree(dir.file("whole")));
    EXPECT_EQ(1, copyFile(src, dir.file("p/a.txt/x"), 1));
    // Links to directories are made again, not followed; a destination inside
    // the source is not copied into itself.
    ASSERT_EQ(0, symlink("..", (src + "/up").c_str()));
    ASSERT_EQ(0, symlink(src.c_str(), (src + "/sub/self").c_str()));
    EXPECT_EQ(0, copyFile(src, src + "/in/deep", 1));
    EXPECT_EQ(
        ".h=H a.txt=A b.log=B in/ in/deep/ in/deep/.h=H in/deep/a.txt=A in/deep/b.log=B in/deep/in/ "
        "in/deep/sub/ in/deep/sub/c.txt=C in/deep/sub/self->" +
            src +
            " in/deep/up->.. sub/ sub/c.txt=C "
            "sub/self->" +
            src + " up->.. ",
        tree(src));
}

// zkFileManager::CopyFile: single files, trees, links, and the paths on
// which a copy could lose data.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <list>
#include <set>
#include <vector>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

// Arguments in the order of CopyFile without symLink, makeDir last.
static int copyFile(const std::string& from, const std::string& to, unsigned recursive = 0, unsigned overwrite = 0,
                    unsigned deleteSource = 0, unsigned makeDir = 0) {
    zkStringBase source(from.c_str()), target(to.c_str());
    return zkFileManager::CopyFile(source, target, recursive, makeDir, overwrite, 0, deleteSource, nullptr, nullptr);
}

// Names for a chain of folders below top whose deepest path is exactly
// 4095 bytes, the longest a path may be: a folder "d" below it is past the
// limit, whatever the length of top.
static std::vector<std::string> chainTo4095(const std::string& top) {
    std::vector<std::string> names;
    for (size_t left = 4095 - top.size(); left != 0; left -= names.back().size() + 1)
        names.emplace_back(left > 256 ? 200 : left - 1, static_cast<char>('a' + names.size()));
    return names;
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

TEST(FileManagerCopy, SingleFile) {
    zkTempDir dir;
    // More than two blocks of the copy loop, and not a whole number of them.
    std::string a = dir.file("a.txt"), old = dir.file("old"), big(40000, 'b');
    big[20000] = 'm';
    ASSERT_TRUE(zkWriteFile(a, big));
    ASSERT_TRUE(zkWriteFile(dir.file("z.tar.gz"), ""));
    ASSERT_TRUE(zkWriteFile(old, big + "old"));
    EXPECT_EQ(0, copyFile(dir.file("z.tar.gz"), dir.file("e/"), 0, 0, 0, 1));
    EXPECT_EQ(0, copyFile(a, dir.file("e/?"), 0, 0, 0, 1));
    EXPECT_EQ(1, copyFile(a, old));
    EXPECT_EQ(big + "old", zkReadFile(old));
    EXPECT_EQ(0, copyFile(a, old, 0, 1));  // a longer file is cut to the copy
    EXPECT_EQ(big, zkReadFile(old));
    EXPECT_EQ(0, copyFile(a, "/dev/null", 0, 1));         // written through, not replaced
    EXPECT_EQ(1, copyFile(a, old + "/x/y", 0, 0, 0, 1));  // no directory under a file
    EXPECT_EQ(0, copyFile(a, dir.file("e/*.bak"), 0, 0, 1));
    EXPECT_EQ("a=" + big + " a.bak=" + big + " z.tar.gz= ", tree(dir.file("e")));
    EXPECT_EQ("e/ e/a=" + big + " e/a.bak=" + big + " e/z.tar.gz= old=" + big + " z.tar.gz= ", tree(dir.path()));
}

// Copies that fail leave no file behind and keep the source.
TEST(FileManagerCopy, RefusedCopies) {
    zkTempDir dir;
    const std::string w = dir.file("w"), a = w + "/a.txt", fifo = dir.file("fifo");
    ASSERT_EQ(0, mkdir(w.c_str(), 0777));
    ASSERT_TRUE(zkWriteFile(a, "abc"));
    ASSERT_EQ(0, symlink(a.c_str(), (w + "/soft").c_str()));
    ASSERT_EQ(0, link(a.c_str(), (w + "/hard").c_str()));
    ASSERT_EQ(0, mkfifo(fifo.c_str(), 0666));
    // The same file under another name, even through links, is never
    // truncated; opening a FIFO at either end would wait for the other side;
    // a file that holds less than its size says ends the copy early.
    const std::string rows[][2] = {
        {a, w + "/soft"},
        {w + "/soft", a},
        {a, w + "/hard"},
        {w + "/hard", a},
        {a, w + "/./a.txt"},
        {a, w + "/e/../a.txt"},
        {a, w + "/"},
        {a, w + "/A.TXT"},
        {fifo, w + "/x"},
        {a, fifo},
        {w + "/none", w + "/x"},
        {"/sys/devices/system/cpu/online", w + "/x"},
        {a, "/dev/full"},
        {"http://h/a.txt", w + "/x"},
        {"ftp://h/a.txt", w + "/x"},
    };
    const std::string before = tree(w);
    for (const auto& row : rows) {
        SCOPED_TRACE(row[0] + " -> " + row[1]);
        EXPECT_EQ(1, copyFile(row[0], row[1], 0, 1, 1));
        EXPECT_EQ(before, tree(w));
    }
}

// A new copy is never more open than its source, also when it could have
// overwritten a file.
TEST(FileManagerCopy, NewCopyTakesTheSourcesPermissionsAtMost) {
    zkTempDir dir;
    const mode_t mask = umask(0);
    for (unsigned overwrite : {0u, 1u})
        for (mode_t mode : {0600u, 0755u, 0666u}) {
            SCOPED_TRACE(std::to_string(mode) + (overwrite ? " overwriting" : ""));
            const std::string source = dir.file("s" + std::to_string(mode)), copy = source + std::to_string(overwrite);
            ASSERT_TRUE(zkWriteFile(source, "x"));
            ASSERT_EQ(0, chmod(source.c_str(), mode));
            EXPECT_EQ(0, copyFile(source, copy, 0, overwrite));
            struct stat st;
            ASSERT_EQ(0, stat(copy.c_str(), &st));
            EXPECT_EQ(mode & 0664u, st.st_mode & 07777u);
        }
    umask(mask);
}

// The kernel will not copy from a memory file to another file system, so
// this source goes through the block loop.
TEST(FileManagerCopy, BlockLoopCopiesWhatTheKernelWillNot) {
    zkTempDir dir;
    std::string big(40000, 'b');
    big[20000] = 'm';
    const int memory = memfd_create("source", MFD_CLOEXEC);
    ASSERT_EQ(static_cast<ssize_t>(big.size()), write(memory, big.data(), big.size()));
    const int probe = open(dir.file("m").c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, 0666);
    EXPECT_EQ(-1, copy_file_range(memory, nullptr, probe, nullptr, 1, 0));
    close(probe);
    EXPECT_EQ(0, copyFile("/proc/self/fd/" + std::to_string(memory), dir.file("m"), 0, 1));
    EXPECT_EQ(big, zkReadFile(dir.file("m")));
    close(memory);
}

TEST(FileManagerCopy, DirectoryCopies) {
    zkTempDir dir;
    const std::string src = dir.file("src");
    ASSERT_NE(0, zkFileManager::CreateDirectory((src + "/sub").c_str(), nullptr));
    for (const char* name : {"/a.txt", "/b.log", "/.h", "/sub/c.txt"}) ASSERT_TRUE(zkWriteFile(src + name, name));
    EXPECT_EQ(0, copyFile(src + "/*.txt", dir.file("p/")));
    EXPECT_EQ("a.txt=/a.txt ", tree(dir.file("p")));
    EXPECT_EQ(0, copyFile(src, dir.file("flat")));
    EXPECT_EQ(".h=/.h a.txt=/a.txt b.log=/b.log ", tree(dir.file("flat")));
    EXPECT_EQ(0, copyFile(src + "/", dir.file("whole"), 1));
    // An existing destination without the separator is filled, not passed by.
    EXPECT_EQ(4, copyFile(src, dir.file("whole"), 1));
    EXPECT_EQ(0, copyFile(src, dir.file("whole"), 1, 1));
    EXPECT_EQ(".h=/.h a.txt=/a.txt b.log=/b.log sub/ sub/c.txt=/sub/c.txt ", tree(dir.file("whole")));
    EXPECT_EQ(1, copyFile(src, dir.file("p/a.txt/x"), 1));
    // Links to directories are made again, not followed; a destination inside
    // the source is not copied into itself.
    ASSERT_EQ(0, symlink("..", (src + "/up").c_str()));
    EXPECT_EQ(0, copyFile(src, src + "/in/deep", 1));
    EXPECT_EQ(
        ".h=/.h a.txt=/a.txt b.log=/b.log in/ in/deep/ in/deep/.h=/.h in/deep/a.txt=/a.txt "
        "in/deep/b.log=/b.log in/deep/in/ in/deep/sub/ in/deep/sub/c.txt=/sub/c.txt in/deep/up->.. sub/ "
        "sub/c.txt=/sub/c.txt up->.. ",
        tree(src));
}

// A move takes the files and links and leaves the emptied directories; a
// link of any length is made again over the one an earlier copy made.
TEST(FileManagerCopy, TreeMove) {
    zkTempDir dir;
    const std::string src = dir.file("src"), far = std::string(300, '/') + "..";
    ASSERT_NE(0, zkFileManager::CreateDirectory((src + "/sub").c_str(), nullptr));
    ASSERT_TRUE(zkWriteFile(src + "/sub/c.txt", "C"));
    ASSERT_EQ(0, symlink(far.c_str(), (src + "/sub/up").c_str()));
    EXPECT_EQ(0, copyFile(src, dir.file("to"), 1));
    EXPECT_EQ(2, copyFile(src, dir.file("to"), 1));  // the file and the link are there
    EXPECT_EQ(0, copyFile(src, dir.file("to"), 1, 1, 1));
    EXPECT_EQ("sub/ sub/c.txt=C sub/up->" + far + " ", tree(dir.file("to")));
    EXPECT_EQ("sub/ ", tree(src));
}

// A symbolic link instead of a copy: for a file, and for each entry of a
// directory, since the directory's own path ends in '/'.
TEST(FileManagerCopy, SymbolicLinkInsteadOfACopy) {
    zkTempDir dir;
    ASSERT_EQ(0, mkdir(dir.file("d").c_str(), 0777));
    ASSERT_TRUE(zkWriteFile(dir.file("d/a"), "A"));
    zkStringBase file(dir.file("d/a").c_str()), fileLink(dir.file("l").c_str());
    zkStringBase folder(dir.file("d").c_str()), folderLinks(dir.file("e").c_str());
    EXPECT_EQ(0, zkFileManager::CopyFile(file, fileLink, 0, 0, 0, 1, 0, nullptr, nullptr));
    EXPECT_EQ(0, zkFileManager::CopyFile(folder, folderLinks, 0, 0, 0, 1, 0, nullptr, nullptr));
    EXPECT_EQ("d/ d/a=A e/ e/a->" + dir.file("d/a") + " l->" + dir.file("d/a") + " ", tree(dir.path()));
}

// A new copy or a move that fails at any offset leaves no partial file and
// keeps the source; overwriting copies are covered with the other replaces.
TEST(FileManagerCopy, FileSizeLimitAtEveryOffsetLeavesNoPartialFile) {
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

// The chain is made and removed through descriptors, as no path names its end.
TEST(FileManagerCopy, TreesPastThePathLimit) {
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

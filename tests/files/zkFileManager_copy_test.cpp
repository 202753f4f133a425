// zkFileManager::CopyFile: single files, trees, links, and the paths on
// which a copy could lose data.
#include <dirent.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <algorithm>
#include <string>
#include <vector>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

namespace {

// Arguments in the order of CopyFile, makeDir last.
int copyFile(const std::string& from, const std::string& to, unsigned recursive = 0, unsigned overwrite = 0,
             unsigned symLink = 0, unsigned deleteSource = 0, unsigned makeDir = 0) {
    zkStringBase source(from.c_str()), destination(to.c_str());
    return zkFileManager::CopyFile(source, destination, recursive, makeDir, overwrite, symLink, deleteSource,
                                   nullptr, nullptr);
}

bool exists(const std::string& path) {
    struct stat st;
    return lstat(path.c_str(), &st) == 0;
}

// The entries below dir in name order: "name=content", "name/" followed by
// the directory's entries, or "name->target".
std::string tree(const std::string& dir, const std::string& prefix = "") {
    std::vector<std::string> names;
    if (DIR* d = opendir(dir.c_str())) {
        while (dirent* e = readdir(d)) names.push_back(e->d_name);
        closedir(d);
    }
    std::sort(names.begin(), names.end());
    std::string out;
    for (const std::string& name : names) {
        if (name == "." || name == "..") continue;
        std::string path = dir + "/" + name;
        char target[512];
        ssize_t n = readlink(path.c_str(), target, sizeof target);
        if (n >= 0) out += prefix + name + "->" + std::string(target, static_cast<size_t>(n)) + " ";
        else if (zkFilename::IsDirectory(path.c_str())) out += prefix + name + "/ " + tree(path, prefix + name + "/");
        else out += prefix + name + "=" + zkReadFile(path) + " ";
    }
    return out;
}

}  // namespace

TEST(FileManagerCopy, SingleFileNamesOverwriteSameFileAndMove) {
    zkTempDir dir;
    // More than two blocks of the copy loop, and not a whole number of them.
    std::string a = dir.file("a.txt"), big(40000, 'b');
    big[20000] = 'm';
    ASSERT_TRUE(zkWriteFile(a, big) && zkWriteFile(dir.file("empty"), "") && zkWriteFile(dir.file("old"), "old"));

    EXPECT_EQ(1, copyFile(dir.file("none"), dir.file("n")));
    EXPECT_EQ(0, copyFile(dir.file("empty"), dir.file("e/"), 0, 0, 0, 0, 1));
    EXPECT_EQ(0, copyFile(a, dir.file("e/")));
    EXPECT_EQ(0, copyFile(a, dir.file("e/*.bak")));
    EXPECT_EQ("a.bak=" + big + " a.txt=" + big + " empty= ", tree(dir.file("e")));
    EXPECT_EQ(1, copyFile(a, dir.file("old")));
    EXPECT_EQ("old", zkReadFile(dir.file("old")));
    EXPECT_EQ(0, copyFile(a, dir.file("old"), 0, 1));
    EXPECT_EQ(big, zkReadFile(dir.file("old")));
    EXPECT_EQ(1, copyFile(a, dir.file("A.TXT"), 0, 1));
    EXPECT_EQ(1, copyFile(a, dir.file("missing/x"), 0, 0, 0, 0, 2));


    // The same file under another name, even through links, is never truncated.
    ASSERT_EQ(0, symlink(a.c_str(), dir.file("soft").c_str()));
    ASSERT_EQ(0, link(a.c_str(), dir.file("hard").c_str()));
    for (const std::string& same : {dir.file("soft"), dir.file("hard"), dir.file("./a.txt"), dir.file("e/../a.txt"),
                                    dir.file("")}) {
        EXPECT_EQ(1, copyFile(a, same, 0, 1, 0, 1)) << same;
        EXPECT_EQ(1, copyFile(same, a, 0, 1, 0, 1)) << same;
        EXPECT_EQ(big, zkReadFile(a)) << same;
    }
    unlink(dir.file("hard").c_str());
    EXPECT_EQ(0, copyFile(a, dir.file("new/sub/m.txt"), 0, 0, 0, 1, 1));
    EXPECT_EQ(big, zkReadFile(dir.file("new/sub/m.txt")));
    EXPECT_FALSE(exists(a) || exists(dir.file("A.TXT")) || exists(dir.file("n")) || exists(dir.file("missing")));
}

TEST(FileManagerCopy, FailedCopyKeepsTheSourceAndLeavesNoPartialDestination) {
    zkTempDir dir;
    std::string a = dir.file("a.txt"), big(40000, 'b');
    ASSERT_TRUE(zkWriteFile(a, big));
    // The kernel will not copy from a memory file to another file system, so
    // this source goes through the block loop.
    int memory = memfd_create("source", MFD_CLOEXEC);
    ASSERT_EQ(static_cast<ssize_t>(big.size()), write(memory, big.data(), big.size()));
    std::string fromMemory = "/proc/self/fd/" + std::to_string(memory);
    int probe = open(dir.file("m").c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, 0666);
    EXPECT_EQ(-1, copy_file_range(memory, nullptr, probe, nullptr, 1, 0));
    close(probe);
    EXPECT_EQ(0, copyFile(fromMemory, dir.file("m"), 0, 1));
    EXPECT_EQ(big, zkReadFile(dir.file("m")));

    rlimit saved, limit;
    getrlimit(RLIMIT_FSIZE, &saved);
    limit = saved;
    limit.rlim_cur = big.size() / 2;
    sighandler_t handler = signal(SIGXFSZ, SIG_IGN);
    ASSERT_EQ(0, setrlimit(RLIMIT_FSIZE, &limit));
    int moved = copyFile(a, dir.file("moved"), 0, 0, 0, 1);
    int fallback = copyFile(fromMemory, dir.file("m"), 0, 1);
    setrlimit(RLIMIT_FSIZE, &saved);
    signal(SIGXFSZ, handler);
    close(memory);
    EXPECT_EQ(1, moved);
    EXPECT_EQ(1, fallback);
    EXPECT_EQ("a.txt=" + big + " ", tree(dir.path()));

    // A file that holds less than its size says ends the copy early.
    const char* shortFile = "/sys/devices/system/cpu/online";
    struct stat st;
    if (stat(shortFile, &st) == 0 && static_cast<size_t>(st.st_size) > zkReadFile(shortFile).size()) {
        EXPECT_EQ(1, copyFile(shortFile, dir.file("online")));
        EXPECT_FALSE(exists(dir.file("online")));
    }
    // A device that fails every write is kept, and so is the source.
    std::string full = dir.file("full");
    if (mknod(full.c_str(), S_IFCHR | 0666, makedev(1, 7)) == 0 && !zkWriteFile(full, "x")) {
        EXPECT_EQ(1, copyFile(a, full, 0, 1, 0, 1));
        EXPECT_TRUE(exists(full) && exists(a));
    }
    // Opening a FIFO at either end would wait for the other side.
    ASSERT_EQ(0, mkfifo(dir.file("fifo").c_str(), 0666));
    EXPECT_EQ(1, copyFile(dir.file("fifo"), dir.file("x")));
    EXPECT_EQ(1, copyFile(a, dir.file("fifo"), 0, 1));
}

TEST(FileManagerCopy, DirectoryCopiesTheirResultsAndLoops) {
    zkTempDir dir;
    std::string src = dir.file("src");
    ASSERT_EQ(0, zkFileManager::CreateDirectory((src + "/sub").c_str(), nullptr) ? 0 : 1);
    ASSERT_TRUE(zkWriteFile(src + "/a.txt", "A") && zkWriteFile(src + "/b.log", "B"));
    ASSERT_TRUE(zkWriteFile(src + "/.h", "H") && zkWriteFile(src + "/sub/c.txt", "C"));
    const std::string whole = ".h=H a.txt=A b.log=B sub/ sub/c.txt=C ";

    EXPECT_EQ(0, copyFile(src + "/*.txt", dir.file("p/")));
    EXPECT_EQ("a.txt=A ", tree(dir.file("p")));
    EXPECT_EQ(0, copyFile(src, dir.file("flat")));
    EXPECT_EQ(".h=H a.txt=A b.log=B ", tree(dir.file("flat")));
    EXPECT_EQ(0, copyFile(src + "/", dir.file("whole"), 1));
    EXPECT_EQ(whole, tree(dir.file("whole")));
    // An existing destination without the separator is filled, not passed by.
    EXPECT_EQ(4, copyFile(src, dir.file("whole"), 1));
    EXPECT_EQ(0, copyFile(src, dir.file("whole"), 1, 1));
    EXPECT_EQ(whole, tree(dir.file("whole")));
    EXPECT_EQ(whole, tree(src));

    EXPECT_EQ(0, copyFile(src + "/*", dir.file("links"), 1, 0, 1));
    EXPECT_EQ(".h->" + src + "/.h a.txt->" + src + "/a.txt b.log->" + src + "/b.log sub/ sub/c.txt->" + src +
                  "/sub/c.txt ",
              tree(dir.file("links")));
    EXPECT_EQ(1, copyFile(src + "/a.txt", dir.file("links/a.txt"), 0, 0, 1));
    EXPECT_EQ(1, copyFile(src, dir.file("p/a.txt/x"), 1));

    // Links to directories are made again, not followed; a destination inside
    // the source is not copied into itself.
    ASSERT_EQ(0, symlink("..", (src + "/up").c_str()));
    ASSERT_EQ(0, symlink(src.c_str(), (src + "/sub/self").c_str()));
    EXPECT_EQ(0, copyFile(src, src + "/in/deep", 1));
    EXPECT_EQ(".h=H a.txt=A b.log=B in/ in/deep/ in/deep/.h=H in/deep/a.txt=A in/deep/b.log=B in/deep/in/ "
              "in/deep/sub/ in/deep/sub/c.txt=C in/deep/sub/self->" + src + " in/deep/up->.. sub/ sub/c.txt=C "
              "sub/self->" + src + " up->.. ",
              tree(src));
}


// zkFileManager::GetFileList and GetFolderList.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <list>
#include <vector>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

using Names = std::vector<std::string>;

static Names sorted(Names names) {
    std::sort(names.begin(), names.end());
    return names;
}

// "path:size" of each record appended after the one already there, sorted:
// readdir has no fixed order.
static Names files(const std::string& dir, const char* pattern, unsigned fullPaths = 0) {
    std::list<zkFileInfo> list(1);
    EXPECT_EQ(0, zkFileManager::GetFileList(dir.c_str(), pattern, list, fullPaths));
    Names out;
    for (auto it = std::next(list.begin()); it != list.end(); ++it)
        out.push_back(std::string(it->m_file.GetFullPath()) + ":" + std::to_string(it->m_size));
    return sorted(out);
}

// The names in list order.
static Names folders(const std::string& root, const char* relative, unsigned recursive, unsigned fullPaths) {
    std::list<zkStringBase> list;
    EXPECT_EQ(0, zkFileManager::GetFolderList(root.c_str(), relative, list, recursive, fullPaths));
    Names out;
    for (const zkStringBase& name : list) out.push_back(name.data());
    return out;
}

// Files, folders, links to both and a dangling link, all 5 bytes long.
static void makeTree(const zkTempDir& dir) {
    for (const char* name : {"a.txt", "b.txt", "e.TXT", "notes", "x.tar.gz"})
        ASSERT_TRUE(zkWriteFile(dir.file(name), name));
    for (const char* name : {"d.txt", "s", "s/a", "s/a/x", "s/b", "s/.cache"})
        ASSERT_EQ(0, mkdir(dir.file(name).c_str(), 0777));
    const char* links[][2] = {{"a.txt", "link.txt"}, {"d.txt", "dir.txt"}, {"gone", "dangling.txt"}, {"..", "s/a/up"}};
    for (const auto& l : links) ASSERT_EQ(0, symlink(l[0], dir.file(l[1]).c_str())) << l[1];
}

TEST(FileManagerList, FilesMatchTheLastExtensionExactly) {
    zkTempDir dir;
    makeTree(dir);
    // A link is described by its target, or by itself when the target is missing.
    EXPECT_EQ((Names{"a.txt:5", "b.txt:5", "dangling.txt:4", "link.txt:5"}), files(dir.path(), "*.txt"));
    EXPECT_EQ((Names{"notes:5"}), files(dir.path(), "plain"));
    EXPECT_EQ((Names{dir.file("x.tar.gz:8")}), files(dir.path(), "*.tar.gz", 1));
    std::list<zkFileInfo> none;
    EXPECT_EQ(1, zkFileManager::GetFileList(dir.file("none").c_str(), "*.txt", none, 0));
    EXPECT_TRUE(none.empty());
}

TEST(FileManagerList, FoldersComeDepthFirst) {
    zkTempDir dir;
    makeTree(dir);
    EXPECT_EQ((Names{"/up/", "/x/"}), sorted(folders(dir.file("s/a"), "", 0, 0)));
    EXPECT_EQ((Names{dir.file("s/.cache"), dir.file("s/a"), dir.file("s/b")}), sorted(folders(dir.path(), "s", 0, 1)));
    // s/a/ is followed by its own folders; up leads back to s and is not entered.
    const Names deep = folders(dir.path(), "s", 1, 0);
    EXPECT_EQ((Names{"s/.cache/", "s/a/", "s/a/up/", "s/a/x/", "s/b/"}), sorted(deep));
    const auto below = std::find(deep.begin(), deep.end(), "s/a/") + 1;
    ASSERT_LE(below + 2, deep.end());
    EXPECT_EQ((Names{"s/a/up/", "s/a/x/"}), sorted(Names(below, below + 2)));
    std::list<zkStringBase> none;
    EXPECT_EQ(1, zkFileManager::GetFolderList(dir.path().c_str(), "none", none, 1, 0));
    EXPECT_TRUE(none.empty());
}

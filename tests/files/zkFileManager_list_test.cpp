// zkFileManager::GetFileList and GetFolderList.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <list>
#include <string>
#include <vector>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

namespace {

using Names = std::vector<std::string>;

Names sorted(Names names) {
    std::sort(names.begin(), names.end());
    return names;
}

// "path:size" of each new record, sorted: readdir has no fixed order.
Names files(const std::string& dir, const char* pattern, unsigned fullPaths = 0) {
    std::list<zkFileInfo> list(1);
    EXPECT_EQ(0, zkFileManager::GetFileList(dir.c_str(), pattern, list, fullPaths));
    EXPECT_STREQ("", list.front().m_file.GetFullPath());
    Names out;
    for (auto it = std::next(list.begin()); it != list.end(); ++it)
        out.push_back(std::string(it->m_file.GetFullPath()) + ":" + std::to_string(it->m_size));
    return sorted(out);
}

// The names in list order.
Names folders(const std::string& root, const char* relative, unsigned recursive, unsigned fullPaths) {
    std::list<zkStringBase> list;
    EXPECT_EQ(0, zkFileManager::GetFolderList(root.c_str(), relative, list, recursive, fullPaths));
    Names out;
    for (const zkStringBase& name : list) out.push_back(name.data());
    return out;
}

}  // namespace

TEST(FileManagerList, FilesMatchTheLastExtensionExactly) {
    zkTempDir dir;
    for (const char* name : {"a.txt", "b.txt", "e.TXT", "notes", "x.tar.gz"})
        ASSERT_TRUE(zkWriteFile(dir.file(name), name));
    ASSERT_EQ(0, mkdir(dir.file("d.txt").c_str(), 0777));
    ASSERT_EQ(0, symlink("a.txt", dir.file("link.txt").c_str()));
    ASSERT_EQ(0, symlink("d.txt", dir.file("dir.txt").c_str()));
    ASSERT_EQ(0, symlink("gone", dir.file("dangling.txt").c_str()));

    // A link is described by its target, or by itself when the target is missing.
    EXPECT_EQ((Names{"a.txt:5", "b.txt:5", "dangling.txt:4", "link.txt:5"}), files(dir.path(), "*.txt"));
    EXPECT_EQ((Names{"notes:5"}), files(dir.path(), "plain"));
    EXPECT_EQ((Names{dir.file("x.tar.gz:8")}), files(dir.path(), "*.tar.gz", 1));
    ASSERT_EQ(0, mkdir(dir.file("empty").c_str(), 0777));
    EXPECT_EQ(Names{}, files(dir.file("empty"), "*.txt"));
    std::list<zkFileInfo> list;
    EXPECT_EQ(1, zkFileManager::GetFileList(dir.file("none").c_str(), "*.txt", list, 0));
    EXPECT_TRUE(list.empty());
}

TEST(FileManagerList, FoldersComeDepthFirstAndLinksAreNotEntered) {
    zkTempDir dir;
    for (const char* name : {"s", "s/a", "s/a/x", "s/b", "s/.cache"}) ASSERT_EQ(0, mkdir(dir.file(name).c_str(), 0777));
    ASSERT_TRUE(zkWriteFile(dir.file("s/f"), ""));
    ASSERT_EQ(0, symlink("..", dir.file("s/a/up").c_str()));

    EXPECT_EQ((Names{"/up/", "/x/"}), sorted(folders(dir.file("s/a"), "", 0, 0)));
    EXPECT_EQ((Names{"s/.cache/", "s/a/", "s/b/"}), sorted(folders(dir.path(), "s", 0, 0)));
    EXPECT_EQ((Names{dir.file("s/.cache"), dir.file("s/a"), dir.file("s/b")}), sorted(folders(dir.path(), "s", 0, 1)));
    // s/a/ is followed by its own folders; up leads back to s and is not entered.
    Names deep = folders(dir.path(), "s", 1, 0);
    EXPECT_EQ((Names{"s/.cache/", "s/a/", "s/a/up/", "s/a/x/", "s/b/"}), sorted(deep));
    auto below = std::find(deep.begin(), deep.end(), "s/a/") + 1;
    ASSERT_LE(below + 2, deep.end());
    EXPECT_EQ((Names{"s/a/up/", "s/a/x/"}), sorted(Names(below, below + 2)));

    std::list<zkStringBase> list;
    EXPECT_EQ(1, zkFileManager::GetFolderList(dir.path().c_str(), "none", list, 1, 0));
    EXPECT_TRUE(list.empty());
}

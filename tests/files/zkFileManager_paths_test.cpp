// Path joining and separator translation of zkFileManager.
#include <gtest/gtest.h>

#include <string>

#include "zkFileManager.h"

static std::string joined(const char* dir, const char* name, unsigned noTrailing) {
    zkStringBase result("stale");
    zkFileManager::MakePath(result, zkStringBase(dir), zkStringBase(name), noTrailing);
    return std::string(result.data(), result.length());
}

TEST(MakePath, JoinsDirectoryAndName) {
    const struct {
        const char *dir, *name;
        unsigned flag;
        const char* path;
    } cases[] = {
        {"", "x", 0, "/x/"},
        {"/tmp/", "/x", 1, "/tmp/x"},
        {"/a/", "b/", 1, "/a/b"},
        {"/a", ".", 0, "/a/"},
        {"D:\\data", "./a", 1, "D:/data/a"},
        {"/home/u", ".profile", 1, "/home/u/.profile"},
        // Walks to the parent, for leading steps only.
        {"/a/b", "..", 0, "/a/"},
        {"/a/b", "../", 1, "/a"},
        {"/a/b/d", "../../x", 0, "/a/x/"},
        {"a/b", "../x", 1, "a/x"},
        {"/a/b", "../.hidden", 1, "/a/.hidden"},
        {"/a/b", "..x", 1, "/a/b/..x"},
        {"/a/b", ".././x", 1, "/a/x"},
        {"/a/b", "../x/../y", 1, "/a/x/../y"},
        {"C:\\x\\y", "..\\z", 1, "C:/x/z"},
        // Climbing stops at the root, which stays "/".
        {"ab", "../x", 1, "/x"},
        {"/ab", "../../x", 1, "/x"},
        {"/ab", "..", 1, "/"},
        {"/ab", "..", 0, "/"},
        {"", "", 1, "/"},
        {"", "../..", 1, "/"},
    };
    for (const auto& c : cases) EXPECT_EQ(c.path, joined(c.dir, c.name, c.flag)) << c.dir << " + " << c.name;

    // The four-string form appends the file unexamined.
    zkStringBase path;
    zkFileManager::MakePath(path, zkStringBase("/d/s"), zkStringBase("../../x"), zkStringBase("\\a\\..\\b"));
    EXPECT_STREQ("/x/a\\..\\b", path.data());
}

// The result may be the same string as any argument.
TEST(MakePath, ResultMayBeAnArgument) {
    zkStringBase dir("/a"), name("b"), file("f");
    zkFileManager::MakePath(dir, dir, name, 1u);
    EXPECT_STREQ("/a/b", dir.data());
    zkFileManager::MakePath(name, dir, name, 1u);
    EXPECT_STREQ("/a/b/b", name.data());
    zkFileManager::MakePath(file, zkStringBase("/d"), zkStringBase("s"), file);
    EXPECT_STREQ("/d/s/f", file.data());
}

TEST(MakePath, InsertsTheChosenSeparator) {
    zkFileManager::m_slash = '\\';
    const std::string windows = joined("C:/a", "b", 0), root = joined("", "..", 1);
    zkFileManager::m_slash = '/';
    EXPECT_EQ("C:/a\\b\\", windows);
    EXPECT_EQ("\\", root);
    zkStringBase mixed("a\\b/c");
    zkFileManager::TranslatePathSeparators(mixed, 0);
    EXPECT_STREQ("a/b/c", mixed.data());
}

// Path joining and separator translation of zkFileManager.
#include <gtest/gtest.h>

#include <string>

#include "zkFileManager.h"

namespace {

std::string joined(const char* dir, const char* name, unsigned noTrailing) {
    zkStringBase result("stale");
    zkFileManager::MakePath(result, zkStringBase(dir), zkStringBase(name), noTrailing);
    return std::string(result.data(), result.length());
}

std::string filePath(const char* dir, const char* subdir, const char* file) {
    zkStringBase result;
    zkFileManager::MakePath(result, zkStringBase(dir), zkStringBase(subdir), zkStringBase(file));
    return result.data();
}

}  // namespace

TEST(MakePath, JoinsDirectoryAndName) {
    const struct {
        const char *dir, *name;
        unsigned flag;
        const char* path;
    } cases[] = {
        {"", "x", 0, "/x/"},
        {"/tmp", "log.txt", 1, "/tmp/log.txt"},
        {"/tmp", "log.txt", 0, "/tmp/log.txt/"},
        {"/tmp/", "/x", 1, "/tmp/x"},
        {"D:\\data", "./a", 1, "D:/data/a"},
        {"/home/u", ".profile", 1, "/home/u/.profile"},
        {"/a", ".", 0, "/a/"},
        {"/a/", "", 1, "/a"},
        {"/a/", "b/", 1, "/a/b"},
        {"rel", "x", 1, "rel/x"},
        {"", "", 1, "/"},
        {"/", ".", 1, "/"},
        // Walks to the parent.
        {"/a/b", "..", 0, "/a/"},
        {"/a/b", "..", 1, "/a"},
        {"/a/b", "../", 1, "/a"},
        {"/a/b/d", "../../x", 1, "/a/x"},
        {"/a/b/d", "../../x", 0, "/a/x/"},
        {"a/b", "../x", 1, "a/x"},
        {"/a/b", "../.hidden", 1, "/a/.hidden"},
        {"/a/b", ".././x", 1, "/a/x"},
        {"/a/b", "..//x", 1, "/a/x"},
        {"/a/b", "..x", 1, "/a/b/..x"},
        {"/a/b", "../x/../y", 1, "/a/x/../y"},
        {"C:\\x\\y", "..\\z", 1, "C:/x/z"},
        // Climbing stops at the root, which stays "/".
        {"/ab", "../x", 1, "/x"},
        {"ab", "../x", 1, "/x"},
        {"/ab", "../../x", 1, "/x"},
        {"/ab", "..", 1, "/"},
        {"/ab", "..", 0, "/"},
        {"", "../..", 1, "/"},
    };
    for (const auto& c : cases) EXPECT_EQ(c.path, joined(c.dir, c.name, c.flag)) << c.dir << " + " << c.name;
}

TEST(MakePath, FourStringFormAppendsTheFileUnexamined) {
    EXPECT_EQ("/d/f.txt", filePath("/d", "", "f.txt"));
    EXPECT_EQ("/d/s/f", filePath("/d", "s", "\\f"));
    EXPECT_EQ("/d/s/", filePath("/d", "s", ""));
    EXPECT_EQ("/d/s/a\\..\\b", filePath("/d", "s", "a\\..\\b"));
    EXPECT_EQ("/x/f", filePath("/d/s", "../../x", "/f"));
}

TEST(MakePath, InsertsTheChosenSeparator) {
    zkStringBase path("a\\b/d\\");
    zkFileManager::TranslatePathSeparators(path, 1);
    EXPECT_STREQ("a/b/d/", path.data());

    zkFileManager::m_slash = '\\';
    path = "a\\b/d";
    zkFileManager::TranslatePathSeparators(path, 1);
    std::string kept = path.data();
    zkFileManager::TranslatePathSeparators(path, 0);
    std::string windows = joined("C:/a", "b", 0);
    std::string root = joined("", "..", 1);
    zkFileManager::m_slash = '/';
    EXPECT_EQ("a\\b/d", kept);
    EXPECT_STREQ("a/b/d", path.data());
    EXPECT_EQ("C:/a\\b\\", windows);
    EXPECT_EQ("\\", root);
}

// The platform file layer: zkFilename and the handle functions.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "support/zkTempDir.h"
#include "zkFilename.h"

static std::string parts(const zkFilename& f) {
    return std::string(f.GetDirectory()) + "|" + f.GetName() + "|" + f.GetExtension();
}

TEST(Filename, SplitsIntoDirectoryNameAndExtension) {
    const char* cases[][2] = {
        {"/opt/app/bin", "/opt/app/|bin|"},
        {"/d/a.tar.gz", "/d/|a.tar|gz"},
        {"/u/.profile", "/u/|.profile|"},
        {"..", "|..|"},
        {"a.", "|a.|"},
        {"x/a..b", "x/|a.|b"},
        {"/e/", "/e/||"},
        {"", "||"},
    };
    for (const auto& c : cases) EXPECT_EQ(c[1], parts(zkFilename(c[0]))) << c[0];
    EXPECT_STREQ("http", zkFilename("HTTP://h/").GetProtocol());
    EXPECT_STREQ("file", zkFilename("/a://b").GetProtocol());
}

TEST(Filename, TypesAndExistenceOnDisk) {
    zkTempDir dir;
    const std::string dangling = dir.file("dangling");
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x") && symlink(dir.path().c_str(), dir.file("dl").c_str()) == 0 &&
                symlink(dir.file("none").c_str(), dangling.c_str()) == 0);
    const std::pair<std::string, int> types[] = {
        {dir.file("dl"), 1}, {dir.file("f"), 2}, {"/dev/null", 3}, {dangling, 0}, {dir.file("f/x"), 0}};
    for (const auto& t : types) EXPECT_EQ(t.second, zkFilename(t.first.c_str()).GetType()) << t.first;
    // A dangling link exists only when links are not followed.
    EXPECT_TRUE(zkFilename(dangling.c_str()).FileExists(1) && !zkFilename(dangling.c_str()).FileExists(0));
}

TEST(HandleFiles, CarryCloseOnExecAndGiveSizesPast32BitsInTwoWords) {
    zkTempDir dir;
    const int out = CreateFile(dir.file("h").c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr);
    EXPECT_EQ(FD_CLOEXEC, fcntl(out, F_GETFD) & FD_CLOEXEC);
    ASSERT_EQ(0, ftruncate(out, (5ll << 30) + 3));
    unsigned high = 99;
    EXPECT_EQ((1u << 30) + 3, GetFileSize(out, &high));
    EXPECT_EQ(1u, high);
    CloseHandle(out);
}

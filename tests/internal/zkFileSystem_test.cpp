// The boundary's paths: links followed to the file itself, and the
// failures of a replace that the operating system reports on its own.
#include <gtest/gtest.h>

#include "internal/zkFileSystem.h"
#include "support/zkTempDir.h"

// Relative targets are relative to the link's directory; a chain longer
// than the kernel follows fails with ELOOP.
TEST(FileSystem, ResolveLinksFollowsToTheFileItself) {
    zkTempDir dir;
    const std::string d = dir.path() + "/", longest = std::string(4095 - d.size() - 5, '/') + d + "plain";
    ASSERT_EQ(0, mkdir((d + "sub").c_str(), 0755));
    for (int i = 1; i <= 40; ++i) ASSERT_EQ(0, symlink(std::to_string(i - 1).c_str(), (d + std::to_string(i)).c_str()));
    // A name, the target of the link it becomes (none: no link), and the name
    // it leads to, in the order made.
    const std::string rows[][3] = {{"plain", "", d + "plain"},      {"rel", "sub/b", d + "sub/b"},
                                   {"abs", d + "rel", d + "sub/b"}, {"sub/up", "../abs", d + "sub/b"},
                                   {"long", longest, longest},      {"39", "", d + "0"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row[0]);
        std::string path = d + row[0];
        ASSERT_EQ(0, row[1].empty() ? 0 : symlink(row[1].c_str(), path.c_str()));
        EXPECT_TRUE(zkResolveLinks(path));
        EXPECT_EQ(row[2], path);
    }
    std::string path = d + "40";
    EXPECT_FALSE(zkResolveLinks(path));
}

// Every failure gives 1, with the first failure's errno, and leaves the
// directory as it was.
TEST(FileSystem, FailuresGiveOne) {
    zkTempDir dir;
    ASSERT_EQ(0, symlink("loop", dir.file("loop").c_str()));
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    const zkContentWriter fails = [](int) { return (errno = EIO) == 0; };
    for (const std::string& path : {std::string(), dir.file("f/x"), dir.file("none/x")})
        EXPECT_EQ(1, zkReplaceFile(path.c_str(), 0644, 0, fails)) << path;
    EXPECT_EQ(1, zkReplaceFile(nullptr, 0644, 0, fails));
    EXPECT_EQ(1, zkWriteAll(-1, "y", 1));
    EXPECT_EQ(1, zkReplaceFile(dir.file("loop").c_str(), 0644, 0, fails));
    EXPECT_EQ(ELOOP, errno);
    EXPECT_EQ(1, zkReplaceFile(dir.file("f").c_str(), 0644, 0, fails));
    EXPECT_EQ(EIO, errno);
    EXPECT_EQ(1, zkCreateNewFile(dir.file("f").c_str(), 0644, false, fails));
    EXPECT_EQ(1, zkCreateNewFile(dir.file("n").c_str(), 0644, true, fails));
    EXPECT_EQ(EIO, errno);
    EXPECT_EQ("x", zkReadFile(dir.file("f")));
    EXPECT_EQ((std::set<std::string>{"f", "loop"}), zkDirEntries(dir.path()));
}

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "support/zkTempDir.h"

TEST(TempDir, MakesAFreshDirectoryAndRemovesItsWholeTree) {
    std::string kept;
    {
        zkTempDir dir;
        ASSERT_FALSE(dir.path().empty());
        kept = dir.path();
        ASSERT_EQ(0, mkdir(dir.file("sub").c_str(), 0777));
        ASSERT_TRUE(zkWriteFile(dir.file("sub/a.txt"), std::string("x\0y", 3)));
        EXPECT_EQ(std::string("x\0y", 3), zkReadFile(dir.file("sub/a.txt")));
        zkTempDir other;
        EXPECT_NE(dir.path(), other.path());
    }
    struct stat st;
    EXPECT_NE(0, stat(kept.c_str(), &st));
}

// zkFileInfo records and zkFileManager::GetFileInfo.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "support/zkTempDir.h"
#include "zkFileInfo.h"
#include "zkFileManager.h"

TEST(FileInfo, GetFileInfoFillsTheRecordOnlyOnSuccess) {
    zkTempDir dir;
    const std::string path = dir.file("a.b.txt");
    // Sizes past 4 GiB and dates past 2038 keep their values.
    const long long in2100 = 4102444800ll;
    const struct timespec times[2] = {{static_cast<time_t>(in2100), 0}, {static_cast<time_t>(in2100 + 7), 0}};
    ASSERT_TRUE(zkWriteFile(path, ""));
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "1"));
    ASSERT_EQ(0, truncate(path.c_str(), 5ll << 30));
    ASSERT_EQ(0, utimensat(AT_FDCWD, path.c_str(), times, 0));

    zkFileInfo info;
    info.m_file.SetDirectory("/keep/");
    info.m_size = 42u;
    const zkFileInfo untouched(info);
    for (const std::string& bad : {std::string(), dir.file("none"), dir.file("plain/x")})
        EXPECT_EQ(1, zkFileManager::GetFileInfo(bad.c_str(), info)) << bad;
    EXPECT_EQ(1, zkFileManager::GetFileInfo(nullptr, info));
    EXPECT_TRUE(info == untouched);
    ASSERT_EQ(0, zkFileManager::GetFileInfo(path.c_str(), info));
    // The name and extension are taken; the record's directory stays.
    EXPECT_STREQ("/keep/a.b.txt", info.m_file.GetFullPath());
    EXPECT_EQ(5ull << 30, info.m_size);
    EXPECT_EQ(in2100, info.m_atime);
    EXPECT_EQ(in2100 + 7, info.m_mtime);
    EXPECT_GT(info.m_ctime, 0);
    EXPECT_LT(info.m_ctime, in2100);
    EXPECT_TRUE(S_ISREG(info.m_mode));
    // Records are equal only when every field is.
    zkFileInfo other(info);
    EXPECT_TRUE(other == info);
    other.m_mtime++;
    EXPECT_FALSE(other == info);
    ASSERT_EQ(0, zkFileManager::GetFileInfo(dir.file("plain").c_str(), info));
    EXPECT_STREQ("/keep/plain", info.m_file.GetFullPath());  // the old extension went too
}

// zkFileInfo records and zkFileManager::GetFileInfo.
#include "zkFileInfo.h"

#include <gtest/gtest.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "support/zkTempDir.h"
#include "zkFileManager.h"

namespace {

std::string name(const zkFileInfo& info) {
    return std::string(info.m_file.GetDirectory()) + "|" + info.m_file.GetName() + "|" + info.m_file.GetExtension();
}

}  // namespace

TEST(FileInfo, SetFromTakesTheNameAndTheStatValuesOrNothing) {
    zkTempDir dir;
    std::string path = dir.file("a.b.txt");
    ASSERT_TRUE(zkWriteFile(path, "12345"));
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "1"));
    struct stat st;
    ASSERT_EQ(0, stat(path.c_str(), &st));

    zkFileInfo info;
    EXPECT_EQ(0u, info.m_size + info.m_mode);
    EXPECT_EQ(0, info.m_ctime + info.m_atime + info.m_mtime);
    info.m_file.SetDirectory("/keep/");
    zkFilename file(path.c_str());
    info.SetFrom(file);
    EXPECT_EQ("/keep/|a.b|txt", name(info));
    EXPECT_EQ(5u, info.m_size);
    EXPECT_EQ(static_cast<unsigned>(st.st_mode), info.m_mode);
    EXPECT_EQ(static_cast<long long>(st.st_mtime), info.m_mtime);
    EXPECT_EQ(static_cast<long long>(st.st_atime), info.m_atime);
    EXPECT_EQ(static_cast<long long>(st.st_ctime), info.m_ctime);
    // The next file's parts replace the previous ones whole.
    zkFilename plain(dir.file("plain").c_str());
    info.SetFrom(plain);
    EXPECT_STREQ("/keep/plain", info.m_file.GetFullPath());

    const zkFileInfo before(info);
    for (const std::string& bad : {dir.file("none.c"), dir.file("plain/x.c")}) {
        zkFilename missing(bad.c_str());
        info.SetFrom(missing);
        EXPECT_TRUE(info == before);
        EXPECT_STREQ("/keep/plain", info.m_file.GetFullPath());
    }
    EXPECT_EQ("||", name(zkFileInfo(zkFilename(dir.file("none").c_str()))));
}

TEST(FileInfo, EqualityCoversTheNameAndEveryNumber) {
    zkTempDir dir;
    std::string path = dir.file("f.txt");
    ASSERT_TRUE(zkWriteFile(path, "abc"));
    const zkFileInfo a{zkFilename(path.c_str())};
    zkFileInfo changed(a);
    EXPECT_TRUE(changed == zkFileInfo(zkFilename(path.c_str())));
    changed.m_size += 1;
    EXPECT_TRUE(changed != a);
    for (long long zkFileInfo::*field : {&zkFileInfo::m_ctime, &zkFileInfo::m_atime, &zkFileInfo::m_mtime}) {
        changed = a;
        changed.*field += 1;
        EXPECT_TRUE(changed != a);
    }
    changed = a;
    changed.m_mode ^= 1u;
    EXPECT_FALSE(changed == a);
    changed = a;
    changed.m_file.SetName("g");
    changed = changed;
    EXPECT_FALSE(changed == a);
    EXPECT_STREQ("g.txt", changed.m_file.GetFullPath());
    ASSERT_TRUE(zkWriteFile(path, "abcd"));
    EXPECT_FALSE(zkFileInfo(zkFilename(path.c_str())) == a);
}

TEST(FileInfo, GetFileInfoFillsTheRecordOrFails) {
    zkTempDir dir;
    std::string path = dir.file("n.dat");
    ASSERT_TRUE(zkWriteFile(path, "1234567"));
    zkFileInfo info;
    info.m_size = 42u;
    const zkFileInfo untouched(info);
    EXPECT_EQ(1, zkFileManager::GetFileInfo(nullptr, info));
    EXPECT_EQ(1, zkFileManager::GetFileInfo("", info));
    EXPECT_EQ(1, zkFileManager::GetFileInfo(dir.file("none").c_str(), info));
    EXPECT_EQ(1, zkFileManager::GetFileInfo(dir.file("n.dat/x").c_str(), info));
    EXPECT_TRUE(info == untouched);
    EXPECT_EQ(0, zkFileManager::GetFileInfo(path.c_str(), info));
    EXPECT_EQ(7u, info.m_size);
    EXPECT_TRUE(info == zkFileInfo(zkFilename(path.c_str())));
}

TEST(FileInfo, SizesPastFourGiBAndDatesPast2038KeepTheirValues) {
    zkTempDir dir;
    std::string path = dir.file("sparse.bin");
    const unsigned long long size = 5ull << 30;
    ASSERT_TRUE(zkWriteFile(path, ""));
    ASSERT_EQ(0, truncate(path.c_str(), static_cast<off_t>(size)));
    const long long in2100 = 4102444800ll;
    struct timespec times[2] = {{static_cast<time_t>(in2100), 0}, {static_cast<time_t>(in2100), 0}};
    ASSERT_EQ(0, utimensat(AT_FDCWD, path.c_str(), times, 0));
    zkFileInfo info;
    ASSERT_EQ(0, zkFileManager::GetFileInfo(path.c_str(), info));
    EXPECT_EQ(size, info.m_size);
    EXPECT_EQ(in2100, info.m_mtime);
    EXPECT_EQ(in2100, info.m_atime);
}

// zkFileManager: path joining, directories, disk space, file and folder
// lists, and file records.
#include <sys/statfs.h>

#include "zkFilesTest.h"

// The four-string form appends the file unexamined; the result may be the
// same string as any argument. Backslashes become the chosen separator.
TEST(MakePath, JoinsDirectoryAndName) {
    zkForEachRow("files_makepath.txt", [&](const zkRow& row) {
        zkStringBase path("stale");
        zkFileManager::m_slash = row.size() > 4 ? row[4][0] : '/';
        zkFileManager::MakePath(path, zkStr(row[0]), zkStr(row[1]), std::stoul(row[2]));
        zkFileManager::m_slash = '/';
        EXPECT_EQ(row[3], zkText(path));
    });
    zkStringBase dir("/a"), name("b"), file("\\a\\..\\b");
    zkFileManager::MakePath(dir, dir, name, 1u);
    EXPECT_EQ("/a/b", zkText(dir));
    zkFileManager::MakePath(name, dir, name, 1u);
    EXPECT_EQ("/a/b/b", zkText(name));
    zkFileManager::MakePath(file, zkStr("/d/s"), zkStr("../../x"), file);
    EXPECT_EQ("/x/a\\..\\b", zkText(file));
}

static std::string current(void (*get)(zkStringBase&)) {
    zkStringBase path("stale");
    get(path);
    return zkText(path);
}

TEST(FileManagerDirs, CreateDirectoryMakesTheMissingPartsOfAnyPath) {
    zkRunSteps("files_mkdir.txt");
}

TEST(FileManagerDirs, DeleteFileRemovesADirectoryOnlyWithTheFlag) {
    zkRunSteps("files_delete.txt");
}

// The module directory ends with the chosen separator.
TEST(FileManagerDirs, DirectoryNamesOfAnyLength) {
    const std::string saved = current(zkFileManager::GetCurrentDirectory);
    ASSERT_EQ(0, chdir("/"));
    zkFileManager::m_slash = '\\';
    const std::string root = current(zkFileManager::GetModuleDirectory);
    zkFileManager::m_slash = '/';
    EXPECT_EQ("/\\", root);
    zkTempDir dir;
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    std::string deep = current(zkFileManager::GetCurrentDirectory);
    // Far longer than any first guess at a buffer.
    for (int i = 0; i < 6; ++i) ASSERT_EQ(0, mkdir((deep += "/" + std::string(200, 'c')).c_str(), 0777));
    ASSERT_EQ(0, chdir(deep.c_str()));
    EXPECT_EQ(deep, current(zkFileManager::GetCurrentDirectory));
    // A current directory that was removed has no name.
    ASSERT_EQ(0, rmdir(deep.c_str()));
    EXPECT_EQ("", current(zkFileManager::GetModuleDirectory));
    EXPECT_EQ(0, zkFileManager::CreateDirectory("a/b", nullptr));
    EXPECT_EQ(0, chdir(saved.c_str()));
}

TEST(FileManagerDirs, FreeDiskSpaceIsBlockSizeTimesAvailableBlocks) {
    const zkTempDir dir;
    EXPECT_EQ(0, zkFileManager::GetFreeDiskSpace(dir.file("none").c_str()));
    struct statfs before, after;
    long long space = 0;
    do {  // again when another program wrote meanwhile
        ASSERT_EQ(0, statfs(dir.path().c_str(), &before));
        space = zkFileManager::GetFreeDiskSpace(dir.path().c_str());
        ASSERT_EQ(0, statfs(dir.path().c_str(), &after));
    } while (before.f_bavail != after.f_bavail);
    EXPECT_EQ(static_cast<long long>(static_cast<unsigned long long>(before.f_bsize) * before.f_bavail), space);
}

TEST(FileManagerList, ListsTheMatchingEntries) {
    zkRunSteps("files_lists.txt");
}

// "path size ctime atime mtime mode" of a record.
static std::string record(const zkFileInfo& r) {
    return std::string(r.m_file.GetFullPath()) + " " + std::to_string(r.m_size) + " " + std::to_string(r.m_ctime) +
           " " + std::to_string(r.m_atime) + " " + std::to_string(r.m_mtime) + " " + std::to_string(r.m_mode);
}

// A new record is empty; one made from a file takes its name and extension.
TEST(FileInfo, GetFileInfoFillsTheRecordOnlyOnSuccess) {
    zkTempDir dir;
    const std::string path = dir.file("a.b.txt");
    // Sizes past 4 GiB and dates past 2038 keep their values.
    const long long in2100 = 4102444800ll;
    const struct timespec times[2] = {{static_cast<time_t>(in2100), 0}, {static_cast<time_t>(in2100 + 7), 0}};
    zkPlant(dir.path(), "a.b.txt= plain=1");
    ASSERT_EQ(0, truncate(path.c_str(), 5ll << 30));
    ASSERT_EQ(0, utimensat(AT_FDCWD, path.c_str(), times, 0));

    EXPECT_EQ(" 0 0 0 0 0", record(zkFileInfo()));
    EXPECT_STREQ("a.b.txt", zkFileInfo(zkFilename(path.c_str())).m_file.GetFullPath());
    zkFileInfo info;
    info.m_file.SetDirectory("/keep/");
    info.m_size = 42u;
    const zkFileInfo untouched(info);
    for (const char* bad : {"", "none", "plain/x"}) {
        SCOPED_TRACE(bad);
        EXPECT_EQ(1, zkFileManager::GetFileInfo(*bad ? dir.file(bad).c_str() : bad, info));
    }
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
    other.m_mtime++;
    EXPECT_FALSE(other == info);
    ASSERT_EQ(0, zkFileManager::GetFileInfo(dir.file("plain").c_str(), info));
    EXPECT_STREQ("/keep/plain", info.m_file.GetFullPath());  // the old extension went too
}

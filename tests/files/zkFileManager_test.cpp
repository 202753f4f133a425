// zkFileManager: path joining, directories, disk space, file and folder
// lists, and file records.
#include <sys/statfs.h>

#include <algorithm>

#include "zkFilesTest.h"

using Names = std::multiset<std::string>;

static std::string joined(const char* dir, const char* name, unsigned noTrailing) {
    zkStringBase result("stale");
    zkFileManager::MakePath(result, zkStr(dir), zkStr(name), noTrailing);
    return zkText(result);
}

// The four-string form appends the file unexamined; the result may be the
// same string as any argument.
TEST(MakePath, JoinsDirectoryAndName) {
    for (const auto& row : zkCases("files_makepath.txt")) {
        SCOPED_TRACE(testing::PrintToString(row));
        EXPECT_EQ(row[3], joined(row[0].c_str(), row[1].c_str(), std::stoul(row[2])));
    }
    zkStringBase dir("/a"), name("b"), file("\\a\\..\\b");
    zkFileManager::MakePath(dir, dir, name, 1u);
    EXPECT_EQ("/a/b", zkText(dir));
    zkFileManager::MakePath(name, dir, name, 1u);
    EXPECT_EQ("/a/b/b", zkText(name));
    zkFileManager::MakePath(file, zkStr("/d/s"), zkStr("../../x"), file);
    EXPECT_EQ("/x/a\\..\\b", zkText(file));
}

TEST(MakePath, InsertsTheChosenSeparator) {
    zkFileManager::m_slash = '\\';
    zkStringBase mixed("a\\b/c");
    zkFileManager::TranslatePathSeparators(mixed, 0);
    const std::string windows = joined("C:/a", "b", 0), root = joined("", "..", 1);
    zkFileManager::m_slash = '/';
    EXPECT_EQ("C:/a\\b\\", windows);
    EXPECT_EQ("\\", root);
    EXPECT_EQ("a/b/c", zkText(mixed));
}

static std::string current(void (*get)(zkStringBase&)) {
    zkStringBase path("stale");
    get(path);
    return zkText(path);
}

TEST(FileManagerDirs, DeleteFileRemovesADirectoryOnlyWithTheFlag) {
    zkTempDir dir;
    zkPlant(dir.path(), "d/ link->d");
    zkStringBase sub(dir.file("d").c_str());
    zkFilename link(dir.file("link").c_str());
    EXPECT_EQ(0, zkFileManager::DeleteFile(sub, 0));
    EXPECT_EQ(1, zkFileManager::DeleteFile(link, 0));
    EXPECT_EQ(1, zkFileManager::DeleteFile(sub, 1));
    EXPECT_EQ(0, zkFileManager::DeleteFile(sub, 1));
    EXPECT_EQ(0, zkUnlink(nullptr, 0));
}

TEST(FileManagerDirs, DirectoryNamesOfAnyLength) {
    const std::string saved = current(zkFileManager::GetCurrentDirectory);
    ASSERT_EQ(0, chdir("/"));
    EXPECT_EQ("/", current(zkFileManager::GetModuleDirectory));
    zkTempDir dir;
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    std::string deep = current(zkFileManager::GetCurrentDirectory);
    // Far longer than any first guess at a buffer.
    for (int i = 0; i < 6; ++i) ASSERT_EQ(0, mkdir((deep += "/" + std::string(200, 'c')).c_str(), 0777));
    ASSERT_EQ(0, chdir(deep.c_str()));
    EXPECT_EQ(deep, current(zkFileManager::GetCurrentDirectory));
    EXPECT_EQ(deep.substr(0, deep.size() - 200), current(zkFileManager::GetModuleDirectory));
    // A current directory that was removed has no name.
    ASSERT_EQ(0, rmdir(deep.c_str()));
    EXPECT_EQ("", current(zkFileManager::GetCurrentDirectory));
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

TEST(FileManagerDirs, CreateDirectoryMakesTheMissingPartsOfAnyPath) {
    zkTempDir dir;
    zkPlant(dir.path(), "plain=x");
    const int home = open(".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    EXPECT_NE(0, zkFileManager::CreateDirectory("a//b/c/", nullptr));
    EXPECT_NE(0, zkFileManager::CreateDirectory("a/b/c", nullptr));  // already there
    EXPECT_NE(0, zkFileManager::CreateDirectory((dir.path() + "/a/x/y").c_str(), nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory("plain/a/b", nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory("", nullptr));
    EXPECT_EQ(0, zkFileManager::CreateDirectory(nullptr, nullptr));
    ASSERT_EQ(0, fchdir(home));
    close(home);
    EXPECT_EQ("a/ a/b/ a/b/c/ a/x/ a/x/y/ plain=x ", zkTree(dir.path()));
}

// "path:size" of each record appended after the one already there; readdir
// has no fixed order.
static Names files(const std::string& dir, const char* pattern, unsigned fullPaths = 0) {
    std::list<zkFileInfo> list(1);
    EXPECT_EQ(0, zkFileManager::GetFileList(dir.c_str(), pattern, list, fullPaths));
    Names out;
    for (auto it = std::next(list.begin()); it != list.end(); ++it)
        out.insert(std::string(it->m_file.GetFullPath()) + ":" + std::to_string(it->m_size));
    return out;
}

// The names in list order.
static std::vector<std::string> folders(const std::string& root, const char* relative, unsigned recursive,
                                        unsigned fullPaths) {
    std::list<zkStringBase> list;
    EXPECT_EQ(0, zkFileManager::GetFolderList(root.c_str(), relative, list, recursive, fullPaths));
    std::vector<std::string> out;
    for (const zkStringBase& name : list) out.push_back(name.data());
    return out;
}

// Files, folders, links to both and a dangling link, all 5 bytes long.
static const char* const kTree =
    "a.txt=a.txt b.txt=b.txt e.TXT=e.TXT notes=notes x.tar.gz=x.tar.gz d.txt/ s/ s/a/ s/a/x/ s/b/ s/.cache/ s/n.txt=n "
    "link.txt->a.txt dir.txt->d.txt dangling.txt->gone s/a/up->..";

// Files match the last extension exactly; folders come depth first.
TEST(FileManagerList, ListsTheMatchingEntries) {
    zkTempDir dir;
    zkPlant(dir.path(), kTree);
    // A link is described by its target, or by itself when the target is missing.
    EXPECT_EQ((Names{"a.txt:5", "b.txt:5", "dangling.txt:4", "link.txt:5"}), files(dir.path(), "*.txt"));
    EXPECT_EQ((Names{"notes:5"}), files(dir.path(), "plain"));
    EXPECT_EQ((Names{"n.txt:1"}), files(dir.path(), "s/*.txt"));
    EXPECT_EQ((Names{dir.file("x.tar.gz:8")}), files(dir.path(), "*.tar.gz", 1));
    std::list<zkFileInfo> noFiles;
    EXPECT_EQ(1, zkFileManager::GetFileList(dir.file("none").c_str(), "*.txt", noFiles, 0));
    EXPECT_TRUE(noFiles.empty());

    const std::vector<std::string> top = folders(dir.file("s/a"), "", 0, 0), full = folders(dir.path(), "s", 0, 1);
    EXPECT_EQ((Names{"/up/", "/x/"}), Names(top.begin(), top.end()));
    EXPECT_EQ((Names{dir.file("s/.cache"), dir.file("s/a"), dir.file("s/b")}), Names(full.begin(), full.end()));
    // s/a/ is followed by its own folders; up leads back to s and is not entered.
    const std::vector<std::string> deep = folders(dir.path(), "s", 1, 0);
    EXPECT_EQ((Names{"s/.cache/", "s/a/", "s/a/up/", "s/a/x/", "s/b/"}), Names(deep.begin(), deep.end()));
    const auto below = std::find(deep.begin(), deep.end(), "s/a/") + 1;
    ASSERT_LE(below + 2, deep.end());
    EXPECT_EQ((Names{"s/a/up/", "s/a/x/"}), Names(below, below + 2));
    std::list<zkStringBase> noFolders;
    EXPECT_EQ(1, zkFileManager::GetFolderList(dir.path().c_str(), "none", noFolders, 1, 0));
    EXPECT_TRUE(noFolders.empty());
}

TEST(FileInfo, GetFileInfoFillsTheRecordOnlyOnSuccess) {
    zkTempDir dir;
    const std::string path = dir.file("a.b.txt");
    // Sizes past 4 GiB and dates past 2038 keep their values.
    const long long in2100 = 4102444800ll;
    const struct timespec times[2] = {{static_cast<time_t>(in2100), 0}, {static_cast<time_t>(in2100 + 7), 0}};
    zkPlant(dir.path(), "a.b.txt= plain=1");
    ASSERT_EQ(0, truncate(path.c_str(), 5ll << 30));
    ASSERT_EQ(0, utimensat(AT_FDCWD, path.c_str(), times, 0));

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
    EXPECT_TRUE(other == info);
    other.m_mtime++;
    EXPECT_FALSE(other == info);
    ASSERT_EQ(0, zkFileManager::GetFileInfo(dir.file("plain").c_str(), info));
    EXPECT_STREQ("/keep/plain", info.m_file.GetFullPath());  // the old extension went too
}

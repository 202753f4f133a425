// The platform file layer: zkFilename, the handle functions and zkDirIterator.
#include <map>

#include "zkFilesTest.h"

// "path=directory|name|extension|protocol"
static std::string parts(const zkFilename& f) {
    return std::string(f.GetFullPath()) + "=" + f.GetDirectory() + "|" + f.GetName() + "|" + f.GetExtension() + "|" +
           f.GetProtocol();
}

// A copy holds the same parts.
TEST(Filename, PartsOfAPath) {
    using Setter = void (zkFilename::*)(const char*);
    const std::map<std::string, Setter> setters = {
        {"name", &zkFilename::SetName}, {"ext", &zkFilename::SetExtension}, {"dir", &zkFilename::SetDirectory}};
    zkForEachRow("files_names.txt", [&](const zkRow& row) {
        zkFilename f(row[0].c_str());
        if (!row[1].empty()) (f.*setters.at(row[1]))(row[2].c_str());
        EXPECT_EQ(row[3], parts(f));
        EXPECT_EQ(row[3], parts(zkFilename(f)));
    });
    // Parts set directly: a directory without its separator, and a name
    // holding a directory part of its own.
    zkFilename direct;
    zkFilename::Dup(&direct.m_dir, "/d", -1);
    zkFilename::Dup(&direct.m_fname, "s/b", -1);
    direct.Rebuild(0, 0, 0, 0, 0);
    EXPECT_EQ("/d/s/b=/d/s/|b||file", parts(direct));
    // A length of 0 copies nothing.
    EXPECT_STREQ("", zkFilename::Dup(&direct.m_ext, "ext", 0));
}

TEST(Filename, TypeOnDisk) {
    zkRunSteps("files_types.txt");
}

// Each call on a closed handle fails: -1, 0 and, for a size, all ones.
TEST(HandleFiles, ResultsOfEachCall) {
    zkTempDir dir;
    const std::string path = dir.file("h");
    const int out = CreateFile(path.c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr);
    EXPECT_EQ(FD_CLOEXEC, fcntl(out, F_GETFD) & FD_CLOEXEC);
    EXPECT_EQ(-1, CreateFile(path.c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr));
    EXPECT_EQ(-1, CreateFile(nullptr, O_RDONLY, 0, 0, 0, 0, nullptr));
    unsigned done = 99, high = 99;
    EXPECT_EQ(1, WriteFile(out, "a", 1, &done, nullptr));
    EXPECT_EQ(1, CloseHandle(out));
    EXPECT_EQ(0, CloseHandle(out));

    const int in = CreateFile(path.c_str(), O_RDONLY, 0, 0, 0, 0, nullptr);
    char buffer[8];
    EXPECT_EQ(1, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(1u, done);
    EXPECT_EQ(1, ReadFile(in, buffer, sizeof buffer, &done, nullptr));  // the end
    EXPECT_EQ(0u, done);
    // A size past 4 GiB comes as its low word, the high word apart.
    ASSERT_EQ(0, truncate(path.c_str(), (5ll << 30) + 3));
    EXPECT_EQ((1u << 30) + 3, GetFileSize(in, &high));
    EXPECT_EQ(1u, high);
    CloseHandle(in);
    done = 99;
    EXPECT_EQ(0, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(0u, done);
    EXPECT_EQ(0xFFFFFFFFu, GetFileSize(in, &high));
    EXPECT_EQ(0xFFFFFFFFu, high);
}

// Names in byte order; a copy goes on from the same name on its own. The
// directory is read once and closed.
TEST(DirIterator, ListsMatchingNamesInOrder) {
    zkTempDir dir;
    zkPlant(dir.path(), "b= a*= ab= c=");
    const int next = dup(0);  // the lowest free descriptor, which the iterator takes while reading
    close(next);
    EXPECT_EQ(nullptr, zkDirIterator((dir.path() + "/x*").c_str()).GetName());
    EXPECT_EQ(-1, fcntl(next, F_GETFD));
    EXPECT_STREQ("a*", zkDirIterator((dir.path() + "/a\\*").c_str()).GetName());
    EXPECT_STREQ("dev", zkDirIterator("/dev").GetName());  // a directory part of "/"
    zkDirIterator it((dir.path() + "/[a-c]*").c_str()), assigned;
    ++it;
    zkDirIterator copy(it);
    assigned = it;
    assigned = assigned;
    EXPECT_TRUE(copy == it);  // the same name in another buffer
    std::string names;
    for (; copy != zkDirIterator(); ++copy, ++assigned) names += std::string(copy.GetName()) + " ";
    EXPECT_TRUE(assigned == zkDirIterator());
    EXPECT_EQ("ab b c ", names);
    EXPECT_STREQ("ab", it.GetName());
    EXPECT_FALSE(it == zkDirIterator());
}

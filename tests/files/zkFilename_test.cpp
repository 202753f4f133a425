// The platform file layer: zkFilename and the handle functions.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "support/zkTempDir.h"
#include "zkFilename.h"

static std::string parts(const zkFilename& f) {
    return std::string(f.GetFullPath()) + "=" + f.GetDirectory() + "|" + f.GetName() + "|" + f.GetExtension() + "|" +
           f.GetProtocol();
}

// A copy and an assigned name hold the same parts.
TEST(Filename, SplitsIntoParts) {
    const char* cases[][2] = {
        {"/opt/app/bin", "/opt/app/bin=/opt/app/|bin||file"},
        {"/d/a.tar.gz", "/d/a.tar.gz=/d/|a.tar|gz|file"},
        {"/u/.profile", "/u/.profile=/u/|.profile||file"},
        {"..", "..=|..||file"},
        {"a.", "a.=|a.||file"},
        {"x/a..b", "x/a..b=x/|a.|b|file"},
        {"/e/", "/e/=/e/|||file"},
        {"", "=|||file"},
        {"HTTP://h/x.y", "HTTP://h/x.y=HTTP://h/|x|y|http"},
        {"svn+ssh://h/", "svn+ssh://h/=svn+ssh://h/|||svn+ssh"},
        {"a-b.c://h", "a-b.c://h=a-b.c://|h||a-b.c"},
        {"/a://b", "/a://b=/a://|b||file"},
        {"://h", "://h=://|h||file"},
        {"1a://h", "1a://h=1a://|h||file"},
        {"a_b://h", "a_b://h=a_b://|h||file"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c[0]);
        const zkFilename f(c[0]);
        zkFilename assigned("/old/name.ext");
        assigned = f;
        EXPECT_EQ(c[1], parts(f));
        EXPECT_EQ(c[1], parts(zkFilename(f)));
        EXPECT_EQ(c[1], parts(assigned));
    }
}

TEST(Filename, SettersRebuildThePath) {
    using Setter = void (zkFilename::*)(const char*);
    const struct {
        const char* path;
        Setter set;
        const char* value;
        const char* parts;
    } cases[] = {
        {"/d/a.txt", &zkFilename::SetName, "b", "/d/b.txt=/d/|b|txt|file"},
        {"/d/a.txt", &zkFilename::SetName, "b.c", "/d/b.c.txt=/d/|b.c|txt|file"},
        {"/d/a.txt", &zkFilename::SetName, "s/b", "/d/s/b.txt=/d/s/|b|txt|file"},
        {"a.txt", &zkFilename::SetName, "s/b", "s/b.txt=s/|b|txt|file"},
        {"HTTP://h/a.txt", &zkFilename::SetName, "b", "HTTP://h/b.txt=HTTP://h/|b|txt|http"},
        {"/d/a.txt", &zkFilename::SetName, "", "/d/.txt=/d/||txt|file"},
        {"/d/a.txt", &zkFilename::SetExtension, ".gz", "/d/a.gz=/d/|a|gz|file"},
        {"/d/a.b.c", &zkFilename::SetExtension, "", "/d/a.b=/d/|a|b|file"},
        {"x.y", &zkFilename::SetExtension, "", "x=|x||file"},
        {"/d/a.txt", &zkFilename::SetDirectory, "/x", "/x/a.txt=/x/|a|txt|file"},
        {"/d/a.txt", &zkFilename::SetDirectory, "", "a.txt=|a|txt|file"},
        {"/d/a.txt", &zkFilename::SetDirectory, "ftp://h/", "ftp://h/a.txt=ftp://h/|a|txt|ftp"},
        {"/d/", &zkFilename::SetDirectory, "", "=|||file"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(std::string(c.path) + " <- " + c.value);
        zkFilename f(c.path);
        (f.*c.set)(c.value);
        EXPECT_EQ(c.parts, parts(f));
    }
}

TEST(Filename, TypeOnDisk) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    ASSERT_EQ(0, symlink(dir.path().c_str(), dir.file("dl").c_str()));
    ASSERT_EQ(0, symlink("none", dir.file("dangling").c_str()));
    const std::pair<std::string, int> types[] = {
        {dir.file("dl"), 1}, {dir.file("f"), 2}, {"/dev/null", 3}, {dir.file("dangling"), 0}, {dir.file("f/x"), 0}};
    for (const auto& t : types) EXPECT_EQ(t.second, zkFilename(t.first.c_str()).GetType()) << t.first;
    // A dangling link exists only when links are not followed.
    EXPECT_EQ(1, zkFilename(dir.file("dangling").c_str()).FileExists(1));
    EXPECT_EQ(0, zkFilename(dir.file("dangling").c_str()).FileExists(0));
    EXPECT_EQ(0, zkFilename(dir.file("none").c_str()).FileExists(1));
}

TEST(HandleFiles, CreateFileGivesACloseOnExecHandle) {
    zkTempDir dir;
    const int out = CreateFile(dir.file("h").c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr);
    EXPECT_EQ(FD_CLOEXEC, fcntl(out, F_GETFD) & FD_CLOEXEC);
    EXPECT_EQ(-1, CreateFile(dir.file("h").c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr));
    EXPECT_EQ(1, CloseHandle(out));
    EXPECT_EQ(0, CloseHandle(out));
    EXPECT_EQ(-1, CreateFile(nullptr, O_RDONLY, 0, 0, 0, 0, nullptr));
}

TEST(HandleFiles, ReadFileSaysHowMuchItRead) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("r"), "abc"));
    const int in = CreateFile(dir.file("r").c_str(), O_RDONLY, 0, 0, 0, 0, nullptr);
    char buffer[8];
    unsigned done = 99;
    EXPECT_EQ(1, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(3u, done);
    EXPECT_EQ(1, ReadFile(in, buffer, sizeof buffer, &done, nullptr));  // the end
    EXPECT_EQ(0u, done);
    CloseHandle(in);
    done = 99;
    EXPECT_EQ(0, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(0u, done);
}

// Names in byte order; a copy goes on from the same name on its own.
TEST(DirIterator, ListsMatchingNamesInOrder) {
    zkTempDir dir;
    for (const char* name : {"b", "a*", "ab", "c"}) ASSERT_TRUE(zkWriteFile(dir.file(name), ""));
    EXPECT_EQ(nullptr, zkDirIterator((dir.path() + "/x*").c_str()).GetName());
    EXPECT_STREQ("a*", zkDirIterator((dir.path() + "/a\\*").c_str()).GetName());
    zkDirIterator it((dir.path() + "/[a-c]*").c_str()), assigned;
    ++it;
    zkDirIterator copy(it);
    assigned = it;
    assigned = assigned;
    EXPECT_TRUE(copy == it);  // the same name in another buffer
    EXPECT_FALSE(++zkDirIterator(it) == it);
    EXPECT_STREQ("dev", zkDirIterator("/dev").GetName());  // a directory part of "/"
    std::string names;
    for (; copy != zkDirIterator(); ++copy, ++assigned) {
        EXPECT_STREQ(copy.GetName(), assigned.GetName());
        names += std::string(copy.GetName()) + " ";
    }
    EXPECT_TRUE(assigned == zkDirIterator());
    EXPECT_EQ("ab b c ", names);
    EXPECT_STREQ("ab", it.GetName());
    EXPECT_FALSE(it == zkDirIterator());
}

TEST(HandleFiles, GetFileSizeGivesTheHighWordApart) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("h"), ""));
    ASSERT_EQ(0, truncate(dir.file("h").c_str(), (5ll << 30) + 3));
    const int in = CreateFile(dir.file("h").c_str(), O_RDONLY, 0, 0, 0, 0, nullptr);
    unsigned high = 99;
    EXPECT_EQ((1u << 30) + 3, GetFileSize(in, &high));
    EXPECT_EQ(1u, high);
    CloseHandle(in);
    EXPECT_EQ(0xFFFFFFFFu, GetFileSize(in, &high));
    EXPECT_EQ(0xFFFFFFFFu, high);
    EXPECT_EQ(0xFFFFFFFFu, GetFileSize(in, nullptr));
}

// Each interrupted write returns short, and the rest must follow from there.
TEST(HandleFiles, WriteFileGoesOnAfterShortWrites) {
    if (zkUnderEmulator()) GTEST_SKIP() << "the emulator cannot interrupt a blocking write as the kernel does";
    std::string data((1 << 19) + 1000, '\0');  // not a whole number of blocks
    for (size_t i = 0; i < data.size(); ++i) data[i] = static_cast<char>(i % 251);
    unsigned done = 0;
    int result = 0;
    EXPECT_EQ(data, zkReadFromShortWrites([&](int fd) {
                  result = WriteFile(fd, data.data(), static_cast<unsigned>(data.size()), &done, nullptr);
              }));
    EXPECT_EQ(1, result);
    EXPECT_EQ(data.size(), done);
}

// The platform file layer: zkFilename, zkDirIterator and the free functions.
#include "zkFilename.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "support/zkTempDir.h"

namespace {

// The parts, after checking that splitting the full path gives them back.
std::string parts(const zkFilename& f) {
    std::string text = std::string(f.GetDirectory()) + "|" + f.GetName() + "|" + f.GetExtension();
    zkFilename again(f.GetFullPath());
    EXPECT_EQ(text, std::string(again.GetDirectory()) + "|" + again.GetName() + "|" + again.GetExtension());
    return text;
}

std::string names(const std::string& pattern) {
    std::string seen;
    for (zkDirIterator it(pattern.c_str()); it != zkDirIterator(); ++it) seen += std::string(it.m_name) + " ";
    return seen;
}

}  // namespace

TEST(Filename, SplitsIntoDirectoryNameAndExtension) {
    const char* cases[][2] = {
        {"/opt/app/bin", "/opt/app/|bin|"}, {"a.txt", "|a|txt"}, {"/d/a.tar.gz", "/d/|a.tar|gz"},
        {"/u/.profile", "/u/|.profile|"},   {"..", "|..|"},      {"a.", "|a.|"},
        {"x/a..b", "x/|a.|b"},              {"/e/", "/e/||"},    {"", "||"},
    };
    for (const auto& c : cases) {
        zkFilename f(c[0]);
        EXPECT_EQ(c[1], parts(f)) << c[0];
        EXPECT_STREQ(c[0], f.GetFullPath());
    }
    EXPECT_STREQ("", zkFilename(nullptr).GetName());
    EXPECT_STREQ("ftp", zkFilename("ftp://host/a.txt").GetProtocol());
    EXPECT_STREQ("http", zkFilename("HTTP://host/").GetProtocol());
    EXPECT_STREQ("file", zkFilename("/a://b").GetProtocol());
}

TEST(Filename, RebuildAndSettersKeepPathAndPartsInAgreement) {
    zkFilename f;
    zkFilename::Dup(&f.m_dir, "/d", -1);
    f.Rebuild(0, 0, 0, 0, 0);
    EXPECT_STREQ("/d/", f.GetFullPath());
    zkFilename::Dup(&f.m_fname, "*.txt", -1);
    f.Rebuild(0, 0, 0, 0, 0);
    EXPECT_EQ("/d/|*|txt", parts(f));
    // The front of a name moves to the directory; with an extension present
    // a dotted name stays whole.
    zkFilename::Dup(&f.m_fname, "sub/x.c", -1);
    zkFilename::Dup(&f.m_ext, ".md", -1);
    f.Rebuild(0, 0, 0, 0, 0);
    EXPECT_EQ("/d/sub/|x.c|md", parts(f));
    f.SetExtension(nullptr);
    EXPECT_EQ("/d/sub/|x|c", parts(f));
    f.SetName("*");
    f.SetExtension("");
    f.SetDirectory("ftp://h");
    EXPECT_STREQ("ftp://h/*", f.GetFullPath());
    EXPECT_STREQ("ftp", f.GetProtocol());
    f.SetName(nullptr);
    f.SetExtension("txt");
    EXPECT_STREQ("ftp://h/.txt", f.GetFullPath());

    char* p = nullptr;
    EXPECT_STREQ("abc", zkFilename::Dup(&p, "abcdef", 3));
    EXPECT_STREQ("bc", zkFilename::Dup(&p, p + 1, 10));
    EXPECT_EQ(nullptr, zkFilename::Dup(&p, nullptr, -1));
}

TEST(Filename, CopiesAreDeepAndCompareByFullPath) {
    zkFilename a("ftp://x/a.txt");
    zkFilename b(a), c;
    c = a;
    a.SetName("changed");
    c = c;
    EXPECT_EQ("ftp://x/|a|txt", parts(b));
    EXPECT_STREQ("ftp", c.GetProtocol());
    EXPECT_TRUE(b == c);
    EXPECT_TRUE(a != b);
    EXPECT_TRUE(zkFilename(nullptr) == zkFilename(""));
    EXPECT_FALSE(zkFilename("..") == zkFilename("."));
    EXPECT_FALSE(zkFilename("A") == zkFilename("a"));
}

TEST(Filename, TypeAndExistenceOnDisk) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    ASSERT_EQ(0, mkdir(dir.file("d").c_str(), 0777));
    ASSERT_EQ(0, symlink(dir.file("d").c_str(), dir.file("dl").c_str()));
    ASSERT_EQ(0, symlink(dir.file("none").c_str(), dir.file("dangling").c_str()));
    auto type = [&](const char* name) { return zkFilename(dir.file(name).c_str()).GetType(); };
    auto exists = [&](const char* name, int noFollow) {
        return zkFilename(dir.file(name).c_str()).FileExists(noFollow);
    };
    auto isDir = [&](const char* name) { return zkFilename::IsDirectory(dir.file(name).c_str()); };

    EXPECT_EQ(1, type("d"));
    EXPECT_EQ(1, type("dl"));
    EXPECT_EQ(2, type("f"));
    EXPECT_EQ(3, zkFilename("/dev/null").GetType());
    EXPECT_EQ(0, type("none") + type("f/x"));
    EXPECT_TRUE(exists("f", 0) && exists("dangling", 1));
    EXPECT_FALSE(exists("dangling", 0) || exists("none", 1) || zkFilename().FileExists(0));
    EXPECT_EQ(1, isDir("d"));
    EXPECT_EQ(1, isDir("dl"));
    EXPECT_EQ(0, isDir("f") + isDir("none") + zkFilename::IsDirectory(nullptr));
}

TEST(DirIterator, MatchesTheNamePartInByteOrder) {
    zkTempDir dir;
    for (const char* name : {"b.txt", "a.txt", "c.log", ".h.txt", "a.TXT"}) {
        ASSERT_TRUE(zkWriteFile(dir.file(name), ""));
    }
    ASSERT_EQ(0, mkdir(dir.file("sub").c_str(), 0777));

    EXPECT_EQ(".h.txt a.txt b.txt ", names(dir.file("*.txt")));
    EXPECT_EQ("c.log ", names(dir.file("?.log")));
    EXPECT_EQ(". .. .h.txt a.TXT a.txt b.txt c.log sub ", names(dir.file("*")));
    EXPECT_EQ(names(dir.file("*")), names(dir.path() + "/"));
    EXPECT_EQ("", names(dir.file("*.none")) + names(dir.file("none/*")) + names(dir.file("c.log/*")));
    EXPECT_TRUE(zkDirIterator(nullptr) == zkDirIterator());

    zkDirIterator it(dir.file("*.txt").c_str());
    zkDirIterator copy(++it);
    ++copy;
    EXPECT_STREQ("a.txt", it.GetName());
    EXPECT_STREQ("b.txt", copy.GetName());
    copy = it;
    for (int i = 0; i < 3; ++i) ++it;
    EXPECT_TRUE(it == zkDirIterator());
    EXPECT_STREQ("a.txt", copy.GetName());
}

TEST(CreateDirAndUnlink, MakeParentsAcceptExistingAndRemoveByFlag) {
    zkTempDir dir;
    unsigned mode = 0700;
    EXPECT_NE(0, zkCreateDir(dir.file("a/b//c").c_str(), &mode));
    EXPECT_NE(0, zkCreateDir(dir.file("a/b/c/").c_str(), nullptr));
    struct stat st;
    ASSERT_EQ(0, stat(dir.file("a/b").c_str(), &st));
    EXPECT_EQ(0700u, st.st_mode & 0777u);
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "x"));
    EXPECT_EQ(0, zkCreateDir(dir.file("f").c_str(), nullptr) + zkCreateDir(dir.file("f/sub").c_str(), nullptr) +
                     zkCreateDir("", nullptr) + zkCreateDir(nullptr, nullptr));

    ASSERT_EQ(0, symlink(dir.file("f").c_str(), dir.file("link").c_str()));
    EXPECT_NE(0, zkUnlink(dir.file("link").c_str(), 0));
    EXPECT_TRUE(zkFilename(dir.file("f").c_str()).FileExists(0));
    EXPECT_NE(0, zkUnlink(dir.file("f").c_str(), 0));
    EXPECT_EQ(0, zkUnlink(dir.file("f").c_str(), 0));
    EXPECT_EQ(0, zkUnlink(dir.file("a/b/c").c_str(), 0));
    EXPECT_NE(0, zkUnlink(dir.file("a/b/c").c_str(), 1));
    EXPECT_EQ(0, zkFilename::IsDirectory(dir.file("a/b/c").c_str()) + zkUnlink(dir.file("a").c_str(), 1));
}

TEST(HandleFiles, CreateWriteReadMeasureAndFail) {
    zkTempDir dir;
    std::string name = dir.file("h");
    int out = CreateFile(name.c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr);
    ASSERT_NE(-1, out);
    EXPECT_EQ(FD_CLOEXEC, fcntl(out, F_GETFD) & FD_CLOEXEC);
    unsigned done = 99, high = 99;
    EXPECT_NE(0, WriteFile(out, "hello\0x", 7, &done, nullptr));
    EXPECT_EQ(7u, done);
    EXPECT_EQ(7u, GetFileSize(out, &high));
    EXPECT_EQ(0u, high);
    EXPECT_NE(0, CloseHandle(out));
    EXPECT_EQ(0, CloseHandle(out));
    EXPECT_EQ(-1, CreateFile(name.c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr));

    int in = CreateFile(name.c_str(), O_RDONLY, 0444, 0, 0, 0664, nullptr);
    char buffer[16];
    EXPECT_NE(0, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(std::string("hello\0x", 7), std::string(buffer, done));
    EXPECT_NE(0, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(0u, done);
    EXPECT_EQ(0, WriteFile(in, "x", 1, &done, nullptr));
    CloseHandle(in);
    // A size past 32 bits comes back in two words.
    ASSERT_EQ(0, truncate(name.c_str(), (5ll << 30) + 3));
    in = CreateFile(name.c_str(), O_CREAT | O_WRONLY, 0222, 0, 0, 0664, nullptr);
    EXPECT_EQ((1u << 30) + 3, GetFileSize(in, &high));
    EXPECT_EQ(1u, high);
    CloseHandle(in);
    in = CreateFile(name.c_str(), O_CREAT | O_WRONLY, 0222, 0, O_TRUNC, 0664, nullptr);
    EXPECT_EQ(0u, GetFileSize(in, nullptr));
    CloseHandle(in);

    EXPECT_EQ(0xFFFFFFFFu, GetFileSize(in, &high));
    EXPECT_EQ(0xFFFFFFFFu, high);
    EXPECT_EQ(0, ReadFile(in, buffer, 1, &done, nullptr));
    EXPECT_EQ(-1, CreateFile(dir.file("none/h").c_str(), O_CREAT | O_WRONLY, 0222, 0, 0, 0664, nullptr));
    int full = CreateFile("/dev/full", O_WRONLY, 0222, 0, 0, 0664, nullptr);
    EXPECT_EQ(0, WriteFile(full, "x", 1, &done, nullptr));
    EXPECT_EQ(0u, done);
    CloseHandle(full);
}

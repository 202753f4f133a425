// zkBasicFile: results, ReadAll, 64-bit positions, long names.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>

#include "support/zkTempDir.h"
#include "zkBasicFile.h"
#include "zkStringBase.h"

static std::string bytes(const zkStringBase& s) {
    return std::string(s.data(), s.length());
}

TEST(BasicFile, ResultsOfEachCall) {
    zkTempDir dir;
    zkBasicFile file(dir.file("a.txt").c_str(), O_RDWR, O_TRUNC, O_CREAT);  // the three words are joined by OR
    const int next = dup(0);  // the lowest free descriptor, which Open will take
    close(next);
    ASSERT_EQ(0, file.Open());
    EXPECT_EQ(FD_CLOEXEC, fcntl(next, F_GETFD) & FD_CLOEXEC);
    EXPECT_EQ(1, file.Open());
    EXPECT_EQ(0, file.Write("abc\0def", 0, nullptr));  // length 0: up to the zero byte
    // Several blocks of the read loop, and not a whole number of them.
    const std::string more(5000, 'r');
    ASSERT_EQ(0, file.Write(more.c_str(), more.size(), nullptr));
    ASSERT_EQ(1u, file.SetFilePointer(1, zkBasicFile::SeekBegin));
    zkStringBase text("head");
    EXPECT_EQ(0, file.ReadAll(text));
    EXPECT_EQ("headbc" + more, bytes(text));

    // A directory opens for reading, but reading it fails.
    zkBasicFile directory(dir.path().c_str(), 0, O_RDONLY, 0);
    ASSERT_EQ(0, directory.Open());
    EXPECT_EQ(1, directory.ReadAll(text));
    EXPECT_EQ(EISDIR, errno);
    EXPECT_EQ("headbc" + more, bytes(text));

    // Slashes pad the name of a.txt to 4095 bytes; one byte more would name
    // a.txtg, and cut back to 4095 bytes it would open a.txt.
    const std::string name = dir.path() + std::string(4090 - dir.path().size(), '/') + "a.txt";
    zkBasicFile longName((name + "g").c_str(), O_CREAT, O_RDWR, 0);
    EXPECT_EQ(1, longName.Open());
    EXPECT_EQ(ENAMETOOLONG, errno);
    longName.SetFilename(name.c_str());
    EXPECT_EQ(0, longName.Open());
    EXPECT_EQ(0, longName.Sync());
    EXPECT_EQ(zkBasicFile::kBadPosition, longName.SetFilePointer(~0ull, zkBasicFile::SeekBegin));
}

TEST(BasicFile, ClosedFileFailsEveryCall) {
    zkBasicFile file;
    char buffer[4];
    unsigned long count = 0;
    zkStringBase text("keep");
    EXPECT_EQ(1, file.Close());
    EXPECT_EQ(1, file.Read(buffer, sizeof buffer, &count));
    EXPECT_EQ(1, file.Write("abc", 3, &count));
    EXPECT_EQ(1, file.ReadAll(text));
    EXPECT_EQ(1, file.Sync());
    EXPECT_EQ(zkBasicFile::kBadPosition, file.SetFilePointer(0, zkBasicFile::SeekBegin));
    EXPECT_EQ(zkBasicFile::kBadPosition, file.GetSize());
    EXPECT_STREQ("keep", text.data());
}

TEST(BasicFile, PositionsPast4GiB) {
    zkTempDir dir;
    const std::string path = dir.file("sparse");
    const unsigned long long size = 0x100000000ull + 10;
    ASSERT_TRUE(zkWriteFile(path, ""));
    if (truncate(path.c_str(), static_cast<off_t>(size)) != 0) GTEST_SKIP() << "no sparse file of 4 GiB here";
    zkBasicFile file(path.c_str(), 0, O_RDONLY, 0);
    ASSERT_EQ(0, file.Open());
    EXPECT_EQ(size, file.GetSize());
    zkStringBase text("keep");
    EXPECT_EQ(1, file.ReadAll(text));  // the rest would not fit in a string
    EXPECT_EQ("keep", bytes(text));
    EXPECT_EQ(size - 5, file.SetFilePointer(size - 5, zkBasicFile::SeekBegin));
    EXPECT_EQ(0, file.ReadAll(text));
    EXPECT_EQ(std::string("keep") + std::string(5, '\0'), bytes(text));
}

TEST(BasicFile, FailedWritesGiveFailureResults) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "x"));
    zkBasicFile under(dir.file("plain/a").c_str(), O_CREAT, O_WRONLY, 0);
    EXPECT_EQ(1, under.Open());
    unsigned long count = 0;
    EXPECT_EQ(1, under.Write("abc", 3, &count));

    zkBasicFile full("/dev/full", 0, O_WRONLY, 0);
    ASSERT_EQ(0, full.Open());
    EXPECT_EQ(1, full.Write("abc", 3, &count));
    EXPECT_EQ(static_cast<unsigned long>(-1), count);
    zkBasicFile limited(dir.file("limited").c_str(), O_CREAT, O_WRONLY, 0);
    ASSERT_EQ(0, limited.Open());
    int first = 1, second = 0;
    ASSERT_TRUE(zkWithFileSizeLimit(2, [&] {
        first = limited.Write("abc", 3, &count);
        second = limited.Write("d", 1, nullptr);
    }));
    EXPECT_EQ(0, first);  // a short write
    EXPECT_EQ(2u, count);
    EXPECT_EQ(1, second);
    EXPECT_EQ(0, limited.Close());
    EXPECT_EQ("ab", zkReadFile(dir.file("limited")));
}

// zkBasicFile: results, ReadAll, 64-bit positions, long names.
#include <cerrno>
#include <cstring>
#include <memory>

#include "zkFilesTest.h"

TEST(BasicFile, ResultsOfEachCall) {
    zkTempDir dir;
    const std::string path = dir.file("a.txt");
    // The three words are joined by OR.
    std::unique_ptr<zkBasicFile> file(new zkBasicFile(path.c_str(), O_RDWR, O_TRUNC, O_CREAT));
    const int next = dup(0);  // the lowest free descriptor, which Open will take
    close(next);
    ASSERT_EQ(0, file->Open());
    EXPECT_EQ(FD_CLOEXEC, fcntl(next, F_GETFD) & FD_CLOEXEC);
    EXPECT_EQ(1, file->Open());
    EXPECT_EQ(0, file->Write("abc\0def", 0, nullptr));  // length 0: up to the zero byte
    // Several blocks of the read loop, and not a whole number of them.
    const std::string more(5000, 'r');
    ASSERT_EQ(0, file->Write(more.c_str(), more.size(), nullptr));
    ASSERT_EQ(1u, file->SetFilePointer(1, zkBasicFile::SeekBegin));
    zkStringBase text("head");
    EXPECT_EQ(0, file->ReadAll(text));
    EXPECT_EQ("headbc" + more, zkText(text));
    file.reset();
    EXPECT_EQ(-1, fcntl(next, F_GETFD));  // closed with the object

    // A directory opens for reading, but reading it fails.
    zkBasicFile directory(dir.path().c_str(), 0, O_RDONLY, 0);
    char buffer[4];
    unsigned long count = 99;
    ASSERT_EQ(0, directory.Open());
    EXPECT_EQ(1, directory.Read(buffer, sizeof buffer, &count));
    EXPECT_EQ(0u, count);
    EXPECT_EQ(1, directory.ReadAll(text));
    EXPECT_EQ(EISDIR, errno);
    EXPECT_EQ("headbc" + more, zkText(text));

    // Slashes pad the name of a.txt to 4095 bytes; one byte more would name
    // a.txtg, and cut back to 4095 bytes it would open a.txt.
    const std::string name = dir.path() + std::string(4090 - dir.path().size(), '/') + "a.txt";
    zkBasicFile longName((name + "g").c_str(), O_CREAT, O_RDWR, 0);
    EXPECT_EQ(1, longName.Open());
    longName.SetFilename(name.c_str());
    EXPECT_EQ(0, longName.Open());
    EXPECT_EQ(0, longName.Sync());
    EXPECT_EQ(zkBasicFile::kBadPosition, longName.SetFilePointer(~0ull, zkBasicFile::SeekBegin));

    // A new object has no name and is closed, whatever its bytes held
    // before: every call fails, leaving the count and the string alone and
    // trying no read. Its flags are O_CREAT and O_RDWR.
    alignas(zkBasicFile) unsigned char raw[sizeof(zkBasicFile)];
    std::memset(raw, 'q', sizeof raw);
    zkBasicFile& fresh = *new (raw) zkBasicFile;
    count = 99;
    EXPECT_EQ(1, fresh.Close());
    EXPECT_EQ(1, fresh.Open());
    EXPECT_EQ(1, fresh.Read(buffer, sizeof buffer, &count));
    EXPECT_EQ(1, fresh.Write("abc", 3, &count));
    EXPECT_EQ(99u, count);
    errno = EINTR;
    EXPECT_EQ(1, fresh.ReadAll(text));
    EXPECT_EQ(1, fresh.Sync());
    fresh.SetFilename(dir.file("made").c_str());
    EXPECT_EQ(0, fresh.Open());
    EXPECT_EQ(0, fresh.Write("", 0, nullptr));  // nothing to write is no failure
    EXPECT_EQ(0, fresh.Close());
    EXPECT_EQ(1, fresh.Close());
    fresh.~zkBasicFile();
    // A name taken back is the empty name.
    zkBasicFile closed(".", 0, O_RDONLY, 0);
    closed.SetFilename(nullptr);
    EXPECT_EQ(1, closed.Open());

    // A write that fails gives 1 and a count of all ones; one cut short by
    // the file size limit gives 0 and the count written.
    zkBasicFile full("/dev/full", 0, O_WRONLY, 0), limited(dir.file("limited").c_str(), O_CREAT, O_WRONLY, 0);
    ASSERT_EQ(0, full.Open());
    EXPECT_EQ(1, full.Sync());  // a device that cannot be flushed
    EXPECT_EQ(1, full.Write("abc", 3, &count));
    EXPECT_EQ(static_cast<unsigned long>(-1), count);
    ASSERT_EQ(0, limited.Open());
    int first = 1;
    ASSERT_TRUE(zkWithFileSizeLimit(2, [&] { first = limited.Write("abc", 3, &count); }));
    EXPECT_EQ(0, first);
    EXPECT_EQ(2u, count);
    EXPECT_EQ("ab", zkReadFile(dir.file("limited")));
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
    EXPECT_EQ("keep", zkText(text));
    EXPECT_EQ(size - 5, file.SetFilePointer(size - 5, zkBasicFile::SeekBegin));
    EXPECT_EQ(0, file.ReadAll(text));
    EXPECT_EQ(std::string("keep") + std::string(5, '\0'), zkText(text));
}

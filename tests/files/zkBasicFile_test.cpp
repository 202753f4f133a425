// zkBasicFile: states and results, ReadAll, 64-bit positions, long names.
#include "zkBasicFile.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <string>
#include <type_traits>

#include "support/zkTempDir.h"
#include "zkStringBase.h"

static_assert(!std::is_copy_constructible<zkBasicFile>::value && !std::is_copy_assignable<zkBasicFile>::value,
              "a copy would close the descriptor twice");

namespace {

std::string bytes(const zkStringBase& s) {
    return std::string(s.data(), s.length());
}

class CountingString : public zkStringBase {
public:
    void resize(unsigned newCapacity) override {
        ++calls;
        zkStringBase::resize(newCapacity);
    }
    unsigned calls = 0;
};

}  // namespace

TEST(BasicFile, StatesAndResults) {
    zkTempDir dir;
    const std::string path = dir.file("a.txt");
    zkBasicFile file(path.c_str(), O_RDWR, O_TRUNC, O_CREAT);  // the three words are joined by OR
    unsigned long count = 0;
    const int next = dup(0);  // the lowest free descriptor, which Open will take
    close(next);
    ASSERT_EQ(0, file.Open());
    EXPECT_EQ(FD_CLOEXEC, fcntl(next, F_GETFD) & FD_CLOEXEC);
    EXPECT_EQ(1, file.Open());
    EXPECT_EQ(0, file.Write("abc\0def", 0, &count));  // length 0: up to the zero byte
    EXPECT_EQ(3u, count);
    EXPECT_EQ(0, file.Write(zkStringBase("de"), nullptr));
    EXPECT_EQ(~0ull, file.SetFilePointer(static_cast<unsigned long long>(-9), zkBasicFile::SeekCurrent));
    EXPECT_EQ(0, file.Close());
    EXPECT_EQ(1, file.Close());
    EXPECT_EQ("abcde", zkReadFile(path));

    zkBasicFile readOnly(path.c_str(), 0, O_RDONLY, 0);
    ASSERT_EQ(0, readOnly.Open());
    EXPECT_EQ(1, readOnly.Write("zz", 2, &count));
    EXPECT_EQ(static_cast<unsigned long>(-1), count);
}

TEST(BasicFile, ReadAllAppendsTheRestAfterOneGrowth) {
    zkTempDir dir;
    std::string content;
    for (int i = 0; i < 500; ++i) content += "line " + std::to_string(i) + "\n";
    ASSERT_TRUE(zkWriteFile(dir.file("a"), content));
    zkBasicFile file(dir.file("a").c_str(), 0, O_RDONLY, 0);
    ASSERT_EQ(0, file.Open());
    CountingString all;
    EXPECT_EQ(0, file.ReadAll(all));
    EXPECT_EQ(content, bytes(all));
    EXPECT_EQ(1u, all.calls);
    EXPECT_EQ(content.size() + 128, all.capacity());

    EXPECT_EQ(0, file.ReadAll(all));  // at the end: nothing more
    EXPECT_EQ(content, bytes(all));

    // A directory opens for reading, but reading it fails.
    zkBasicFile directory(dir.path().c_str(), 0, O_RDONLY, 0);
    ASSERT_EQ(0, directory.Open());
    EXPECT_EQ(1, directory.ReadAll(all));
    EXPECT_EQ(EISDIR, errno);
    EXPECT_EQ(content, bytes(all));
}

TEST(BasicFile, PositionsAndSizesPast4GiB) {
    zkTempDir dir;
    const std::string path = dir.file("sparse");
    const unsigned long long size = 0x100000000ull + 10;
    const int fd = open(path.c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, 0600);
    ASSERT_NE(-1, fd);
    const int grown = ftruncate(fd, static_cast<off_t>(size));
    close(fd);
    if (grown != 0) GTEST_SKIP() << "no sparse file of 4 GiB here";

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

TEST(BasicFile, NamesOf4096BytesAreRefusedNotShortened) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("f"), "short"));
    // Slashes pad the name of dir/f to 4095 bytes; one byte more would name
    // dir/fg, and cut back to 4095 bytes it would open dir/f.
    const std::string name = dir.path() + std::string(4094 - dir.path().size(), '/') + "f";
    zkBasicFile file((name + "g").c_str(), O_CREAT, O_RDWR, 0);
    EXPECT_EQ(1, file.Open());
    EXPECT_EQ(ENAMETOOLONG, errno);
    file.SetFilename(name.c_str());
    EXPECT_EQ(0, file.Open());
}

// The platform layer's ReadFile and WriteFile on calls made to misbehave: an
// interrupted call is made again, a write cut short goes on from where it
// stopped, and a failure reports what was moved before it. zkCreateDir's
// calls are counted.
#include "support/zkFaults.h"
#include "zkFilename.h"

namespace {

const Fault kCounted = {-1, 0, 0};  // never answers for the call, only counts it

using HandleFiles = zkFaultTest;

// The rows of transfer_faults.txt.
TEST_F(HandleFiles, TransfersGoOnUntilDoneOrFailed) {
    const std::string data = "0123456789";
    zkForEachRow("transfer_faults.txt", [&](const auto& row) {
        const bool reads = row[1] == "read";
        const unsigned moved = static_cast<unsigned>(std::stoul(row[3]));
        const std::string path = m_dir.file(row[0]);
        ASSERT_TRUE(zkWriteFile(path, reads ? data : ""));
        const int fd = open(path.c_str(), O_RDWR | O_CLOEXEC);
        ASSERT_NE(-1, fd);
        char got[16] = {};
        unsigned done = 99;
        zkArm(zkSteps(row, 5));
        const int result =
            reads ? ReadFile(fd, got, 10, &done, nullptr) : WriteFile(fd, data.data(), 10, &done, nullptr);
        zkSystem = kRealCalls;
        close(fd);
        EXPECT_EQ(std::stoi(row[2]), result);
        EXPECT_EQ(moved, done);
        EXPECT_EQ(data.substr(0, moved), reads ? std::string(got) : zkReadFile(path));
        EXPECT_EQ(std::stol(row[4]),
                  reads ? Faulty<&zkSystemCalls::read>::calls : Faulty<&zkSystemCalls::write>::calls);
    });
}

// A path whose parent exists costs one mkdir however deep it lies; each
// missing part costs one more on the way back, to the deepest part that
// exists, and one on the way forward. Repeated separators name no part of
// their own; a trailing one is tried only as the path given. errno starts as ENOENT, which a made directory must
// not be taken for a missing parent by.
TEST_F(HandleFiles, CreateDirWalksBackOnlyToWhatExists) {
    const std::pair<const char*, long> rows[] = {{"a", 1},         {"b/c/d", 5},    {"b/c/d/e", 1},
                                                 {"x//y///z/", 6}, {"x//y///w", 1}, {"p/q/", 4}};
    for (const auto& [path, calls] : rows) {
        SCOPED_TRACE(path);
        zkArm({{ZK_FAULTY(mkdir), kCounted}});
        errno = ENOENT;
        EXPECT_EQ(1, zkCreateDir(m_dir.file(path).c_str(), nullptr));
        EXPECT_EQ(calls, Faulty<&zkSystemCalls::mkdir>::calls);
    }
    EXPECT_EQ(0, zkCreateDir(nullptr, nullptr));
    EXPECT_EQ(0, zkUnlink(nullptr, 1));
}

}  // namespace

// The platform layer's ReadFile and WriteFile on calls made to misbehave: an
// interrupted call is made again, a write cut short goes on from where it
// stopped, and a failure reports what was moved before it. zkCreateDir's
// calls are counted.
#include "support/zkFaults.h"
#include "zkFilename.h"

namespace {

// calls: how many reads (reads) or writes were made.
struct Row {
    const char* name;
    bool reads;
    Step steps[2];
    int result;
    unsigned done;
    long calls;
};

const Fault kCounted = {-1, 0, 0};  // never answers for the call, only counts it

const Row kRows[] = {
    {"read interrupted", true, {{ZK_FAULTY(read), {1, -1, EINTR}}}, 1, 10, 2},
    {"read fails", true, {{ZK_FAULTY(read), {1, -1, EIO}}}, 0, 0, 1},
    {"write interrupted", false, {{ZK_FAULTY(write), {1, -1, EINTR}}}, 1, 10, 2},
    {"short writes", false, {{armShortTransfers, {}}, {ZK_FAULTY(write), kCounted}}, 1, 10, 4},
    {"write takes nothing", false, {{armShortTransfers, {}}, {ZK_FAULTY(write), {2, 0, 0}}}, 0, 3, 2},
    {"write fails", false, {{armShortTransfers, {}}, {ZK_FAULTY(write), {2, -1, EIO}}}, 0, 3, 2},
};

using HandleFiles = zkFaultTest;

TEST_F(HandleFiles, TransfersGoOnUntilDoneOrFailed) {
    const std::string data = "0123456789";  // not a whole number of short writes
    for (const Row& row : kRows) {
        SCOPED_TRACE(row.name);
        const std::string path = m_dir.file(row.name);
        ASSERT_TRUE(zkWriteFile(path, row.reads ? data : ""));
        const int fd = open(path.c_str(), O_RDWR | O_CLOEXEC);
        ASSERT_NE(-1, fd);
        char got[16] = {};
        unsigned done = 99;
        zkArm(row.steps);
        const int result =
            row.reads ? ReadFile(fd, got, 10, &done, nullptr) : WriteFile(fd, data.data(), 10, &done, nullptr);
        zkSystem = kRealCalls;
        close(fd);
        EXPECT_EQ(row.result, result);
        EXPECT_EQ(row.done, done);
        EXPECT_EQ(data.substr(0, row.done), row.reads ? std::string(got) : zkReadFile(path));
        EXPECT_EQ(row.calls, row.reads ? Faulty<&zkSystemCalls::read>::calls : Faulty<&zkSystemCalls::write>::calls);
    }
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

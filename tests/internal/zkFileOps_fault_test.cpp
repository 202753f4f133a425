// The platform layer's ReadFile and WriteFile on calls made to misbehave: an
// interrupted call is made again, a write cut short goes on from where it
// stopped, and a failure reports what was moved before it.
#include "support/zkFaults.h"
#include "zkFilename.h"

namespace {

struct Row {
    const char* name;
    bool reads;
    Step steps[2];
    int result;
    unsigned done;
};

const Row kRows[] = {
    {"read interrupted", true, {{ZK_FAULTY(read), {1, -1, EINTR}}}, 1, 10},
    {"read fails", true, {{ZK_FAULTY(read), {1, -1, EIO}}}, 0, 0},
    {"write interrupted", false, {{ZK_FAULTY(write), {1, -1, EINTR}}}, 1, 10},
    {"short writes", false, {{armShortTransfers, {}}}, 1, 10},
    {"write takes nothing", false, {{armShortTransfers, {}}, {ZK_FAULTY(write), {2, 0, 0}}}, 0, 3},
    {"write fails", false, {{armShortTransfers, {}}, {ZK_FAULTY(write), {2, -1, EIO}}}, 0, 3},
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
    }
}

}  // namespace

// Single system calls made to fail through the boundary's call table. A
// failed replace leaves the old bytes, owner, group and mode, no other file
// and no open descriptor, and reports the failing call's errno; an
// interrupted call is retried; a refused new file or rename falls back to
// rewriting in place. No file is made more open than the one it replaces.
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <string>

#include "support/zkFaults.h"

namespace {

// A 250-byte name: a temporary name that took it whole would be too long.
const std::string kName = std::string(246, 't') + ".ini";
const std::string kOld = "old bytes\n";
const std::string kNew = "the new bytes, longer than the old\n";
constexpr gid_t kOtherGroup = 65534;
constexpr mode_t kMode = 06750;

const Step kRenameRefused = {ZK_FAULTY(rename), {0, -1, EACCES}};  // the directory admits no new file

struct Row {
    const char* name;
    Step steps[4];
    int errorSeen;  // 0: the replace succeeds
};

const Row kRows[] = {
    {"open interrupted", {{ZK_FAULTY(open), {1, -1, EINTR}}}, 0},
    {"temporary name taken", {{ZK_FAULTY(open), {1, -1, EEXIST}}}, 0},
    {"every temporary name taken", {{ZK_FAULTY(open), {0, -1, EEXIST}}}, EEXIST},
    {"write interrupted", {{ZK_FAULTY(write), {1, -1, EINTR}}}, 0},
    {"write fails", {{ZK_FAULTY(write), {1, -1, EIO}}}, EIO},
    {"write takes nothing", {{ZK_FAULTY(write), {1, 0, 0}}}, EIO},
    {"owner refused", {{ZK_FAULTY(fchown), {1, -1, EPERM}}}, 0},
    {"mode refused", {{ZK_FAULTY(fchmod), {1, -1, EIO}}}, EIO},
    {"flush fails", {{ZK_FAULTY(fsync), {1, -1, EIO}}}, EIO},
    {"close fails", {{ZK_FAULTY(close), {1, -1, EIO}}}, EIO},
    {"close interrupted", {{ZK_FAULTY(close), {1, -1, EINTR}}}, 0},
    {"rename fails", {{ZK_FAULTY(rename), {1, -1, EIO}}}, EIO},
    {"link unreadable", {{ZK_FAULTY(readlink), {1, -1, EIO}}}, EIO},
    {"link target too long", {{ZK_FAULTY(readlink), {1, 4096, 0}}}, ENAMETOOLONG},
    {"in place", {kRenameRefused}, 0},
    {"in place: new file refused", {{ZK_FAULTY(open), {1, -1, EACCES}}}, 0},
    {"in place: rename not permitted", {{ZK_FAULTY(rename), {0, -1, EPERM}}}, 0},
    {"in place: open fails", {kRenameRefused, {ZK_FAULTY(open), {2, -1, EIO}}}, EIO},
    {"in place: read interrupted", {kRenameRefused, {ZK_FAULTY(pread), {1, -1, EINTR}}}, 0},
    {"in place: read fails", {kRenameRefused, {ZK_FAULTY(pread), {1, -1, EIO}}}, EIO},
    {"in place: no space to reserve", {kRenameRefused, {ZK_FAULTY(allocate), {1, ENOSPC, 0}}}, ENOSPC},
    {"in place: reserving unsupported", {kRenameRefused, {ZK_FAULTY(allocate), {1, EOPNOTSUPP, 0}}}, 0},
    {"in place: write fails", {kRenameRefused, {ZK_FAULTY(write), {2, -1, EIO}}}, EIO},
    {"in place: cut fails", {kRenameRefused, {ZK_FAULTY(ftruncate), {1, -1, EIO}}}, EIO},
    {"in place: flush fails", {kRenameRefused, {ZK_FAULTY(fsync), {2, -1, EIO}}}, EIO},
    {"in place: short reads and writes", {{armShortTransfers, {}}, kRenameRefused}, 0},
    // 12 short writes beside, then 3 bytes in place before the failure
    {"in place: short restore", {{armShortTransfers, {}}, kRenameRefused, {ZK_FAULTY(write), {14, -1, EIO}}}, EIO},
    {"in place: restore interrupted after 12 bytes",
     {{armShortTransfers, {}}, kRenameRefused, {ZK_FAULTY(write), {17, -1, EIO}}, {ZK_FAULTY(pwrite), {2, -1, EINTR}}},
     EIO},
    {"in place: restore interrupted",
     {kRenameRefused, {ZK_FAULTY(write), {2, -1, EIO}}, {ZK_FAULTY(pwrite), {1, -1, EINTR}}},
     EIO},
};

size_t openDescriptors() {
    return zkDirEntries("/proc/self/fd").size();
}

bool writeNew(int fd) {
    return zkWriteAll(fd, kNew.data(), kNew.size()) == 0;
}

// The modes asked for by the opens that may create a file, joined.
mode_t gCreateModes = 0;
zkSystemCalls recordingCreateModes() {
    zkSystemCalls calls = kRealCalls;
    calls.open = [](const char* path, int flags, mode_t mode) {
        gCreateModes |= (flags & O_CREAT) != 0 ? mode : 0;
        return kRealCalls.open(path, flags, mode);
    };
    return calls;
}

// Replaces, through a link, a file of another group where we may, with
// steps armed; errorSeen 0 when the replace must succeed.
void expectReplace(const std::string& dir, const Step (&steps)[4], int errorSeen) {
    const std::string target = dir + "/" + kName, link = dir + "/link";
    ASSERT_TRUE(zkWriteFile(target, kOld));
    ASSERT_EQ(0, symlink(kName.c_str(), link.c_str()));
    (void)chown(target.c_str(), static_cast<uid_t>(-1), kOtherGroup);  // where we may
    ASSERT_EQ(0, chmod(target.c_str(), kMode));
    struct stat before, after;
    ASSERT_EQ(0, stat(target.c_str(), &before));
    const size_t descriptors = openDescriptors();
    gCreateModes = 0;
    zkArm(steps, recordingCreateModes());
    errno = 0;
    const int result = zkReplaceFile(link.c_str(), 0644, kNew.size(), writeNew);
    const int error = errno;
    zkSystem = kRealCalls;
    EXPECT_EQ(errorSeen == 0 ? 0 : 1, result);
    EXPECT_EQ(errorSeen, result == 0 ? 0 : error);
    EXPECT_EQ(errorSeen == 0 ? kNew : kOld, zkReadFile(target));
    EXPECT_EQ((std::set<std::string>{"link", kName}), zkDirEntries(dir));
    EXPECT_EQ(descriptors, openDescriptors());
    EXPECT_EQ(0u, gCreateModes & ~0600u);
    ASSERT_EQ(0, stat(target.c_str(), &after));
    EXPECT_EQ(before.st_uid, after.st_uid);
    EXPECT_EQ(before.st_gid, after.st_gid);
    EXPECT_EQ(kMode, after.st_mode & 07777);
    unlink(target.c_str());
    unlink(link.c_str());
}

using FileSystemFault = zkFaultTest;

TEST_F(FileSystemFault, OneFailingCallLeavesTheOldFileWhole) {
    for (const Row& row : kRows) {
        SCOPED_TRACE(row.name);
        expectReplace(m_dir.path(), row.steps, row.errorSeen);
    }
}

// Writes of three bytes a call, the nth failing: beside the file and in
// place, a failure at any offset of the new bytes leaves the old file.
TEST_F(FileSystemFault, AFailedWriteAtAnyOffsetLeavesTheOldFile) {
    const long calls = static_cast<long>(kNew.size() + 2) / 3;
    for (const Step& where : {Step{}, kRenameRefused}) {
        for (long nth = 1; nth <= calls; ++nth) {
            SCOPED_TRACE(std::string(where.arm ? "in place, " : "beside, ") + std::to_string(nth));
            const long failing = where.arm ? calls + nth : nth;  // in place comes after the writes beside
            expectReplace(m_dir.path(), {{armShortTransfers, {}}, where, {ZK_FAULTY(write), {failing, -1, EIO}}}, EIO);
        }
    }
}

// As an owner without privilege, whose writes and cuts clear the set-id
// bits, which the replace gives back, also to an old file it restores.
TEST_F(FileSystemFault, SetIdBitsStayForAnOwnerWithoutPrivilege) {
    const Row rows[] = {{"beside", {}, 0},
                        {"in place", {kRenameRefused}, 0},
                        {"in place: write fails", {kRenameRefused, {ZK_FAULTY(write), {2, -1, EIO}}}, EIO}};
    ASSERT_TRUE(zkSetEffectiveCapabilities(false));
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        expectReplace(m_dir.path(), row.steps, row.errorSeen);
    }
    EXPECT_TRUE(zkSetEffectiveCapabilities(true));
}

TEST_F(FileSystemFault, DeviceFailuresAreReportedButAnUnsupportedFlushIsNot) {
    const struct {
        const char* name;
        Arm arm;
        Fault fault;
        int result;
    } rows[] = {{"open fails", ZK_FAULTY(open), {1, -1, EIO}, 1},
                {"flush fails", ZK_FAULTY(fsync), {1, -1, EIO}, 1},
                {"flush unsupported", ZK_FAULTY(fsync), {1, -1, EINVAL}, 0},
                {"flush succeeds, errno stale", ZK_FAULTY(fsync), {1, 0, EIO}, 0}};
    // A node of its own, so that a faulty replace could never take /dev/null.
    const std::string null = m_dir.file("null");
    if (mknod(null.c_str(), S_IFCHR | 0666, makedev(1, 3)) != 0) GTEST_SKIP() << "no device node can be made here";
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        zkArm({{row.arm, row.fault}});
        errno = 0;
        EXPECT_EQ(row.result, zkReplaceFile(null.c_str(), 0644, 0, writeNew));
        EXPECT_EQ(row.fault.error, errno);
    }
}

}  // namespace

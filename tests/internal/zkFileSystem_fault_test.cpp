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
void expectReplace(const std::string& dir, const std::vector<Step>& steps, int errorSeen) {
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

// The rows of replace_faults.txt, each run as the user it names.
TEST_F(FileSystemFault, OneFailingCallLeavesTheOldFileWhole) {
    zkForEachRow("replace_faults.txt", [&](const auto& row) {
        ASSERT_TRUE(zkSetEffectiveCapabilities(row[1] == "root"));
        expectReplace(m_dir.path(), zkSteps(row, 3), static_cast<int>(zkNumber(row[2])));
    });
    EXPECT_TRUE(zkSetEffectiveCapabilities(true));
}

// The rows of device_faults.txt.
TEST_F(FileSystemFault, DeviceFailuresAreReportedButAnUnsupportedFlushIsNot) {
    // A node of its own, so that a faulty replace could never take /dev/null.
    const std::string null = m_dir.file("null");
    if (mknod(null.c_str(), S_IFCHR | 0666, makedev(1, 3)) != 0) GTEST_SKIP() << "no device node can be made here";
    zkForEachRow("device_faults.txt", [&](const auto& row) {
        zkArm(zkSteps(row, 3));
        errno = 0;
        EXPECT_EQ(std::stoi(row[1]), zkReplaceFile(null.c_str(), 0644, 0, writeNew));
        EXPECT_EQ(zkNumber(row[2]), errno);
    });
}

}  // namespace

// Single system calls made to misbehave through the boundary's call table.
// A failed replace leaves the old bytes, owner, group and mode, no other file
// and no open descriptor, and reports the failing call's errno; an
// interrupted call is retried; a refused new file or rename falls back to
// rewriting in place. No file is made more open than the one it replaces.
// The platform layer's ReadFile and WriteFile make an interrupted call again,
// go on after a short write, and report what was moved before a failure;
// zkCreateDir's calls are counted. An in-place INI save reserves room for
// exactly the text it writes, so a full disk stops it before the old bytes
// are touched.
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <string>

#include "ini/zkIniTestSupport.h"
#include "support/zkFaults.h"
#include "zkFilename.h"

namespace {

// A 250-byte name: a temporary name that took it whole would be too long.
const std::string kName = std::string(246, 't') + ".ini";
const std::string kOld = "old bytes\n";
const std::string kNew = "the new bytes, longer than the old\n";
constexpr gid_t kOtherGroup = 65534;
constexpr mode_t kMode = 06750;

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
    const size_t descriptors = zkDirEntries("/proc/self/fd").size();
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
    EXPECT_EQ(descriptors, zkDirEntries("/proc/self/fd").size());
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

off_t gReservedTo = 0;  // where the last reservation ended

using IniSaveFault = zkFaultTest;

// The rows of ini_saves.txt, each saved in place.
TEST_F(IniSaveFault, InPlaceSaveReservesWhatItWrites) {
    zkSystemCalls recording = kRealCalls;
    recording.allocate = [](int fd, off_t at, off_t length) {
        gReservedTo = at + length;
        return kRealCalls.allocate(fd, at, length);
    };
    zkForEachRow("ini_saves.txt", [&](const auto& row) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, m_dir, "source.ini", zkTestText(row[0])));
        ASSERT_TRUE(zkWriteFile(m_dir.file("a.ini"), "[s]\n"));  // shorter than every text saved
        ini.SetFilename(m_dir.file("a.ini").c_str());
        gReservedTo = 0;
        zkArm(zkSteps({"rename:0:-1:EACCES"}, 0), recording);
        EXPECT_EQ(0, row[1] == "firewall" ? ini.CloseFW(1) : ini.Close(1));
        zkSystem = kRealCalls;
        EXPECT_EQ(static_cast<off_t>(zkReadFile(m_dir.file("a.ini")).size()), gReservedTo);
    });
}

}  // namespace

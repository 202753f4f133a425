// Every call the library makes to replace, create or flush a file lives here.
#include "zkFileSystem.h"

#include <errno.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <vector>

zkSystemCalls zkSystem = {
    [](const char* path, int flags, mode_t mode) { return ::open(path, flags, mode); },
    ::close,
    ::read,
    ::write,
    [](int fd, void* data, size_t size, off_t offset) { return ::pread(fd, data, size, offset); },
    [](int fd, const void* data, size_t size, off_t offset) { return ::pwrite(fd, data, size, offset); },
    ::fsync,
    [](int fd, off_t length) { return ::ftruncate(fd, length); },
    [](int fd, off_t offset, off_t length) { return ::posix_fallocate(fd, offset, length); },
    ::rename,
    ::mkdir,
    ::readlink,
    ::fchown,
    ::fchmod,
};

namespace {

// Symbolic links followed before giving up, as the kernel does.
constexpr int kMaxLinkDepth = 40;
// Room for a link's target.
constexpr size_t kLinkTargetSize = 4096;
// Names tried for a temporary file before giving up.
constexpr int kTempNameAttempts = 64;
// Bytes of the target's own name kept in the temporary file's name: with the
// dot before it and the suffix after it, the name stays far inside one path
// component's limit whatever the target's length.
constexpr size_t kTempNameKeep = 64;
// The mode of a temporary file until it takes the old file's.
constexpr mode_t kPrivateMode = 0600;
// The permission bits, set-id and sticky bits included, that a replacement
// takes over.
constexpr mode_t kPermissionBits = 07777;

std::string directoryOf(const std::string& path) {
    size_t slash = path.rfind('/');
    return slash == std::string::npos ? std::string() : path.substr(0, slash + 1);
}

std::string baseOf(const std::string& path) {
    size_t slash = path.rfind('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

// A name beside the target, unlikely to be taken: the process, the time and
// a counter shared by the whole process.
std::string tempName(const std::string& target) {
    static std::atomic<unsigned> counter{0};
    struct timespec now = {};
    clock_gettime(CLOCK_REALTIME, &now);
    unsigned long long mix =
        static_cast<unsigned long long>(now.tv_nsec) ^ (static_cast<unsigned long long>(now.tv_sec) << 30) ^
        (static_cast<unsigned long long>(getpid()) << 40) ^ (counter.fetch_add(1) * 0x9E3779B97F4A7C15ull);
    char suffix[24];
    std::snprintf(suffix, sizeof suffix, ".%012llx", mix & 0xFFFFFFFFFFFFull);
    return directoryOf(target) + "." + baseOf(target).substr(0, kTempNameKeep) + suffix;
}

int closeChecked(int fd) {
    // Linux releases the descriptor even when close is interrupted.
    return zkSystem.close(fd) == 0 || errno == EINTR ? 0 : 1;
}

int fail(int fd) {
    zkErrnoKeeper keep;
    if (fd != -1) zkSystem.close(fd);
    return 1;
}

// Creates the file that receives the new contents beside target, with mode;
// -1 when none can be made.
int createBeside(const std::string& target, mode_t mode, std::string& temp) {
    for (int attempt = 0; attempt < kTempNameAttempts; ++attempt) {
        temp = tempName(target);
        int fd = zkOpen(temp.c_str(), O_CREAT | O_EXCL | O_WRONLY, mode);
        if (fd != -1 || errno != EEXIST) return fd;
    }
    return -1;
}

// Gives the new file the old one's owner, then its permission bits: a change
// of owner clears the set-id bits that the permissions then restore. Only
// the group may be ours to give, or neither, so those refusals are no
// failure.
int takeOverMode(int fd, const struct stat& old) {
    if (zkSystem.fchown(fd, old.st_uid, old.st_gid) != 0) (void)zkSystem.fchown(fd, static_cast<uid_t>(-1), old.st_gid);
    return zkSystem.fchmod(fd, old.st_mode & kPermissionBits) == 0 ? 0 : 1;
}

// Writes through fd, gives it old's owner and mode when old is given, flushes
// it when sync and closes it: 0, or 1 with errno (fd closed either way). The
// mode comes after the bytes: a write by a process without CAP_FSETID clears
// the set-id bits.
int writeAndClose(int fd, const zkContentWriter& write, const struct stat* old, bool sync) {
    if (!write(fd)) return fail(fd);
    if (old && takeOverMode(fd, *old) != 0) return fail(fd);
    if (sync && zkSystem.fsync(fd) != 0) return fail(fd);
    return closeChecked(fd);
}

bool refusedHere(int error) {
    return error == EACCES || error == EPERM;
}

enum class Outcome { Done, Failed, NotHere };

// The new contents go to a file beside the target, which is renamed over it
// once whole: at every moment the name holds the whole old file or the whole
// new one. NotHere, with nothing left behind, when the directory admits no
// new file or refuses the rename. An existing file's replacement is private
// until it holds the old file's mode, and is flushed before the rename, so
// that a crash cannot leave a name whose old bytes are gone and whose new
// ones never reached the disk. A new file's mode is the caller's (less the
// umask), and it is not flushed: there is no old content to guard.
Outcome replaceBeside(const std::string& target, const struct stat* old, mode_t newMode, const zkContentWriter& write) {
    std::string temp;
    int fd = createBeside(target, old ? kPrivateMode : newMode, temp);
    if (fd == -1) return refusedHere(errno) ? Outcome::NotHere : Outcome::Failed;
    int failed = writeAndClose(fd, write, old, old != nullptr);
    if (!failed && zkSystem.rename(temp.c_str(), target.c_str()) != 0) failed = refusedHere(errno) ? 2 : 1;
    if (failed) {
        zkErrnoKeeper keep;
        unlink(temp.c_str());
        return failed == 2 ? Outcome::NotHere : Outcome::Failed;
    }
    zkSyncDirectoryOf(target);
    return Outcome::Done;
}

// Reads the whole file from its start; false on a read error.
bool readAll(int fd, std::vector<char>& bytes, size_t size) {
    bytes.resize(size);
    size_t got = 0;
    while (got < size) {
        ssize_t n = zkSystem.pread(fd, bytes.data() + got, size - got, static_cast<off_t>(got));
        if (n < 0 && errno == EINTR) continue;
        if (n < 0) return false;
        if (n == 0) break;
        got += static_cast<size_t>(n);
    }
    bytes.resize(got);
    return true;
}

// Writes and cuts by a process that may not keep the set-id bits clear
// them; the owner may set them again. Where the process may not, they stay
// cleared.
void giveBackSetIdBits(int fd, const struct stat& old) {
    if ((old.st_mode & (S_ISUID | S_ISGID)) != 0) (void)zkSystem.fchmod(fd, old.st_mode & kPermissionBits);
}

// Puts the old bytes, length and set-id bits back after a failed rewrite.
// The bytes fitted before, so no new room is needed for them.
void restore(int fd, const std::vector<char>& old, const struct stat& st) {
    zkErrnoKeeper keep;
    size_t put = 0;
    while (put < old.size()) {
        ssize_t n = zkSystem.pwrite(fd, old.data() + put, old.size() - put, static_cast<off_t>(put));
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) break;
        put += static_cast<size_t>(n);
    }
    (void)zkSystem.ftruncate(fd, static_cast<off_t>(old.size()));
    giveBackSetIdBits(fd, st);
    (void)zkSystem.fsync(fd);
}

// Rewrites a regular file where it stands, for a directory that admits no
// new file. The old bytes are read first and the new size reserved before
// any is overwritten; the file is cut to its new length only at the end, and
// any failure on the way writes the old bytes back.
int rewriteInPlace(const std::string& target, unsigned long long sizeHint, const zkContentWriter& write) {
    int fd = zkOpen(target.c_str(), O_RDWR, 0);
    if (fd == -1) return 1;
    struct stat st;
    std::vector<char> old;
    if (fstat(fd, &st) != 0 || !readAll(fd, old, static_cast<size_t>(st.st_size))) return fail(fd);
    if (sizeHint > old.size()) {
        int error = zkSystem.allocate(fd, static_cast<off_t>(old.size()), static_cast<off_t>(sizeHint - old.size()));
        // A file system that cannot reserve space says so with EOPNOTSUPP or
        // EINVAL; the write then finds out.
        if (error != 0 && error != EOPNOTSUPP && error != EINVAL) {
            errno = error;
            restore(fd, old, st);
            return fail(fd);
        }
    }
    off_t end = write(fd) ? lseek(fd, 0, SEEK_CUR) : -1;
    bool cut = end != -1 && zkSystem.ftruncate(fd, end) == 0;
    if (cut) giveBackSetIdBits(fd, st);
    if (!cut || zkSystem.fsync(fd) != 0) {
        restore(fd, old, st);
        return fail(fd);
    }
    return closeChecked(fd);
}

// Devices, FIFOs and the like are written to as they are.
int writeThrough(const std::string& target, const zkContentWriter& write) {
    int fd = zkOpen(target.c_str(), O_WRONLY | O_TRUNC, 0);
    if (fd == -1) return 1;
    if (!write(fd)) return fail(fd);
    // Devices and pipes cannot be flushed and say so with EINVAL.
    if (zkSystem.fsync(fd) != 0 && errno != EINVAL) return fail(fd);
    return closeChecked(fd);
}

}  // namespace

int zkOpen(const char* path, int flags, mode_t mode) {
    int fd;
    do {
        fd = zkSystem.open(path, flags | O_CLOEXEC, mode);
    } while (fd == -1 && errno == EINTR);
    return fd;
}

int zkWriteAll(int fd, const void* data, size_t size) {
    const char* bytes = static_cast<const char*>(data);
    while (size != 0) {
        ssize_t n = zkSystem.write(fd, bytes, size);
        if (n < 0 && errno == EINTR) continue;
        if (n < 0) return 1;
        // A write that takes nothing would repeat forever.
        if (n == 0) {
            errno = EIO;
            return 1;
        }
        bytes += n;
        size -= static_cast<size_t>(n);
    }
    return 0;
}

bool zkResolveLinks(std::string& path) {
    for (int depth = 0; depth < kMaxLinkDepth; ++depth) {
        struct stat st;
        if (lstat(path.c_str(), &st) != 0 || !S_ISLNK(st.st_mode)) return true;
        std::string target(kLinkTargetSize, '\0');
        ssize_t n = zkSystem.readlink(path.c_str(), &target[0], target.size());
        if (n < 0) return false;
        if (static_cast<size_t>(n) >= target.size()) {
            errno = ENAMETOOLONG;
            return false;
        }
        target.resize(static_cast<size_t>(n));
        // A relative target is relative to the link's directory.
        if (!target.empty() && target[0] != '/') target.insert(0, directoryOf(path));
        path.swap(target);
    }
    errno = ELOOP;
    return false;
}

void zkSyncDirectoryOf(const std::string& path) {
    std::string directory = directoryOf(path);
    int fd = zkOpen(directory.empty() ? "." : directory.c_str(), O_RDONLY | O_DIRECTORY, 0);
    if (fd == -1) return;
    (void)zkSystem.fsync(fd);
    zkSystem.close(fd);
}

int zkReplaceFile(const char* path, mode_t newMode, unsigned long long sizeHint, const zkContentWriter& write) {
    if (path == nullptr || *path == '\0') {
        errno = ENOENT;
        return 1;
    }
    std::string target(path);
    if (!zkResolveLinks(target)) return 1;
    struct stat old;
    const bool exists = stat(target.c_str(), &old) == 0;
    if (!exists && errno != ENOENT) return 1;
    if (exists && !S_ISREG(old.st_mode)) return writeThrough(target, write);

    Outcome outcome = replaceBeside(target, exists ? &old : nullptr, newMode, write);
    if (outcome == Outcome::NotHere && exists) return rewriteInPlace(target, sizeHint, write);
    return outcome == Outcome::Done ? 0 : 1;
}

int zkCreateNewFile(const char* path, mode_t mode, bool sync, const zkContentWriter& write) {
    int fd = zkOpen(path, O_CREAT | O_EXCL | O_WRONLY, mode);
    if (fd == -1) return 1;
    if (writeAndClose(fd, write, nullptr, sync) == 0) return 0;
    zkErrnoKeeper keep;
    unlink(path);
    return 1;
}

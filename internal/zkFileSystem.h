// The library's one boundary to the operating system for writing files.
//
// Every write that replaces a user's file goes through zkReplaceFile; every
// new file that a copy creates goes through zkCreateNewFile. Both take the
// new contents from a writer callback that writes to the descriptor it is
// given (through zkWriteAll or its own loop) and returns false on failure,
// with errno set. A writer may run twice: once beside the file and again
// in place when the rename is refused.
//
// Results follow one rule: 0 done, 1 failed with errno telling why (the
// first failure's errno, kept across the cleanup that follows it).
#ifndef ZK_FILE_SYSTEM_H
#define ZK_FILE_SYSTEM_H

#include <errno.h>
#include <sys/stat.h>
#include <sys/types.h>

#include <cstring>
#include <functional>
#include <memory>
#include <string>

// The system calls through which this boundary, and the platform layer's
// ReadFile, WriteFile and zkCreateDir, read, write, flush, rename and make
// files, gathered in one table: the library uses the real calls, and a test
// may replace an entry to make that call fail or count it. allocate answers
// like posix_fallocate (0 or an error number); the others like the calls
// they name.
struct zkSystemCalls {
    int (*open)(const char* path, int flags, mode_t mode);
    int (*close)(int fd);
    ssize_t (*read)(int fd, void* data, size_t size);
    ssize_t (*write)(int fd, const void* data, size_t size);
    ssize_t (*pread)(int fd, void* data, size_t size, off_t offset);
    ssize_t (*pwrite)(int fd, const void* data, size_t size, off_t offset);
    int (*fsync)(int fd);
    int (*ftruncate)(int fd, off_t length);
    int (*allocate)(int fd, off_t offset, off_t length);
    int (*rename)(const char* from, const char* to);
    int (*mkdir)(const char* path, mode_t mode);
    ssize_t (*readlink)(const char* path, char* target, size_t size);
    int (*fchown)(int fd, uid_t owner, gid_t group);
    int (*fchmod)(int fd, mode_t mode);
};

extern zkSystemCalls zkSystem;

// Keeps errno across cleanup calls that may change it, so a failure's errno
// reaches the caller.
class zkErrnoKeeper {
public:
    zkErrnoKeeper() : m_saved(errno) {}
    ~zkErrnoKeeper() { errno = m_saved; }
    zkErrnoKeeper(const zkErrnoKeeper&) = delete;
    zkErrnoKeeper& operator=(const zkErrnoKeeper&) = delete;

private:
    int m_saved;
};

// Whether two stat results describe the same file.
inline bool zkSameFile(const struct stat& a, const struct stat& b) {
    return a.st_dev == b.st_dev && a.st_ino == b.st_ino;
}

// Doubles a read buffer of size bytes that is full, keeping its first kept
// bytes; size becomes the new size.
inline void zkDoubleBuffer(std::unique_ptr<char[]>& buffer, size_t& size, size_t kept) {
    std::unique_ptr<char[]> larger(new char[2 * size]);
    std::memcpy(larger.get(), buffer.get(), kept);
    buffer.swap(larger);
    size *= 2;
}

// Writes the new contents to the descriptor; false on failure, errno set.
using zkContentWriter = std::function<bool(int fd)>;

// Opens path with flags | O_CLOEXEC, retrying when interrupted; -1 on failure.
int zkOpen(const char* path, int flags, mode_t mode);

// Writes all size bytes, continuing after short and interrupted writes:
// 0 written, 1 failed (a write that takes nothing fails with EIO).
int zkWriteAll(int fd, const void* data, size_t size);

// Follows path through symbolic links to the name of the file itself, which
// may not exist yet: false (errno ELOOP, ENAMETOOLONG or the readlink error)
// when the chain is too long or unreadable.
bool zkResolveLinks(std::string& path);

// Makes a durable record of renames in the directory of path; failures
// only cost durability and are not reported.
void zkSyncDirectoryOf(const std::string& path);

// Replaces the contents of the file at path (through symbolic links: the
// final target is replaced and the links stay) with what write produces.
//
// An existing regular file: the contents go to a new file beside it, made
// exclusively with mode 0600 under a name that fits one path component,
// written, then given the old file's owner and group (where the process may)
// and its permission bits, set-id bits included, through the descriptor, so
// that it is private until it is whole; the new file is flushed, renamed over the old one and the
// directory flushed. Where no file can be made or renamed beside it and the
// process may write the old file, it is rewritten in place so that a
// failure writes the old bytes back. sizeHint (0: unknown) is the size the
// new contents will have; the in-place path reserves it before overwriting.
// A missing file is made the same way with newMode (the umask applies) and
// not flushed before the rename: no old content is at stake.
// Devices, FIFOs and other files that are not regular are written through.
//
// On failure the old file is as it was, byte for byte, and no temporary
// file is left.
int zkReplaceFile(const char* path, mode_t newMode, unsigned long long sizeHint, const zkContentWriter& write);

// Creates path exclusively with mode (the umask applies), writes it through
// write and flushes it when sync; on failure removes it again.
int zkCreateNewFile(const char* path, mode_t mode, bool sync, const zkContentWriter& write);

#endif

// The editor's file: reading it, the lock, and saving.
#include <errno.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <chrono>
#include <cstring>

#include "internal/zkFileSystem.h"
#include "internal/zkStringRules.h"
#include "zkINIEditorImpl.h"

namespace {

// The mode of a file that Open or Save creates, less the umask.
constexpr mode_t kNewFileMode = 0666;

// The first pause between tries of a held lock, doubled up to the longest.
constexpr long kFirstPauseNs = 1000000;
constexpr long kLongestPauseNs = 16000000;

using Clock = std::chrono::steady_clock;

// Keeps errno across cleanup calls that may change it.
void closeKeepingErrno(int fd) {
    zkErrnoKeeper keep;
    close(fd);
}

// Reads fd from where it stands to its end; false with errno on failure,
// EFBIG for a text longer than a string can hold (GetText must give it).
bool readAll(int fd, std::unique_ptr<char[]>& bytes, size_t& size) {
    struct stat st;
    if (fstat(fd, &st) != 0) return false;
    if (static_cast<unsigned long long>(st.st_size) > kZkMaxStringLength) {
        errno = EFBIG;
        return false;
    }
    // The size is a first guess: the file may grow while it is read.
    size_t room = static_cast<size_t>(st.st_size) + 1;
    bytes.reset(new char[room]);
    size = 0;
    for (;;) {
        if (size == room) zkDoubleBuffer(bytes, room, size);
        ssize_t n = read(fd, bytes.get() + size, room - size);
        if (n < 0 && errno == EINTR) continue;
        if (n < 0) return false;
        if (n == 0) return true;
        size += static_cast<size_t>(n);
        if (size > kZkMaxStringLength) {
            errno = EFBIG;
            return false;
        }
    }
}

// Takes the exclusive lock on fd, trying until deadline: false with errno
// (EWOULDBLOCK when another holder kept it).
bool waitForLock(int fd, Clock::time_point deadline) {
    long pause = kFirstPauseNs;
    for (;;) {
        if (flock(fd, LOCK_EX | LOCK_NB) == 0) return true;
        if (errno == EINTR) continue;
        if (errno != EWOULDBLOCK) return false;
        const auto left = std::chrono::duration_cast<std::chrono::nanoseconds>(deadline - Clock::now()).count();
        if (left <= 0) {
            errno = EWOULDBLOCK;
            return false;
        }
        struct timespec nap = {0, left < pause ? static_cast<long>(left) : pause};
        nanosleep(&nap, nullptr);
        if (pause < kLongestPauseNs) pause *= 2;
    }
}

// Opens and locks the file at path, the final target of its links: the
// locked descriptor, or -1 with errno. A save by the holder the lock was
// waited for renames a new file over the one locked, so the lock counts only
// while that file is still the one at the path; else the new one is locked.
int lockFile(const std::string& path, bool create, unsigned waitMs) {
    const Clock::time_point deadline = Clock::now() + std::chrono::milliseconds(waitMs);
    for (;;) {
        std::string target = path;
        if (!zkResolveLinks(target)) return -1;
        const int fd = zkOpen(target.c_str(), O_RDONLY | (create ? O_CREAT : 0), kNewFileMode);
        if (fd == -1) return -1;
        if (!waitForLock(fd, deadline)) {
            closeKeepingErrno(fd);
            return -1;
        }
        struct stat locked, named;
        if (fstat(fd, &locked) == 0 && stat(path.c_str(), &named) == 0 && zkSameFile(locked, named)) return fd;
        close(fd);
    }
}

}  // namespace

zkINIEditor::zkINIEditor() : m_impl(new Impl) {}

zkINIEditor::zkINIEditor(const char* filename) : zkINIEditor() {
    SetFilename(filename);
}

zkINIEditor::~zkINIEditor() {
    Close();
    delete m_impl;
}

void zkINIEditor::SetFilename(const char* filename) {
    m_impl->filename = filename ? filename : "";
}

void zkINIEditor::Close() {
    if (m_impl->lockFd != -1) close(m_impl->lockFd);
    m_impl->lockFd = -1;
    m_impl->clear();
}

int zkINIEditor::Open(bool create, bool lock, unsigned lockWaitMs) {
    Close();
    int fd;
    if (lock) {
        fd = lockFile(m_impl->filename, create, lockWaitMs);
    } else {
        fd = zkOpen(m_impl->filename.c_str(), O_RDONLY, 0);
        if (fd == -1 && errno == ENOENT && create) return Done;
    }
    if (fd == -1) return FileError;
    std::unique_ptr<char[]> bytes;
    size_t size = 0;
    if (!readAll(fd, bytes, size)) {
        closeKeepingErrno(fd);
        return FileError;
    }
    m_impl->adopt(std::move(bytes), size);
    if (lock)
        m_impl->lockFd = fd;
    else
        close(fd);
    return Done;
}

void zkINIEditor::Load(const char* text, unsigned long length) {
    std::unique_ptr<char[]> bytes(new char[length + 1]);
    if (length) std::memcpy(bytes.get(), text, length);
    m_impl->adopt(std::move(bytes), length);
}

// With the lock held, the new file is locked through the writer's descriptor
// before it is renamed over the old one, so no other editor can take it in
// between; the lock on the old file goes when the new one is in place. A
// rewrite in place writes the locked file itself, whose lock stays.
int zkINIEditor::Save() {
    Impl& impl = *m_impl;
    int newLock = -1;
    auto writer = [&impl, &newLock](int fd) {
        if (impl.lockFd != -1) {
            struct stat written, locked;
            if (fstat(fd, &written) != 0 || fstat(impl.lockFd, &locked) != 0) return false;
            if (newLock != -1) closeKeepingErrno(newLock);
            newLock = -1;
            if (!zkSameFile(written, locked)) {
                newLock = fcntl(fd, F_DUPFD_CLOEXEC, 0);
                if (newLock == -1) return false;
                if (flock(newLock, LOCK_EX | LOCK_NB) != 0) return false;
            }
        }
        return impl.write([fd](const char* p, size_t n) { return zkWriteAll(fd, p, n) == 0; });
    };
    if (zkReplaceFile(impl.filename.c_str(), kNewFileMode, impl.size(), writer) != 0) {
        if (newLock != -1) closeKeepingErrno(newLock);
        return FileError;
    }
    if (newLock != -1) {
        close(impl.lockFd);
        impl.lockFd = newLock;
    }
    return Done;
}

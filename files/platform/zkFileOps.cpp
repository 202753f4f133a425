#include "zkFilename.h"

#include <errno.h>
#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>

namespace {

constexpr char kSeparator = '/';
constexpr mode_t kDefaultDirMode = 0777;

}  // namespace

int zkCreateDir(const char* path, void* attributes) {
    if (path == nullptr || *path == '\0') return 0;
    mode_t mode = attributes ? static_cast<mode_t>(*static_cast<const unsigned*>(attributes)) : kDefaultDirMode;
    // Each directory above is made in turn; one that is already there is no
    // error, and any real failure shows in the final test.
    std::string partial(path);
    for (size_t i = 1; i < partial.size(); ++i) {
        if (partial[i] != kSeparator || partial[i - 1] == kSeparator) continue;
        partial[i] = '\0';
        mkdir(partial.c_str(), mode);
        partial[i] = kSeparator;
    }
    mkdir(path, mode);
    return zkFilename::IsDirectory(path);
}

int zkUnlink(const char* path, unsigned flag) {
    if (path == nullptr) return 0;
    return (flag ? remove(path) : unlink(path)) == 0;
}

int CreateFile(const char* path, unsigned flags, unsigned, unsigned, unsigned creation, unsigned mode, void*) {
    if (path == nullptr) return -1;
    int fd;
    do {
        fd = open(path, static_cast<int>(flags | creation) | O_CLOEXEC, static_cast<mode_t>(mode));
    } while (fd == -1 && errno == EINTR);
    return fd;
}

int ReadFile(int handle, void* buffer, unsigned count, unsigned* done, void*) {
    ssize_t n;
    do {
        n = read(handle, buffer, count);
    } while (n == -1 && errno == EINTR);
    if (done) *done = n < 0 ? 0 : static_cast<unsigned>(n);
    return n >= 0;
}

int WriteFile(int handle, const void* buffer, unsigned count, unsigned* done, void*) {
    const char* bytes = static_cast<const char*>(buffer);
    unsigned written = 0;
    while (written < count) {
        ssize_t n = write(handle, bytes + written, count - written);
        if (n == -1 && errno == EINTR) continue;
        // A write that takes nothing would repeat forever: count it as a failure.
        if (n <= 0) break;
        written += static_cast<unsigned>(n);
    }
    if (done) *done = written;
    return written == count;
}

unsigned GetFileSize(int handle, unsigned* high) {
    constexpr unsigned kFailure = 0xFFFFFFFFu;
    constexpr int kHighShift = 32;
    struct stat st;
    if (fstat(handle, &st) != 0) {
        if (high) *high = kFailure;
        return kFailure;
    }
    unsigned long long size = static_cast<unsigned long long>(st.st_size);
    if (high) *high = static_cast<unsigned>(size >> kHighShift);
    return static_cast<unsigned>(size);
}

int CloseHandle(int handle) {
    // Linux releases the descriptor even when close is interrupted, so it is
    // never retried.
    return close(handle) == 0 || errno == EINTR;
}

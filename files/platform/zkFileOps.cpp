#include <errno.h>
#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "internal/zkFileSystem.h"
#include "internal/zkPathRules.h"
#include "zkFilename.h"

namespace {

constexpr mode_t kDefaultDirMode = 0777;

}  // namespace

int zkCreateDir(const char* path, void* attributes) {
    if (path == nullptr || *path == '\0') return 0;
    mode_t mode = attributes ? static_cast<mode_t>(*static_cast<const unsigned*>(attributes)) : kDefaultDirMode;
    // Back from the end to the deepest directory that exists or can be made
    // at once, then forward making the rest: a path whose parent exists costs
    // one mkdir, however deep it lies. Any real failure shows in the final
    // test.
    std::string partial(path);
    size_t end = partial.size();
    while (zkSystem.mkdir(partial.substr(0, end).c_str(), mode) != 0 && errno == ENOENT) {
        size_t slash = partial.rfind(kZkPathSeparator, end - 1);
        while (slash != std::string::npos && slash > 0 && partial[slash - 1] == kZkPathSeparator) --slash;
        if (slash == std::string::npos || slash == 0) break;
        end = slash;
    }
    while (end < partial.size()) {
        end = partial.find(kZkPathSeparator, end + 1);
        if (end == std::string::npos) end = partial.size();
        if (partial[end - 1] != kZkPathSeparator) zkSystem.mkdir(partial.substr(0, end).c_str(), mode);
    }
    return zkFilename::IsDirectory(path);
}

int zkUnlink(const char* path, unsigned flag) {
    if (path == nullptr) return 0;
    return (flag ? remove(path) : unlink(path)) == 0;
}

int CreateFile(const char* path, unsigned flags, unsigned, unsigned, unsigned creation, unsigned mode, void*) {
    if (path == nullptr) return -1;
    return zkOpen(path, static_cast<int>(flags | creation), static_cast<mode_t>(mode));
}

int ReadFile(int handle, void* buffer, unsigned count, unsigned* done, void*) {
    ssize_t n;
    do {
        n = zkSystem.read(handle, buffer, count);
    } while (n == -1 && errno == EINTR);
    if (done) *done = n < 0 ? 0 : static_cast<unsigned>(n);
    return n >= 0;
}

int WriteFile(int handle, const void* buffer, unsigned count, unsigned* done, void*) {
    const char* bytes = static_cast<const char*>(buffer);
    unsigned written = 0;
    while (written < count) {
        ssize_t n = zkSystem.write(handle, bytes + written, count - written);
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

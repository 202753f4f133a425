#include "io.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>

namespace {

// Bytes asked of each read.
constexpr unsigned kReadChunk = 64 * 1024;

int readAll(int fd, zkStringBase& text) {
    text.makeNull();
    char buffer[kReadChunk];
    for (;;) {
        const ssize_t n = read(fd, buffer, sizeof buffer);
        if (n == 0) return 0;
        if (n < 0) {
            if (errno == EINTR) continue;
            return errno;
        }
        text.append(buffer, static_cast<unsigned>(n));
    }
}

}  // namespace

bool IsStdStream(const zkStringBase& path) {
    return path == "-";
}

int ReadPath(const zkStringBase& path, zkStringBase& text) {
    if (IsStdStream(path)) return readAll(STDIN_FILENO, text);
    const int fd = open(path.data(), O_RDONLY | O_CLOEXEC);
    if (fd < 0) return errno;
    const int error = readAll(fd, text);
    close(fd);
    return error;
}

int WriteAll(int fd, const zkStringBase& text) {
    const char* p = text.data();
    unsigned left = text.length();
    while (left > 0) {
        const ssize_t n = write(fd, p, left);
        if (n < 0) {
            if (errno == EINTR) continue;
            return errno;
        }
        p += n;
        left -= static_cast<unsigned>(n);
    }
    return 0;
}

int WritePath(const char* path, const zkStringBase& text) {
    const int fd = open(path, O_WRONLY | O_TRUNC | O_CLOEXEC);
    if (fd < 0) return errno;
    int error = WriteAll(fd, text);
    if (close(fd) != 0 && error == 0) error = errno;
    return error;
}

TempFile::~TempFile() {
    if (!m_path.isNull()) unlink(m_path.data());
}

int TempFile::Create() {
    const char* dir = std::getenv("TMPDIR");
    m_path = dir && *dir ? dir : "/tmp";
    m_path.append("/zkini.XXXXXX");
    const int fd = mkostemp(&m_path[0], O_CLOEXEC);
    if (fd < 0) {
        const int error = errno;
        m_path.makeNull();
        return error;
    }
    close(fd);
    return 0;
}

#include "zkBasicFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "internal/zkStringRules.h"
#include "zkStringBase.h"

static_assert(sizeof(off_t) == 8, "file offsets must be 64-bit: build with _FILE_OFFSET_BITS=64");

namespace {

constexpr unsigned kDefaultMode = 0666;

// ReadAll reads in blocks of this size.
constexpr unsigned kReadBlockSize = 2048;

unsigned long long widen(off_t position) {
    return position < 0 ? zkBasicFile::kBadPosition : static_cast<unsigned long long>(position);
}

}  // namespace

zkBasicFile::zkBasicFile()
    : m_creation(O_CREAT), m_access(O_RDWR), m_extraFlags(0), m_mode(kDefaultMode), m_fd(-1), m_nameRefused(false) {
    m_filename[0] = '\0';
}

zkBasicFile::zkBasicFile(const char* filename, unsigned long creation, unsigned long access, unsigned long extraFlags)
    : m_creation(static_cast<unsigned>(creation)),
      m_access(static_cast<unsigned>(access)),
      m_extraFlags(static_cast<unsigned>(extraFlags)),
      m_mode(kDefaultMode),
      m_fd(-1),
      m_nameRefused(false) {
    SetFilename(filename);
}

zkBasicFile::~zkBasicFile() {
    Close();
}

void zkBasicFile::SetFilename(const char* filename) {
    m_filename[0] = '\0';
    m_nameRefused = false;
    if (filename == nullptr) return;
    // A shortened name could name another file: refuse it whole.
    size_t length = strnlen(filename, kNameSize);
    if (length >= kNameSize) {
        m_nameRefused = true;
        return;
    }
    std::memcpy(m_filename, filename, length + 1);
}

int zkBasicFile::Open() {
    if (m_fd != -1) return 1;
    if (m_nameRefused) {
        errno = ENAMETOOLONG;
        return 1;
    }
    m_fd = ::open(m_filename, static_cast<int>(m_creation | m_extraFlags | m_access) | O_CLOEXEC,
                  static_cast<mode_t>(m_mode));
    return m_fd != -1 ? 0 : 1;
}

int zkBasicFile::Close() {
    if (m_fd == -1) return 1;
    int result = ::close(m_fd);
    m_fd = -1;
    return result;
}

int zkBasicFile::Read(char* buffer, unsigned long length, unsigned long* count) {
    if (m_fd == -1) return 1;
    ssize_t got = ::read(m_fd, buffer, length);
    if (got < 0) {
        if (count) *count = 0;
        return 1;
    }
    if (count) *count = static_cast<unsigned long>(got);
    return 0;
}

int zkBasicFile::Write(const char* buffer, unsigned long length, unsigned long* count) {
    if (m_fd == -1) return 1;
    if (length == 0) length = std::strlen(buffer);
    ssize_t put = ::write(m_fd, buffer, length);
    if (count) *count = static_cast<unsigned long>(put);
    return put < 0 ? 1 : 0;
}

int zkBasicFile::Write(const zkStringBase& text, unsigned long* count) {
    return Write(text.data(), text.length(), count);
}

int zkBasicFile::ReadAll(zkStringBase& text) {
    if (m_fd == -1) return 1;
    const unsigned long long start = text.length();

    // Size the string once for the rest of the file. A file whose size is
    // unknown or that grows meanwhile is still read whole; the limit check in
    // the loop catches what the size did not announce.
    unsigned long long size = GetSize();
    unsigned long long position = GetCurrentFilePointer();
    if (size != kBadPosition && position != kBadPosition && size > position) {
        unsigned long long rest = size - position;
        if (start + rest > kZkMaxStringLength) return 1;
        unsigned long long needed = start + rest + 1;
        if (text.capacity() < needed) text.resize(zkAssignCapacity(start + rest));
    }

    char block[kReadBlockSize];
    for (;;) {
        unsigned long got = 0;
        if (Read(block, sizeof block, &got) != 0) {
            if (errno == EINTR) continue;
            return 1;
        }
        if (got == 0) return 0;
        if (text.length() + static_cast<unsigned long long>(got) > kZkMaxStringLength) {
            text.cut(static_cast<unsigned>(text.length() - start));
            return 1;
        }
        text.append(block, static_cast<unsigned>(got));
    }
}

int zkBasicFile::Sync() {
    if (m_fd == -1) return 1;
    return ::fsync(m_fd) == 0 ? 0 : 1;
}

unsigned long long zkBasicFile::SetFilePointer(unsigned long long offset, SeekMode mode) {
    if (m_fd == -1) return kBadPosition;
    // The offset travels as the two's complement of a signed offset, so a
    // backward seek from the current position or the end works too.
    return widen(::lseek(m_fd, static_cast<off_t>(offset), static_cast<int>(mode)));
}

unsigned long long zkBasicFile::GetCurrentFilePointer() {
    return SetFilePointer(0, SeekCurrent);
}

unsigned long long zkBasicFile::GetSize() {
    if (m_fd == -1) return kBadPosition;
    struct stat st;
    if (::fstat(m_fd, &st) != 0) return kBadPosition;
    return widen(st.st_size);
}

#include "zkFilename.h"

#include <sys/stat.h>

#include <cctype>
#include <cstring>
#include <initializer_list>

#include "../../internal/zkPathRules.h"

namespace {

constexpr const char* kSchemeMark = "://";
constexpr const char* kDefaultProtocol = "file";

const char* text(const char* part) {
    return part ? part : "";
}

char* copyOf(const char* s, size_t n) {
    char* copy = new char[n + 1];
    std::memcpy(copy, s, n);
    copy[n] = '\0';
    return copy;
}

// Replaces an empty part by null, so that every empty part looks the same.
void dropIfEmpty(char** part) {
    if (*part && **part == '\0') {
        delete[] *part;
        *part = nullptr;
    }
}

}  // namespace

zkFilename::zkFilename(const char* path)
    : m_path(nullptr), m_dir(nullptr), m_fname(nullptr), m_ext(nullptr), m_protocol(nullptr) {
    split(path);
}

zkFilename::zkFilename(const zkFilename& other)
    : m_path(nullptr), m_dir(nullptr), m_fname(nullptr), m_ext(nullptr), m_protocol(nullptr) {
    *this = other;
}

zkFilename& zkFilename::operator=(const zkFilename& other) {
    if (this == &other) return *this;
    Dup(&m_path, other.m_path, -1);
    Dup(&m_dir, other.m_dir, -1);
    Dup(&m_fname, other.m_fname, -1);
    Dup(&m_ext, other.m_ext, -1);
    Dup(&m_protocol, other.m_protocol, -1);
    return *this;
}

zkFilename::~zkFilename() {
    release();
}

void zkFilename::release() {
    for (char** part : {&m_path, &m_dir, &m_fname, &m_ext, &m_protocol}) {
        delete[] *part;
        *part = nullptr;
    }
}

bool zkFilename::operator==(const zkFilename& other) const {
    return std::strcmp(text(m_path), text(other.m_path)) == 0;
}

char* zkFilename::Dup(char** target, const char* source, int length) {
    // The copy is made before the old text goes, so a source inside it is safe.
    char* copy = nullptr;
    if (source) {
        size_t n = length < 0 ? std::strlen(source) : strnlen(source, static_cast<size_t>(length));
        copy = copyOf(source, n);
    }
    delete[] *target;
    *target = copy;
    return copy;
}

void zkFilename::split(const char* path) {
    release();
    if (path == nullptr || *path == '\0') return;
    size_t n = std::strlen(path);
    m_path = copyOf(path, n);
    const char* slash = std::strrchr(path, kZkPathSeparator);
    const char* name = slash ? slash + 1 : path;
    if (slash) m_dir = copyOf(path, static_cast<size_t>(name - path));
    size_t nameLength = n - static_cast<size_t>(name - path);
    size_t dot = zkExtensionDot(name, nameLength);
    m_fname = copyOf(name, dot);
    if (dot < nameLength) m_ext = copyOf(name + dot + 1, nameLength - dot - 1);
    dropIfEmpty(&m_fname);
    updateProtocol();
}

void zkFilename::Rebuild(int, int, int, int, int) {
    if (m_fname) {
        const char* slash = std::strrchr(m_fname, kZkPathSeparator);
        if (slash) {
            size_t moved = static_cast<size_t>(slash - m_fname) + 1;
            size_t dirLength = m_dir ? std::strlen(m_dir) : 0;
            bool joint = dirLength && m_dir[dirLength - 1] != kZkPathSeparator;
            char* dir = new char[dirLength + joint + moved + 1];
            std::memcpy(dir, text(m_dir), dirLength);
            if (joint) dir[dirLength] = kZkPathSeparator;
            std::memcpy(dir + dirLength + joint, m_fname, moved);
            dir[dirLength + joint + moved] = '\0';
            delete[] m_dir;
            m_dir = dir;
            Dup(&m_fname, slash + 1, -1);
        }
    }
    if (m_ext && *m_ext == '.') Dup(&m_ext, m_ext + 1, -1);
    dropIfEmpty(&m_ext);
    if (m_ext == nullptr && m_fname) {
        size_t n = std::strlen(m_fname);
        size_t dot = zkExtensionDot(m_fname, n);
        if (dot < n) {
            Dup(&m_ext, m_fname + dot + 1, -1);
            m_fname[dot] = '\0';
        }
    }
    dropIfEmpty(&m_dir);
    dropIfEmpty(&m_fname);

    size_t dirLength = m_dir ? std::strlen(m_dir) : 0;
    size_t nameLength = m_fname ? std::strlen(m_fname) : 0;
    size_t extLength = m_ext ? std::strlen(m_ext) : 0;
    bool joint = dirLength && m_dir[dirLength - 1] != kZkPathSeparator;
    if (joint) {
        char* dir = copyOf(m_dir, dirLength + 1);
        dir[dirLength++] = kZkPathSeparator;
        delete[] m_dir;
        m_dir = dir;
    }
    size_t total = dirLength + nameLength + (extLength ? extLength + 1 : 0);
    delete[] m_path;
    m_path = nullptr;
    if (total) {
        m_path = new char[total + 1];
        char* out = m_path;
        std::memcpy(out, text(m_dir), dirLength);
        out += dirLength;
        std::memcpy(out, text(m_fname), nameLength);
        out += nameLength;
        if (extLength) {
            *out++ = '.';
            std::memcpy(out, m_ext, extLength);
            out += extLength;
        }
        *out = '\0';
    }
    updateProtocol();
}

void zkFilename::updateProtocol() {
    delete[] m_protocol;
    m_protocol = nullptr;
    const char* path = text(m_path);
    const char* mark = std::strstr(path, kSchemeMark);
    if (mark == nullptr || mark == path || !std::isalpha(static_cast<unsigned char>(*path))) return;
    for (const char* p = path; p < mark; ++p) {
        unsigned char ch = static_cast<unsigned char>(*p);
        if (!std::isalnum(ch) && ch != '+' && ch != '-' && ch != '.') return;
    }
    m_protocol = copyOf(path, static_cast<size_t>(mark - path));
    for (char* p = m_protocol; *p; ++p) *p = static_cast<char>(std::tolower(static_cast<unsigned char>(*p)));
}

const char* zkFilename::GetFullPath() const {
    return text(m_path);
}

const char* zkFilename::GetProtocol() const {
    return m_protocol ? m_protocol : kDefaultProtocol;
}

const char* zkFilename::GetDirectory() const {
    return text(m_dir);
}

const char* zkFilename::GetName() const {
    return text(m_fname);
}

const char* zkFilename::GetExtension() const {
    return text(m_ext);
}

void zkFilename::SetDirectory(const char* dir) {
    Dup(&m_dir, dir, -1);
    Rebuild(0, 0, 0, 0, 0);
}

void zkFilename::SetName(const char* name) {
    Dup(&m_fname, name, -1);
    Rebuild(0, 0, 0, 0, 0);
}

void zkFilename::SetExtension(const char* ext) {
    Dup(&m_ext, ext, -1);
    Rebuild(0, 0, 0, 0, 0);
}

int zkFilename::GetType() const {
    struct stat st;
    if (stat(text(m_path), &st) != 0) return 0;
    if (S_ISDIR(st.st_mode)) return 1;
    return S_ISREG(st.st_mode) ? 2 : 3;
}

int zkFilename::FileExists(int noFollow) const {
    struct stat st;
    return (noFollow ? lstat(text(m_path), &st) : stat(text(m_path), &st)) == 0;
}

int zkFilename::IsDirectory(const char* path) {
    struct stat st;
    return path && stat(path, &st) == 0 && S_ISDIR(st.st_mode);
}

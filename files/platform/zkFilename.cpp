#include "zkFilename.h"

#include <sys/stat.h>

#include <cctype>
#include <cstring>
#include <initializer_list>

#include "internal/zkPathRules.h"

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
        delete[] * part;
        *part = nullptr;
    }
}

// Moves a directory part that the name holds ("sub/a") to the end of the
// directory part, joined by one separator.
void moveDirectoryPart(char** dir, char* name) {
    const char* slash = name ? std::strrchr(name, kZkPathSeparator) : nullptr;
    if (slash == nullptr) return;
    size_t moved = static_cast<size_t>(slash - name) + 1;
    size_t dirLength = *dir ? std::strlen(*dir) : 0;
    bool joint = dirLength && (*dir)[dirLength - 1] != kZkPathSeparator;
    char* joined = new char[dirLength + joint + moved + 1];
    std::memcpy(joined, text(*dir), dirLength);
    if (joint) joined[dirLength] = kZkPathSeparator;
    std::memcpy(joined + dirLength + joint, name, moved);
    joined[dirLength + joint + moved] = '\0';
    delete[] * dir;
    *dir = joined;
    std::memmove(name, slash + 1, std::strlen(slash + 1) + 1);
}

// Drops the dot an extension was given with; without an extension, takes
// the one the name ends in.
void splitExtension(char* name, char** ext) {
    if (*ext && **ext == '.') zkFilename::Dup(ext, *ext + 1, -1);
    dropIfEmpty(ext);
    if (*ext != nullptr || name == nullptr) return;
    size_t n = std::strlen(name);
    size_t dot = zkExtensionDot(name, n);
    if (dot == n) return;
    zkFilename::Dup(ext, name + dot + 1, -1);
    name[dot] = '\0';
}

// Gives a directory part that does not end in a separator its separator.
void endWithSeparator(char** dir) {
    size_t n = *dir ? std::strlen(*dir) : 0;
    if (n == 0 || (*dir)[n - 1] == kZkPathSeparator) return;
    char* ended = copyOf(*dir, n + 1);
    ended[n] = kZkPathSeparator;
    delete[] * dir;
    *dir = ended;
}

// The full path: directory, name and, after a dot, extension; null when all
// are empty.
char* joinParts(const char* dir, const char* name, const char* ext) {
    size_t dirLength = dir ? std::strlen(dir) : 0;
    size_t nameLength = name ? std::strlen(name) : 0;
    size_t extLength = ext ? std::strlen(ext) : 0;
    size_t total = dirLength + nameLength + (extLength ? extLength + 1 : 0);
    if (total == 0) return nullptr;
    char* path = new char[total + 1];
    char* out = path;
    std::memcpy(out, text(dir), dirLength);
    out += dirLength;
    std::memcpy(out, text(name), nameLength);
    out += nameLength;
    if (extLength) {
        *out++ = '.';
        std::memcpy(out, ext, extLength);
        out += extLength;
    }
    *out = '\0';
    return path;
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
        delete[] * part;
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
    delete[] * target;
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
    moveDirectoryPart(&m_dir, m_fname);
    splitExtension(m_fname, &m_ext);
    dropIfEmpty(&m_dir);
    dropIfEmpty(&m_fname);
    endWithSeparator(&m_dir);
    delete[] m_path;
    m_path = joinParts(m_dir, m_fname, m_ext);
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
    if (stat(text(m_path), &st) != 0) return NoEntry;
    if (S_ISDIR(st.st_mode)) return DirectoryEntry;
    return S_ISREG(st.st_mode) ? RegularFileEntry : OtherEntry;
}

int zkFilename::FileExists(int noFollow) const {
    struct stat st;
    return (noFollow ? lstat(text(m_path), &st) : stat(text(m_path), &st)) == 0;
}

int zkFilename::IsDirectory(const char* path) {
    struct stat st;
    return path && stat(path, &st) == 0 && S_ISDIR(st.st_mode);
}

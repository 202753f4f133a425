#include <dirent.h>
#include <fnmatch.h>

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "internal/zkPathRules.h"
#include "zkFilename.h"

namespace {

constexpr const char* kCurrentDir = ".";
constexpr const char* kMatchAll = "*";

}  // namespace

zkDirIterator::zkDirIterator() : m_names(nullptr), m_end(nullptr), m_name(nullptr) {}

zkDirIterator::zkDirIterator(const char* pattern) : zkDirIterator() {
    if (pattern == nullptr) return;
    const char* slash = std::strrchr(pattern, kZkPathSeparator);
    std::string dir = slash ? std::string(pattern, static_cast<size_t>(slash - pattern) + 1) : kCurrentDir;
    const char* match = slash ? slash + 1 : pattern;
    if (*match == '\0') match = kMatchAll;

    DIR* stream = opendir(dir.c_str());
    if (stream == nullptr) return;
    std::vector<std::string> names;
    size_t bytes = 0;
    while (const dirent* entry = readdir(stream)) {
        if (fnmatch(match, entry->d_name, 0) != 0) continue;
        names.emplace_back(entry->d_name);
        bytes += names.back().size() + 1;
    }
    closedir(stream);
    if (names.empty()) return;

    std::sort(names.begin(), names.end());
    m_names = new char[bytes];
    m_end = m_names + bytes;
    char* out = m_names;
    for (const std::string& name : names) {
        std::memcpy(out, name.c_str(), name.size() + 1);
        out += name.size() + 1;
    }
    m_name = m_names;
}

zkDirIterator::zkDirIterator(const zkDirIterator& other) : zkDirIterator() {
    *this = other;
}

zkDirIterator& zkDirIterator::operator=(const zkDirIterator& other) {
    if (this == &other) return *this;
    char* names = nullptr;
    if (other.m_names) {
        names = new char[other.m_end - other.m_names];
        std::memcpy(names, other.m_names, static_cast<size_t>(other.m_end - other.m_names));
    }
    delete[] m_names;
    m_names = names;
    m_end = names ? names + (other.m_end - other.m_names) : nullptr;
    m_name = other.m_name ? names + (other.m_name - other.m_names) : nullptr;
    return *this;
}

zkDirIterator::~zkDirIterator() {
    delete[] m_names;
}

bool zkDirIterator::operator==(const zkDirIterator& other) const {
    if (m_name == nullptr || other.m_name == nullptr) return m_name == other.m_name;
    return std::strcmp(m_name, other.m_name) == 0;
}

zkDirIterator& zkDirIterator::operator++() {
    if (m_name == nullptr) return *this;
    m_name += std::strlen(m_name) + 1;
    if (m_name >= m_end) m_name = nullptr;
    return *this;
}

// The path rules the file classes share.
#ifndef ZK_INTERNAL_PATH_RULES_H
#define ZK_INTERNAL_PATH_RULES_H

#include <cstddef>

// The separator of the file system's paths.
constexpr char kZkPathSeparator = '/';

// Where the extension's dot is in a name of n bytes, or n when it has none:
// the last dot, unless it is the first or the last character.
inline std::size_t zkExtensionDot(const char* name, std::size_t n) {
    for (std::size_t i = n; i-- > 1;) {
        if (name[i] == '.') return i + 1 < n ? i : n;
    }
    return n;
}

#endif

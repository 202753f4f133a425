// Case folding through the C library's case tables of the current locale.
//
// Each byte is taken as a signed char, as toupper/tolower expect of a plain
// char, so bytes from 0x80 up map as the locale says (unchanged by default).
// Under glibc the table pointers are fetched once per object, which keeps
// the per-byte cost of a folded search to one load.
#ifndef ZK_INTERNAL_CASE_TABLES_H
#define ZK_INTERNAL_CASE_TABLES_H

#include <cctype>
#include <cstdint>

class zkCaseTables {
public:
#if defined(__GLIBC__)
    zkCaseTables() : m_upper(*__ctype_toupper_loc()), m_lower(*__ctype_tolower_loc()) {}
    int upper(char c) const {
        return m_upper[static_cast<signed char>(c)];
    }
    int lower(char c) const {
        return m_lower[static_cast<signed char>(c)];
    }

private:
    const std::int32_t* m_upper;
    const std::int32_t* m_lower;
#else
    int upper(char c) const {
        return std::toupper(static_cast<signed char>(c));
    }
    int lower(char c) const {
        return std::tolower(static_cast<signed char>(c));
    }
#endif
};

#endif

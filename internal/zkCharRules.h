// The character classes the library's parsers share.
//
// The C library's classifiers take an int that is an unsigned char value or
// EOF; the library hands them each byte as a signed char, as its case
// tables do, so bytes from 0x80 up are classified as the locale says for
// those values (in the C locale: not space, not digit).
#ifndef ZK_INTERNAL_CHAR_RULES_H
#define ZK_INTERNAL_CHAR_RULES_H

#include <cctype>

// isspace: blank, tab, CR, LF, vertical tab, form feed in the C locale.
inline bool zkIsSpace(char c) {
    return std::isspace(static_cast<signed char>(c)) != 0;
}

inline bool zkIsDigit(char c) {
    return std::isdigit(static_cast<signed char>(c)) != 0;
}

// The blanks that separate words on one line, and the line ends: what
// skipNextWhite passes over and what an unquoted command-line value skips.
inline bool zkIsBlankOrLineEnd(char c) {
    return c == ' ' || c == '\t' || c == '\r' || c == '\n';
}

#endif

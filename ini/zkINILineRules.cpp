// Classifying one line of INI text.
#include "zkINILineRules.h"

#include <cstring>

#include "internal/zkCharRules.h"

namespace {

void trim(const char*& first, const char*& last) {
    while (first < last && zkIsSpace(*first)) ++first;
    while (last > first && zkIsSpace(last[-1])) --last;
}

// The section name of the header [first, last), which starts with "[". A line
// that ends with "]" names the text between the brackets, "]" inside it
// included, so every name the document writes reads back unchanged. Any
// other line names the text up to its first "]", or to its end without one:
// "[net] ; note" names net.
void headerName(const char* first, const char* last, zkINILine& line) {
    const char* begin = first + 1;
    const char* end = last;
    if (last[-1] == ']') {
        end = last - 1;
    } else if (begin < last) {
        const void* bracket = std::memchr(begin, ']', static_cast<size_t>(last - begin));
        if (bracket) end = static_cast<const char*>(bracket);
    }
    if (end < begin) end = begin;
    trim(begin, end);
    line.name = begin;
    line.nameEnd = end;
}

}  // namespace

bool zkStartsWithINIMark(const char* p, const char* end) {
    return static_cast<size_t>(end - p) >= kINIByteOrderMarkSize &&
           std::memcmp(p, kINIByteOrderMark, kINIByteOrderMarkSize) == 0;
}

// A line of one character is ignored whatever it is, a lone "[" or a
// one-letter key included, and so is a line left with at most one character
// after its leading blanks. The trailing cut keeps one character, so "[ "
// is a header (of the empty name) and "a " the key a.
void zkClassifyINILine(const char* begin, const char* end, zkINILine& line) {
    const char* first = begin;
    // The blanks passed over before a line's first character (a line holds no
    // line end); other whitespace there makes the line count.
    while (first < end && zkIsBlankOrLineEnd(*first)) ++first;
    if (end - first <= 1) {
        line.kind = zkINILine::Ignored;
        return;
    }
    const char* last = end;
    while (last - 1 > first && zkIsSpace(last[-1])) --last;

    if (*first == '[') {
        line.kind = zkINILine::Header;
        headerName(first, last, line);
        return;
    }
    if (*first == ';' || *first == '#') {
        line.kind = zkINILine::Comment;
        line.name = first;
        line.nameEnd = last;
        return;
    }
    line.kind = zkINILine::Key;
    const void* found = std::memchr(first, '=', static_cast<size_t>(last - first));
    line.equals = static_cast<const char*>(found);
    const char* keyEnd = found ? line.equals : last;
    trim(first, keyEnd);
    line.name = first;
    line.nameEnd = keyEnd;
    const char* value = found ? line.equals + 1 : last;
    const char* valueEnd = last;
    trim(value, valueEnd);
    line.value = value;
    line.valueEnd = valueEnd;
}

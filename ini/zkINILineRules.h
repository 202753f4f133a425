// The reading rules of INI text, in one place: where lines end, which lines
// count, and what a counted line holds. The document's loader and the
// line-keeping editor both read through these, so both find the same
// sections and keys in any text.
#ifndef ZK_INI_LINE_RULES_H
#define ZK_INI_LINE_RULES_H

#include <cstddef>

// The UTF-8 byte-order mark some editors put at the start of a file; it is
// passed over there and nowhere else.
constexpr char kINIByteOrderMark[] = "\xEF\xBB\xBF";
constexpr unsigned kINIByteOrderMarkSize = sizeof kINIByteOrderMark - 1;

// Whether [p, end) starts with the byte-order mark.
bool zkStartsWithINIMark(const char* p, const char* end);

// The whitespace cut off a line's end and off names, keys and values.
bool zkIsINISpace(char c);

// What one line of text holds, as pointers into it.
struct zkINILine {
    enum Kind : unsigned char {
        Ignored,  // blank, or at most one character after leading blanks
        Header,   // name: the section name
        Comment,  // name: the whole line, leading blanks and trailing whitespace cut
        Key       // name: the key; value: the value; equals: the first "=", or null
    };
    Kind kind;
    const char* name;
    const char* nameEnd;
    const char* value;
    const char* valueEnd;
    const char* equals;
};

// Classifies the line [begin, end), which holds no line end.
void zkClassifyINILine(const char* begin, const char* end, zkINILine& line);

// Calls onLine(begin, contentEnd, next) for each line of the text [p, end):
// the line's bytes are [begin, contentEnd) and its line end (CR, LF, CR LF,
// or none at the end of the text) [contentEnd, next). atEnd says that no text
// follows end; without it, a line whose end is not seen yet, or whose CR is
// the last byte, is left for the caller to pass again with more text after
// it. Returns where the scan stopped: end, or the start of such a line.
template <class OnLine>
const char* zkScanINILines(const char* p, const char* end, bool atEnd, OnLine&& onLine) {
    while (p < end) {
        const char* contentEnd = p;
        while (contentEnd < end && *contentEnd != '\r' && *contentEnd != '\n') ++contentEnd;
        const char* next = contentEnd;
        if (next == end) {
            if (!atEnd) return p;
        } else if (*next++ == '\r') {
            if (next == end && !atEnd) return p;
            if (next < end && *next == '\n') ++next;
        }
        onLine(p, contentEnd, next);
        p = next;
    }
    return p;
}

#endif

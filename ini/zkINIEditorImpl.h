// The editor's held file: the text as read, the lines that point into it or
// into texts made by edits, grouped into sections, and the lock.
#ifndef ZK_INI_EDITOR_IMPL_H
#define ZK_INI_EDITOR_IMPL_H

#include <deque>
#include <initializer_list>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "internal/zkOutOfMemory.h"
#include "zkINIEditor.h"
#include "zkINILineRules.h"

// One line: its bytes, then its line end, and what the reading rules found
// in them, as offsets from text.
struct zkINIEditorLine {
    const char* text;
    unsigned length;          // without the line end
    unsigned char endLength;  // 0 (the text's last line only), 1 or 2
    zkINILine::Kind kind;
    bool hasEquals;
    unsigned name;  // header name, key or comment text
    unsigned nameLength;
    unsigned value;  // a key's value
    unsigned valueLength;
};
using zkINIEditorLines = std::vector<zkINIEditorLine, zkNodeAllocator<zkINIEditorLine>>;

// The lines from one header up to the next, the header first; the first
// section holds the lines before the first header and has none.
struct zkINIEditorSection {
    zkINIEditorLines lines;
};

// Hidden, unlike the exported class it belongs to: nothing of it is part of
// the library's interface.
struct __attribute__((visibility("hidden"))) zkINIEditor::Impl {
    using Line = zkINIEditorLine;
    using Lines = zkINIEditorLines;
    using Section = zkINIEditorSection;

    Impl() { clear(); }

    // Empties the editor (the file name and the lock stay).
    void clear();
    // Takes size bytes of text, read or copied, and finds its lines.
    void adopt(std::unique_ptr<char[]> bytes, size_t size);

    // The section that a name addresses, or -1: the lines before the first
    // header when the name is empty and they hold a key or comment, else the
    // first header whose name matches.
    int findSection(const zkStringBase& name) const;
    // The index of the first key line of a section whose key matches, or -1.
    int findKey(const Section& section, const zkStringBase& key) const;
    bool preambleExists() const;

    int set(const zkStringBase& section, const zkStringBase& key, const zkStringBase& value);
    // Bytes the whole text takes.
    unsigned long long size() const;
    // Calls put(bytes, n) for the text in order, adjacent pieces joined.
    template <class Put>
    bool write(Put&& put) const;

    // The file's text: the byte-order mark (when it has one) and then the
    // lines; a line made by an edit lives in made.
    std::unique_ptr<char[]> text;
    size_t textSize = 0;
    bool hasMark = false;
    std::vector<Section, zkNodeAllocator<Section>> sections;
    std::deque<std::unique_ptr<char[]>, zkNodeAllocator<std::unique_ptr<char[]>>> made;
    // The line end of the text's first line that has one; LF without any.
    char lineEnd[2] = {'\n', 0};
    unsigned char lineEndLength = 1;

    std::string filename;
    // The locked descriptor, or -1.
    int lockFd = -1;

private:
    Line record(const char* begin, const char* contentEnd, const char* next) const;
    // A new line of the pieces' bytes followed by end (endLength bytes).
    Line makeLine(std::initializer_list<std::pair<const char*, unsigned>> pieces, const char* end, unsigned endLength);
    Line withLineEnd(const Line& line);
    void insertKey(Section& section, const zkStringBase& key, const zkStringBase& value);
    void appendSection(const zkStringBase& name, const zkStringBase& key, const zkStringBase& value);
    void replaceValue(Line& line, const zkStringBase& value);
};

template <class Put>
bool zkINIEditor::Impl::write(Put&& put) const {
    const char* run = hasMark ? text.get() : nullptr;
    size_t runLength = hasMark ? kINIByteOrderMarkSize : 0;
    for (const Section& section : sections)
        for (const Line& line : section.lines) {
            const size_t n = line.length + line.endLength;
            if (run + runLength == line.text) {
                runLength += n;
                continue;
            }
            if (runLength && !put(run, runLength)) return false;
            run = line.text;
            runLength = n;
        }
    return runLength == 0 || put(run, runLength);
}

#endif

// The records, the document's lifetime, and loading a file.
#include <fcntl.h>

#include <cctype>
#include <cstring>

#include "zkBasicFile.h"
#include "zkMappedINIFile.h"
#include "zkMappedINIFileDetail.h"

namespace {

// An empty stored string: one byte, for the terminator.
constexpr unsigned kEmptyCapacity = 1;

// The UTF-8 byte-order mark some editors put at the start of a file.
constexpr char kByteOrderMark[] = "\xEF\xBB\xBF";
constexpr unsigned kByteOrderMarkSize = sizeof kByteOrderMark - 1;

// The blanks passed over before a line's first character (those of
// zkStringBase::skipNextWhite: line ends included, so a run of blank lines is
// passed at once).
bool isLeadingBlank(char c) {
    return c == ' ' || c == '\t' || c == '\r' || c == '\n';
}

// The whitespace cut off a line's end and off keys, values and names (that
// of zkStringBase::stripWhite).
bool isSpace(char c) {
    return std::isspace(static_cast<unsigned char>(c)) != 0;
}

// Narrows [first, last) to its text without whitespace at either end.
void trim(const char*& first, const char*& last) {
    while (first < last && isSpace(*first)) ++first;
    while (last > first && isSpace(last[-1])) --last;
}

void setTrimmed(zkStringBase& s, const char* first, const char* last) {
    trim(first, last);
    zkSetSized(s, first, static_cast<unsigned>(last - first));
}

// The section name of the header line [first, last), which starts with "[".
// A line that ends with "]" names the text between the brackets, "]" inside
// it included, so every name the writer writes reads back unchanged. Any
// other line names the text up to its first "]", or to its end without one:
// text after the closing bracket is not part of the name.
void headerName(zkStringBase& name, const char* first, const char* last) {
    const char* begin = first + 1;
    const char* end = last;
    if (last[-1] == ']') {
        end = last - 1;
    } else if (begin < last) {
        const void* bracket = std::memchr(begin, ']', static_cast<size_t>(last - begin));
        if (bracket) end = static_cast<const char*>(bracket);
    }
    setTrimmed(name, begin, end < begin ? begin : end);
}

}  // namespace

// ---- Records ----

INILine::KeyCompare::KeyCompare(const zkStringBase& key) : m_key(key) {}

bool INILine::KeyCompare::operator()(const INILine* line) const {
    return line->m_key.equals(m_key, false);
}

INILine::INILine() : m_key(kEmptyCapacity), m_value(kEmptyCapacity), m_isComment(0) {}

INISection::INISection() : m_name(kEmptyCapacity), m_lines(zkNewRecord<std::list<INILine*>>()) {}

INISection::INISection(const zkStringBase& name) : INISection() {
    zkAssignSized(m_name, name);
}

INISection::~INISection() {
    for (INILine* line : *m_lines) delete line;
    delete m_lines;
}

// ---- The document ----

zkMappedINIFile::zkMappedINIFile() {}

zkMappedINIFile::zkMappedINIFile(const char* filename) : m_filename(filename) {}

zkMappedINIFile::~zkMappedINIFile() {
    Clear();
}

void zkMappedINIFile::Clear() {
    for (INISection* section : m_sections) delete section;
    m_sections.clear();
}

void zkMappedINIFile::SetFilename(const char* filename) {
    m_filename = filename;
}

int zkMappedINIFile::Open(unsigned int create) {
    zkBasicFile file(m_filename.data(), create ? O_CREAT : O_RDWR, O_RDONLY, 0);
    if (file.Open() != 0) return 1;
    zkStringBase text;
    if (file.SetFilePointer(0, zkBasicFile::SeekBegin) != 0 || file.ReadAll(text) != 0) return 1;
    Parse(text);
    return 0;
}

void zkMappedINIFile::Parse(const zkStringBase& text) {
    const char* const data = text.data();
    const char* const end = data + text.length();
    const char* p = data;
    if (text.length() >= kByteOrderMarkSize && std::memcmp(data, kByteOrderMark, kByteOrderMarkSize) == 0)
        p += kByteOrderMarkSize;
    std::list<INILine*>* current = nullptr;

    while (p < end) {
        // The line is [p, lineEnd); next is where the following line starts.
        const char* lineEnd = p;
        while (lineEnd < end && *lineEnd != '\r' && *lineEnd != '\n') ++lineEnd;
        const char* next = lineEnd;
        if (next < end) {
            ++next;
            if (*lineEnd == '\r' && next < end && *next == '\n') ++next;
        }

        // A line of one character is ignored whatever it is, a lone "[" or a
        // one-letter key included. Otherwise the passing of leading blanks
        // may run on over blank lines; a line of which at most one character
        // is left is ignored, and the scan resumes where the blanks ended.
        if (lineEnd - p == 1) {
            p = next;
            continue;
        }
        const char* first = p;
        while (first < end && isLeadingBlank(*first)) ++first;
        if (first + 1 >= lineEnd) {
            p = first;
            continue;
        }
        // At least two characters remain: the trimmed line is never empty.
        const char* last = lineEnd;
        while (last - 1 > first && isSpace(last[-1])) --last;

        if (*first == '[') {
            INISection* section = zkNewRecord<INISection>();
            headerName(section->m_name, first, last);
            zkAppendNode(m_sections, section);
            current = section->m_lines;
        } else if (current != nullptr) {
            INILine* line = zkNewRecord<INILine>();
            if (*first == ';' || *first == '#') {
                line->m_isComment = 1;
                zkSetSized(line->m_value, first, static_cast<unsigned>(last - first));
            } else {
                const void* found = std::memchr(first, '=', static_cast<size_t>(last - first));
                const char* equals = found ? static_cast<const char*>(found) : last;
                setTrimmed(line->m_key, first, equals);
                if (equals < last) setTrimmed(line->m_value, equals + 1, last);
            }
            zkAppendNode(*current, line);
        }
        p = next;
    }
}

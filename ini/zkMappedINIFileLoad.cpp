// The records, the document's lifetime, and loading a file.
#include <fcntl.h>

#include <cctype>
#include <cerrno>
#include <cstring>
#include <memory>

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

// Open reads the file in blocks of this size, and parses each block's
// complete lines before reading the next.
constexpr size_t kReadBlockSize = size_t{16} << 10;

// The longest file Open accepts: the most a zkStringBase could hold of it.
constexpr unsigned long long kMaxTextLength = 0xFFFFFFFEull;

// Turns text into sections and lines, appended to a list. The text may come
// in pieces: scan parses the lines of a piece as far as it can tell them
// from the text seen, and says where the next piece must start.
class LineScanner {
public:
    explicit LineScanner(std::list<INISection*>& sections) : m_sections(sections) {}

    // Parses [p, end), the text up to the end of the file when atEnd is set.
    // Returns where it stopped: end, or the start of a line whose outcome
    // depends on bytes past end (its line end not seen yet, a CR that may
    // be followed by LF, a run of blanks reaching end). Given the rest of
    // the text from there, it goes on exactly as over the whole text at once.
    const char* scan(const char* p, const char* end, bool atEnd);

private:
    void addLine(const char* first, const char* last);

    std::list<INISection*>& m_sections;
    std::list<INILine*>* m_current = nullptr;
};

const char* LineScanner::scan(const char* p, const char* end, bool atEnd) {
    while (p < end) {
        // The line is [p, lineEnd); next is where the following line starts.
        const char* lineEnd = p;
        while (lineEnd < end && *lineEnd != '\r' && *lineEnd != '\n') ++lineEnd;
        if (lineEnd == end && !atEnd) return p;
        const char* next = lineEnd;
        if (next < end) {
            ++next;
            if (*lineEnd == '\r') {
                if (next == end && !atEnd) return p;
                if (next < end && *next == '\n') ++next;
            }
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
        if (first == end && !atEnd) return p;
        if (first + 1 >= lineEnd) {
            p = first;
            continue;
        }
        // At least two characters remain: the trimmed line is never empty.
        const char* last = lineEnd;
        while (last - 1 > first && isSpace(last[-1])) --last;
        addLine(first, last);
        p = next;
    }
    return p;
}

void LineScanner::addLine(const char* first, const char* last) {
    if (*first == '[') {
        INISection* section = zkNewRecord<INISection>();
        headerName(section->m_name, first, last);
        zkAppendNode(m_sections, section);
        m_current = section->m_lines;
    } else if (m_current != nullptr) {
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
        zkAppendNode(*m_current, line);
    }
}

// Whether [p, end) starts with the byte-order mark.
bool startsWithMark(const char* p, const char* end) {
    return static_cast<size_t>(end - p) >= kByteOrderMarkSize && std::memcmp(p, kByteOrderMark, kByteOrderMarkSize) == 0;
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

// The file is read in blocks and parsed as it comes, rather than read whole
// into one string first: the document is the same, and loading never holds
// the file's text and the document at once. The sections go to a list of
// their own and join the document only when the whole file has been read,
// so a failed read leaves the document unchanged. A file longer than a
// string can hold fails, as reading it whole would.
int zkMappedINIFile::Open(unsigned int create) {
    zkBasicFile file(m_filename.data(), create ? O_CREAT : O_RDWR, O_RDONLY, 0);
    if (file.Open() != 0) return 1;
    if (file.SetFilePointer(0, zkBasicFile::SeekBegin) != 0) return 1;

    std::list<INISection*> loaded;
    LineScanner scanner(loaded);
    size_t size = kReadBlockSize;
    std::unique_ptr<char[]> buffer(new char[size]);
    size_t held = 0;  // bytes in the buffer not parsed yet
    unsigned long long total = 0;
    bool started = false;
    bool failed = false;
    for (;;) {
        // A line longer than the buffer makes it grow.
        if (held == size) {
            std::unique_ptr<char[]> larger(new char[2 * size]);
            std::memcpy(larger.get(), buffer.get(), held);
            buffer.swap(larger);
            size *= 2;
        }
        unsigned long got = 0;
        if (file.Read(buffer.get() + held, size - held, &got) != 0) {
            if (errno == EINTR) continue;
            failed = true;
            break;
        }
        total += got;
        if (total > kMaxTextLength) {
            failed = true;
            break;
        }
        held += got;
        const bool atEnd = got == 0;
        const char* p = buffer.get();
        const char* const end = p + held;
        if (!started) {
            // The mark is looked for once, at the start of the file.
            if (held < kByteOrderMarkSize && !atEnd) continue;
            if (startsWithMark(p, end)) p += kByteOrderMarkSize;
            started = true;
        }
        p = scanner.scan(p, end, atEnd);
        if (atEnd) break;
        held = static_cast<size_t>(end - p);
        std::memmove(buffer.get(), p, held);
    }
    if (failed) {
        for (INISection* section : loaded) delete section;
        return 1;
    }
    m_sections.splice(m_sections.end(), loaded);
    return 0;
}

void zkMappedINIFile::Parse(const zkStringBase& text) {
    const char* p = text.data();
    const char* const end = p + text.length();
    if (startsWithMark(p, end)) p += kByteOrderMarkSize;
    LineScanner(m_sections).scan(p, end, true);
}

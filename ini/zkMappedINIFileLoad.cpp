// The document's lifetime, and loading a file.
#include "zkMappedINIFile.h"

#include <fcntl.h>

#include <cerrno>
#include <cstring>
#include <memory>

#include "internal/zkFileSystem.h"
#include "internal/zkOutOfMemory.h"
#include "internal/zkStringRules.h"
#include "zkBasicFile.h"
#include "zkINILineRules.h"

namespace {

// Open reads the file in blocks of this size, and parses each block's
// complete lines before reading the next.
constexpr size_t kReadBlockSize = size_t{16} << 10;

// Turns classified lines into sections and lines appended to a list; lines
// before the first header are not stored.
class SectionBuilder {
public:
    explicit SectionBuilder(std::list<INISection*>& sections) : m_sections(sections) {}

    void add(const char* begin, const char* end);

private:
    std::list<INISection*>& m_sections;
    std::list<INILine*>* m_current = nullptr;
};

unsigned lengthOf(const char* first, const char* last) {
    return static_cast<unsigned>(last - first);
}

void SectionBuilder::add(const char* begin, const char* end) {
    zkINILine text;
    zkClassifyINILine(begin, end, text);
    if (text.kind == zkINILine::Header) {
        INISection* section = zkNewRecord<INISection>();
        zkAssignExact(section->m_name, text.name, lengthOf(text.name, text.nameEnd));
        zkAppendNode(m_sections, section);
        m_current = section->m_lines;
    } else if (text.kind != zkINILine::Ignored && m_current != nullptr) {
        INILine* line = zkNewRecord<INILine>();
        if (text.kind == zkINILine::Comment) {
            line->m_isComment = 1;
            zkAssignExact(line->m_value, text.name, lengthOf(text.name, text.nameEnd));
        } else {
            zkAssignExact(line->m_key, text.name, lengthOf(text.name, text.nameEnd));
            zkAssignExact(line->m_value, text.value, lengthOf(text.value, text.valueEnd));
        }
        zkAppendNode(*m_current, line);
    }
}

}  // namespace

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

namespace {

// Reads the file from its start in blocks, passing each block's complete
// lines to builder before reading the next, and the last line at the end:
// false when a read fails or the file is longer than a string can hold.
bool scanInBlocks(zkBasicFile& file, SectionBuilder& builder) {
    auto onLine = [&builder](const char* begin, const char* end, const char*) { builder.add(begin, end); };
    size_t size = kReadBlockSize;
    std::unique_ptr<char[]> buffer(new char[size]);
    size_t held = 0;  // bytes in the buffer not parsed yet
    unsigned long long total = 0;
    bool started = false;
    for (;;) {
        // A line longer than the buffer makes it grow.
        if (held == size) zkDoubleBuffer(buffer, size, held);
        unsigned long got = 0;
        if (file.Read(buffer.get() + held, size - held, &got) != 0) {
            if (errno == EINTR) continue;
            return false;
        }
        total += got;
        if (total > kZkMaxStringLength) return false;
        held += got;
        const bool atEnd = got == 0;
        const char* p = buffer.get();
        const char* const end = p + held;
        if (!started) {
            // The mark is looked for once, at the start of the file.
            if (held < kINIByteOrderMarkSize && !atEnd) continue;
            if (zkStartsWithINIMark(p, end)) p += kINIByteOrderMarkSize;
            started = true;
        }
        p = zkScanINILines(p, end, atEnd, onLine);
        if (atEnd) return true;
        held = static_cast<size_t>(end - p);
        std::memmove(buffer.get(), p, held);
    }
}

}  // namespace

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
    SectionBuilder builder(loaded);
    if (!scanInBlocks(file, builder)) {
        for (INISection* section : loaded) delete section;
        return 1;
    }
    m_sections.splice(m_sections.end(), loaded);
    return 0;
}

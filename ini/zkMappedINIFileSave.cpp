// Writing the document back to its file.
#include "zkMappedINIFile.h"

#include <cerrno>

#include "internal/zkFileSystem.h"
#include "internal/zkStringRules.h"

namespace {

// The section whose key lines CloseFW writes without "=".
constexpr char kFirewallSection[] = "IPsBehindFirewall";

// The blank that may follow a line of one character.
constexpr unsigned long long kLinePad = 1;

// The mode of a file that a save creates, less the umask.
constexpr mode_t kNewFileMode = 0666;

bool hasLineBreak(const zkStringBase& s) {
    for (unsigned i = 0; i < s.length(); ++i)
        if (s[i] == '\r' || s[i] == '\n') return true;
    return false;
}

// The size of a section's text: "[", name, "]", LF, then the lines, then
// the empty line.
unsigned long long sectionSize(const INISection& section, bool bare) {
    unsigned long long size = section.m_name.length() + 4ull;
    for (const INILine* line : *section.m_lines) {
        unsigned long long length = line->m_value.length();
        if (!line->m_isComment) length += line->m_key.length() + (bare ? 0ull : 1ull);
        size += length + ((!bare || line->m_isComment) && length == 1 ? kLinePad : 0ull) + 1ull;
    }
    return size;
}

// Whether CloseFW writes this section's key lines bare. The test of the name
// follows its compare type: a name copied from a case-insensitive string
// matches in any case.
bool isBare(const INISection& section, bool firewall) {
    static const zkStringBase firewallName(kFirewallSection);
    return firewall && section.m_name == firewallName;
}

unsigned long long documentSize(const std::list<INISection*>& sections, bool firewall) {
    unsigned long long size = 0;
    for (const INISection* section : sections) size += sectionSize(*section, isBare(*section, firewall));
    return size;
}

// Appends one line of a section to text.
void appendLine(zkStringBase& text, const INILine& line, bool bare) {
    const unsigned start = text.length();
    if (!line.m_isComment) {
        text.append(line.m_key);
        if (!bare) text.append('=');
    }
    text.append(line.m_value);
    // Loading ignores a line of one character, so a lone comment character
    // or a lone "=" would be lost; a blank after it is cut off again when the
    // line is read. The bare keys of the firewall form are written as they
    // are, except a comment, which is no key.
    if ((!bare || line.m_isComment) && text.length() - start == 1) text.append(' ');
    text.append('\n');
}

// Writes every section, each with its text built in one buffer sized for it
// before the first append. The buffer is reused, so it grows only for a
// section longer than all before it.
bool writeSections(int fd, const std::list<INISection*>& sections, bool firewall) {
    zkStringBase text;
    for (const INISection* section : sections) {
        const bool bare = isBare(*section, firewall);
        unsigned long long size = sectionSize(*section, bare);
        if (size > kZkMaxStringLength) {
            errno = EOVERFLOW;
            return false;
        }
        text.makeNull();
        if (size >= text.capacity()) text.reserve(static_cast<unsigned>(size + 1));
        text.append('[').append(section->m_name).append(']').append('\n');
        for (const INILine* line : *section->m_lines) appendLine(text, *line, bare);
        text.append('\n');
        if (zkWriteAll(fd, text.data(), text.length()) != 0) return false;
    }
    return true;
}

}  // namespace

int zkMappedINIFile::Close(unsigned int save) {
    if (save && Save(false) != 0) return 1;
    Clear();
    return 0;
}

int zkMappedINIFile::CloseFW(unsigned int save) {
    if (save && Save(true) != 0) return 1;
    Clear();
    return 0;
}

bool zkMappedINIFile::HasLineBreaks() const {
    for (const INISection* section : m_sections) {
        if (hasLineBreak(section->m_name)) return true;
        for (const INILine* line : *section->m_lines)
            if (hasLineBreak(line->m_key) || hasLineBreak(line->m_value)) return true;
    }
    return false;
}

// The new file keeps the old one's mode and owner; a new one gets 0666 less
// the umask.
int zkMappedINIFile::Save(bool firewall) {
    if (HasLineBreaks()) {
        errno = EINVAL;
        return 1;
    }
    const std::list<INISection*>& sections = m_sections;
    return zkReplaceFile(m_filename.data(), kNewFileMode, documentSize(sections, firewall),
                         [&sections, firewall](int fd) { return writeSections(fd, sections, firewall); });
}

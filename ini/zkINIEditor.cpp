// The editor's lines: finding sections and keys, and changing them.
#include <cstring>
#include <initializer_list>
#include <utility>

#include "internal/zkCaseTables.h"
#include "internal/zkCharRules.h"
#include "internal/zkOutOfMemory.h"
#include "internal/zkStringRules.h"
#include "zkINIEditorImpl.h"

namespace {

unsigned offset(const char* base, const char* p) {
    return static_cast<unsigned>(p - base);
}

bool sameName(const char* p, unsigned n, const zkStringBase& name) {
    if (n != name.length()) return false;
    zkCaseTables fold;
    for (unsigned i = 0; i < n; ++i)
        if (fold.upper(p[i]) != fold.upper(name[i])) return false;
    return true;
}

bool sameName(const zkINIEditorLine& line, const zkStringBase& name) {
    return sameName(line.text + line.name, line.nameLength, name);
}

bool isBlank(const zkINIEditorLine& line) {
    for (unsigned i = 0; i < line.length; ++i)
        if (!zkIsSpace(line.text[i])) return false;
    return true;
}

bool hasLineEnd(const zkStringBase& s) {
    return std::memchr(s.data(), '\r', s.length()) != nullptr || std::memchr(s.data(), '\n', s.length()) != nullptr;
}

// Whether s has whitespace at either end, which reading would cut off.
bool hasOuterSpace(const zkStringBase& s) {
    return !s.isNull() && (zkIsSpace(s[0]) || zkIsSpace(s[s.length() - 1]));
}

}  // namespace

// ---- The held lines ----

void zkINIEditor::Impl::clear() {
    text.reset();
    textSize = 0;
    hasMark = false;
    made.clear();
    sections.clear();
    sections.emplace_back();
    lineEnd[0] = '\n';
    lineEndLength = 1;
}

zkINIEditorLine zkINIEditor::Impl::record(const char* begin, const char* contentEnd, const char* next) const {
    zkINILine found;
    zkClassifyINILine(begin, contentEnd, found);
    const auto endLength = static_cast<unsigned char>(next - contentEnd);
    Line line = {begin, offset(begin, contentEnd), endLength, found.kind, false, 0, 0, 0, 0};
    if (found.kind == zkINILine::Ignored) return line;
    line.name = offset(begin, found.name);
    line.nameLength = offset(found.name, found.nameEnd);
    if (found.kind == zkINILine::Key) {
        line.hasEquals = found.equals != nullptr;
        line.value = offset(begin, found.value);
        line.valueLength = offset(found.value, found.valueEnd);
    }
    return line;
}

void zkINIEditor::Impl::adopt(std::unique_ptr<char[]> bytes, size_t size) {
    clear();
    text = std::move(bytes);
    textSize = size;
    const char* p = text.get();
    const char* const end = p + size;
    hasMark = zkStartsWithINIMark(p, end);
    if (hasMark) p += kINIByteOrderMarkSize;
    bool styleSeen = false;
    zkScanINILines(p, end, true, [&](const char* begin, const char* contentEnd, const char* next) {
        Line line = record(begin, contentEnd, next);
        if (!styleSeen && line.endLength) {
            std::memcpy(lineEnd, contentEnd, line.endLength);
            lineEndLength = line.endLength;
            styleSeen = true;
        }
        if (line.kind == zkINILine::Header) sections.emplace_back();
        sections.back().lines.push_back(line);
    });
}

unsigned long long zkINIEditor::Impl::size() const {
    unsigned long long total = hasMark ? kINIByteOrderMarkSize : 0;
    for (const Section& section : sections)
        for (const Line& line : section.lines) total += line.length + line.endLength;
    return total;
}

bool zkINIEditor::Impl::preambleExists() const {
    for (const Line& line : sections[0].lines)
        if (line.kind == zkINILine::Key || line.kind == zkINILine::Comment) return true;
    return false;
}

int zkINIEditor::Impl::findSection(const zkStringBase& name) const {
    if (name.isNull() && preambleExists()) return 0;
    for (size_t i = 1; i < sections.size(); ++i)
        if (sameName(sections[i].lines[0], name)) return static_cast<int>(i);
    return -1;
}

int zkINIEditor::Impl::findKey(const Section& section, const zkStringBase& key) const {
    for (size_t i = 0; i < section.lines.size(); ++i) {
        const Line& line = section.lines[i];
        if (line.kind == zkINILine::Key && sameName(line, key)) return static_cast<int>(i);
    }
    return -1;
}

// ---- Changes ----

zkINIEditorLine zkINIEditor::Impl::makeLine(std::initializer_list<std::pair<const char*, unsigned>> pieces,
                                            const char* end, unsigned endLength) {
    size_t length = 0;
    for (const auto& piece : pieces) length += piece.second;
    std::unique_ptr<char[]> bytes(new char[length + endLength]);
    char* p = bytes.get();
    for (const auto& piece : pieces) {
        if (piece.second) std::memcpy(p, piece.first, piece.second);
        p += piece.second;
    }
    std::memcpy(p, end, endLength);
    const char* begin = bytes.get();
    made.push_back(std::move(bytes));
    return record(begin, begin + length, begin + length + endLength);
}

zkINIEditorLine zkINIEditor::Impl::withLineEnd(const Line& line) {
    return makeLine({{line.text, line.length}}, lineEnd, lineEndLength);
}

// The new line follows the section's last key or comment line, else its
// header, and takes that line's line end. The text's last line has none, and
// the new line becomes the last: the line before it gets the text's line
// end, and the text still ends without one.
void zkINIEditor::Impl::insertKey(Section& section, const zkStringBase& key, const zkStringBase& value) {
    Lines& lines = section.lines;
    size_t at = lines.size();
    while (at > 0 && lines[at - 1].kind != zkINILine::Key && lines[at - 1].kind != zkINILine::Comment &&
           lines[at - 1].kind != zkINILine::Header)
        --at;
    const char* end = lineEnd;
    unsigned endLength = lineEndLength;
    if (at > 0) {
        Line& anchor = lines[at - 1];
        end = anchor.text + anchor.length;
        endLength = anchor.endLength;
        if (endLength == 0) anchor = withLineEnd(anchor);
    }
    Line added = makeLine({{key.data(), key.length()}, {"=", 1}, {value.data(), value.length()}}, end, endLength);
    lines.insert(lines.begin() + static_cast<long>(at), added);
}

void zkINIEditor::Impl::appendSection(const zkStringBase& name, const zkStringBase& key, const zkStringBase& value) {
    Lines& last = sections.back().lines;
    if (!last.empty()) {
        if (last.back().endLength == 0) last.back() = withLineEnd(last.back());
        if (!isBlank(last.back())) last.push_back(makeLine({}, lineEnd, lineEndLength));
    }
    sections.emplace_back();
    Lines& lines = sections.back().lines;
    lines.push_back(makeLine({{"[", 1}, {name.data(), name.length()}, {"]", 1}}, lineEnd, lineEndLength));
    lines.push_back(
        makeLine({{key.data(), key.length()}, {"=", 1}, {value.data(), value.length()}}, lineEnd, lineEndLength));
}

// The value's bytes are replaced and everything around them kept. An empty
// value goes after the blanks that follow "="; a line without "=" gets one
// after its key.
void zkINIEditor::Impl::replaceValue(Line& line, const zkStringBase& value) {
    unsigned from = line.value;
    if (line.hasEquals && line.valueLength == 0)
        while (from < line.length && zkIsSpace(line.text[from])) ++from;
    const unsigned to = from + line.valueLength;
    const char* equals = line.hasEquals ? "" : "=";
    line = makeLine({{line.text, from},
                     {equals, line.hasEquals ? 0u : 1u},
                     {value.data(), value.length()},
                     {line.text + to, line.length - to}},
                    line.text + line.length, line.endLength);
}

int zkINIEditor::Impl::set(const zkStringBase& section, const zkStringBase& key, const zkStringBase& value) {
    const int s = findSection(section);
    if (s < 0) {
        // Keys of the empty name go before the first header, as the file's
        // first lines when it has none before it.
        if (section.isNull())
            insertKey(sections[0], key, value);
        else
            appendSection(section, key, value);
        return Missing;
    }
    Section& found = sections[static_cast<size_t>(s)];
    const int k = findKey(found, key);
    if (k < 0) {
        insertKey(found, key, value);
        return Missing;
    }
    replaceValue(found.lines[static_cast<size_t>(k)], value);
    return Done;
}

// ---- The public operations ----

void zkINIEditor::GetText(zkStringBase& text) const {
    text.makeNull();
    text.reserve(static_cast<unsigned>(m_impl->size() + 1));
    m_impl->write([&text](const char* p, size_t n) {
        text.append(p, static_cast<unsigned>(n));
        return true;
    });
}

bool zkINIEditor::HasSection(const zkStringBase& section) const {
    return m_impl->findSection(section) >= 0;
}

int zkINIEditor::GetVal(const zkStringBase& section, const zkStringBase& key, zkStringBase& value) const {
    const int s = m_impl->findSection(section);
    if (s < 0) return Missing;
    const zkINIEditorSection& found = m_impl->sections[static_cast<size_t>(s)];
    const int k = m_impl->findKey(found, key);
    if (k < 0) return Missing;
    const zkINIEditorLine& line = found.lines[static_cast<size_t>(k)];
    value.assign(line.text + line.value, line.valueLength);
    return Done;
}

void zkINIEditor::GetSectionNames(std::list<zkStringBase>& names) const {
    if (m_impl->preambleExists()) zkAppendNode(names, zkStringBase());
    for (size_t i = 1; i < m_impl->sections.size(); ++i) {
        const zkINIEditorLine& header = m_impl->sections[i].lines[0];
        zkAppendNode(names, zkStringBase(header.text + header.name, header.nameLength));
    }
}

int zkINIEditor::GetKeyValues(const zkStringBase& section,
                              std::list<std::pair<zkStringBase, zkStringBase>>& pairs) const {
    const int s = m_impl->findSection(section);
    if (s < 0) return Missing;
    for (const zkINIEditorLine& line : m_impl->sections[static_cast<size_t>(s)].lines)
        if (line.kind == zkINILine::Key)
            zkAppendNode(pairs, std::make_pair(zkStringBase(line.text + line.name, line.nameLength),
                                               zkStringBase(line.text + line.value, line.valueLength)));
    return Done;
}

int zkINIEditor::SetVal(const zkStringBase& section, const zkStringBase& key, const zkStringBase& value) {
    if (!IsValidSection(section) || !IsValidKey(key) || !IsValidValue(value)) return Refused;
    return m_impl->set(section, key, value);
}

int zkINIEditor::RemoveKey(const zkStringBase& section, const zkStringBase& key) {
    const int s = m_impl->findSection(section);
    if (s < 0) return Missing;
    zkINIEditorLines& lines = m_impl->sections[static_cast<size_t>(s)].lines;
    const int k = m_impl->findKey(m_impl->sections[static_cast<size_t>(s)], key);
    if (k < 0) return Missing;
    lines.erase(lines.begin() + k);
    return Done;
}

int zkINIEditor::RemoveSection(const zkStringBase& section) {
    const int s = m_impl->findSection(section);
    if (s < 0) return Missing;
    if (s == 0)
        m_impl->sections[0].lines.clear();
    else
        m_impl->sections.erase(m_impl->sections.begin() + s);
    return Done;
}

// Every key is checked before the first is set, so a refusal changes nothing.
int zkINIEditor::MergeFrom(const zkINIEditor& other) {
    if (&other == this) return Done;
    const auto& from = other.m_impl->sections;
    for (int pass = 0; pass < 2; ++pass)
        for (size_t i = 0; i < from.size(); ++i) {
            zkStringBase name;
            if (i > 0) {
                const zkINIEditorLine& header = from[i].lines[0];
                name = zkStringBase(header.text + header.name, header.nameLength);
            }
            for (const zkINIEditorLine& line : from[i].lines) {
                if (line.kind != zkINILine::Key) continue;
                const zkStringBase key(line.text + line.name, line.nameLength);
                const zkStringBase value(line.text + line.value, line.valueLength);
                if (pass == 1)
                    m_impl->set(name, key, value);
                else if (!IsValidSection(name) || !IsValidKey(key) || !IsValidValue(value))
                    return Refused;
            }
        }
    return Done;
}

bool zkINIEditor::IsValidSection(const zkStringBase& section) {
    return std::memchr(section.data(), ']', section.length()) == nullptr && !hasLineEnd(section) &&
           !hasOuterSpace(section);
}

bool zkINIEditor::IsValidKey(const zkStringBase& key) {
    if (key.isNull() || hasLineEnd(key) || hasOuterSpace(key)) return false;
    if (key[0] == '[' || key[0] == ';' || key[0] == '#') return false;
    return std::memchr(key.data(), '=', key.length()) == nullptr;
}

bool zkINIEditor::IsValidValue(const zkStringBase& value) {
    return !hasLineEnd(value) && !hasOuterSpace(value);
}

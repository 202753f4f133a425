// The document's records: lines, sections, and the key comparator.
#include "internal/zkOutOfMemory.h"
#include "internal/zkStringRules.h"
#include "zkMappedINIFile.h"

namespace {

// An empty stored string: one byte, for the terminator.
constexpr unsigned kEmptyCapacity = 1;

}  // namespace

INILine::KeyCompare::KeyCompare(const zkStringBase& key) : m_key(key) {}

bool INILine::KeyCompare::operator()(const INILine* line) const {
    return line->m_key.equals(m_key, false);
}

INILine::INILine() : m_key(kEmptyCapacity), m_value(kEmptyCapacity), m_isComment(0) {}

INISection::INISection() : m_name(kEmptyCapacity), m_lines(zkNewRecord<std::list<INILine*>>()) {}

INISection::INISection(const zkStringBase& name) : INISection() {
    zkAssignExact(m_name, name);
}

INISection::~INISection() {
    for (INILine* line : *m_lines) delete line;
    delete m_lines;
}

// Reading and changing values, and merging documents.
#include "zkMappedINIFile.h"

#include <algorithm>
#include <cassert>
#include <cstddef>

#include "internal/zkOutOfMemory.h"
#include "internal/zkStringRules.h"

namespace {

// A new line holding sized copies of key and value.
INILine* newLine(const zkStringBase& key, const zkStringBase& value, int isComment) {
    INILine* line = zkNewRecord<INILine>();
    zkAssignExact(line->m_key, key);
    zkAssignExact(line->m_value, value);
    line->m_isComment = isComment;
    return line;
}

}  // namespace

std::list<INISection*>* zkMappedINIFile::GetSectionList() {
    return &m_sections;
}

void zkMappedINIFile::GetSectionNameList(std::list<zkStringBase>& names) {
    for (INISection* section : m_sections) zkAppendNode(names, section->m_name);
}

std::list<INILine*>* zkMappedINIFile::GetPropertyList(const char* name) {
    assert(name != nullptr);
    for (INISection* section : m_sections)
        if (section->m_name.equals(name, false)) return section->m_lines;
    return nullptr;
}

std::list<INILine*>::iterator zkMappedINIFile::FindKey(std::list<INILine*>* lines, const zkStringBase& key) {
    assert(lines != nullptr);
    return std::find_if(lines->begin(), lines->end(), INILine::KeyCompare(key));
}

const zkStringBase& zkMappedINIFile::GetVal(const zkStringBase& section, const zkStringBase& key) {
    return GetVal(GetPropertyList(section.data()), key);
}

int zkMappedINIFile::GetVal(const zkStringBase& section, const zkStringBase& key, zkStringBase& value) {
    std::list<INILine*>* lines = GetPropertyList(section.data());
    if (lines == nullptr) return 1;
    auto found = FindKey(lines, key);
    if (found == lines->end()) return 1;
    value = (*found)->m_value;
    return 0;
}

const zkStringBase& zkMappedINIFile::GetVal(std::list<INILine*>* lines, const zkStringBase& key) {
    if (lines == nullptr) return zkStringBase::NullStr;
    auto found = FindKey(lines, key);
    return found == lines->end() ? zkStringBase::NullStr : (*found)->m_value;
}

void zkMappedINIFile::SetVal(const zkStringBase& section, const zkStringBase& key, const zkStringBase& value) {
    bool matched = false;
    for (INISection* each : m_sections) {
        if (!each->m_name.equals(section, false)) continue;
        matched = true;
        auto found = FindKey(each->m_lines, key);
        if (found != each->m_lines->end())
            zkAssignExact((*found)->m_value, value);
        else
            zkAppendNode(*each->m_lines, newLine(key, value, 0));
    }
    if (matched) return;
    INISection* added = zkNewRecord<INISection>(section);
    zkAppendNode(*added->m_lines, newLine(key, value, 0));
    zkAppendNode(m_sections, added);
}

void zkMappedINIFile::SetVal(const zkStringBase& section, const zkStringBase& key, long value) {
    zkStringBase text;
    text.append(value);
    SetVal(section, key, text);
}

void zkMappedINIFile::RemoveKey(const zkStringBase& section, const zkStringBase& key) {
    std::list<INILine*>* lines = GetPropertyList(section.data());
    if (lines == nullptr) return;
    auto found = FindKey(lines, key);
    if (found == lines->end()) return;
    delete *found;
    lines->erase(found);
}

void zkMappedINIFile::AddMapSection(const zkStringBase& name, std::list<INILine*>* lines) {
    INISection* added = zkNewRecord<INISection>(name);
    zkAppendNode(m_sections, added);
    DoUpdateMapSection(added->m_lines, lines);
}

void zkMappedINIFile::UpdateMapSection(const zkStringBase& name, std::list<INILine*>* lines) {
    DoUpdateMapSection(GetPropertyList(name.data()), lines);
}

void zkMappedINIFile::DoUpdateMapSection(std::list<INILine*>* target, std::list<INILine*>* source) {
    if (target == nullptr || source == nullptr) return;
    // Only the lines present at the start are mapped: when target and source
    // are one list, the copies appended to it are not visited again.
    auto it = source->begin();
    for (size_t left = source->size(); left != 0; --left, ++it) {
        const INILine* from = *it;
        if (from->m_key.isNull()) continue;
        auto found = std::find_if(target->begin(), target->end(), [from](const INILine* line) {
            return line->m_isComment != 1 && line->m_key.equals(from->m_key, false);
        });
        if (found != target->end())
            zkAssignExact((*found)->m_value, from->m_value);
        else
            zkAppendNode(*target, newLine(from->m_key, from->m_value, from->m_isComment));
    }
}

int zkMappedINIFile::MergeFrom(zkMappedINIFile& other) {
    // Only the sections present at the start are walked: a document merged
    // into itself may append to the list being walked.
    auto it = other.m_sections.begin();
    for (size_t left = other.m_sections.size(); left != 0; --left, ++it) {
        INISection* section = *it;
        if (GetPropertyList(section->m_name.data()) != nullptr)
            UpdateMapSection(section->m_name, section->m_lines);
        else
            AddMapSection(section->m_name, section->m_lines);
    }
    return 0;
}

#include "batch.h"

#include "zkINIEditor.h"

namespace {

// Splits line at its first maxFields - 1 tabs; the last field keeps any
// further tabs.
std::vector<zkStringBase> splitAtTabs(const zkStringBase& line, unsigned maxFields) {
    std::vector<zkStringBase> fields;
    unsigned from = 0;
    while (fields.size() + 1 < maxFields) {
        const unsigned tab = line.find('\t', from);
        if (tab == zkStringBase::BadIndex) break;
        fields.emplace_back(line.data() + from, tab - from);
        from = tab + 1;
    }
    fields.emplace_back(line.data() + from, line.length() - from);
    return fields;
}

// Why the change would be refused, or null.
const char* refusal(const BatchChange& change) {
    if (!zkINIEditor::IsValidSection(change.section)) return "a section name that cannot be written";
    if (change.kind != BatchChange::SetKey) return nullptr;
    if (!zkINIEditor::IsValidKey(change.key)) return "a key that cannot be written";
    if (!zkINIEditor::IsValidValue(change.value)) return "a value that cannot be written";
    return nullptr;
}

// Reads one line into change: null, or why it is bad.
const char* parseLine(const zkStringBase& line, BatchChange& change) {
    if (line.find('\0') != zkStringBase::BadIndex) return "a zero byte";
    const std::vector<zkStringBase> fields = splitAtTabs(line, 4);
    if (fields[0] == "set") {
        if (fields.size() != 4) return "set needs SECTION, KEY and VALUE, separated by tabs";
        change.kind = BatchChange::SetKey;
        change.value = fields[3];
    } else if (fields[0] == "delete") {
        if (fields.size() == 4) return "delete takes SECTION and an optional KEY, separated by tabs";
        change.kind = fields.size() == 3 ? BatchChange::DeleteKey : BatchChange::DeleteSection;
        if (fields.size() < 2) return "delete needs a SECTION";
    } else {
        return "not a change: each line starts with set or delete and a tab";
    }
    change.section = fields[1];
    if (fields.size() > 2) change.key = fields[2];
    return refusal(change);
}

}  // namespace

bool ParseBatch(const zkStringBase& text, std::vector<BatchChange>& changes, zkStringBase& error) {
    unsigned number = 0;
    for (unsigned from = 0; from < text.length();) {
        unsigned end = text.find('\n', from);
        if (end == zkStringBase::BadIndex) end = text.length();
        unsigned stop = end;
        if (stop > from && text[stop - 1] == '\r') --stop;
        zkStringBase line(text.data() + from, stop - from);
        from = end + 1;
        ++number;
        if (line.isNull() || line[0] == '#') continue;
        BatchChange change{BatchChange::SetKey, zkStringBase(), zkStringBase(), zkStringBase(), number};
        if (const char* why = parseLine(line, change)) {
            error = "line ";
            error.append(static_cast<long>(number)).append(": ").append(why);
            return false;
        }
        changes.push_back(change);
    }
    return true;
}

#include "arguments.h"

#include <cstring>
#include <initializer_list>

namespace {

struct SwitchSpelling {
    const char* name;  // without the leading "-"
    bool valued;
};

// Indexed by Arguments::Switch.
const SwitchSpelling kSwitches[Arguments::SwitchCount] = {
    {"get", false},      {"set", false},    {"delete", false},   {"list", false},    {"normalize", false},
    {"firewall", false}, {"merge", true},   {"batch", true},     {"version", false}, {"help", false},
    {"file", true},      {"section", true}, {"key", true},       {"value", true},    {"out", true},
    {"log", true},       {"format", true},  {"existing", false}, {"quiet", false},
};

// Whole words that name a bare switch besides "-" and its name.
struct Alias {
    const char* word;
    Arguments::Switch as;
};
const Alias kAliases[] = {{"--help", Arguments::Help}, {"-h", Arguments::Help}, {"--version", Arguments::Version}};

constexpr unsigned bit(Arguments::Switch s) {
    return 1u << s;
}

constexpr unsigned kActions = bit(Arguments::Get) | bit(Arguments::Set) | bit(Arguments::Delete) |
                              bit(Arguments::List) | bit(Arguments::Normalize) | bit(Arguments::Firewall) |
                              bit(Arguments::Merge) | bit(Arguments::Batch) | bit(Arguments::Version) |
                              bit(Arguments::Help);

// What each action accepts besides itself, and what it needs.
struct ActionRule {
    unsigned allowed;
    unsigned required;
};

constexpr unsigned kFileQuiet = bit(Arguments::File) | bit(Arguments::Quiet);
constexpr unsigned kWrites = bit(Arguments::Out) | bit(Arguments::Log);
constexpr unsigned kSectionKey = bit(Arguments::Section) | bit(Arguments::Key);

// Indexed by the action's Switch value.
const ActionRule kRules[] = {
    /* Get */ {kFileQuiet | kSectionKey | bit(Arguments::Format), bit(Arguments::File) | kSectionKey},
    /* Set */
    {kFileQuiet | kSectionKey | bit(Arguments::Value) | bit(Arguments::Existing) | kWrites,
     bit(Arguments::File) | kSectionKey | bit(Arguments::Value)},
    /* Delete */
    {kFileQuiet | kSectionKey | bit(Arguments::Existing) | kWrites, bit(Arguments::File) | bit(Arguments::Section)},
    /* List */ {kFileQuiet | bit(Arguments::Section) | bit(Arguments::Format), bit(Arguments::File)},
    /* Normalize */ {kFileQuiet | kWrites, bit(Arguments::File)},
    /* Firewall */ {kFileQuiet | kWrites, bit(Arguments::File)},
    /* Merge */ {kFileQuiet | kWrites, bit(Arguments::File)},
    /* Batch */ {kFileQuiet | bit(Arguments::Existing) | kWrites, bit(Arguments::File)},
    /* Version */ {0, 0},
    /* Help */ {0, 0},
};

// The switch as the help text writes it: "-get", "-file:".
zkStringBase spelling(unsigned s) {
    zkStringBase text("-");
    text.append(kSwitches[s].name);
    if (kSwitches[s].valued) text.append(':');
    return text;
}

}  // namespace

Arguments::Arguments(int argc, char** argv) : zkCommandLineParser(argc, argv) {}

const zkStringBase& Arguments::ValueOf(Switch s) const {
    return Has(s) ? GetValue(kSwitches[s].name) : zkStringBase::NullStr;
}

int Arguments::Refuse(std::initializer_list<const char*> parts) {
    m_error.makeNull();
    for (const char* part : parts) m_error.append(part);
    return 0;
}

int Arguments::Validate() {
    m_given = 0;
    m_error.makeNull();
    for (int k = 1; k < m_argc; ++k)
        if (!CheckWord(m_argv[k])) return 0;
    if (!CheckCombination()) return 0;
    if (!CheckValues()) return 0;
    return zkCommandLineParser::Validate();
}

int Arguments::CheckWord(const char* word) {
    if (word[0] != '-') return Refuse({"stray word '", word, "'"});
    const char* colon = std::strchr(word, ':');
    const size_t nameLength = colon ? static_cast<size_t>(colon - word - 1) : std::strlen(word + 1);
    unsigned found = SwitchCount;
    for (unsigned s = 0; s < SwitchCount; ++s)
        if (std::strlen(kSwitches[s].name) == nameLength && std::strncmp(kSwitches[s].name, word + 1, nameLength) == 0)
            found = s;
    if (!colon)
        for (const Alias& alias : kAliases)
            if (std::strcmp(alias.word, word) == 0) found = alias.as;
    if (found == SwitchCount) return Refuse({"unknown switch '", word, "'"});
    if (kSwitches[found].valued && !colon)
        return Refuse({"'", word, "' lacks its colon: write ", spelling(found).data(), "VALUE"});
    if (!kSwitches[found].valued && colon)
        return Refuse({"'", word, "' takes no value: write ", spelling(found).data()});
    if (Has(static_cast<Switch>(found))) return Refuse({"'", word, "' repeats ", spelling(found).data()});
    m_given |= 1u << found;
    return 1;
}

int Arguments::CheckCombination() {
    unsigned action = SwitchCount;
    for (unsigned s = 0; s < SwitchCount; ++s) {
        if (!(kActions & (1u << s)) || !Has(static_cast<Switch>(s))) continue;
        if (action != SwitchCount)
            return Refuse({"give one action, not ", spelling(action).data(), " and ", spelling(s).data()});
        action = s;
    }
    if (action == SwitchCount)
        return Refuse(
            {"no action given: one of -get, -set, -delete, -list, -merge:, -batch:, -normalize, "
             "-firewall"});
    m_action = static_cast<Switch>(action);
    const ActionRule& rule = kRules[action];
    for (unsigned s = 0; s < SwitchCount; ++s) {
        const unsigned b = 1u << s;
        if (s == action) continue;
        if (Has(static_cast<Switch>(s)) && !(rule.allowed & b))
            return Refuse({spelling(s).data(), " does not apply to ", spelling(action).data()});
        if (!Has(static_cast<Switch>(s)) && (rule.required & b))
            return Refuse({spelling(action).data(), " needs ", spelling(s).data()});
    }
    return 1;
}

int Arguments::CheckValues() {
    for (Switch s : {File, Merge, Batch, Out, Log})
        if (Has(s) && ValueOf(s).isNull()) return Refuse({spelling(s).data(), " needs a value"});
    if (Has(Log) && ValueOf(Log) == "-") return Refuse({"-log: needs a file, not standard output"});
    unsigned fromStdin = 0;
    for (Switch s : {File, Merge, Batch})
        if (ValueOf(s) == "-") ++fromStdin;
    if (fromStdin > 1) return Refuse({"standard input can feed only one of -file:, -merge: and -batch:"});
    const zkStringBase& format = ValueOf(Format);
    if (Has(Format) && format != "lines" && format != "sh" && format != "json")
        return Refuse({"unknown format in '-format:", format.data(), "': use lines, sh or json"});
    return 1;
}

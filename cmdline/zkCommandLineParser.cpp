#include "zkCommandLineParser.h"

#include <cstring>
#include <new>
#include <tuple>
#include <unordered_map>
#include <utility>

#include "internal/zkCaseTables.h"
#include "internal/zkCharRules.h"
#include "internal/zkOutOfMemory.h"

namespace {

// The bucket request the table starts with.
constexpr std::size_t kInitialBuckets = 100;

// Items of a command string are separated by spaces only; a value is quoted
// with double quotes.
constexpr char kItemSeparator = ' ';
constexpr char kQuote = '"';

// The first c in [from, end), or null.
const char* findIn(const char* from, const char* end, char c) {
    if (from >= end) return nullptr;
    return static_cast<const char*>(std::memchr(from, c, static_cast<std::size_t>(end - from)));
}

// Replaces the text of s with the bytes [from, to).
void assignRange(zkStringBase& s, const char* from, const char* to) {
    s.assign(from, to > from ? static_cast<unsigned>(to - from) : 0u);
}

// Objects the parser owns through a pointer are allocated as the containers'
// nodes are, so running out of memory ends the process the same way.
template <class T>
T* newOwned() {
    return new (zkNodeAllocator<T>().allocate(1)) T();
}

template <class T>
void deleteOwned(T* p) {
    p->~T();
    zkNodeAllocator<T>().deallocate(p, 1);
}

}  // namespace

// The most entries the table is sized for ahead of a parse; a longer
// command string lets the table grow as it fills.
constexpr std::size_t kMaxReservedEntries = std::size_t{1} << 16;

struct zkCommandLineParser::Table {
    // Every name is hashed on its folded bytes, whatever its compare type, so
    // that names equal without regard to case share a bucket and a
    // CaseInsensitive lookup can reach an entry written in capitals. The fold
    // is the one zkStringBase::equals uses (toupper), which keeps the hash
    // consistent with Equal in any locale. Bytes after a zero byte are not
    // hashed; Equal still compares them.
    struct Hash {
        std::size_t operator()(const zkStringBase& name) const {
            zkCaseTables fold;
            unsigned h = 0;
            for (const char* p = name.data(); *p; ++p) h = 5u * h + static_cast<unsigned>(fold.upper(*p));
            return h;
        }
    };

    // Equal lengths and bytes, compared without regard to case when either
    // name is CaseInsensitive. Stored names are always CaseSensitive, so
    // entries never collapse into one another.
    struct Equal {
        bool operator()(const zkStringBase& a, const zkStringBase& b) const {
            bool exact = a.getCompareType() != zkStringBase::CaseInsensitive &&
                         b.getCompareType() != zkStringBase::CaseInsensitive;
            return a.equals(b, exact);
        }
    };

    using Entry = std::pair<const zkStringBase, zkStringBase>;
    std::unordered_map<zkStringBase, zkStringBase, Hash, Equal, zkNodeAllocator<Entry>> map{kInitialBuckets};
};

namespace {

// Sizes the table for one entry per switch character of [p, end), an upper
// bound on what the parse can add, so that the table is not rebuilt while it
// fills. Only the bucket count changes, which nothing outside the table sees.
template <class Map>
void reserveEntries(Map& map, const char* p, const char* end, char switchChar) {
    std::size_t switches = 0;
    while (switches < kMaxReservedEntries && (p = findIn(p, end, switchChar)) != nullptr) {
        ++switches;
        ++p;
    }
    if (switches > map.bucket_count()) map.reserve(switches);
}

}  // namespace

zkCommandLineParser::zkCommandLineParser()
    : m_valid(0),
      m_switchChar(DefaultSwitchChar),
      m_separatorChar(DefaultSeparatorChar),
      m_argc(0),
      m_argv(nullptr),
      m_useArgv(0),
      m_values(newOwned<Table>()) {}

zkCommandLineParser::zkCommandLineParser(const zkStringBase& command, char switchChar, char separatorChar)
    : m_command(command),
      m_valid(0),
      m_switchChar(switchChar),
      m_separatorChar(separatorChar),
      m_argc(0),
      m_argv(nullptr),
      m_useArgv(0),
      m_values(newOwned<Table>()) {}

zkCommandLineParser::zkCommandLineParser(int argc, char** argv, char switchChar, char separatorChar)
    : m_valid(0),
      m_switchChar(switchChar),
      m_separatorChar(separatorChar),
      m_argc(argc),
      m_argv(argv),
      m_useArgv(1),
      m_values(newOwned<Table>()) {}

zkCommandLineParser::~zkCommandLineParser() {
    deleteOwned(m_values);
}

int zkCommandLineParser::ParseCommand() {
    return m_useArgv ? ParseArgcArgv() : ParseCmdLine();
}

// One pass from left to right: every scan below starts where the previous one
// stopped and the position moves past what it scanned, so the work is linear
// in the length of the string. The pending name and value are reused buffers;
// only stored entries get buffers of their own.
int zkCommandLineParser::ParseCmdLine() {
    const char* p = m_command.data();
    const char* const end = p + m_command.length();
    reserveEntries(m_values->map, p, end, m_switchChar);
    zkStringBase name;
    zkStringBase value;

    while (p < end) {
        const char c = *p;
        if (c == m_switchChar) {
            // The name runs to the next separator, spaces and quotes included.
            // It replaces any pending name: a switch with no value before the
            // next switch stores nothing.
            const char* sep = findIn(p + 1, end, m_separatorChar);
            if (sep == nullptr) break;
            assignRange(name, p + 1, sep);
            p = sep + 1;
        } else if (c == kQuote) {
            // An unclosed quote runs to the end and is still stored.
            const char* close = findIn(p + 1, end, kQuote);
            assignRange(value, p + 1, close ? close : end);
            if (!name.isNull()) store(name, value);
            name.makeNull();
            if (close == nullptr) break;
            p = close + 1;
        } else if (c == kItemSeparator) {
            ++p;
        } else {
            // Only a space ends the value: a switch character, a quote or a
            // tab inside it is plain text.
            while (p < end && zkIsBlankOrLineEnd(*p)) ++p;
            const char* space = findIn(p, end, kItemSeparator);
            assignRange(value, p, space ? space : end);
            value.stripWhite(zkStringBase::StripEnds);
            if (!name.isNull()) store(name, value);
            name.makeNull();
            if (space == nullptr) break;
            p = space;
        }
    }
    return Validate();
}

int zkCommandLineParser::ParseArgcArgv() {
    zkStringBase name;
    zkStringBase value;
    // argv[0] is the program name and is never read.
    for (int k = 1; m_argv != nullptr && k < m_argc; ++k) {
        const char* arg = m_argv[k];
        if (arg == nullptr || arg[0] == '\0' || arg[0] != m_switchChar || arg[1] == '\0') continue;
        const char* a = arg + 1;
        const char* end = a + std::strlen(a);
        // Searched within the element's length, so a zero separator character
        // is never found at the terminator.
        const char* sep = findIn(a, end, m_separatorChar);
        if (sep != nullptr) {
            assignRange(name, a, sep);
            assignRange(value, sep + 1, end);
        } else {
            // Without a separator only the first character names the switch.
            assignRange(name, a, a + 1);
            value.makeNull();
        }
        store(name, value);
    }
    return Validate();
}

int zkCommandLineParser::SetCommand(const zkStringBase& command) {
    m_command = command;
    m_argc = 0;
    m_argv = nullptr;
    m_useArgv = 0;
    m_valid = 0;
    return ParseCommand();
}

int zkCommandLineParser::SetCommand(int argc, char** argv) {
    m_command = zkStringBase::NullStr;
    m_argc = argc;
    m_argv = argv;
    m_valid = 0;
    return ParseArgcArgv();
}

int zkCommandLineParser::Validate() {
    m_valid = 1;
    return 1;
}

void zkCommandLineParser::store(const zkStringBase& name, const zkStringBase& value) {
    // New entries get buffers sized to their text (length + 1) rather than
    // copies of the parse's reused buffers, whose capacity is that of the
    // longest item seen. The key is const inside the table, so it is copied
    // from a sized string; the copy keeps that capacity. Names are mostly
    // new, so the entry is built first and the table searched once; an
    // existing name drops the new entry and keeps its own.
    zkStringBase sizedName(name.length() + 1u);
    sizedName.assign(name.data(), name.length());
    auto placed = m_values->map.emplace(std::piecewise_construct, std::forward_as_tuple(sizedName),
                                        std::forward_as_tuple(value.length() + 1u));
    zkStringBase& stored = placed.first->second;
    if (placed.second) {
        stored.assign(value.data(), value.length());
        stored.setCompareType(value.getCompareType());
    } else {
        stored = value;
    }
}

const zkStringBase* zkCommandLineParser::lookUp(const zkStringBase& name) const {
    auto it = m_values->map.find(name);
    return it == m_values->map.end() ? nullptr : &it->second;
}

const zkStringBase& zkCommandLineParser::GetValue(const zkStringBase& name) const {
    const zkStringBase* value = lookUp(name);
    return value ? *value : zkStringBase::NullStr;
}

int zkCommandLineParser::GetValue(const zkStringBase& name, zkStringBase& value) const {
    const zkStringBase* stored = lookUp(name);
    if (stored == nullptr) return 0;
    value = *stored;
    return 1;
}

const zkStringBase& zkCommandLineParser::GetValue(const char* name) const {
    return GetValue(zkStringBase(name));
}

int zkCommandLineParser::GetValue(const char* name, zkStringBase& value) const {
    return GetValue(zkStringBase(name), value);
}

void zkCommandLineParser::SetValue(const char* name, const zkStringBase& value) {
    store(zkStringBase(name), value);
}

bool zkCommandLineParser::Exists(const zkStringBase& name) const {
    return lookUp(name) != nullptr;
}

// zkStringBase: construction, the growth rule and editing; comparison, search
// and cutting; number conversion, case and whitespace. The folded find over
// long strings skips ahead; it is checked against the same search over a
// short string, which tries every position.
#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <map>
#include <new>
#include <string>

#include "support/zkStringText.h"
#include "support/zkTableFile.h"
#include "zkStringBase.h"

using S = zkStringBase;
constexpr unsigned kSlack = 128, Bad = S::BadIndex;
constexpr auto kExact = S::CaseSensitive, kFolded = S::CaseInsensitive;
const char* const kNull = nullptr;

// A position of a table file: "-" is BadIndex.
const auto position = [](const std::string& f) { return f == "-" ? Bad : static_cast<unsigned>(std::stoul(f)); };

// Counts the calls of resize(), to prove that all growth goes through it, and
// keeps the last capacity asked for.
struct CountingString : zkStringBase {
    using zkStringBase::zkStringBase;
    using zkStringBase::operator=;
    void resize(unsigned n) override {
        ++calls;
        asked = n;
        zkStringBase::resize(n);
    }
    unsigned calls = 0, asked = 0;
};
using C = CountingString;
using Op = void (*)(C&);

// Capacity and compare type of new strings. A copy keeps both, leaving room
// for the terminator when an adopted buffer recorded its length as its
// capacity; an assigned text keeps the target's compare type; concatenate
// copies the first string and stops the second at a zero byte. With no slack
// every buffer still has room for the terminator.
TEST(StringConstruction, CapacityIsTextPlusSlack) {
    const unsigned slack = zkStringBase::_sGrowLength;
    zkStringBase::_sGrowLength = 0;
    zkStringBase empty0, abc0("abc"), appended0("ab"), assigned0;
    appended0.append("cd");
    assigned0 = "abcdefgh";
    zkStringBase::_sGrowLength = slack;
    zkStringBase wide = zkStr("x", kFolded), assigned, zero(0u);
    wide = "abcd";
    wide.reserve(40);
    assigned = wide;
    zero.append("ab");
    char* tight = new char[4];
    std::strcpy(tight, "abc");
    zkStringBase adopted(tight, 0, 99);
    EXPECT_EQ(tight, adopted.data());
    EXPECT_EQ(3u, adopted.capacity());
    // clang-format off
    const struct { const zkStringBase& s; std::string text; unsigned capacity; S::CompareType type; } cases[] = {
        {S(), "", kSlack, kExact}, {S("abc"), "abc", 3 + kSlack, kExact}, {S("abc", 0), "", kSlack, kExact},
        {S(nullptr), "", kSlack, kExact}, {S(nullptr, 5), "", kSlack, kExact}, {S(16u), "", 16, kExact},
        {S("a\0b", 3), {"a\0b", 3}, 3 + kSlack, kExact}, {S(0u), "", 1, kExact}, {zero, "ab", 3 + kSlack, kExact},
        {S(adopted), "abc", 4, kExact}, {wide, "abcd", 40, kFolded}, {S(wide), "abcd", 40, kFolded},
        {assigned, "abcd", kSlack, kFolded}, {S::concatenate(wide, S("ef\0g", 4)), "abcdef", 40, kFolded},
        {empty0, "", 1, kExact}, {abc0, "abc", 4, kExact}, {appended0, "abcd", 5, kExact},
        {assigned0, "abcdefgh", 9, kExact},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(&c - cases);
        EXPECT_EQ(c.text, zkText(c.s));
        EXPECT_EQ(c.capacity, c.s.capacity());
        EXPECT_EQ(c.type, c.s.getCompareType());
    }
}

// Each edit starts from `start`, reserved to `room` bytes unless that is 0,
// and gives `text`. A growth adds the slack to what is needed and goes
// through resize(), and nothing else reallocates: a row without a capacity
// keeps the one it started with. Ranges are clamped to the text; a null or
// empty source adds nothing; a length past 32 bits throws with the text
// kept, also when the source lies in the string's own buffer.
TEST(StringEditing, EditsFollowTheGrowthRule) {
    const unsigned big = static_cast<unsigned>(std::to_string(1e300).size());
    const unsigned longMin = static_cast<unsigned>(std::to_string(LONG_MIN).size());
    // clang-format off
    const struct { const char* start; Op op; std::string text; unsigned room = 0, capacity = 0, resizes = 0; }
    cases[] = {
        {"", [](C& s) { for (int i = 0; i < 127; ++i) s.append('x'); }, std::string(127, 'x')},
        {"", [](C& s) { for (int i = 0; i < 128; ++i) s.append('x'); }, std::string(128, 'x'), 0, 129 + kSlack, 1},
        {"", [](C& s) { s = "abc"; }, "abc", 4, 4, 0}, {"", [](C& s) { s = "abcd"; }, "abcd", 4, 4 + kSlack, 1},
        {"", [](C& s) { s = 'x'; }, "x", 2, 2, 0}, {"", [](C& s) { s = 'x'; }, "x", 1, 1 + kSlack, 1},
        {"abc", [](C& s) { for (char c : std::string("defg")) s.fappend(c); }, "abcdefg", 8, 8, 0},
        {"abc", [](C& s) { for (char c : std::string("defgh")) s.fappend(c); }, "abcdefgh", 8, 9 + kSlack, 1},
        {"abc", [](C& s) { s.append("defgh"); }, "abcdefgh", 8, 9 + kSlack, 1},
        {"ac", [](C& s) { s.insert("b", 1); }, "abc", 3, 4 + kSlack, 1},
        {"ac", [](C& s) { s.insert("b", 1); }, "abc", 4, 4, 0},
        {"v=", [](C& s) { s += LONG_MIN; }, "v=" + std::to_string(LONG_MIN)},
        {"v=", [](C& s) { s += -1e300; }, "v=" + std::to_string(-1e300), 3, 2 + big + 2 + kSlack, 1},
        {"", [](C& s) { s.fromDouble(1e300, 6); }, std::to_string(1e300), 2, big + kSlack, 1},
        {"", [](C& s) { s.fromLong(LONG_MIN); }, std::to_string(LONG_MIN), 1, longMin + kSlack, 1},
        // Sources inside the string's own buffer, which growth releases.
        {"abc", [](C& s) { s.append(s); }, "abcabc", 4, 7 + kSlack, 1},
        {"abab", [](C& s) { s.insert(s.data(), 1, 2); }, "aabbab", 5, 7 + kSlack, 1},
        {"abcd", [](C& s) { s = s.data() + 2; }, "cd"},
        // Below length + 1 a request is clamped, never losing text.
        {"abc", [](C& s) { s.reserve(2); s.reserve(3); EXPECT_EQ(4u, s.asked); }, "abc", 8, 4, 2},
        {"abc", [](C& s) { s.resize(0); }, "abc", 8, 4, 1},
        {"abc", [](C& s) { s.resize(3); }, "abc", 8, 4, 1}, {"abc", [](C& s) { s.cut(10); }, ""},
        {"x", [](C& s) { s.append("", 0).append(nullptr, 5).prepend(nullptr).insert(nullptr, 0); }, "x"},
        {"x", [](C& s) { s.append("ab", 1).append("cd\0e", 0).append(S("\0z", 2)).append('\0'); }, {"xacd\0z\0", 7}},
        {"cd", [](C& s) { s.prepend("ab").prepend('>').prepend(S("\0", 1)); }, {"\0>abcd", 6}},
        {"x", [](C& s) { s += "yz"; s += S("!"); s += '?'; }, "xyz!?"},
        {"abc", [](C& s) { s.insert("xy", 1).insert("xy", 0, 0).insert("<>", 99, 1); }, "xyaxybc<"},
        {"abc", [](C& s) { s.insert(S("1\0", 2), 2).insert(S("0"), 0).insert(S("-"), 1); }, {"0-ab1\0c", 7}},
        {"abcdef", [](C& s) { s.del(1, 2).del(4, 2).del(4, 12).del(3, 3).del(2, 3).erase(1, Bad); }, "a"},
        {"abc", [](C& s) { s.cut(2).cut(0); }, "a"}, {"a", [](C& s) { s.del(0, 0); }, ""},
        {"abcb", [](C& s) { s.replace("b", "XY", 0, true).replace("b", nullptr, 3, true); }, "aXYc"},
        {"abxbc", [](C& s) { s.replace("bc", "-", 0, true); }, "abx-"},
        {"aXYcb", [](C& s) { s.replace("xy", "-", 0, true).replace("xy", "-", 0, false); }, "a-cb"},
        {"abcd", [](C& s) { s.replace("XY", 1, 2).replace(S("<>"), 0, 0).replace("Z", 5, 9); }, "<>XYdZ"},
        // A range ending before it starts, or starting past the end, adds nothing.
        {"", [](C& s) { s.appendSubString(S("hello"), 1, 3).appendSubString(S("hello"), 3, 99); }, "elllo"},
        {"", [](C& s) { s.appendSubString(S("hello"), 4, 4).appendSubString(S("hello"), 5, 9); }, "o"},
        {"", [](C& s) { s.appendSubString(S("hello"), 3, 1).appendSubString(S(), 0, 0); }, ""},
        {"", [](C& s) { s.appendSubString(S("hello"), 4, 5); }, "o"}, {"xz", [](C& s) { s = kNull; }, "xz"},
        {"xz", [](C& s) { EXPECT_THROW(s.assign("y", 0xFFFFFFFFu), std::bad_alloc); }, "xz"},
        {"xz", [](C& s) { EXPECT_THROW(s.append("y", 0xFFFFFFFFu), std::bad_alloc); }, "xz"},
        {"xz", [](C& s) { EXPECT_THROW(s.append("y", 0xFFFFFFFDu), std::bad_alloc); }, "xz"},
        {"xz", [](C& s) { EXPECT_THROW(s.prepend("y", 0xFFFFFFFEu), std::bad_alloc); }, "xz"},
        {"xz", [](C& s) { EXPECT_THROW(s.insert("y", 1, 0xFFFFFFFDu), std::bad_alloc); }, "xz"},
        {"xz", [](C& s) { EXPECT_THROW(s.append(s.data(), 0xFFFFFFFFu), std::bad_alloc); }, "xz"},
        {"xz", [](C& s) { EXPECT_THROW(s.insert(s.data(), 1, 0xFFFFFFFEu), std::bad_alloc); }, "xz"},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(&c - cases);
        CountingString s(c.start);
        if (c.room != 0) s.reserve(c.room);
        s.calls = 0;
        c.op(s);
        EXPECT_EQ(c.text, zkText(s));
        EXPECT_EQ(c.resizes, s.calls);
        EXPECT_EQ(c.capacity != 0 ? c.capacity : std::strlen(c.start) + kSlack, s.capacity());
    }
}

// The const char* forms read the text up to its first zero byte.
TEST(StringCompare, NamedComparisons) {
    zkForEachRow("str_compare.txt", [](const auto& row) {
        const zkStringBase a = zkStr(row[0]), b = zkStr(row[1]), bText = zkStr(b.data());
        const bool exact = row[2] == "exact";
        const int order = std::stoi(row[3]);
        EXPECT_EQ(order, a.compareTo(b, exact));
        EXPECT_EQ(order < 0, a.lessThan(b, exact));
        EXPECT_EQ(order > 0, a.greaterThan(b, exact));
        EXPECT_EQ(a.compareTo(bText, exact), a.compareTo(b.data(), exact));
        EXPECT_EQ(a.equals(bText, exact), a.equals(b.data(), exact));
    });
    const bool helpers[] = {
        zkStringBase::imemcmp("abc", "ABD", 3) == 'C' - 'D', zkStringBase::imemcmp("abc", "ABD", 2) == 0,
        !zkStringBase::lessThanStrings("a", "A", false),     zkStringBase::lessThanStrings("A", "a", true),
        !zkStringBase::equalStrings("B", "b", true),         zkStringBase::equalStrings("B", "b", false)};
    for (const bool& fact : helpers) EXPECT_TRUE(fact) << "fact " << &fact - helpers;
}

// Operators between strings compare exactly only when both are
// case-sensitive, any non-zero compare type counting as such; a null text
// makes every operator false.
TEST(StringCompare, OperatorsFollowTheCompareType) {
    const zkStringBase seven = zkStr("Abc", static_cast<zkStringBase::CompareType>(7)), none;
    const zkStringBase a = zkStr("a"), foldedA = zkStr("a", kFolded), B = zkStr("B"), foldedB = zkStr("B", kFolded);
    const zkStringBase Abc = zkStr("Abc"), abc = zkStr("abc"), foldedAbc = zkStr("Abc", kFolded);
    // clang-format off
    const bool truths[] = {
        foldedAbc == abc, abc == foldedAbc, seven == zkStr("abc", kFolded), !(Abc == abc), !(abc != foldedAbc),
        Abc != abc, !(seven == "abc"), a > B, !(a < B), a < foldedB, foldedB > a, !(foldedB < a), Abc != "abc",
        foldedAbc == "abc", foldedAbc < "abd", !(foldedAbc > "abd"), !(foldedAbc != "ABC"), !(foldedA < "A"),
        !(foldedA > "A"), zkStr("b") > "a", !(zkStr("b") < "a"), !(a == kNull), !(a != kNull), !(a < kNull),
        !(a > kNull), !(foldedA == kNull), !(foldedA != kNull), !(foldedA < kNull), !(foldedA > kNull),
        !(none == kNull), !(none != kNull), !(none < kNull), !(none > kNull),
    };
    // clang-format on
    for (const bool& fact : truths) EXPECT_TRUE(fact) << "fact " << &fact - truths;
}

TEST(StringSearch, SearchesStopAtTheirBounds) {
    zkForEachRow("str_search.txt", [](const auto& row) {
        const zkStringBase text = zkStr(row[1]);
        const char* pattern = row[2].c_str();
        const unsigned start = position(row[3]), n = position(row[4]);
        const bool exact = row[5] == "exact";
        // clang-format off
        const std::map<std::string, unsigned> found = {
            {"find", text.find(pattern, start, n, exact)}, {"findc", text.find(pattern[0], start, exact)},
            {"findS", text.find(zkStr(row[2]), start, exact)}, {"rfind", text.rfind(pattern, start, n, exact)},
            {"rfindc", text.rfind(pattern[0], start, exact)}, {"rfindS", text.rfind(zkStr(row[2]), start, exact)},
            {"findFirstOf", text.findFirstOf(pattern, start, n, exact)},
            {"findFirstOfS", text.findFirstOf(zkStr(row[2]), start, exact)}};
        // clang-format on
        EXPECT_EQ(position(row[6]), found.at(row[0]));
    });
    // By default from the start (backwards from the end), case-sensitive.
    EXPECT_EQ(4u, zkStr("abxab").rfind('b'));
    EXPECT_EQ(Bad, zkStr("").rfind('a'));
    // Bytes past the length, here left behind by cut, are never searched.
    EXPECT_EQ(Bad, zkStr("hello").cut(2).find('o', 1));
    EXPECT_EQ(Bad, zkStr("hello").cut(2).rfind("hel\0o", Bad, 5, true));
}

// The long search finds what the short one finds, shifted by the filler, and
// a match may end at the last byte.
TEST(StringSearch, FoldedFindSkipsAheadWithoutMissingAMatch) {
    const std::string filler(4096, '-');
    zkForEachRow("str_folded_find.txt", [&](const auto& row) {
        const zkStringBase shortText = zkStr(row[0]), longText = zkStr(filler + row[0]), pattern = zkStr(row[1]);
        const unsigned expected = position(row[2]), shifted = expected == Bad ? expected : expected + 4096u;
        EXPECT_EQ(expected, shortText.find(pattern, 0, false));
        EXPECT_EQ(shifted, longText.find(pattern, 0, false));
        EXPECT_EQ(shifted, longText.find(pattern, 100, false));
    });
}

TEST(StringCut, SubStringCopiesTheRange) {
    zkForEachRow("str_substring.txt", [](const auto& row) {
        const zkStringBase sub = zkStr(row[0], kFolded).subString(position(row[1]), position(row[2]));
        EXPECT_EQ(row[3], zkText(sub));
        EXPECT_EQ(zkStringBase::CaseSensitive, sub.getCompareType());
    });
}

// A field cutter appends up to the first separator within the range and
// returns its position, else BadIndex, and a non-zero clearOnFail then
// empties out.
TEST(StringCut, FieldCutterStopsAtASeparator) {
    zkForEachRow("str_cut_fields.txt", [](const auto& row) {
        const zkStringBase source = zkStr(row[0]), seps = zkStr(row[1]);
        const unsigned from = position(row[2]), to = position(row[3]);
        const int clear = std::stoi(row[4]);
        zkStringBase out = zkStr(row[5]);
        const unsigned result = seps.length() == 1 ? source.subString(seps[0], out, from, to, clear)
                                                   : source.subString(seps, out, from, to, clear);
        EXPECT_EQ(position(row[6]), result);
        EXPECT_EQ(row[7], zkText(out));
    });
}

// The compare type stays.
TEST(StringConvert, NumbersToText) {
    zkStringBase s = zkStr("a longer text than some results below", S::CaseInsensitive);
    zkForEachRow("str_number_text.txt", [&](const auto& row) {
        s.fromDouble(std::stod(row[0]), std::stoi(row[1]));
        EXPECT_EQ(row[2], zkText(s));
    });
    s.fromLong(-42);
    EXPECT_EQ("-42", zkText(s));
    EXPECT_EQ(S::CaseInsensitive, s.getCompareType());
}

TEST(StringConvert, TextToNumbers) {
    zkForEachRow("str_numbers.txt", [](const auto& row) {
        const zkStringBase text = zkStr(row[0]);
        EXPECT_EQ(row[1] == "yes", text.isNumber());
        EXPECT_EQ(std::stol(row[2]), text.asLong());
        EXPECT_EQ(std::stod(row[3]), text.asDouble());
    });
}

// Whitespace is blank, tab and line ends for skipNextWhite, and also \v and
// \f for stripWhite.
TEST(StringText, WhitespaceRules) {
    zkForEachRow("str_skip_white.txt", [](const auto& row) {
        EXPECT_EQ(std::stoul(row[2]), zkStr(row[0]).skipNextWhite(std::stoul(row[1])));
    });
    // clang-format off
    const std::map<std::string, S::StripType> bits = {{"leading", S::StripLeading}, {"trailing", S::StripTrailing},
        {"ends", S::StripEnds}, {"all", S::StripAll}, {"leading|all", S::StripLeading | S::StripAll}};
    // clang-format on
    zkForEachRow("str_strip_white.txt",
                 [&](const auto& row) { EXPECT_EQ(row[2], zkText(zkStr(row[0]).stripWhite(bits.at(row[1])))); });
}

TEST(StringText, CaseChanges) {
    // clang-format off
    const std::map<std::string, void (S::*)()> changes = {{"invertCase", &S::invertCase}, {"toUpper", &S::toUpper},
        {"toLower", &S::toLower}, {"firstUpper", &S::firstUpper}};
    // clang-format on
    zkForEachRow("str_case.txt", [&](const auto& row) {
        zkStringBase s = zkStr(row[1]);
        (s.*changes.at(row[0]))();
        EXPECT_EQ(row[2], zkText(s));
    });
}

// Comparison, search and cutting of zkStringBase. The folded find over long
// strings skips ahead; it is checked against the same search over a short
// string, which tries every position.
#include <gtest/gtest.h>

#include <string>

#include "support/zkStringText.h"
#include "zkStringBase.h"

constexpr unsigned Bad = zkStringBase::BadIndex;
constexpr auto kFolded = zkStringBase::CaseInsensitive;
const char* const kNull = nullptr;

// Exact: -1 or +1 at the first differing unsigned byte; folded: the
// difference of the upper-cased bytes; on an equal prefix the shorter first.
// The const char* forms read the text up to its first zero byte.
TEST(StringCompare, NamedComparisons) {
    // clang-format off
    const struct { std::string a, b; bool exact; short order; } rows[] = {
        {"abc", "abd", true, -1}, {"abc", "ab", true, 1}, {"ab", "abc", true, -1}, {"abc", "abc", true, 0},
        {"abc", "ABC", true, 1}, {"\xff", "a", true, 1}, {{"ab\0", 3}, "ab", true, 1},
        {{"a\0b", 3}, {"a\0c", 3}, true, -1}, {"ABC", "abc", false, 0}, {"a", "e", false, -4}, {"e", "A", false, 4},
        {"ab", "ABC", false, -1}, {"[", "a", false, '[' - 'A'}, {{"a\0b", 3}, {"A\0C", 3}, false, -1},
    };
    // clang-format on
    for (const auto& row : rows) {
        SCOPED_TRACE(row.a + " vs " + row.b);
        const zkStringBase a = zkStr(row.a), b = zkStr(row.b), bText = zkStr(b.data());
        EXPECT_EQ(row.order, a.compareTo(b, row.exact));
        EXPECT_EQ(row.order == 0, a.equals(b, row.exact));
        EXPECT_EQ(row.order < 0, a.lessThan(b, row.exact));
        EXPECT_EQ(row.order > 0, a.greaterThan(b, row.exact));
        EXPECT_EQ(a.compareTo(bText, row.exact), a.compareTo(b.data(), row.exact));
        EXPECT_EQ(a.equals(bText, row.exact), a.equals(b.data(), row.exact));
        EXPECT_EQ(a.lessThan(bText, row.exact), a.lessThan(b.data(), row.exact));
        EXPECT_EQ(a.greaterThan(bText, row.exact), a.greaterThan(b.data(), row.exact));
    }
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
    const zkStringBase hello("hello"), s("abxab"), line("ab\r\n"), empty;
    // clang-format off
    const unsigned found[][2] = {
        {hello.find('l', 3), 3}, {hello.find('h', 1), Bad}, {hello.find('o', 4), 4}, {hello.find('o', 5), Bad},
        {hello.find('L', 0, false), 2}, {hello.find('L', 0, true), Bad}, {hello.find("lo", 0, 0, true), 3},
        {hello.find("lo", 4, 0, true), Bad}, {hello.find("o", 4, 0, true), 4}, {hello.find("LO", 0, 0, false), 3},
        {hello.find("LO", 0, 0, true), Bad}, {hello.find("", 0, 0, true), Bad},
        {zkStr("xHeLLo").find("hello", 0, 0, false), 1}, {hello.find("hello!", 0, 0, true), Bad},
        {hello.find("lox", 0, 2, true), 3}, {zkStr({"a\0b\0c", 5}).find(zkStr({"\0c", 2})), 3},
        {s.rfind(zkStringBase("ab")), 3}, {s.rfind("ab", 2, 0, true), 0}, {s.rfind("ab", 5, 0, true), Bad},
        {s.rfind("AB", Bad, 0, false), 3}, {s.rfind("AB", Bad, 0, true), Bad}, {s.rfind("xz", Bad, 1, true), 2},
        {s.rfind("abxab", Bad, 0, true), 0}, {s.rfind("abxabc", Bad, 0, true), Bad}, {s.rfind("", Bad, 0, true), Bad},
        {s.rfind('b'), 4}, {s.rfind('a', 2), 0}, {s.rfind('b', 0), Bad}, {s.rfind('a', 5), Bad},
        {s.rfind('A', Bad, false), 3}, {s.rfind('Z', Bad, false), Bad}, {s.rfind("ABX", Bad, 0, false), 0}, {empty.rfind('a'), Bad}, {empty.rfind("a", Bad, 0, true), Bad},
        {line.findFirstOf("\r\n", 0, 0, true), 2}, {line.findFirstOf("\n\r", 0, 0, true), 2}, {line.findFirstOf("\n", 3, 0, true), 3},
        {line.findFirstOf("\r\n", 4, 0, true), Bad}, {line.findFirstOf("", 0, 0, true), Bad},
        {line.findFirstOf("XB", 0, 0, false), 1}, {line.findFirstOf("X\n", 2, 0, false), 3},
        {line.findFirstOf("XB\n", 0, 0, true), 3}, {zkStr("ab\n").findFirstOf("\r\n", 0, 1, true), Bad},
        {zkStr({"a\0b", 3}).findFirstOf(zkStr({"\0", 1})), 1},
    };
    // clang-format on
    for (const auto& row : found) EXPECT_EQ(row[1], row[0]) << "row " << &row - found;
}

// The same tail behind a long filler that holds no match: the long search
// finds what the short one finds, shifted by the filler. Bytes from 0x80 up
// fold only as the locale says (not at all by default), and a match may end
// at the last byte.
TEST(StringSearch, FoldedFindSkipsAheadWithoutMissingAMatch) {
    const std::string filler(4096, '-');
    // clang-format off
    const struct { std::string tail, pattern; } cases[] = {
        {"abc xyzXYZ", "xYz"}, {"zz Hello\xC4\xE4 hello\xE4\xE4", "HELLO\xE4\xE4"}, {"aaaaaaaaab", "AAB"},
        {"no match here", "MATCHES"}, {"\xE9t\xC9T\xE9T", "\xC9t"}, {"end", "END"}, {"ba", "AB"},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(c.tail);
        const zkStringBase shortText = zkStr(c.tail), longText = zkStr(filler + c.tail), pattern = zkStr(c.pattern);
        const unsigned expected = shortText.find(pattern, 0, false);
        const unsigned shifted = expected == zkStringBase::BadIndex ? expected : expected + 4096u;
        EXPECT_EQ(shifted, longText.find(pattern, 0, false));
        EXPECT_EQ(shifted, longText.find(pattern, 100, false));
    }
    EXPECT_EQ(4096u + 3u, zkStr(filler + "zz Hello").find(zkStr("HELLO"), 0, false));
    EXPECT_EQ(zkStringBase::BadIndex, zkStr(filler + "zz Hell").find(zkStr("HELLO"), 0, false));
}

// subString(from, to) makes a new case-sensitive string.
TEST(StringCut, SubStringCopiesTheRange) {
    const zkStringBase hello = zkStr("hello", kFolded);
    EXPECT_EQ(zkStringBase::CaseSensitive, hello.subString(0, Bad).getCompareType());
    // clang-format off
    const std::pair<zkStringBase, std::string> subs[] = {
        {hello.subString(1, 3), "ell"}, {hello.subString(1, Bad), "ello"}, {hello.subString(0, 0), "h"},
        {hello.subString(3, 1), ""}, {hello.subString(5, 9), ""}, {zkStr({"a\0bc", 4}).subString(1, 2), {"\0b", 2}},
    };
    // clang-format on
    for (const auto& sub : subs) EXPECT_EQ(sub.second, zkText(sub.first)) << "row " << &sub - subs;
}

// A field cutter appends up to the first separator within the range and
// returns its position, else BadIndex, and a non-zero clearOnFail then
// empties out.
TEST(StringCut, FieldCutterStopsAtASeparator) {
    // clang-format off
    const struct { std::string source, seps; unsigned from, to; int clear; const char* before; unsigned result;
                   std::string after; } cuts[] = {
        {"a,bc", ",", 0, Bad, 0, "X", 1, "Xa"},    {"a,bc", ",", 2, Bad, 0, "", Bad, "bc"},
        {"a,bc", ",", 2, Bad, 1, "k", Bad, ""},    {"a,bc", ",", 1, Bad, 1, "k", 1, "k"},
        {"a,bc", ",", 0, 0, 0, "", Bad, "a"},      {"a,bc", ",", 4, Bad, 0, "k", Bad, "k"},
        {"a,bc", ",", Bad, Bad, 0, "k", Bad, "k"}, {"a,bc", ",", 3, 2, 2, "k", Bad, ""},
        {"", ",", 0, Bad, 1, "k", Bad, ""},        {"x,,yz", ",", 3, 99, 0, "", Bad, "yz"},
        {"a;b,c", ",;", 2, Bad, 0, "=", 3, "=b"},  {"a;b,c", ",;", 4, Bad, 0, "", Bad, "c"},
        {"a;b,c", ",;", 1, 1, 1, "", 1, ""},       {"a;b,c", ",;", 2, 2, 0, "", Bad, "b"},   {"a;b,c", ",;=", 2, 2, 0, "", Bad, "b"},
        {"a;b", "", 0, Bad, 0, "", Bad, "a;b"},    {{"a\0b", 3}, {"\0", 1}, 0, Bad, 0, "", 1, "a"},
    };
    // clang-format on
    for (const auto& c : cuts) {
        SCOPED_TRACE(c.source + " from " + std::to_string(c.from));
        const zkStringBase source = zkStr(c.source);
        zkStringBase out(c.before);
        const unsigned result = c.seps.size() == 1 ? source.subString(c.seps[0], out, c.from, c.to, c.clear)
                                                   : source.subString(zkStr(c.seps), out, c.from, c.to, c.clear);
        EXPECT_EQ(c.result, result);
        EXPECT_EQ(c.after, zkText(out));
    }
}

// Comparison, search and cutting of zkStringBase.
#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <tuple>

#include "zkStringBase.h"

namespace {

constexpr unsigned Bad = zkStringBase::BadIndex;
constexpr auto kFolded = zkStringBase::CaseInsensitive;
const char* const kNull = nullptr;

zkStringBase str(const std::string& text, zkStringBase::CompareType type = zkStringBase::CaseSensitive) {
    zkStringBase s(text.data(), static_cast<unsigned>(text.size()));
    s.setCompareType(type);
    return s;
}

std::string text(const zkStringBase& s) {
    return std::string(s.data(), s.length());
}

}  // namespace

// Exact: -1 or +1 at the first differing unsigned byte; folded: the
// difference of the upper-cased bytes; on an equal prefix the shorter first.
TEST(StringCompare, NamedComparisonsAndOperatorsAgree) {
    const struct {
        std::string a, b;
        bool exact;
        short order;
    } cases[] = {
        {"abc", "abd", true, -1},     {"abc", "ab", true, 1},
        {"ab", "abc", true, -1},      {"abc", "abc", true, 0},
        {"abc", "ABC", true, 1},      {"\xff", "a", true, 1},
        {{"ab\0", 3}, "ab", true, 1}, {{"a\0b", 3}, {"a\0c", 3}, true, -1},
        {"ABC", "abc", false, 0},     {"a", "e", false, -4},
        {"e", "A", false, 4},         {"ab", "ABC", false, -1},
        {"[", "a", false, '[' - 'A'}, {{"a\0b", 3}, {"A\0C", 3}, false, -1},
    };
    for (const auto& c : cases) {
        const zkStringBase a = str(c.a), b = str(c.b);
        const auto all = [&](const auto& other) {
            return std::make_tuple(a.compareTo(other, c.exact), a.equals(other, c.exact), a.lessThan(other, c.exact),
                                   a.greaterThan(other, c.exact));
        };
        const auto expected = std::make_tuple(c.order, c.order == 0, c.order<0, c.order> 0);
        EXPECT_EQ(expected, all(b)) << c.a << " " << c.b;
        EXPECT_TRUE(std::strlen(b.data()) != b.length() || expected == all(b.data())) << c.a << " " << c.b;
    }
    EXPECT_TRUE(zkStringBase::imemcmp("abc", "ABD", 3) == 'C' - 'D' && zkStringBase::imemcmp("abc", "ABD", 2) == 0);
    EXPECT_FALSE(zkStringBase::lessThanStrings("a", "A", false) || zkStringBase::equalStrings("B", "b", true));

    // Operators between strings compare exactly only when both are
    // case-sensitive, any non-zero compare type counting as such; a null text
    // makes every operator false.
    const zkStringBase seven = str("Abc", static_cast<zkStringBase::CompareType>(7)), none;
    EXPECT_TRUE(str("Abc", kFolded) == str("abc") && str("abc") == str("Abc", kFolded) && seven == str("abc", kFolded));
    EXPECT_FALSE(str("Abc") == str("abc") || str("abc") != str("Abc", kFolded) || seven == "abc");
    EXPECT_TRUE(str("a") > str("B") && str("a") < str("B", kFolded) && str("B", kFolded) > str("a"));
    EXPECT_TRUE(str("Abc") != "abc" && str("Abc", kFolded) == "abc" && str("Abc", kFolded) < "abd");
    EXPECT_FALSE(str("Abc", kFolded) != "ABC" || str("a", kFolded) < "A");
    for (const zkStringBase& t : {str("x"), str("x", kFolded), none})
        EXPECT_FALSE(t == kNull || t != kNull || t < kNull || t > kNull);
}

TEST(StringSearch, FindRfindAndFindFirstOfBoundaries) {
    const zkStringBase hello("hello"), s("abxab"), line("ab\r\n"), empty;
    const unsigned found[][2] = {
        {hello.find('l', 3), 3},
        {hello.find('h', 1), Bad},
        {hello.find('o', 4), 4},
        {hello.find('o', 5), Bad},
        {hello.find('L', 0, false), 2},
        {hello.find('L', 0, true), Bad},
        {hello.find("lo", 0, 0, true), 3},
        {hello.find("lo", 4, 0, true), Bad},
        {hello.find("o", 4, 0, true), 4},
        {hello.find("LO", 0, 0, false), 3},
        {hello.find("LO", 0, 0, true), Bad},
        {hello.find("", 0, 0, true), Bad},
        {str("xHeLLo").find("hello", 0, 0, false), 1},
        {hello.find("hello!", 0, 0, true), Bad},
        {hello.find("lox", 0, 2, true), 3},
        {str({"a\0b\0c", 5}).find(str({"\0c", 2})), 3},
        {s.rfind(zkStringBase("ab")), 3},
        {s.rfind("ab", 2, 0, true), 0},
        {s.rfind("ab", 5, 0, true), Bad},
        {s.rfind("AB", Bad, 0, false), 3},
        {s.rfind("AB", Bad, 0, true), Bad},
        {s.rfind("xz", Bad, 1, true), 2},
        {s.rfind("abxab", Bad, 0, true), 0},
        {s.rfind("abxabc", Bad, 0, true), Bad},
        {s.rfind("", Bad, 0, true), Bad},
        {s.rfind('b'), 4},
        {s.rfind('a', 2), 0},
        {s.rfind('b', 0), Bad},
        {s.rfind('a', 5), Bad},
        {s.rfind('A', Bad, false), 3},
        {empty.rfind('a'), Bad},
        {empty.rfind("a", Bad, 0, true), Bad},
        {line.findFirstOf("\r\n", 0, 0, true), 2},
        {line.findFirstOf("\n", 3, 0, true), 3},
        {line.findFirstOf("\r\n", 4, 0, true), Bad},
        {line.findFirstOf("", 0, 0, true), Bad},
        {line.findFirstOf("XB", 0, 0, false), 1},
        {line.findFirstOf("X\n", 2, 0, false), 3},
        {line.findFirstOf("XB\n", 0, 0, true), 3},
        {str("ab\n").findFirstOf("\r\n", 0, 1, true), Bad},
        {str({"a\0b", 3}).findFirstOf(str({"\0", 1})), 1},
    };
    for (const auto& row : found) EXPECT_EQ(row[1], row[0]) << "row " << &row - found;
}

// subString(from, to) makes a new case-sensitive string; a field cutter
// appends up to the first separator within the range and returns its
// position, else BadIndex, and a non-zero clearOnFail then empties out.
TEST(StringCut, SubStringAndFieldCutters) {
    const zkStringBase hello = str("hello", kFolded);
    EXPECT_EQ(zkStringBase::CaseSensitive, hello.subString(0, Bad).getCompareType());
    const std::pair<zkStringBase, std::string> subs[] = {
        {hello.subString(1, 3), "ell"}, {hello.subString(1, Bad), "ello"},
        {hello.subString(0, 0), "h"},   {hello.subString(3, 1), ""},
        {hello.subString(5, 9), ""},    {str({"a\0bc", 4}).subString(1, 2), {"\0b", 2}},
    };
    for (const auto& sub : subs) EXPECT_EQ(sub.second, text(sub.first));

    const struct {
        std::string source, seps;
        unsigned from, to;
        int clear;
        const char* before;
        unsigned result;
        std::string after;
    } cuts[] = {
        {"a,bc", ",", 0, Bad, 0, "X", 1, "Xa"},    {"a,bc", ",", 2, Bad, 0, "", Bad, "bc"},
        {"a,bc", ",", 2, Bad, 1, "k", Bad, ""},    {"a,bc", ",", 1, Bad, 1, "k", 1, "k"},
        {"a,bc", ",", 0, 0, 0, "", Bad, "a"},      {"a,bc", ",", 4, Bad, 0, "k", Bad, "k"},
        {"a,bc", ",", Bad, Bad, 0, "k", Bad, "k"}, {"a,bc", ",", 3, 2, 2, "k", Bad, ""},
        {"", ",", 0, Bad, 1, "k", Bad, ""},        {"x,,yz", ",", 3, 99, 0, "", Bad, "yz"},
        {"a;b,c", ",;", 2, Bad, 0, "=", 3, "=b"},  {"a;b,c", ",;", 4, Bad, 0, "", Bad, "c"},
        {"a;b,c", ",;", 1, 1, 1, "", 1, ""},       {"a;b,c", ",;", 2, 2, 0, "", Bad, "b"},
        {"a;b", "", 0, Bad, 0, "", Bad, "a;b"},    {{"a\0b", 3}, {"\0", 1}, 0, Bad, 0, "", 1, "a"},
    };
    for (const auto& c : cuts) {
        const zkStringBase source = str(c.source);
        zkStringBase out(c.before);
        const unsigned result = c.seps.size() == 1 ? source.subString(c.seps[0], out, c.from, c.to, c.clear)
                                                   : source.subString(str(c.seps), out, c.from, c.to, c.clear);
        EXPECT_EQ(c.result, result) << c.source << " from " << c.from;
        EXPECT_EQ(c.after, text(out)) << c.source << " from " << c.from;
    }
}

// Comparison, search and cutting of zkStringBase.
#include "zkStringBase.h"

#include <gtest/gtest.h>

#include <string>

namespace {

constexpr unsigned Bad = zkStringBase::BadIndex;

// The bytes of s, after checking that the terminator is in place.
std::string bytes(const zkStringBase& s) {
    EXPECT_EQ('\0', s.data()[s.length()]);
    return std::string(s.data(), s.length());
}

zkStringBase folded(const char* text) {
    zkStringBase s(text);
    s.setCompareType(zkStringBase::CaseInsensitive);
    return s;
}

// One call of a field cutter: the source, the range, the flag, what out held
// before, and the expected result and out afterwards.
struct Cut {
    const char* source;
    unsigned from, to;
    int clearOnFail;
    const char* before;
    unsigned result;
    const char* after;
};

}  // namespace

TEST(StringCompare, ExactGivesOneStepOnUnsignedBytes) {
    const zkStringBase abc("abc");
    EXPECT_EQ(-1, abc.compareTo(zkStringBase("abd"), true));
    EXPECT_EQ(1, abc.compareTo(zkStringBase("ab"), true));
    EXPECT_EQ(-1, zkStringBase("ab").compareTo(abc, true));
    EXPECT_EQ(0, abc.compareTo(zkStringBase("abc"), true));
    EXPECT_EQ(-1, zkStringBase("a").compareTo("z", true));
    EXPECT_EQ(1, abc.compareTo("ABC", true));
    EXPECT_EQ(1, zkStringBase("\xff").compareTo("a", true));
    EXPECT_EQ(-1, zkStringBase("a\0b", 3).compareTo(zkStringBase("a\0c", 3), true));
    EXPECT_EQ(0, zkStringBase("ab").compareTo("ab\0c", true));
}

TEST(StringCompare, FoldedGivesDifferenceOfFoldedBytes) {
    EXPECT_EQ(0, zkStringBase("ABC").compareTo(zkStringBase("abc"), false));
    EXPECT_EQ(-4, zkStringBase("a").compareTo(zkStringBase("e"), false));
    EXPECT_EQ(4, zkStringBase("e").compareTo("A", false));
    EXPECT_EQ(-1, zkStringBase("ab").compareTo("ABC", false));
    EXPECT_EQ(-1, zkStringBase("a\0b", 3).compareTo(zkStringBase("A\0C", 3), false));

    EXPECT_EQ(0, zkStringBase::imemcmp("abc", "ABD", 0));
    EXPECT_EQ(0, zkStringBase::imemcmp("abc", "ABD", 2));
    EXPECT_EQ('C' - 'D', zkStringBase::imemcmp("abc", "ABD", 3));
    EXPECT_EQ('[' - 'A', zkStringBase::imemcmp("[", "a", 1));
}

TEST(StringCompare, EqualsOrderingAndStaticHelpers) {
    const zkStringBase abc("abc");
    EXPECT_FALSE(abc.equals(zkStringBase("abcd"), true));
    EXPECT_FALSE(abc.equals("ab", false));
    EXPECT_FALSE(abc.equals("ABC", true));
    EXPECT_TRUE(abc.equals("ABC", false));
    EXPECT_FALSE(zkStringBase("a\0b", 3).equals(zkStringBase("a\0c", 3), true));
    EXPECT_FALSE(zkStringBase("ab\0", 3).equals("ab", true));

    const zkStringBase b("B");
    EXPECT_FALSE(b.greaterThan("a", true));
    EXPECT_TRUE(b.greaterThan("a", false));
    EXPECT_TRUE(b.lessThan(zkStringBase("a"), true));
    EXPECT_FALSE(b.lessThan(zkStringBase("b"), false));

    EXPECT_TRUE(zkStringBase::equalStrings("ABC", "abc", false));
    EXPECT_FALSE(zkStringBase::equalStrings("ABC", "abc", true));
    EXPECT_TRUE(zkStringBase::lessThanStrings("a", "e", true));
    EXPECT_TRUE(zkStringBase::lessThanStrings("a", "e", false));
    EXPECT_TRUE(zkStringBase::lessThanStrings("B", "a", true));
    EXPECT_FALSE(zkStringBase::lessThanStrings("B", "a", false));
    EXPECT_FALSE(zkStringBase::lessThanStrings("a", "A", false));
}

TEST(StringCompare, OperatorsFoldWhenEitherSideIsCaseInsensitive) {
    const zkStringBase strict("abc");
    EXPECT_TRUE(folded("Abc") == strict);
    EXPECT_TRUE(strict == folded("Abc"));
    EXPECT_FALSE(strict != folded("Abc"));
    EXPECT_FALSE(zkStringBase("Abc") == strict);
    EXPECT_TRUE(zkStringBase("Abc") != strict);

    const zkStringBase lower("a");
    EXPECT_TRUE(lower > zkStringBase("B"));
    EXPECT_TRUE(lower < folded("B"));
    EXPECT_TRUE(folded("B") > lower);
    EXPECT_FALSE(folded("a") < zkStringBase("A"));

    zkStringBase s("Abc");
    EXPECT_FALSE(s == "abc");
    EXPECT_TRUE(s != "abc");
    s.setCompareType(zkStringBase::CaseInsensitive);
    EXPECT_TRUE(s == "abc");
    EXPECT_FALSE(s != "ABC");
    EXPECT_TRUE(s < "abd");
    EXPECT_TRUE(s > "ABB");
    s.setCompareType(static_cast<zkStringBase::CompareType>(7));
    EXPECT_FALSE(s == "abc");
    EXPECT_TRUE(s == folded("abc"));

    const char* none = nullptr;
    for (const zkStringBase& t : {zkStringBase("x"), folded("x"), zkStringBase()}) {
        EXPECT_FALSE(t == none);
        EXPECT_FALSE(t != none);
        EXPECT_FALSE(t < none);
        EXPECT_FALSE(t > none);
    }
}

TEST(StringSearch, FindCharAndText) {
    const zkStringBase hello("hello");
    EXPECT_EQ(2u, hello.find('l'));
    EXPECT_EQ(3u, hello.find('l', 3));
    EXPECT_EQ(Bad, hello.find('h', 1));
    EXPECT_EQ(Bad, hello.find('o', 5));
    EXPECT_EQ(2u, hello.find('L', 0, false));
    EXPECT_EQ(Bad, hello.find('L', 0, true));

    EXPECT_EQ(3u, hello.find("lo", 0, 0, true));
    EXPECT_EQ(Bad, hello.find("lo", 4, 0, true));
    EXPECT_EQ(4u, hello.find("o", 4, 0, true));
    EXPECT_EQ(3u, hello.find("LO", 0, 0, false));
    EXPECT_EQ(Bad, hello.find("LO", 0, 0, true));
    EXPECT_EQ(1u, zkStringBase("xHeLLo").find("hello", 0, 0, false));
    EXPECT_EQ(Bad, hello.find("l", 5, 0, true));
    EXPECT_EQ(Bad, hello.find("hello!", 0, 0, true));
    EXPECT_EQ(Bad, hello.find("llo", 3, 0, true));
    EXPECT_EQ(3u, hello.find("lox", 0, 2, true));
    EXPECT_EQ(0u, hello.find(hello));
    EXPECT_EQ(Bad, hello.find("", 0, 0, true));
    EXPECT_EQ(3u, zkStringBase("a\0b\0c", 5).find(zkStringBase("\0c", 2)));
}

TEST(StringSearch, RfindFromEndOrStart) {
    const zkStringBase s("abxab");
    EXPECT_EQ(3u, s.rfind(zkStringBase("ab")));
    EXPECT_EQ(0u, s.rfind("ab", 2, 0, true));
    EXPECT_EQ(3u, s.rfind("ab", 4, 0, true));
    EXPECT_EQ(Bad, s.rfind("ab", 5, 0, true));
    EXPECT_EQ(3u, s.rfind("AB", Bad, 0, false));
    EXPECT_EQ(Bad, s.rfind("AB", Bad, 0, true));
    EXPECT_EQ(2u, s.rfind("xz", Bad, 1, true));
    EXPECT_EQ(0u, s.rfind("abxab", Bad, 0, true));
    EXPECT_EQ(Bad, s.rfind("abxabc", Bad, 0, true));
    EXPECT_EQ(Bad, s.rfind("", Bad, 0, true));

    EXPECT_EQ(3u, s.rfind('a'));
    EXPECT_EQ(0u, s.rfind('a', 2));
    EXPECT_EQ(Bad, s.rfind('b', 0));
    EXPECT_EQ(Bad, s.rfind('a', 5));
    EXPECT_EQ(3u, s.rfind('A', Bad, false));

    for (unsigned start : {0u, 1u, Bad}) {
        EXPECT_EQ(Bad, zkStringBase().rfind("a", start, 0, true));
        EXPECT_EQ(Bad, zkStringBase().rfind('a', start));
    }
}

TEST(StringSearch, FindFirstOfReachesTheLastByte) {
    const zkStringBase line("ab\r\n");
    EXPECT_EQ(2u, line.findFirstOf("\r\n", 0, 0, true));
    EXPECT_EQ(3u, line.findFirstOf("\r\n", 3, 0, true));
    EXPECT_EQ(Bad, line.findFirstOf("\r\n", 4, 0, true));
    EXPECT_EQ(Bad, line.findFirstOf("", 0, 0, true));
    EXPECT_EQ(1u, line.findFirstOf("XB", 0, 0, false));
    EXPECT_EQ(Bad, line.findFirstOf("XB", 0, 0, true));
    EXPECT_EQ(Bad, zkStringBase("ab\n").findFirstOf("\r\n", 0, 1, true));
    EXPECT_EQ(1u, zkStringBase("a\0b", 3).findFirstOf(zkStringBase("\0", 1)));
}

TEST(StringCut, SubStringRanges) {
    const zkStringBase hello = folded("hello");
    EXPECT_EQ("ell", bytes(hello.subString(1, 3)));
    EXPECT_EQ("ello", bytes(hello.subString(1, Bad)));
    EXPECT_EQ("h", bytes(hello.subString(0, 0)));
    EXPECT_EQ("", bytes(hello.subString(3, 1)));
    EXPECT_EQ("", bytes(hello.subString(5, 9)));
    EXPECT_EQ("", bytes(zkStringBase().subString(0, Bad)));
    const zkStringBase all = hello.subString(0, Bad);
    EXPECT_EQ(zkStringBase::CaseSensitive, all.getCompareType());
    EXPECT_GE(all.capacity(), all.length() + 1);
    EXPECT_EQ(std::string("\0b", 2), bytes(zkStringBase("a\0bc", 4).subString(1, 2)));
}

TEST(StringCut, FieldCutterAppendsUpToTheSeparator) {
    const Cut cuts[] = {
        {"a,bc", 0, Bad, 0, "X", 1, "Xa"},     {"a,bc", 2, Bad, 0, "", Bad, "bc"},
        {"a,bc", 2, Bad, 1, "k", Bad, ""},     {"a,bc", 1, Bad, 1, "k", 1, "k"},
        {"a,bc", 0, 0, 0, "", Bad, "a"},       {"a,bc", 4, Bad, 0, "k", Bad, "k"},
        {"a,bc", Bad, Bad, 0, "k", Bad, "k"},  {"a,bc", 3, 2, 2, "k", Bad, ""},
        {"", 0, Bad, 0, "k", Bad, "k"},        {"", 0, Bad, 1, "k", Bad, ""},
        {"x,,yz", 2, Bad, 1, "", 2, ""},       {"x,,yz", 3, 99, 0, "", Bad, "yz"},
    };
    for (const Cut& c : cuts) {
        zkStringBase out(c.before);
        EXPECT_EQ(c.result, zkStringBase(c.source).subString(',', out, c.from, c.to, c.clearOnFail))
            << c.source << " from " << c.from;
        EXPECT_EQ(c.after, bytes(out)) << c.source << " from " << c.from;
    }
}

TEST(StringCut, SeparatorSetCutter) {
    const Cut cuts[] = {
        {"a;b,c", 0, Bad, 0, "", 1, "a"},      {"a;b,c", 2, Bad, 0, "=", 3, "=b"},
        {"a;b,c", 4, Bad, 0, "", Bad, "c"},    {"a;b,c", 4, Bad, 1, "k", Bad, ""},
        {"a,b", 2, Bad, 0, "", Bad, "b"},      {"a;b,c", 1, 1, 1, "", 1, ""},
        {"a;b,c", 2, 2, 0, "", Bad, "b"},      {"a;b,c", 3, 2, 1, "k", Bad, ""},
        {"", 0, Bad, 0, "k", Bad, "k"},        {"", 0, Bad, 1, "k", Bad, ""},
    };
    const zkStringBase seps(",;");
    for (const Cut& c : cuts) {
        zkStringBase out(c.before);
        EXPECT_EQ(c.result, zkStringBase(c.source).subString(seps, out, c.from, c.to, c.clearOnFail))
            << c.source << " from " << c.from;
        EXPECT_EQ(c.after, bytes(out)) << c.source << " from " << c.from;
    }

    zkStringBase out;
    EXPECT_EQ(Bad, zkStringBase("a;b").subString(zkStringBase(), out, 0, Bad, 0));
    EXPECT_EQ("a;b", bytes(out));
    out.makeNull();
    EXPECT_EQ(1u, zkStringBase("a\0b", 3).subString(zkStringBase("\0", 1), out, 0, Bad, 0));
    EXPECT_EQ("a", bytes(out));
}

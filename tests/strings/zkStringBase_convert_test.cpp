// Number conversion, case changes and whitespace handling of zkStringBase.
#include "zkStringBase.h"

#include <gtest/gtest.h>

#include <cfloat>
#include <climits>
#include <cstdio>
#include <string>

namespace {

// The bytes of s, after checking that the terminator is in place.
std::string bytes(const zkStringBase& s) {
    EXPECT_EQ('\0', s.data()[s.length()]);
    return std::string(s.data(), s.length());
}

std::string printedFixed(double value, int decimals) {
    char buf[512];
    std::snprintf(buf, sizeof buf, "%.*f", decimals, value);
    return buf;
}

}  // namespace

TEST(StringConvert, AsLongAndAsDouble) {
    EXPECT_EQ(12L, zkStringBase(" 12ab").asLong());
    EXPECT_EQ(0L, zkStringBase("ab").asLong());
    EXPECT_EQ(-7L, zkStringBase("\n -7").asLong());
    EXPECT_EQ(LONG_MAX, zkStringBase("99999999999999999999999").asLong());
    EXPECT_EQ(LONG_MIN, zkStringBase("-99999999999999999999999").asLong());

    EXPECT_DOUBLE_EQ(25.0, zkStringBase("2.5e1x").asDouble());
    EXPECT_DOUBLE_EQ(-0.5, zkStringBase(" -.5").asDouble());
    EXPECT_DOUBLE_EQ(1.0, zkStringBase("1e").asDouble());
    EXPECT_EQ(0.0, zkStringBase("x1").asDouble());
}

TEST(StringConvert, FromDoubleKeepsCompareTypeAndHandlesAnyMagnitude) {
    zkStringBase s("a longer text than any result below");
    s.setCompareType(zkStringBase::CaseInsensitive);
    s.fromDouble(3.14159, 2);
    EXPECT_EQ("3.14", bytes(s));
    EXPECT_EQ(zkStringBase::CaseInsensitive, s.getCompareType());
    s.fromDouble(2.5, 0);
    EXPECT_EQ("2", bytes(s));
    s.fromDouble(-0.05, 1);
    EXPECT_EQ(printedFixed(-0.05, 1), bytes(s));

    for (double v : {1e300, -1e300, DBL_MAX}) {
        zkStringBase big(4u);
        big.fromDouble(v, 2);
        EXPECT_EQ(printedFixed(v, 2), bytes(big));
    }
}

TEST(StringConvert, FromLongReplacesTextAndKeepsCompareType) {
    zkStringBase s("previous text");
    s.setCompareType(zkStringBase::CaseInsensitive);
    s.fromLong(-42);
    EXPECT_EQ("-42", bytes(s));
    EXPECT_EQ(zkStringBase::CaseInsensitive, s.getCompareType());
    s.fromLong(0);
    EXPECT_EQ("0", bytes(s));
    for (long v : {LONG_MAX, LONG_MIN}) {
        char expected[32];
        std::snprintf(expected, sizeof expected, "%ld", v);
        zkStringBase edge(1u);
        edge.fromLong(v);
        EXPECT_EQ(expected, bytes(edge));
    }
}

TEST(StringConvert, IsNumberAcceptsOnlyWholeNumbers) {
    for (const char* text : {"42", " -7", "\t 5", "3.", ".5", "1e5", "1E-3", "2e+", "1e-", "-1e-5", "+0.5e+10"}) {
        EXPECT_TRUE(zkStringBase(text).isNumber()) << '\'' << text << '\'';
    }
    for (const char* text : {"", " ", ".", "-", "5 ", "1.2.3", "1e5.2", "1e2e3", "e5", "+-1", "1,5", "0x1F", "1e",
                             "5-", "-.5", "\n5", "1e5+", "- 5", "1.e", "\xb5"}) {
        EXPECT_FALSE(zkStringBase(text).isNumber()) << '\'' << text << '\'';
    }
    std::string digits(300, '7');
    EXPECT_TRUE(zkStringBase(digits.c_str()).isNumber());
    EXPECT_FALSE(zkStringBase((digits + "x").c_str()).isNumber());
    EXPECT_FALSE(zkStringBase("12\0" "3", 4).isNumber());
}

TEST(StringWhite, SkipNextWhiteStepsOverBlanksAndLineEnds) {
    EXPECT_EQ(4u, zkStringBase(" \t\r\nx").skipNextWhite(0));
    EXPECT_EQ(3u, zkStringBase("   ").skipNextWhite(0));
    EXPECT_EQ(9u, zkStringBase("abc").skipNextWhite(9));
    EXPECT_EQ(3u, zkStringBase("abc").skipNextWhite(3));
    EXPECT_EQ(2u, zkStringBase("a b").skipNextWhite(1));
    EXPECT_EQ(0u, zkStringBase("\vx").skipNextWhite(0));
    EXPECT_EQ(0u, zkStringBase("\fx").skipNextWhite(0));
    EXPECT_EQ(0u, zkStringBase().skipNextWhite(0));
}

TEST(StringCase, CaseChangesTouchOnlyAsciiLetters) {
    zkStringBase s("AbC1 z\xc9");
    s.setCompareType(zkStringBase::CaseInsensitive);
    const unsigned cap = s.capacity();
    s.toLower();
    EXPECT_EQ("abc1 z\xc9", bytes(s));
    s.toUpper();
    EXPECT_EQ("ABC1 Z\xc9", bytes(s));
    EXPECT_EQ(cap, s.capacity());
    EXPECT_EQ(zkStringBase::CaseInsensitive, s.getCompareType());

    zkStringBase inv("aB1\xe9");
    inv.invertCase();
    EXPECT_EQ("Ab1\xe9", bytes(inv));

    zkStringBase words("hello  big\tworld");
    words.firstUpper();
    EXPECT_EQ("Hello  Big\tWorld", bytes(words));
    zkStringBase mixed("hELLO\nwORLD\vx y");
    mixed.firstUpper();
    EXPECT_EQ("HELLO\nWORLD\vX Y", bytes(mixed));
    zkStringBase empty;
    empty.firstUpper();
    EXPECT_EQ("", bytes(empty));
    zkStringBase withZero("a\0b", 3);
    withZero.toUpper();
    EXPECT_EQ(std::string("A\0B", 3), bytes(withZero));
}

TEST(StringWhite, StripWhiteByBits) {
    const struct {
        const char* text;
        zkStringBase::StripType bits;
        const char* expected;
    } cases[] = {
        {"  a b  ", zkStringBase::StripEnds, "a b"},
        {"  a b  ", zkStringBase::StripAll, "ab"},
        {"   ", zkStringBase::StripTrailing, ""},
        {"   ", zkStringBase::StripLeading, ""},
        {"a  ", zkStringBase::StripLeading, "a  "},
        {" a ", zkStringBase::StripTrailing, " a"},
        {" \t\r\n\v\fa\v b\f", zkStringBase::StripEnds, "a\v b"},
        {" a\tb ", zkStringBase::StripLeading | zkStringBase::StripAll, "ab"},
        {"\t\t", zkStringBase::StripAll, ""},
        {"", zkStringBase::StripEnds, ""},
    };
    for (const auto& c : cases) {
        zkStringBase s(c.text);
        const unsigned capacity = s.capacity();
        EXPECT_EQ(&s, &s.stripWhite(c.bits));
        EXPECT_EQ(c.expected, bytes(s)) << '\'' << c.text << "' bits " << c.bits;
        EXPECT_EQ(capacity, s.capacity());
    }
    zkStringBase zero(" \0 ", 3);
    zero.stripWhite(zkStringBase::StripEnds);
    EXPECT_EQ(std::string("\0", 1), bytes(zero));
}

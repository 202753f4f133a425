// Number conversion, case changes and whitespace handling of zkStringBase.
#include <gtest/gtest.h>

#include <cfloat>
#include <cstdio>
#include <string>
#include <utility>

#include "support/zkStringText.h"
#include "zkStringBase.h"

using S = zkStringBase;

// Texts up to and past the fixed buffer come out whole; the compare type stays.
TEST(StringConvert, NumbersToText) {
    zkStringBase s("a longer text than some results below");
    s.setCompareType(zkStringBase::CaseInsensitive);
    const std::pair<double, int> numbers[] = {{3.14159, 2}, {-0.05, 1}, {1.0, 125}, {1.0, 126}, {DBL_MAX, 2}};
    for (const auto& n : numbers) {
        char expected[512];
        std::snprintf(expected, sizeof expected, "%.*f", n.second, n.first);
        s.fromDouble(n.first, n.second);
        EXPECT_EQ(expected, zkText(s));
    }
    s.fromLong(-42);
    EXPECT_EQ("-42", zkText(s));
    EXPECT_EQ(zkStringBase::CaseInsensitive, s.getCompareType());
}

// Decimal, as strtol and strtod read it: leading blanks and a sign allowed,
// stopping at the first byte that does not fit.
TEST(StringConvert, TextToNumbers) {
    // clang-format off
    const struct { const char* text; long asLong; double asDouble; } rows[] = {
        {"10", 10, 10.0}, {" -907x", -907, -907.0}, {"0x1A", 0, 26.0}, {"2.5e1", 2, 25.0}, {"", 0, 0.0},
    };
    // clang-format on
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        EXPECT_EQ(row.asLong, S(row.text).asLong());
        EXPECT_EQ(row.asDouble, S(row.text).asDouble());
    }
}

// isNumber accepts only whole decimal numbers: a sign, digits with at most one
// point, an exponent, blanks only in front.
TEST(StringConvert, IsNumberAcceptsWholeDecimalNumbers) {
    // clang-format off
    const std::pair<std::string, bool> rows[] = {
        {"42", true}, {" -7", true}, {"\t 5", true}, {"3.", true}, {".5", true}, {"1e5", true}, {"1E-3", true},
        {"2e+", true}, {"1e-", true}, {"-1e-5", true}, {"+0.5e+10", true}, {"", false}, {" ", false}, {".", false},
        {"-", false}, {"5 ", false}, {"1.2.3", false}, {"1e5.2", false}, {"1e2e3", false}, {"e5", false},
        {"+-1", false}, {"1,5", false}, {"0x1F", false}, {"1e", false}, {"5-", false}, {"1-2", false},
        {"-.5", false}, {"\n5", false}, {"1e5+", false}, {". 5", false}, {"1.e", false}, {"\xb5", false},
        {{"12\0003", 4}, false},
    };
    // clang-format on
    for (const auto& row : rows) EXPECT_EQ(row.second, zkStr(row.first).isNumber()) << '\'' << row.first << '\'';
}

// Whitespace is blank, tab and line ends for skipNextWhite, and also \v and
// \f for stripWhite.
TEST(StringText, WhitespaceRules) {
    // clang-format off
    const struct { const char* text; unsigned pos, expected; } skips[] = {
        {" \t\r\nx", 0, 4}, {"   ", 0, 3}, {"abc", 9, 9}, {"a b", 1, 2}, {"\vx", 0, 0}, {"\fx", 0, 0}, {"", 0, 0},
    };
    const struct { std::string text; zkStringBase::StripType bits; std::string expected; } strips[] = {
        {"  a b  ", S::StripEnds, "a b"}, {"  a b  ", S::StripAll, "ab"}, {"   ", S::StripTrailing, ""},
        {"   ", S::StripLeading, ""}, {"a  ", S::StripLeading, "a  "}, {" a ", S::StripTrailing, " a"},
        {" \t\r\n\v\fa\v b\f", S::StripEnds, "a\v b"}, {"", S::StripEnds, ""},
        {" a\tb ", S::StripLeading | S::StripAll, "ab"}, {{" \0 ", 3}, S::StripEnds, {"\0", 1}},
    };
    // clang-format on
    for (const auto& row : skips) EXPECT_EQ(row.expected, S(row.text).skipNextWhite(row.pos)) << row.text;
    for (const auto& row : strips) EXPECT_EQ(row.expected, zkText(zkStr(row.text).stripWhite(row.bits))) << row.text;
}

// Case changes touch only letters, zero bytes included; every whitespace
// byte starts a word.
TEST(StringText, CaseChanges) {
    zkStringBase s("AbC1 z\xc9\0x", 9), words("hello  big\tworld\nwORLD\vx y");
    s.invertCase();
    EXPECT_EQ(std::string("aBc1 Z\xc9\0X", 9), zkText(s));
    s.toUpper();
    EXPECT_EQ(std::string("ABC1 Z\xc9\0X", 9), zkText(s));
    s.toLower();
    EXPECT_EQ(std::string("abc1 z\xc9\0x", 9), zkText(s));
    words.firstUpper();
    EXPECT_EQ("Hello  Big\tWorld\nWORLD\vX Y", zkText(words));
}

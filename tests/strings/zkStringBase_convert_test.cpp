// Number conversion, case changes and whitespace handling of zkStringBase.
#include <gtest/gtest.h>

#include <cfloat>
#include <cstdio>
#include <string>
#include <utility>

#include "support/zkStringText.h"
#include "zkStringBase.h"

namespace {

using S = zkStringBase;

}  // namespace

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
    const struct {
        const char* text;
        long asLong;
        double asDouble;
    } rows[] = {{"10", 10, 10.0}, {" -907x", -907, -907.0}, {"0x1A", 0, 26.0}, {"2.5e1", 2, 25.0}, {"", 0, 0.0}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        EXPECT_EQ(row.asLong, S(row.text).asLong());
        EXPECT_EQ(row.asDouble, S(row.text).asDouble());
    }
}

// isNumber accepts only whole decimal numbers.
TEST(StringConvert, IsNumberAcceptsWholeDecimalNumbers) {
    for (const char* text : {"42", " -7", "\t 5", "3.", ".5", "1e5", "1E-3", "2e+", "1e-", "-1e-5", "+0.5e+10"}) {
        SCOPED_TRACE(text);
        EXPECT_TRUE(S(text).isNumber());
    }
    for (const char* text : {"",     " ",  ".",  "-",   "5 ",  "1.2.3", "1e5.2", "1e2e3", "e5",  "+-1", "1,5",
                             "0x1F", "1e", "5-", "1-2", "-.5", "\n5",   "1e5+",  ". 5",   "1.e", "\xb5"}) {
        SCOPED_TRACE(text);
        EXPECT_FALSE(S(text).isNumber());
    }
    EXPECT_FALSE(S("12\0"
                   "3",
                   4)
                     .isNumber());
}

TEST(StringText, SkipNextWhite) {
    const struct {
        const char* text;
        unsigned pos, expected;
    } rows[] = {{" \t\r\nx", 0, 4}, {"   ", 0, 3}, {"abc", 9, 9}, {"a b", 1, 2},
                {"\vx", 0, 0},      {"\fx", 0, 0}, {"", 0, 0}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        EXPECT_EQ(row.expected, S(row.text).skipNextWhite(row.pos));
    }
}

TEST(StringText, StripWhite) {
    // clang-format off
    const struct {
        std::string text;
        zkStringBase::StripType bits;
        std::string expected;
    } rows[] = {
        {"  a b  ", S::StripEnds, "a b"}, {"  a b  ", S::StripAll, "ab"}, {"   ", S::StripTrailing, ""},
        {"   ", S::StripLeading, ""}, {"a  ", S::StripLeading, "a  "}, {" a ", S::StripTrailing, " a"},
        {" \t\r\n\v\fa\v b\f", S::StripEnds, "a\v b"}, {"", S::StripEnds, ""},
        {" a\tb ", S::StripLeading | S::StripAll, "ab"}, {{" \0 ", 3}, S::StripEnds, {"\0", 1}},
    };
    // clang-format on
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        EXPECT_EQ(row.expected, zkText(zkStr(row.text).stripWhite(row.bits)));
    }
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

// Number conversion, case changes and whitespace handling of zkStringBase.
#include <gtest/gtest.h>

#include <cfloat>
#include <cstdio>
#include <string>
#include <utility>

#include "zkStringBase.h"

namespace {

using S = zkStringBase;

// The bytes of s, after checking that the terminator is in place.
std::string bytes(const zkStringBase& s) {
    EXPECT_EQ('\0', s.data()[s.length()]);
    return std::string(s.data(), s.length());
}

}  // namespace

// Texts up to and past the fixed buffer come out whole; the compare type stays.
TEST(StringConvert, NumbersToAndFromText) {
    zkStringBase s("a longer text than some results below");
    s.setCompareType(zkStringBase::CaseInsensitive);
    const std::pair<double, int> numbers[] = {{3.14159, 2}, {-0.05, 1}, {1.0, 125}, {1.0, 126}, {DBL_MAX, 2}};
    for (const auto& n : numbers) {
        char expected[512];
        std::snprintf(expected, sizeof expected, "%.*f", n.second, n.first);
        s.fromDouble(n.first, n.second);
        EXPECT_EQ(expected, bytes(s));
    }
    s.fromLong(-42);
    EXPECT_EQ("-42", bytes(s));
    EXPECT_EQ(zkStringBase::CaseInsensitive, s.getCompareType());

    // isNumber accepts only whole decimal numbers.
    for (const char* text : {"42", " -7", "\t 5", "3.", ".5", "1e5", "1E-3", "2e+", "1e-", "-1e-5", "+0.5e+10"})
        EXPECT_TRUE(zkStringBase(text).isNumber()) << '\'' << text << '\'';
    for (const char* text : {"",     " ",  ".",  "-",   "5 ",  "1.2.3", "1e5.2", "1e2e3", "e5",  "+-1", "1,5",
                             "0x1F", "1e", "5-", "1-2", "-.5", "\n5",   "1e5+",  ". 5",   "1.e", "\xb5"})
        EXPECT_FALSE(zkStringBase(text).isNumber()) << '\'' << text << '\'';
    EXPECT_FALSE(zkStringBase("12\0"
                              "3",
                              4)
                     .isNumber());
}

TEST(StringText, WhitespaceAndCaseRules) {
    const struct {
        const char* text;
        unsigned pos, expected;
    } skips[] = {
        {" \t\r\nx", 0, 4}, {"   ", 0, 3}, {"abc", 9, 9}, {"a b", 1, 2}, {"\vx", 0, 0}, {"\fx", 0, 0}, {"", 0, 0},
    };
    for (const auto& c : skips) EXPECT_EQ(c.expected, zkStringBase(c.text).skipNextWhite(c.pos)) << c.text;

    const struct {
        const char* text;
        zkStringBase::StripType bits;
        const char* expected;
    } strips[] = {
        {"  a b  ", S::StripEnds, "a b"},
        {"  a b  ", S::StripAll, "ab"},
        {"   ", S::StripTrailing, ""},
        {"   ", S::StripLeading, ""},
        {"a  ", S::StripLeading, "a  "},
        {" a ", S::StripTrailing, " a"},
        {" \t\r\n\v\fa\v b\f", S::StripEnds, "a\v b"},
        {"", S::StripEnds, ""},
        {" a\tb ", S::StripLeading | S::StripAll, "ab"},
    };
    for (const auto& c : strips) EXPECT_EQ(c.expected, bytes(S(c.text).stripWhite(c.bits))) << c.text << c.bits;
    zkStringBase zero(" \0 ", 3);
    EXPECT_EQ(std::string("\0", 1), bytes(zero.stripWhite(zkStringBase::StripEnds)));

    // Case changes touch only letters, zero bytes included; every whitespace
    // byte starts a word.
    zkStringBase s("AbC1 z\xc9\0x", 9), words("hello  big\tworld\nwORLD\vx y");
    s.invertCase();
    EXPECT_EQ(std::string("aBc1 Z\xc9\0X", 9), bytes(s));
    EXPECT_EQ(std::string("ABC1 Z\xc9\0X", 9), (s.toUpper(), bytes(s)));
    EXPECT_EQ(std::string("abc1 z\xc9\0x", 9), (s.toLower(), bytes(s)));
    words.firstUpper();
    EXPECT_EQ("Hello  Big\tWorld\nWORLD\vX Y", bytes(words));
}

// Parsing and ordering versions with zkVersionDescriptor.
#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <tuple>
#include <utility>
#include <vector>

#include "zkVersionDescriptor.h"

// Text of any length, with or without a full stop, numbers clamped to 32 bits,
// each read from a heap buffer of its exact size so that a read past the end
// is caught. Unparsable text leaves the version alone.
TEST(VersionDescriptor, ParsesText) {
    const std::pair<const char*, std::tuple<int, int, char>> rows[] = {
        {"123456789.123456789z", {123456789, 123456789, 'z'}},
        {"12345678901234567890", {INT_MAX, 0, 0}},
        {"1.99999999999", {1, INT_MAX, '9'}},
        {"-99999999999.1", {INT_MIN, 1, 0}},
        {"7.5 beta", {7, 5, ' '}},
        {"1.10a", {1, 10, '0'}},
        {"1.2.3", {1, 2, '.'}},
        {"2.1a", {2, 1, 'a'}},
        {"1.-2", {1, 0, '2'}},
        {"", {9, 9, 0}},
        {nullptr, {9, 9, 0}},
        {"2.", {2, 0, 0}},
        {".5", {9, 9, 0}},
        {"5", {5, 0, 0}},
    };
    for (const auto& row : rows) {
        const std::vector<char> text(row.first, row.first + (row.first ? std::strlen(row.first) + 1 : 0));
        zkVersionDescriptor v("9.9");
        EXPECT_EQ(0, v.SetVersionDescriptor(row.first ? text.data() : nullptr));
        EXPECT_EQ(row.second, std::make_tuple(v.GetMajor(), v.GetMinor(), v.GetSubMinor())) << row.first;
    }
}

// Major, then minor, then the sub-minor as a signed byte: a byte of 0x80 or
// more comes before no sub-minor. Versions sharing major and minor are in line.
TEST(VersionDescriptor, OrderingAndLines) {
    const char* ascending[] = {"-1.0", "0.0", "1.2\x80", "1.2", "3.1", "3.1a", "3.1b", "3.2", "10.0"};
    const int line[] = {0, 1, 2, 2, 3, 3, 3, 4, 5};
    for (int i = 0; i < 9; ++i)
        for (int j = 0; j < 9; ++j) {
            const zkVersionDescriptor a(ascending[i]), b(ascending[j]);
            EXPECT_EQ(std::make_tuple(i<j, i> j, i == j, line[i] == line[j]),
                      std::make_tuple(a<b, a> b, a == b, a.IsInline(b)))
                << ascending[i] << " " << ascending[j];
        }
}

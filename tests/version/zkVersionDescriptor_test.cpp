// Parsing and ordering versions with zkVersionDescriptor.
#include "zkVersionDescriptor.h"

#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <memory>
#include <string>
#include <utility>

namespace {

// "major minor sub-minor", the sub-minor as a number.
std::string fields(const zkVersionDescriptor& v) {
    return std::to_string(v.GetMajor()) + " " + std::to_string(v.GetMinor()) + " " +
           std::to_string(static_cast<int>(v.GetSubMinor()));
}

}  // namespace

TEST(VersionDescriptor, ParsesText) {
    const std::string max = std::to_string(INT_MAX), min = std::to_string(INT_MIN);
    const std::pair<const char*, std::string> rows[] = {
        {"2.1a", "2 1 97"}, {"10.20b", "10 20 98"}, {"3.1", "3 1 0"}, {"2.", "2 0 0"}, {"7.5 beta", "7 5 32"},
        {"1.2.3", "1 2 46"}, {"1.10a", "1 10 48"}, {"r1.2", "0 2 0"}, {"-1.0", "-1 0 0"}, {" +7.1", "7 1 0"},
        {"1.-2", "1 0 50"}, {".5", "0 0 0"}, {"", "0 0 0"}, {nullptr, "0 0 0"},
        // Any length, no full stop, and numbers beyond 32 bits.
        {"123456789.123456789z", "123456789 123456789 122"}, {"5", "5 0 0"}, {"12345678901234567890", max + " 0 0"},
        {"99999999999.1", max + " 1 0"}, {"-99999999999.1", min + " 1 0"}, {"1.99999999999", "1 " + max + " 57"}};
    for (const auto& row : rows) EXPECT_EQ(row.second, fields(zkVersionDescriptor(row.first))) << row.first;
}

TEST(VersionDescriptor, UnparsableTextLeavesTheVersionAlone) {
    zkVersionDescriptor v("2.1a");
    for (const char* text : {".5", "", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(0, v.SetVersionDescriptor(text));
        EXPECT_EQ("2 1 97", fields(v));
    }
    // An exact-size heap buffer, so that a read past the end is caught.
    std::unique_ptr<char[]> five(new char[2]);
    std::memcpy(five.get(), "5", 2);
    EXPECT_EQ(0, v.SetVersionDescriptor(five.get()));
    EXPECT_EQ("5 0 0", fields(v));
}

TEST(VersionDescriptor, OrderingAndLines) {
    const char* ascending[] = {"-1.0", "0.0", "3.1", "3.1a", "3.1b", "3.2", "10.0"};
    const int n = sizeof ascending / sizeof ascending[0];
    for (int i = 0; i < n; ++i) {
        for (int j = 0; j < n; ++j) {
            zkVersionDescriptor a(ascending[i]), b(ascending[j]);
            EXPECT_EQ(i < j, a < b) << ascending[i] << " < " << ascending[j];
            EXPECT_EQ(i > j, a > b) << ascending[i] << " > " << ascending[j];
            EXPECT_EQ(i == j, a == b) << ascending[i] << " == " << ascending[j];
        }
    }
    zkVersionDescriptor high("1.2\x80"), plain("1.2"), a("3.1a"), b("3.1b"), c("3.2");
    EXPECT_TRUE(high < plain && plain > high);
    EXPECT_TRUE(a.IsInline(b));
    EXPECT_FALSE(a == b || a.IsInline(c) || b.IsInline(c));
}

// Parsing and ordering versions with zkVersionDescriptor; the library's own
// version is checked by the consumer builds.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "support/zkTableFile.h"
#include "zkVersionDescriptor.h"

static void expectFields(int major, int minor, char subMinor, const zkVersionDescriptor& v) {
    EXPECT_EQ(major, v.GetMajor());
    EXPECT_EQ(minor, v.GetMinor());
    EXPECT_EQ(subMinor, v.GetSubMinor());
}

// Each text is read from a heap buffer of its exact size, so that a read past
// the end is caught. A null text leaves the version alone too, and a new
// version starts at 0.0 with no sub-minor.
TEST(VersionDescriptor, ParsesText) {
    zkForEachRow("str_versions.txt", [](const auto& row) {
        const std::vector<char> text(row[0].c_str(), row[0].c_str() + row[0].size() + 1);
        zkVersionDescriptor v("9.9");
        EXPECT_EQ(0, v.SetVersionDescriptor(text.data()));
        expectFields(std::stoi(row[1]), std::stoi(row[2]), row[3][0], v);
    });
    zkVersionDescriptor v("9.9");
    EXPECT_EQ(0, v.SetVersionDescriptor(nullptr));
    expectFields(9, 9, 0, v);
    const char shifted[] = "95";  // the byte before the text is never read
    expectFields(5, 0, 0, zkVersionDescriptor(shifted + 1));
    expectFields(0, 0, 0, zkVersionDescriptor());
    expectFields(0, 0, 0, zkVersionDescriptor(".5"));
}

// Major, then minor, then the sub-minor as a signed byte: a byte of 0x80 or
// more comes before no sub-minor. Versions sharing major and minor are in line.
TEST(VersionDescriptor, Ordering) {
    const char* ascending[] = {"-1.0", "0.0", "1.2\x80", "1.2", "3.1", "3.1a", "3.1b", "3.2", "10.0"};
    const int line[] = {0, 1, 2, 2, 3, 3, 3, 4, 5};
    for (int i = 0; i < 9; ++i)
        for (int j = 0; j < 9; ++j) {
            SCOPED_TRACE(std::string(ascending[i]) + " vs " + ascending[j]);
            const zkVersionDescriptor a(ascending[i]), b(ascending[j]);
            EXPECT_EQ(i < j, a < b);
            EXPECT_EQ(i > j, a > b);
            EXPECT_EQ(i == j, a == b);
            EXPECT_EQ(line[i] == line[j], a.IsInline(b));
        }
}

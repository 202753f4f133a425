// Loading files longer than the pieces Open reads them in.
#include <gtest/gtest.h>

#include <string>

#include "ini/zkIniTestSupport.h"

// A line end, a CR LF or a run of blank lines split between two pieces, and
// a line longer than a piece, read as in a short file. Each shift of the
// text puts the piece boundaries at other places of the repeated unit.
TEST(IniLoad, LongFilesReadAsShortOnes) {
    const std::string unit = "k = v\r\n  \r\n\r\n   a=b\r\n;c\nx\n\t\t\n  \n  q =  r  \r";
    const std::string unitDump = "k:k|v\nk:a|b\nc:;c\nk:q|r\n";
    const std::string longValue(40000, 'w');
    std::string body = "[s]\n", dump = "[s]\n";
    for (int i = 0; i < 1000; ++i) {
        body += unit;
        dump += unitDump;
        if (i == 500) {
            body += "long = " + longValue + "\n";
            dump += "k:long|" + longValue + "\n";
        }
    }
    zkTempDir dir;
    for (size_t shift = 0; shift < unit.size(); ++shift) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "long.ini", std::string(shift, ';') + "\n" + body));
        EXPECT_EQ(dump, zkDump(ini)) << shift;
    }
}

// Loading INI files: the reading rules, the open modes and the failures.
#include <gtest/gtest.h>
#include <unistd.h>

#include <regex>
#include <string>

#include "ini/zkIniTestSupport.h"

TEST(IniLoad, ReadingRules) {
    const std::string crlf = zkTestData("crlf.ini");
    const char* const crlfDump =
        "[Main]\nk:host|example.org\nk:port|8080\nc:# a comment\nk:empty|\n[Other]\nk:flag|\nk:k|a = b\n";
    const std::pair<std::string, const char*> cases[] = {
        {crlf, crlfDump},
        {std::regex_replace(crlf, std::regex("\r\n"), "\n"), crlfDump},
        {std::regex_replace(crlf, std::regex("\r\n"), "\r"), crlfDump},
        // "[net] ; ..." names net, "[abc" abc; "[a]b]" keeps its inner
        // bracket, "[  ]" is the empty name, a lone "[" is no header.
        {zkTestData("header_comment.ini"), "[net]\nk:host|a\n[abc]\nk:x|1\n[a]b]\nk:y|2\n[]\nk:z|3\nk:w|4\n"},
        {zkTestData("bom.ini"), "[first]\nk:name|one\n[second]\nk:name|two\n"},
        // One character, before or after blanks, is ignored; further "="
        // belong to the value; ";" inside a line is text.
        {"[s]\na\n  b\nc \nd=\n  e = f g = h  \n=v\n;x\n\t# y ; z  \ni ; j=k\n\"q\" = 'r'\nz",
         "[s]\nk:c|\nk:d|\nk:e|f g = h\nk:|v\nc:;x\nc:# y ; z\nk:i ; j|k\nk:\"q\"|'r'\n"},
        {"", ""},
        {"\n\n  \r\n\t\r\r\n \n", ""},
    };
    zkTempDir dir;
    for (const auto& c : cases) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", c.first));
        EXPECT_EQ(c.second, zkDump(ini)) << c.first;
    }
}

// Open appends to the document; a failed Open, a read error included, leaves
// it as it was; Clear keeps the file name.
TEST(IniLoad, OpenModesAndFailuresLeaveTheDocument) {
    zkTempDir dir;
    const std::string missing = dir.file("missing.ini");
    zkMappedINIFile ini(missing.c_str());
    ini.SetVal(zkStr("keep"), zkStr("k"), zkStr("v"));
    EXPECT_TRUE(ini.Open(0) == 1 && access(missing.c_str(), F_OK) != 0);
    EXPECT_TRUE(ini.Open(1) == 0 && access(missing.c_str(), F_OK) == 0);
    // The process's own memory opens for reading and writing, but reading
    // its first page fails.
    for (const std::string& name : {dir.path(), std::string("/proc/self/mem")}) {
        ini.SetFilename(name.c_str());
        EXPECT_EQ(1, ini.Open(1)) << name;
    }
    EXPECT_EQ("[keep]\nk:k|v\n", zkDump(ini));

    ASSERT_TRUE(zkLoad(ini, dir, "a.ini", "[a]\nk=1\n") == 0 && ini.Open(0) == 0);
    EXPECT_EQ("[keep]\nk:k|v\n[a]\nk:k|1\n[a]\nk:k|1\n", zkDump(ini));
    ini.Clear();
    EXPECT_TRUE(ini.Open(0) == 0 && zkDump(ini) == "[a]\nk:k|1\n");
}

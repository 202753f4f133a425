// Loading INI files: the reading rules, the open modes and the failures.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <regex>
#include <string>

#include "ini/zkIniTestSupport.h"

TEST(IniLoad, ReadingRules) {
    const std::string crlf = zkTestData("crlf.ini");
    const char* const crlfDump =
        "[Main]\nk:host|example.org\nk:port|8080\nc:# a comment\nk:empty|\n[Other]\nk:flag|\nk:k|a = b\n";
    const struct {
        std::string bytes;
        const char* dump;
    } cases[] = {
        {crlf, crlfDump},
        {std::regex_replace(crlf, std::regex("\r\n"), "\n"), crlfDump},
        {std::regex_replace(crlf, std::regex("\r\n"), "\r"), crlfDump},
        // "[net] ; ..." names net, "[abc" abc; "[a]b]" keeps its inner
        // bracket, "[  ]" is the empty name, a lone "[" is no header.
        {zkTestData("header_comment.ini"), "[net]\nk:host|a\n[abc]\nk:x|1\n[a]b]\nk:y|2\n[]\nk:z|3\nk:w|4\n"},
        {"  [ spaced ]  \n[x] y ] z\n[ ]]\n", "[spaced]\n[x]\n[]]\n"},
        {zkTestData("bom.ini"), "[first]\nk:name|one\n[second]\nk:name|two\n"},
        {"\xEF\xBB\xBFkey=1\n[s]\nk=v\n", "[s]\nk:k|v\n"},
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
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", c.bytes));
        EXPECT_EQ(c.dump, zkDump(ini)) << c.bytes;
    }
}

TEST(IniLoad, OpenModesAndFailuresLeaveTheDocument) {
    zkTempDir dir;
    const std::string missing = dir.file("missing.ini");
    zkMappedINIFile ini(missing.c_str());
    ini.SetVal(zkStr("keep"), zkStr("k"), zkStr("v"));
    EXPECT_EQ(1, ini.Open(0));
    EXPECT_NE(0, access(missing.c_str(), F_OK));
    EXPECT_EQ(0, ini.Open(1));
    EXPECT_EQ(0, access(missing.c_str(), F_OK));
    ini.SetFilename(dir.path().c_str());
    EXPECT_EQ(1, ini.Open(1));
    // The process's own memory opens for reading and writing, but reading
    // its first page fails.
    ini.SetFilename("/proc/self/mem");
    EXPECT_EQ(1, ini.Open(0));
    EXPECT_EQ("[keep]\nk:k|v\n", zkDump(ini));

    // Open appends; Clear keeps the file name.
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", "[a]\nk=1\n"));
    EXPECT_EQ(0, ini.Open(0));
    EXPECT_EQ("[keep]\nk:k|v\n[a]\nk:k|1\n[a]\nk:k|1\n", zkDump(ini));
    ini.Clear();
    EXPECT_EQ(0, ini.Open(0));
    EXPECT_EQ("[a]\nk:k|1\n", zkDump(ini));
}

TEST(IniLoad, StoredStringsAreSizedToTheirText) {
    zkTempDir dir;
    zkMappedINIFile ini;
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", "[section]\n  key  =  value  \n; comment\nbare \n"));
    ini.SetVal(zkStr("section"), zkStr("key"), zkStr("a longer value than before"));
    ini.SetVal(zkStr("added"), zkStr("k"), 12345L);
    zkMappedINIFile other;
    other.SetVal(zkStr("merged"), zkStr("m"), zkStr("x"));
    ini.MergeFrom(other);
    for (const INISection* section : *ini.GetSectionList()) {
        EXPECT_EQ(section->m_name.length() + 1, section->m_name.capacity());
        for (const INILine* line : *section->m_lines) {
            EXPECT_EQ(line->m_key.length() + 1, line->m_key.capacity()) << zkText(line->m_key);
            EXPECT_EQ(line->m_value.length() + 1, line->m_value.capacity()) << zkText(line->m_value);
        }
    }
}

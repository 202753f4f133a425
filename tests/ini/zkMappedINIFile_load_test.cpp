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
    const std::pair<std::string, const char*> rows[] = {
        {crlf, crlfDump},
        {std::regex_replace(crlf, std::regex("\r\n"), "\n"), crlfDump},
        {std::regex_replace(crlf, std::regex("\r\n"), "\r"), crlfDump},
        // "[net] ; ..." names net, "[abc" abc; "[a]b]" keeps its inner
        // bracket, "[  ]" is the empty name, a lone "[" is no header.
        {zkTestData("header_comment.ini"), "[net]\nk:host|a\n[abc]\nk:x|1\n[a]b]\nk:y|2\n[]\nk:z|3\nk:w|4\n"},
        {zkTestData("bom.ini"), "[first]\nk:name|one\n[second]\nk:name|two\n"},
        // One character, before or after blanks, is ignored; further "="
        // belong to the value; ";" inside a line is text.
        {zkTestData("short_lines.ini"),
         "[s]\nk:c|\nk:d|\nk:e|f g = h\nk:|v\nc:;x\nc:# y ; z\nk:i ; j|k\nk:\"q\"|'r'\n"},
        {zkTestData("lone_characters.ini"), "[short]\nc:;\nc:#\nk:|\n"},
        {"", ""},
        {"\n\n  \r\n\t\r\r\n \n", ""},
    };
    zkTempDir dir;
    for (const auto& row : rows) {
        SCOPED_TRACE(row.first);
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", row.first));
        EXPECT_EQ(row.second, zkDump(ini));
    }
}

// A failed Open, a read error included, leaves the document as it was and
// makes no file.
TEST(IniLoad, FailedOpenLeavesTheDocument) {
    zkTempDir dir;
    const std::string missing = dir.file("missing.ini");
    const std::string tooLong = dir.path() + std::string(4096 - dir.path().size() - 5, '/') + "a.ini";
    const struct {
        std::string file;
        unsigned create;
    } rows[] = {
        {missing, 0},
        {dir.path(), 1},
        // The process's own memory opens for reading and writing, but
        // reading its first page fails.
        {"/proc/self/mem", 1},
        // A name of 4096 bytes is refused, not shortened to another file.
        {tooLong, 0},
    };
    zkMappedINIFile ini;
    ini.SetVal(zkStr("keep"), zkStr("k"), zkStr("v"));
    for (const auto& row : rows) {
        SCOPED_TRACE(row.file);
        ini.SetFilename(row.file.c_str());
        EXPECT_EQ(1, ini.Open(row.create));
        EXPECT_EQ("[keep]\nk:k|v\n", zkDump(ini));
    }
    EXPECT_NE(0, access(missing.c_str(), F_OK));
}

// Open appends what it reads to the document; create makes a missing file;
// Clear empties the document and keeps its file name.
TEST(IniLoad, OpenAppendsToTheDocument) {
    zkTempDir dir;
    const std::string made = dir.file("made.ini");
    zkMappedINIFile ini(made.c_str());
    ini.SetVal(zkStr("keep"), zkStr("k"), zkStr("v"));
    EXPECT_EQ(0, ini.Open(1));
    EXPECT_EQ("", zkReadFile(made));
    EXPECT_EQ(0, access(made.c_str(), F_OK));

    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", "[a]\nk=1\n"));
    ASSERT_EQ(0, ini.Open(0));
    EXPECT_EQ("[keep]\nk:k|v\n[a]\nk:k|1\n[a]\nk:k|1\n", zkDump(ini));
    ini.Clear();
    ASSERT_EQ(0, ini.Open(0));
    EXPECT_EQ("[a]\nk:k|1\n", zkDump(ini));
}

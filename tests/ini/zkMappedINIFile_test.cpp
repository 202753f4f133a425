// The INI document: the reading rules and the open modes, look-ups, changes
// and merging, and saving: the written forms, the refusals, and what a save
// asks of the file replacement (the new file's mode, the size to reserve).
#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>
#include <regex>

#include "ini/zkIniTestSupport.h"

// Each input reads as its ini_*.dump file. crlf.ini reads alike with any of
// the three line ends. header_comment.ini: "[net] ; ..." names net, "[abc"
// abc; "[a]b]" keeps its inner bracket, "[  ]" is the empty name, a lone "["
// is no header. short_lines.ini: one character, before or after blanks, is
// ignored; further "=" belong to the value; ";" inside a line is text; the
// trailing cut keeps a line's first character, even a vertical tab.
// In files longer than the pieces Open reads them in, a line end, a CR LF
// or a run of blank lines split between two pieces, and a line longer than a
// piece, read as in a short file; each shift of the text puts the piece
// boundaries at other places of the repeated unit. So does a first line
// longer than the first pieces.
TEST(IniLoad, ReadingRules) {
    std::vector<std::pair<std::string, std::string>> rows = {{"", ""}, {"\n\n  \r\n\t\r\r\n \n", ""}};
    for (std::string name : {"crlf", "header_comment", "bom", "short_lines", "lone_characters"})
        rows.emplace_back(zkTestText(name + ".ini"), zkTestText("ini_" + name + ".dump"));
    for (const char* lineEnd : {"\n", "\r"})
        rows.emplace_back(std::regex_replace(rows[2].first, std::regex("\r\n"), lineEnd), rows[2].second);
    const std::string unit = "k = v\r\n  \r\n\r\n   a=b\r\n;c\nx\n\t\t\n  \n  q =  r  \r", longValue(40000, 'w');
    std::string body = "[s]\n", dump = "[s]\n";
    for (int i = 0; i < 1000; ++i) {
        body += unit + (i == 500 ? "long = " + longValue + "\n" : "");
        dump += "k:k|v\nk:a|b\nc:;c\nk:q|r\n" + (i == 500 ? "k:long|" + longValue + "\n" : "");
    }
    rows.emplace_back(std::string(40000, '#') + "\n[s]\nk=v\n", "[s]\nk:k|v\n");
    for (size_t shift = 0; shift < unit.size(); ++shift) rows.emplace_back(std::string(shift, ';') + "\n" + body, dump);
    zkTempDir dir;
    for (const auto& row : rows) {
        SCOPED_TRACE(row.first.substr(0, 80));
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", row.first));
        EXPECT_EQ(row.second, zkDump(ini));
    }
}

// Open appends what it reads to the document; create makes a missing file;
// Clear empties the document and keeps its file name. A failed Open, a read
// error included, leaves the document as it was and makes no file. The
// process's own memory opens for reading and writing, but reading its first
// page fails; a name of 4096 bytes is refused, not shortened to another
// file; a FIFO opens, but cannot be read from its start.
TEST(IniLoad, OpenAppendsWhatItReadsOrNothing) {
    zkTempDir dir;
    const std::string missing = dir.file("missing.ini"), made = dir.file("made.ini");
    const std::string tooLong = dir.path() + std::string(4096 - dir.path().size() - 5, '/') + "a.ini";
    const std::pair<std::string, unsigned> failures[] = {
        {missing, 0}, {dir.path(), 1}, {"/proc/self/mem", 1}, {tooLong, 0}, {dir.file("fifo"), 0}};
    ASSERT_EQ(0, mkfifo(failures[4].first.c_str(), 0666));
    zkMappedINIFile ini;
    ini.SetVal(zkStr("keep"), zkStr("k"), zkStr("v"));
    for (const auto& row : failures) {
        SCOPED_TRACE(row.first);
        ini.SetFilename(row.first.c_str());
        EXPECT_EQ(1, ini.Open(row.second));
        EXPECT_EQ("[keep]\nk:k|v\n", zkDump(ini));
    }
    EXPECT_NE(0, access(missing.c_str(), F_OK));
    ini.SetFilename(made.c_str());
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

// Sections and keys are found without regard to case, the first match in
// document order winning; SetVal alone visits every section of the name.
TEST(IniAccess, NamesMatchWithoutRegardToCase) {
    zkTempDir dir;
    zkMappedINIFile ini;
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", "[Net]\n; note\nHost=a\nhost=b\n[other]\nk=1\n[net]\nport=2\n"));

    // Case is ignored and the first match wins, the empty key meeting the comment.
    EXPECT_EQ("; note", zkText(ini.GetVal(zkStr("net"), zkStr(""))));
    EXPECT_EQ(&zkStringBase::NullStr, &ini.GetVal(zkStr("net"), zkStr("port")));
    zkStringBase out("untouched");
    EXPECT_EQ(1, ini.GetVal(zkStr("net"), zkStr("none"), out));
    EXPECT_EQ("untouched", zkText(out));
    EXPECT_EQ(1, ini.GetVal(zkStr("none"), zkStr("k"), out));
    EXPECT_EQ(0, ini.GetVal(zkStr("OTHER"), zkStr("K"), out));
    EXPECT_EQ("1", zkText(out));

    // SetVal visits every section of the name: in place where the key is,
    // the stored key keeping its case, else appended after the comments.
    ini.SetVal(zkStr("NET"), zkStr("HOST"), zkStr("c"));
    ini.SetVal(zkStr("new"), zkStr("n"), -42L);
    ini.RemoveKey(zkStr("net"), zkStr("HOST"));  // the first only
    ini.RemoveKey(zkStr("net"), zkStr(""));
    EXPECT_EQ("[Net]\nk:host|b\n[other]\nk:k|1\n[net]\nk:port|2\nk:HOST|c\n[new]\nk:n|-42\n", zkDump(ini));
}

// The other document's values win, its missing sections are appended, its
// comments and empty keys are not taken; it is not changed.
TEST(IniAccess, MergeFromLetsTheOtherDocumentWin) {
    zkTempDir dir;
    zkMappedINIFile base, over;
    ASSERT_EQ(0, zkLoad(base, dir, "base.ini", "[main]\n; defaults\na=1\nb=2\n[keep]\nx=0\n"));
    ASSERT_EQ(0, zkLoad(over, dir, "over.ini",
                        "[MAIN]\n; not taken\nB=20\nc=3\nc=4\n=skipped\n[extra]\n; dropped\ny=1\n[main]\nd=5\n"));
    const std::string overBefore = zkDump(over);
    EXPECT_EQ(0, base.MergeFrom(over));
    const std::string merged = "[main]\nc:; defaults\nk:a|1\nk:b|20\nk:c|4\nk:d|5\n[keep]\nk:x|0\n[extra]\nk:y|1\n";
    EXPECT_EQ(merged, zkDump(base));
    EXPECT_EQ(overBefore, zkDump(over));
    EXPECT_EQ(0, base.MergeFrom(base));
    EXPECT_EQ(merged, zkDump(base));

    base.AddMapSection(zkStr("keep"), over.GetPropertyList("main"));
    base.AddMapSection(zkStr("bare"), nullptr);
    base.UpdateMapSection(zkStr("missing"), over.GetPropertyList("main"));
    EXPECT_EQ(merged + "[keep]\nk:B|20\nk:c|4\n[bare]\n", zkDump(base));

    // Stored strings, loaded, set, merged or mapped, are copies sized to their text.
    base.SetVal(zkStr("keep"), zkStr("x"), zkStr("a longer value than before"));
    base.SetVal(zkStr("added"), zkStr("k"), 12345L);
    for (const INISection* section : *base.GetSectionList()) {
        EXPECT_EQ(section->m_name.length() + 1, section->m_name.capacity());
        for (const INILine* line : *section->m_lines) {
            EXPECT_EQ(line->m_key.length() + 1, line->m_key.capacity()) << zkText(line->m_key);
            EXPECT_EQ(line->m_value.length() + 1, line->m_value.capacity()) << zkText(line->m_value);
        }
    }
}

// The rows of ini_saves.txt save a loaded document.
TEST(IniSave, WrittenForms) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    zkForEachRow("ini_saves.txt", [&](const auto& row) {
        const std::string written = zkTestText(row[3]);
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "source.ini", zkTestText(row[0])));
        ASSERT_TRUE(zkWriteFile(path, "[s]\n"));  // shorter than every text saved: all its size is reserved
        ini.SetFilename(path.c_str());
        int result = -1;
        const auto save = [&] { result = row[1] == "firewall" ? ini.CloseFW(1) : ini.Close(1); };
        ASSERT_TRUE(zkSave(dir, row[2] == "in-place", written.size(), save));
        EXPECT_EQ(0, result);
        EXPECT_EQ(written, zkReadFile(path));
        EXPECT_EQ("", zkDump(ini));
    });
}

// The rows of ini_failed_saves.txt close a document after setting a key.
TEST(IniSave, OnlyASuccessfulSaveChangesTheFile) {
    zkTempDir dir;
    const std::string old = "[s]\nk=old\n";
    zkForEachRow("ini_failed_saves.txt", [&](const auto& row) {
        for (bool firewall : {false, true}) {
            SCOPED_TRACE(firewall ? "firewall" : "plain");
            zkMappedINIFile ini;
            ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", old));
            ini.SetVal(zkStr(row[2]), zkStr(row[3]), zkStr(row[4]));
            const std::string kept = zkDump(ini);
            ini.SetFilename(dir.file(row[1]).c_str());
            errno = 0;
            EXPECT_EQ(std::stoi(row[5]), firewall ? ini.CloseFW(std::stoi(row[0])) : ini.Close(std::stoi(row[0])));
            EXPECT_EQ(row[6], strerror(errno));
            EXPECT_EQ(row[0] == "1" ? kept : "", zkDump(ini));
            EXPECT_EQ(old, zkReadFile(dir.file("a.ini")));
        }
    });
    // A write that fails.
    zkMappedINIFile ini;
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", old));
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr(std::string(100, 'n')));
    int result = 0;
    ASSERT_TRUE(zkWithFileSizeLimit(20, [&] { result = ini.Close(1); }));
    EXPECT_EQ(1, result);
    EXPECT_EQ(old, zkReadFile(dir.file("a.ini")));
}

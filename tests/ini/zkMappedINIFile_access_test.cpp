// Reading, setting and removing values, and merging documents.
#include <gtest/gtest.h>

#include <string>

#include "ini/zkIniTestSupport.h"

TEST(IniAccess, LookupsSetAndRemove) {
    zkTempDir dir;
    zkMappedINIFile ini;
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", "[Net]\n; note\nHost=a\nhost=b\n[other]\nk=1\n[net]\nport=2\n"));

    // Case is ignored and the first match wins, the empty key meeting the comment.
    EXPECT_EQ("a", zkText(ini.GetVal(zkStr("NET"), zkStr("HOST"))));
    EXPECT_EQ("; note", zkText(ini.GetVal(zkStr("net"), zkStr(""))));
    EXPECT_EQ(&zkStringBase::NullStr, &ini.GetVal(zkStr("net"), zkStr("port")));
    zkStringBase out("untouched");
    EXPECT_EQ(1, ini.GetVal(zkStr("net"), zkStr("none"), out));
    EXPECT_EQ("untouched", zkText(out));
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

// The line-keeping editor: each change touches only its own lines, every
// other byte stays, and what it writes reads back as it was set.
#include <gtest/gtest.h>

#include <list>
#include <string>
#include <vector>

#include "ini/zkIniTestSupport.h"
#include "zkINIEditor.h"

namespace {

std::string replaceFirst(std::string text, const std::string& before, const std::string& after) {
    size_t at = text.find(before);
    if (at != std::string::npos) text.replace(at, before.size(), after);
    return text;
}

// What the document reads for a key: its value, or "<missing>".
std::string documentReads(const std::string& path, const char* section, const char* key) {
    zkMappedINIFile ini(path.c_str());
    zkStringBase value;
    if (ini.Open(0) != 0) return "<unreadable>";
    return ini.GetVal(zkStr(section), zkStr(key), value) == 0 ? zkText(value) : "<missing>";
}

// The names as text, first (when not null) in front.
std::vector<std::string> texts(const std::list<zkStringBase>& names, const char* first) {
    std::vector<std::string> out;
    if (first) out.push_back(first);
    for (const zkStringBase& name : names) out.push_back(zkText(name));
    return out;
}

// Loads text into an editor, runs change on it and returns the text it then
// holds; result receives change's result.
template <class Change>
std::string afterChange(const std::string& text, int& result, Change change) {
    zkINIEditor editor;
    editor.Load(text.data(), text.size());
    result = change(editor);
    zkStringBase out("stale");  // GetText replaces it
    editor.GetText(out);
    return zkText(out);
}

}  // namespace

// Each row changes one file through a locked editor and expects the file's
// first `before` to have become `after` and nothing else to differ.
TEST(IniEditor, EditChangesOnlyItsLines) {
    enum Op { Set, Remove };
    struct Row {
        const char* file;
        Op op;
        const char *section, *key, *value;
        int result;
        const char *before, *after;
        const char* documentReads;  // the key as zkMappedINIFile reads it afterwards
    } rows[] = {
        {"sectionless.ini", Set, "", "http.port", "9090", 0, "port=8080\n", "port=9090\n", "<missing>"},
        {"sectionless.ini", Set, "", "--MODULE", "web", 0, "=http\n", "=web\n", "<missing>"},
        {"sectionless.ini", Set, "", "tls.key", "k.pem", 1, "8443\n", "8443\ntls.key=k.pem\n", "<missing>"},
        {"sectionless.ini", Remove, "", "http.port", "", 0, "http.port=8080\n", "", "<missing>"},
        {"preamble.ini", Set, "", "tls_conf", "other", 0, "= defaults\n", "= other\n", "<missing>"},
        {"preamble.ini", Set, "", "new", "1", 1, ".rnd\n", ".rnd\nnew=1\n", "<missing>"},
        {"preamble.ini", Set, "ssl_sect", "system_default", "lax", 0, "strict", "lax", "lax"},
        {"preamble.ini", Set, "fresh", "k", "v", 1, "strict\n", "strict\n\n[fresh]\nk=v\n", "v"},
        {"crlf.ini", Set, "Main", "host", "b.org", 0, "= example.org \r", "= b.org \r", "b.org"},
        {"crlf.ini", Set, "main", "empty", "v", 0, "empty=\r", "empty=v\r", "v"},
        {"crlf.ini", Set, "Other", "flag", "on", 0, "flag \r", "flag=on \r", "on"},
        {"crlf.ini", Set, "Main", "new", "1", 1, "empty=\r\n", "empty=\r\nnew=1\r\n", "1"},
        {"crlf.ini", Set, "New", "k", "v", 1, "a = b\r\n", "a = b\r\n\r\n[New]\r\nk=v\r\n", "v"},
        {"crlf.ini", Remove, "Other", "k", "", 0, "k = a = b\r\n", "", "<missing>"},
        {"bom.ini", Set, "second", "name", "2", 0, "name=two", "name=2", "2"},
        {"header_comment.ini", Set, "net", "host", "b", 0, "host=a", "host=b", "b"},
        {"header_comment.ini", Set, "a]b", "y", "3", 2, "", "", "2"},
        {"continuation.ini", Set, "runner", "addopts", "-q", 0, "= -v\n", "= -q\n", "-q"},
        {"continuation.ini", Set, "runner", "new", "1", 1, "tests\n", "tests\nnew=1\n", "1"},
        {"repeated.ini", Set, "PATHS", "bin", "/bin", 0, "= /usr/bin\n", "= /bin\n", "/bin"},
        {"repeated.ini", Remove, "Paths", "BIN", "", 0, "bin = /usr/bin\n", "", "/usr/local/bin"},
        {"repeated.ini", Set, "Paths", "lib", "/lib", 1, "local/bin\n", "local/bin\nlib=/lib\n", "/lib"},
        {"inline_comment.ini", Set, "db", "host", "remote", 0, "localhost ; the local server", "remote", "remote"},
        {"inline_comment.ini", Set, "db", "timeout", "30", 0, "timeout = \n", "timeout = 30\n", "30"},
        {"inline_comment.ini", Remove, "db", "user", "", 1, "", "", "<missing>"},
        {"inline_comment.ini", Remove, "nosuch", "port", "", 1, "", "", "<missing>"},
        {"no_final_line_end.ini", Set, "a", "y", "2", 1, "x=1", "x=1\ny=2", "2"},
        {"no_final_line_end.ini", Set, "b", "y", "2", 1, "x=1", "x=1\n\n[b]\ny=2\n", "2"},
    };
    zkTempDir dir;
    const std::string path = dir.file("edit.ini");
    for (const Row& row : rows) {
        SCOPED_TRACE(std::string(row.file) + " " + row.section + "/" + row.key);
        const std::string original = zkTestData(row.file);
        ASSERT_TRUE(zkWriteFile(path, original));
        zkINIEditor editor(path.c_str());
        ASSERT_EQ(zkINIEditor::Done, editor.Open(false, true));
        const int result = row.op == Set ? editor.SetVal(zkStr(row.section), zkStr(row.key), zkStr(row.value))
                                         : editor.RemoveKey(zkStr(row.section), zkStr(row.key));
        EXPECT_EQ(row.result, result);
        EXPECT_EQ(zkINIEditor::Done, editor.Save());
        editor.Close();
        EXPECT_EQ(replaceFirst(original, row.before, row.after), zkReadFile(path));
        EXPECT_EQ(row.documentReads, documentReads(path, row.section, row.key));
    }
}

// Saving an untouched file gives back every byte, and the editor finds the
// sections that the document finds; only the editor lists the lines before
// the first header, as the empty name.
TEST(IniEditor, SavesAnUntouchedFileByteForByte) {
    const struct {
        const char* file;
        const char* preamble;
    } rows[] = {{"sectionless.ini", ""},
                {"preamble.ini", ""},
                {"crlf.ini", ""},
                {"bom.ini", nullptr},
                {"header_comment.ini", nullptr},
                {"continuation.ini", nullptr},
                {"repeated.ini", nullptr},
                {"inline_comment.ini", nullptr},
                {"no_final_line_end.ini", nullptr},
                {"firewall.ini", nullptr}};
    zkTempDir dir;
    for (const auto& row : rows) {
        SCOPED_TRACE(row.file);
        const std::string original = zkTestData(row.file);
        zkMappedINIFile document;
        ASSERT_EQ(0, zkLoad(document, dir, row.file, original));
        zkINIEditor editor(dir.file(row.file).c_str());
        ASSERT_EQ(zkINIEditor::Done, editor.Open(false, false));

        std::list<zkStringBase> documentNames, names;
        document.GetSectionNameList(documentNames);
        editor.GetSectionNames(names);
        EXPECT_EQ(texts(documentNames, row.preamble), texts(names, nullptr));

        EXPECT_EQ(zkINIEditor::Done, editor.Save());
        EXPECT_EQ(original, zkReadFile(dir.file(row.file)));
    }
}

// Text that would not read back as given is refused and changes nothing;
// text at the edge of the rules is taken and reads back unchanged.
TEST(IniEditor, RefusesTextThatWouldNotReadBack) {
    const struct {
        const char *section, *key, *value;
        int result;
    } rows[] = {
        {"a]b", "k", "v", zkINIEditor::Refused},
        {"a\nb", "k", "v", zkINIEditor::Refused},
        {" a", "k", "v", zkINIEditor::Refused},
        {"a", "", "v", zkINIEditor::Refused},
        {"a", "k=x", "v", zkINIEditor::Refused},
        {"a", "k\rx", "v", zkINIEditor::Refused},
        {"a", "[k", "v", zkINIEditor::Refused},
        {"a", ";k", "v", zkINIEditor::Refused},
        {"a", "#k", "v", zkINIEditor::Refused},
        {"a", "k\t", "v", zkINIEditor::Refused},
        {"a", "\vk", "v", zkINIEditor::Refused},
        {"a", "k", "v\n", zkINIEditor::Refused},
        {"a", "k", " v", zkINIEditor::Refused},
        {"a", "k", "v ", zkINIEditor::Refused},
        {"a[", "k]", "=v ; not a comment", zkINIEditor::Missing},
        {"a", "k k", "", zkINIEditor::Missing},
        {"a", "k", "x", zkINIEditor::Missing},
    };
    const std::string original = zkTestData("crlf.ini");
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.section) + "/" + row.key + "/" + row.value);
        int result = 0;
        const std::string text = afterChange(original, result, [&](zkINIEditor& e) {
            return e.SetVal(zkStr(row.section), zkStr(row.key), zkStr(row.value));
        });
        EXPECT_EQ(row.result, result);
        const bool refused = row.result == zkINIEditor::Refused;
        EXPECT_EQ(refused, text == original);
        zkINIEditor reread;
        reread.Load(text.data(), text.size());
        zkStringBase value("<missing>");
        reread.GetVal(zkStr(row.section), zkStr(row.key), value);
        EXPECT_EQ(refused ? "<missing>" : row.value, zkText(value));
    }
}

// A section goes with its lines up to the next header; the empty name takes
// the lines before the first header, the byte-order mark stays.
TEST(IniEditor, RemoveSectionTakesItsLinesUpToTheNextHeader) {
    const struct {
        const char *text, *section;
        int result;
        const char* left;
    } rows[] = {
        {"[a]\nx=1\n\n[b]\ny=2\n", "A", zkINIEditor::Done, "[b]\ny=2\n"},
        {"[a]\nx=1\n\n[b]\ny=2\n", "b", zkINIEditor::Done, "[a]\nx=1\n\n"},
        {"[a]\nx=1\n[A]\ny=2\n", "a", zkINIEditor::Done, "[A]\ny=2\n"},
        {"\xEF\xBB\xBF# c\nk=v\n[a]\n", "", zkINIEditor::Done, "\xEF\xBB\xBF[a]\n"},
        {"\n\n[a]\n", "", zkINIEditor::Missing, "\n\n[a]\n"},
        {"[a]\n", "b", zkINIEditor::Missing, "[a]\n"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        int result = 0;
        EXPECT_EQ(row.left,
                  afterChange(row.text, result, [&](zkINIEditor& e) { return e.RemoveSection(zkStr(row.section)); }));
        EXPECT_EQ(row.result, result);
    }
}

// The lines before the first header are the section of the empty name when
// they hold a key or comment; its first line may be a key.
TEST(IniEditor, LinesBeforeTheFirstHeaderAreTheEmptyName) {
    const std::string text = "k=1\n  j = 2\n[a]\n x = 3\n";
    zkINIEditor editor;
    editor.Load(text.data(), text.size());
    EXPECT_TRUE(editor.HasSection(zkStr("")));
    const struct {
        const char* section;
        int result;
        const char* pairs;
    } rows[] = {{"", zkINIEditor::Done, "k=1;j=2;"}, {"A", zkINIEditor::Done, "x=3;"}, {"b", zkINIEditor::Missing, ""}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.section);
        std::list<std::pair<zkStringBase, zkStringBase>> pairs;
        EXPECT_EQ(row.result, editor.GetKeyValues(zkStr(row.section), pairs));
        std::string listed;
        for (const auto& pair : pairs) listed += zkText(pair.first) + "=" + zkText(pair.second) + ";";
        EXPECT_EQ(row.pairs, listed);
    }
    EXPECT_EQ(zkINIEditor::Done, editor.RemoveKey(zkStr(""), zkStr("k")));
    zkStringBase left;
    editor.GetText(left);
    EXPECT_EQ("  j = 2\n[a]\n x = 3\n", zkText(left));
}

// Where no new file can be made beside it, Save rewrites the file in place
// after reserving exactly the text's size, so it fits a file size limit of
// that many bytes.
TEST(IniEditor, InPlaceSaveReservesTheTextSize) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    for (const char* file : {"bom.ini", "crlf.ini"}) {
        SCOPED_TRACE(file);
        ASSERT_TRUE(zkWriteFile(path, zkTestData(file)));
        ASSERT_EQ(0, chmod(path.c_str(), 0666));
        zkINIEditor editor(path.c_str());
        ASSERT_EQ(zkINIEditor::Done, editor.Open(false, false));
        ASSERT_EQ(zkINIEditor::Missing, editor.SetVal(zkStr("new"), zkStr("k"), zkStr("v")));
        zkStringBase expected;
        editor.GetText(expected);
        int result = -1;
        ASSERT_TRUE(zkInPlaceWithLimit(dir, expected.length(), [&] { result = editor.Save(); }));
        EXPECT_EQ(zkINIEditor::Done, result);
        EXPECT_EQ(zkText(expected), zkReadFile(path));
    }
}

// New keys of the empty name open a file without lines before its first
// header; a new section in an empty file needs no blank line before it.
TEST(IniEditor, NewLinesTakeTheFilesLineEnds) {
    const struct {
        const char *text, *section, *expected;
    } rows[] = {
        {"", "s", "[s]\nk=v\n"},
        {"\xEF\xBB\xBF", "s", "\xEF\xBB\xBF[s]\nk=v\n"},
        {"", "", "k=v\n"},
        {"\r\n[a]\r\n", "", "k=v\r\n\r\n[a]\r\n"},
        {"x=1\r", "", "x=1\rk=v\r"},
        {"[a]\r\n\r\n", "b", "[a]\r\n\r\n[b]\r\nk=v\r\n"},
        {"[a]", "a", "[a]\nk=v"},
        {"[a]\nx\n", "b", "[a]\nx\n\n[b]\nk=v\n"},
        {"[a]\n k=1\n", "b", "[a]\n k=1\n\n[b]\nk=v\n"},
        {"[a]\n; c\n\n\n", "a", "[a]\n; c\nk=v\n\n\n"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        int result = 0;
        EXPECT_EQ(row.expected, afterChange(row.text, result, [&](zkINIEditor& e) {
                      return e.SetVal(zkStr(row.section), zkStr("k"), zkStr("v"));
                  }));
        EXPECT_EQ(zkINIEditor::Missing, result);
    }
}

// A merge sets every key of the other file, the lines before its first
// header included; one key that would be refused stops it before any is set.
TEST(IniEditor, MergeSetsEveryKeyOrNone) {
    const std::string original = "k=1\n# head\n\n[a]\nx = 1\n";
    const struct {
        const char* other;
        int result;
        const char* expected;
    } rows[] = {
        {"[a]\nx=2\n[b]\n=4\n", zkINIEditor::Refused, original.c_str()},
        {"[a]\nx=2\n[b]c]\nz=4\n", zkINIEditor::Refused, original.c_str()},
        {"k=2\n[A]\n  x=2\ny=3\n; c\n[b]\nz=4\n", zkINIEditor::Done, "k=2\n# head\n\n[a]\nx = 2\ny=3\n\n[b]\nz=4\n"},
    };
    zkINIEditor other;  // loaded again for each row: Load replaces what it held
    for (const auto& row : rows) {
        SCOPED_TRACE(row.other);
        other.Load(row.other, std::string(row.other).size());
        int result = 0;
        EXPECT_EQ(row.expected, afterChange(original, result, [&](zkINIEditor& e) { return e.MergeFrom(other); }));
        EXPECT_EQ(row.result, result);
    }
}

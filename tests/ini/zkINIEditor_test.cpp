// The line-keeping editor: each change touches only its own lines, every
// other byte stays, and what it writes reads back as it was set. Its lock is
// held from Open to Close, across saves and through links, and bounded in
// its wait. Concurrent writers and a killed holder are tested through
// zkini, which edits with it.
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstring>
#include <list>
#include <thread>

#include "ini/zkIniTestSupport.h"
#include "internal/zkStringRules.h"
#include "zkINIEditor.h"

namespace {

constexpr int Done = zkINIEditor::Done, Missing = zkINIEditor::Missing, FileError = zkINIEditor::FileError;
const std::pair<int, int> kBlocked = {FileError, EWOULDBLOCK};

// A result by its name in zkINIEditor.h.
std::string resultName(int result) {
    return std::vector<std::string>{"FileError", "Done", "Missing", "Refused"}[result + 1];
}

// What the document reads for a key: its value, or "<missing>".
std::string documentReads(const std::string& path, const std::string& section, const std::string& key) {
    zkMappedINIFile ini(path.c_str());
    zkStringBase value;
    if (ini.Open(0) != 0) return "<unreadable>";
    return ini.GetVal(zkStr(section), zkStr(key), value) == 0 ? zkText(value) : "<missing>";
}

// The names as "[a][b]".
std::string bracketed(const std::list<zkStringBase>& names) {
    std::string out;
    for (const zkStringBase& name : names) out += "[" + zkText(name) + "]";
    return out;
}

// Open's result and, when it failed, errno; by default with the lock and a
// short wait. errno starts as EINTR, which a successful Open must not take
// for an interrupted read.
std::pair<int, int> openResult(zkINIEditor& editor, bool create = false, bool lock = true, unsigned waitMs = 30) {
    errno = EINTR;
    const int result = editor.Open(create, lock, waitMs);
    return {result, result == Done ? 0 : errno};
}

}  // namespace

// The rows of ini_edits.txt change one file each through a locked editor.
TEST(IniEditor, EditChangesOnlyItsLines) {
    zkTempDir dir;
    const std::string path = dir.file("edit.ini");
    // One editor opens every file and another loads every merged text: Open and
    // Load replace what they held.
    zkINIEditor editor(path.c_str()), from;
    zkForEachRow("ini_edits.txt", [&](const auto& row) {
        const std::string original = zkTestText(row[0]);
        std::string expected = original;
        expected.replace(expected.find(row[6]), row[6].size(), row[7]);
        ASSERT_TRUE(zkWriteFile(path, original));
        zkINIEditor other(path.c_str());
        ASSERT_EQ(Done, editor.Open(false, true));
        from.Load(row[4].data(), row[4].size());
        const zkStringBase section = zkStr(row[2]), key = zkStr(row[3]);
        EXPECT_EQ(row[5], resultName(row[1] == "set"          ? editor.SetVal(section, key, zkStr(row[4]))
                                     : row[1] == "merge"      ? editor.MergeFrom(from)
                                     : row[1] == "remove-key" ? editor.RemoveKey(section, key)
                                                              : editor.RemoveSection(section)));
        zkStringBase text("stale");  // GetText replaces it
        editor.GetText(text);
        EXPECT_EQ(expected, zkText(text));
        int saved = FileError;
        ASSERT_TRUE(zkSave(dir, row[9] == "in-place", expected.size(), [&] { saved = editor.Save(); }));
        EXPECT_EQ(Done, saved);
        EXPECT_EQ(kBlocked, openResult(other, false, true, 0));  // the lock outlasts the save
        editor.Close();
        EXPECT_EQ(expected, zkReadFile(path));
        EXPECT_EQ(row[8], documentReads(path, row[2], row[3]));
    });
}

// The rows of ini_sections.txt open a file with both readers.
TEST(IniEditor, SavesAnUntouchedFileByteForByte) {
    zkTempDir dir;
    zkForEachRow("ini_sections.txt", [&](const auto& row) {
        const std::string original = zkTestText(row[0]);
        zkMappedINIFile document;
        ASSERT_EQ(0, zkLoad(document, dir, row[0], original));
        zkINIEditor editor(dir.file(row[0]).c_str());
        ASSERT_EQ(Done, editor.Open(false, false));
        std::list<zkStringBase> names, documentNames;
        editor.GetSectionNames(names);
        document.GetSectionNameList(documentNames);
        EXPECT_EQ(row[1], bracketed(names));
        EXPECT_EQ(row[2], bracketed(documentNames));
        EXPECT_EQ(Done, editor.Save());
        EXPECT_EQ(Done, editor.Save());
        EXPECT_EQ(original, zkReadFile(dir.file(row[0])));
    });
    // A file whose size says less than it holds is read whole.
    zkINIEditor proc("/proc/self/cmdline");
    ASSERT_EQ(Done, proc.Open(false, false));
    zkStringBase text;
    proc.GetText(text);
    EXPECT_EQ(zkReadFile("/proc/self/cmdline"), zkText(text));
}

// The lines before the first header are the section of the empty name when
// they hold a key or comment; its first line may be a key.
TEST(IniEditor, LinesBeforeTheFirstHeaderAreTheEmptyName) {
    const std::string text = "k=1\n  j = 2\n[a]\n x = 3\n";
    zkINIEditor editor;
    editor.Load(text.data(), text.size());
    EXPECT_TRUE(editor.HasSection(zkStr("")));
    const std::pair<const char*, const char*> rows[] = {{"", "k=1;j=2;"}, {"A", "x=3;"}, {"b", nullptr}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.first);
        std::list<std::pair<zkStringBase, zkStringBase>> pairs;
        EXPECT_EQ(row.second ? Done : Missing, editor.GetKeyValues(zkStr(row.first), pairs));
        std::string listed;
        for (const auto& pair : pairs) listed += zkText(pair.first) + "=" + zkText(pair.second) + ";";
        EXPECT_EQ(row.second ? row.second : "", listed);
    }
}

// Another editor cannot take the lock while one holds it: not after the
// holder's save replaced the file, not through a link; it can after Close.
TEST(IniEditorLock, LockIsHeldFromOpenUntilClose) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini"), link = dir.file("link.ini");
    ASSERT_TRUE(zkWriteFile(path, "[s]\nk=1\n"));
    ASSERT_EQ(0, symlink("a.ini", link.c_str()));
    const size_t descriptors = zkDirEntries("/proc/self/fd").size();
    zkINIEditor holder(link.c_str()), direct(path.c_str()), throughLink(link.c_str());
    ASSERT_EQ(Done, holder.Open(false, true));
    EXPECT_EQ(Done, openResult(holder).first);  // the holder's own lock does not block it
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(kBlocked, openResult(direct));
    // The wait of 30 ms is spent, and not much more.
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(30));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(900));
    EXPECT_EQ(Done, holder.SetVal(zkStr("s"), zkStr("k"), zkStr("2")));
    ASSERT_TRUE(zkWithFileSizeLimit(1, [&] { EXPECT_EQ(FileError, holder.Save()); }));
    EXPECT_EQ(Done, holder.Save());
    EXPECT_EQ(kBlocked, openResult(throughLink));
    holder.Close();
    EXPECT_FALSE(holder.HasSection(zkStr("s")));
    EXPECT_EQ(Done, openResult(holder, false, false).first);  // reads without the lock
    ASSERT_EQ(Done, openResult(throughLink).first);
    zkStringBase value;
    EXPECT_EQ(Done, throughLink.GetVal(zkStr("s"), zkStr("k"), value));
    EXPECT_EQ("2", zkText(value));
    EXPECT_EQ(Missing, throughLink.GetVal(zkStr("none"), zkStr("k"), value));
    EXPECT_EQ(Missing, throughLink.GetVal(zkStr("s"), zkStr("none"), value));
    EXPECT_EQ("2", zkText(value));
    throughLink.Close();

    // A waiter that gets the lock of the file the holder's save replaced
    // moves on to the new file and waits for its holder too.
    ASSERT_EQ(Done, holder.Open(false, true));
    std::thread waiter([&] { EXPECT_EQ(Done, openResult(direct, false, true, 10000).first); });
    usleep(100000);  // the waiter waits on the old file
    EXPECT_EQ(Done, holder.SetVal(zkStr("s"), zkStr("k"), zkStr("3")));
    EXPECT_EQ(Done, holder.Save());
    usleep(100000);
    holder.Close();
    waiter.join();
    EXPECT_EQ(Done, direct.GetVal(zkStr("s"), zkStr("k"), value));
    EXPECT_EQ("3", zkText(value));
    direct.Close();

    EXPECT_EQ(descriptors, zkDirEntries("/proc/self/fd").size());  // failed Opens and Saves included
}

// The rows of ini_open_failures.txt open a file that cannot be read.
TEST(IniEditorLock, OpenFailures) {
    zkForEachRow("ini_open_failures.txt", [](const auto& row) {
        zkTempDir dir;
        const std::string path = dir.file(row[0]), huge = dir.file("huge.ini");
        ASSERT_EQ(0, symlink("loop.ini", dir.file("loop.ini").c_str()));
        ASSERT_TRUE(zkWriteFile(huge, ""));
        ASSERT_EQ(0, truncate(huge.c_str(), kZkMaxStringLength + 1));
        for (int attempt = 0; attempt < 2; ++attempt) {
            zkINIEditor editor(path.c_str());
            const auto result = openResult(editor, row[1] == "1", row[2] == "1", 0);
            EXPECT_EQ(row[3], resultName(result.first));
            EXPECT_EQ(row[4], strerror(result.second));
            EXPECT_EQ(row[5] == "1", access(path.c_str(), F_OK) == 0);
        }
    });
}

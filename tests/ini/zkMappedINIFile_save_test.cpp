// Saving INI documents: the written forms, the refusals, and what a save
// asks of the file replacement (the new file's mode, the size to reserve).
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "ini/zkIniTestSupport.h"

namespace {

const std::string kHead = "[Servers]\nalpha=10.0.0.1\nbeta=\n; spare\n\n[IPsBehindFirewall]\n";
const std::string kTail = "\n; trusted\n; \n\n[ipsbehindfirewall]\nlower=1\n\n";
const std::string kPlain = kHead + "192.168.1.7=\nhost=10.1.1.1\nx=" + kTail;
const std::string kFirewall = kHead + "192.168.1.7\nhost10.1.1.1\nx" + kTail;
const char kNul[] = "[nul\0name]\nk\0ey=va\0lue\n; \0\n\n";

int closeSaving(zkMappedINIFile& ini, bool firewall) {
    return firewall ? ini.CloseFW(1) : ini.Close(1);
}

}  // namespace

// Only the section named exactly "IPsBehindFirewall" loses its "=" in the
// firewall form; a lone comment character or "=" keeps a padding blank, as
// a line of one character would read back as nothing.
TEST(IniSave, WrittenForms) {
    const struct {
        std::string text;
        bool firewall;
        std::string written;
    } rows[] = {
        {zkTestData("firewall.ini"), false, kPlain},
        {zkTestData("firewall.ini"), true, kFirewall},
        {zkTestData("lone_characters.ini"), false, "[short]\n; \n# \n= \n\n"},
        {zkTestData("lone_characters.ini"), true, "[short]\n; \n# \n= \n\n"},
        {std::string(kNul, sizeof kNul - 1), false, std::string(kNul, sizeof kNul - 1)},
    };
    zkTempDir dir;
    for (const auto& row : rows) {
        SCOPED_TRACE(row.written);
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", row.text));
        EXPECT_EQ(0, closeSaving(ini, row.firewall));
        EXPECT_EQ(row.written, zkReadFile(dir.file("a.ini")));
        EXPECT_EQ("", zkDump(ini));
    }
}

// The firewall section's name is matched by the compare type of the stored
// name: one set through a case-insensitive string matches in any case.
TEST(IniSave, FirewallNameFollowsItsCompareType) {
    zkTempDir dir;
    zkMappedINIFile ini(dir.file("a.ini").c_str());
    zkStringBase name("IPSBEHINDFIREWALL");
    name.setCompareType(zkStringBase::CaseInsensitive);
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr(""));
    ini.SetVal(name, zkStr("10.0.0.9"), zkStr(""));
    EXPECT_EQ(0, ini.CloseFW(1));
    EXPECT_EQ("[s]\nk=\n\n[IPSBEHINDFIREWALL]\n10.0.0.9\n\n", zkReadFile(dir.file("a.ini")));
}

// Close(0) and CloseFW(0) empty the document and write nothing.
TEST(IniSave, CloseWithoutSavingWritesNothing) {
    zkTempDir dir;
    for (bool firewall : {false, true}) {
        SCOPED_TRACE(firewall);
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", "[s]\nk=1\n"));
        ini.SetVal(zkStr("s"), zkStr("k"), zkStr("2"));
        EXPECT_EQ(0, firewall ? ini.CloseFW(0) : ini.Close(0));
        EXPECT_EQ("", zkDump(ini));
        EXPECT_EQ("[s]\nk=1\n", zkReadFile(dir.file("a.ini")));
    }
}

// A line break in a name, key or value would read back as lines of their
// own, so the save is refused (EINVAL); a failed save, refused or not, keeps
// the document and the old file.
TEST(IniSave, FailedSaveKeepsTheFileAndTheDocument) {
    zkTempDir dir;
    const std::string old = "[s]\nk=old\n";
    const struct {
        const char *file, *section, *key, *value;
        int error;
    } rows[] = {
        {"a.ini", "s", "k", "a\nb", EINVAL},
        {"a.ini", "s", "k\r", "v", EINVAL},
        {"a.ini", "x\ny", "k", "v", EINVAL},
        {"missing/a.ini", "s", "k", "v", ENOENT},
    };
    for (const auto& row : rows) {
        for (bool firewall : {false, true}) {
            SCOPED_TRACE(std::string(row.section) + "/" + row.key + "/" + row.value + (firewall ? " fw" : ""));
            zkMappedINIFile ini;
            ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", old));
            ini.SetVal(zkStr(row.section), zkStr(row.key), zkStr(row.value));
            const std::string kept = zkDump(ini);
            ini.SetFilename(dir.file(row.file).c_str());
            errno = 0;
            EXPECT_EQ(1, closeSaving(ini, firewall));
            EXPECT_EQ(row.error, errno);
            EXPECT_EQ(kept, zkDump(ini));
            EXPECT_EQ(old, zkReadFile(dir.file("a.ini")));
        }
    }
}

// A file that a save creates gets 0666 less the umask.
TEST(IniSave, NewFileTakesTheUmask) {
    zkTempDir dir;
    zkMappedINIFile ini(dir.file("new.ini").c_str());
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr("v"));
    const mode_t mask = umask(022);
    EXPECT_EQ(0, ini.Close(1));
    umask(mask);
    struct stat st = {};
    ASSERT_EQ(0, stat(dir.file("new.ini").c_str(), &st));
    EXPECT_EQ(0644u, st.st_mode & 07777u);
}

// Where no new file can be made beside it, the file is rewritten in place
// after reserving the size the document will take: exactly that size, so
// the save fits a file size limit of that many bytes.
TEST(IniSave, InPlaceRewriteReservesTheWrittenSize) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    for (bool firewall : {false, true}) {
        SCOPED_TRACE(firewall);
        ASSERT_TRUE(zkWriteFile(path, "[s]\n"));
        ASSERT_EQ(0, chmod(path.c_str(), 0666));
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "source.ini", zkTestData("firewall.ini")));
        ini.SetFilename(path.c_str());
        const std::string expected = firewall ? kFirewall : kPlain;
        int result = -1;
        ASSERT_TRUE(zkInPlaceWithLimit(dir, expected.size(), [&] { result = closeSaving(ini, firewall); }));
        EXPECT_EQ(0, result);
        EXPECT_EQ(expected, zkReadFile(path));
    }
}

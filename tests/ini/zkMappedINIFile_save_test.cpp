// Saving INI documents: the written form, the firewall form, and replacing
// the file safely (permissions, owner, links, failures, the in-place way).
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <set>
#include <string>
#include <tuple>

#include "ini/zkIniTestSupport.h"

namespace {

struct stat statOf(const std::string& path) {
    struct stat st = {};
    EXPECT_EQ(0, lstat(path.c_str(), &st)) << path;
    return st;
}

}  // namespace

// Only the section named exactly "IPsBehindFirewall", or by a
// case-insensitive string, loses its "=" in the firewall form; a lone
// comment character keeps its padding blank in both forms.
TEST(IniSave, WrittenForms) {
    const std::string head = "[Servers]\nalpha=10.0.0.1\nbeta=\n; spare\n\n[IPsBehindFirewall]\n";
    const std::string tail = "\n; trusted\n; \n\n[ipsbehindfirewall]\nlower=1\n\n";
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    for (bool firewallForm : {false, true}) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", zkTestData("firewall.ini")));
        EXPECT_EQ(0, firewallForm ? ini.CloseFW(1) : ini.Close(1));
        EXPECT_EQ(head + (firewallForm ? "192.168.1.7\nhost10.1.1.1\nx" : "192.168.1.7=\nhost=10.1.1.1\nx=") + tail,
                  zkReadFile(path));
        EXPECT_EQ("", zkDump(ini));
    }

    // Close(0) empties the document and writes nothing.
    const std::string written = zkReadFile(path);
    zkMappedINIFile ini(path.c_str());
    ini.SetVal(zkStr("t"), zkStr("k"), zkStr(""));
    EXPECT_EQ(0, ini.Close(0));
    EXPECT_EQ(written, zkReadFile(path));
    zkStringBase name("IPSBEHINDFIREWALL");
    name.setCompareType(zkStringBase::CaseInsensitive);
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr(""));
    ini.SetVal(name, zkStr("10.0.0.9"), zkStr(""));
    EXPECT_EQ(0, ini.CloseFW(1));
    EXPECT_EQ("[s]\nk=\n\n[IPSBEHINDFIREWALL]\n10.0.0.9\n\n", zkReadFile(path));
    EXPECT_EQ((std::set<std::string>{"a.ini"}), zkDirEntries(dir.path()));
}

// Through a link the target is replaced and the link stays, also when the
// target does not exist yet; the old file's permissions and owner are kept,
// a new file gets 0666 less the umask.
TEST(IniSave, KeepsPermissionsOwnerAndLinks) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    ASSERT_TRUE(zkWriteFile(path, "[s]\nk=1\n"));
    ASSERT_EQ(0, chmod(path.c_str(), 0640));
    const bool root = geteuid() == 0;
    ASSERT_EQ(0, root ? chown(path.c_str(), 4321, 8765) : 0);
    ASSERT_TRUE(symlink("a.ini", dir.file("link.ini").c_str()) == 0 && mkdir(dir.file("sub").c_str(), 0755) == 0 &&
                symlink("sub/../b.ini", dir.file("dangling.ini").c_str()) == 0);
    zkMappedINIFile ini(dir.file("link.ini").c_str());
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr("2"));
    EXPECT_EQ(0, ini.Close(1));
    EXPECT_EQ("[s]\nk=2\n\n", zkReadFile(path));
    const struct stat st = statOf(path);
    EXPECT_EQ(std::make_tuple(0640u, root ? 4321u : getuid(), root ? 8765u : getgid()),
              std::make_tuple(st.st_mode & 07777u, st.st_uid, st.st_gid));

    const mode_t mask = umask(027);
    ini.SetFilename(dir.file("dangling.ini").c_str());
    ini.SetVal(zkStr("d"), zkStr("k"), zkStr("v"));
    EXPECT_EQ(0, ini.Close(1));
    umask(mask);
    EXPECT_EQ("[d]\nk=v\n\n", zkReadFile(dir.file("b.ini")));
    EXPECT_EQ(0640u, statOf(dir.file("b.ini")).st_mode & 07777);
    EXPECT_TRUE(S_ISLNK(statOf(dir.file("link.ini")).st_mode) && S_ISLNK(statOf(dir.file("dangling.ini")).st_mode));
    EXPECT_EQ((std::set<std::string>{"a.ini", "link.ini", "dangling.ini", "b.ini", "sub"}), zkDirEntries(dir.path()));
}

// No directory to write into, no name, a write past the file size limit, or
// a line break in a name, key or value, which would read back as lines of
// its own: Close and CloseFW return 1 and keep the document, the old file
// and no other.
TEST(IniSave, FailedSavesKeepTheFileAndTheDocument) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini"), old = "[s]\nk=old\n\n";
    const struct {
        std::string file;
        const char *section, *key;
        std::string value;
    } cases[] = {
        {dir.file("missing/a.ini"), "s", "k", "v"},
        {"", "s", "k", "v"},
        {path, "s", "k", std::string(4000, 'v')},
        {path, "s", "k", "a\nb"},
        {path, "s", "k\r", "v"},
        {path, "x\ny", "k", "v"},
    };
    for (const auto& c : cases) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", old));
        ini.SetVal(zkStr(c.section), zkStr(c.key), zkStr(c.value.c_str()));
        const std::string kept = zkDump(ini);
        ini.SetFilename(c.file.c_str());
        int closed = 0, closedFW = 0;
        ASSERT_TRUE(zkWithFileSizeLimit(1024, [&] {
            closed = ini.Close(1);
            closedFW = ini.CloseFW(1);
        }));
        EXPECT_TRUE(closed == 1 && closedFW == 1) << c.file << c.section << c.key << c.value.size();
        EXPECT_EQ(kept, zkDump(ini));
        EXPECT_EQ(old, zkReadFile(path));
        EXPECT_EQ((std::set<std::string>{"a.ini"}), zkDirEntries(dir.path()));
    }
}

// Where no new file can be made, a writable file is rewritten in place; a
// new or unwritable one is not saved. Permission bits do not stop root, who
// acts as an unprivileged user here.
TEST(IniSave, RewritesInPlaceWhenNoNewFileCanBeMade) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini"), locked = dir.file("locked.ini");
    ASSERT_TRUE(zkWriteFile(path, "[s]\nk=old\n\n") && zkWriteFile(locked, "[s]\nk=locked\n\n"));
    ASSERT_TRUE(chmod(path.c_str(), 0666) == 0 && chmod(locked.c_str(), 0444) == 0);
    zkMappedINIFile ini(path.c_str()), other(dir.file("new.ini").c_str());
    ASSERT_EQ(0, ini.Open(0));
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr("new value"));
    other.SetVal(zkStr("s"), zkStr("k"), zkStr("v"));

    const bool root = geteuid() == 0;
    ASSERT_EQ(0, chmod(dir.path().c_str(), root ? 0755 : 0555));
    ASSERT_EQ(0, root ? seteuid(65534) : 0);
    const int rewritten = ini.Close(1), created = other.Close(1);
    other.SetFilename(locked.c_str());
    const int overLocked = other.Close(1);
    ASSERT_EQ(0, root ? seteuid(0) : 0);
    EXPECT_EQ(std::make_tuple(0, 1, 1), std::make_tuple(rewritten, created, overLocked));
    chmod(dir.path().c_str(), 0700);

    EXPECT_EQ("[s]\nk=new value\n\n", zkReadFile(path));
    EXPECT_EQ(0666u, statOf(path).st_mode & 07777);
    EXPECT_EQ("[s]\nk=locked\n\n", zkReadFile(locked));
    EXPECT_EQ((std::set<std::string>{"a.ini", "locked.ini"}), zkDirEntries(dir.path()));

    // A device is written where it stands, never replaced by a regular file.
    struct stat st;
    if (stat("/dev/full", &st) != 0 || !S_ISCHR(st.st_mode)) GTEST_SKIP() << "no /dev/full";
    ASSERT_EQ(0, symlink("/dev/full", dir.file("full.ini").c_str()));
    other.SetFilename(dir.file("full.ini").c_str());
    EXPECT_EQ(1, other.Close(1));
    EXPECT_TRUE(S_ISCHR(statOf("/dev/full").st_mode));
    EXPECT_EQ((std::set<std::string>{"a.ini", "locked.ini", "full.ini"}), zkDirEntries(dir.path()));
}

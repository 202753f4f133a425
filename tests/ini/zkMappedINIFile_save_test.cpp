// Saving INI documents: the written form, the firewall form, and replacing
// the file safely (permissions, owner, links, failures, the in-place way).
#include <dirent.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <set>
#include <string>

#include "ini/zkIniTestSupport.h"
#include "zkMappedINIFile.h"

namespace {

// The names in a directory, "." and ".." left out.
std::set<std::string> entries(const std::string& path) {
    std::set<std::string> names;
    DIR* dir = opendir(path.c_str());
    while (const dirent* entry = dir ? readdir(dir) : nullptr) names.insert(entry->d_name);
    if (dir) closedir(dir);
    names.erase(".");
    names.erase("..");
    return names;
}

struct stat statOf(const std::string& path) {
    struct stat st = {};
    EXPECT_EQ(0, lstat(path.c_str(), &st)) << path;
    return st;
}

}  // namespace

TEST(IniSave, WrittenForms) {
    const char* const firewall = "[Servers]\nalpha=10.0.0.1\nbeta=\n; spare\n\n[IPsBehindFirewall]\n";
    const struct {
        const char* file;
        bool firewallForm;
        std::string written;
    } cases[] = {
        {"crlf.ini", false, "[Main]\nhost=example.org\nport=8080\n# a comment\nempty=\n\n[Other]\nflag=\nk=a = b\n\n"},
        {"header_comment.ini", false, "[net]\nhost=a\n\n[abc]\nx=1\n\n[a]b]\ny=2\n\n[]\nz=3\nw=4\n\n"},
        {"bom.ini", false, "[first]\nname=one\n\n[second]\nname=two\n\n"},
        {"firewall.ini", false,
         std::string(firewall) + "192.168.1.7=\nhost=10.1.1.1\nx=\n; trusted\n\n[ipsbehindfirewall]\nlower=1\n\n"},
        // Only the section named exactly so loses its "=".
        {"firewall.ini", true,
         std::string(firewall) + "192.168.1.7\nhost10.1.1.1\nx\n; trusted\n\n[ipsbehindfirewall]\nlower=1\n\n"},
    };
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    for (const auto& c : cases) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", zkTestData(c.file)));
        const std::string loaded = zkDump(ini);
        EXPECT_EQ(0, c.firewallForm ? ini.CloseFW(1) : ini.Close(1));
        EXPECT_EQ(c.written, zkReadFile(path)) << c.file;
        EXPECT_EQ("", zkDump(ini));
        EXPECT_EQ(0, ini.Open(0));
        if (!c.firewallForm) {
            EXPECT_EQ(loaded, zkDump(ini)) << c.file;
        }
    }

    // Close(0) writes nothing; a name set from a case-insensitive string
    // takes the firewall form in any case.
    zkMappedINIFile ini(path.c_str());
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr(""));
    EXPECT_EQ(0, ini.Close(0));
    zkStringBase name("IPSBEHINDFIREWALL");
    name.setCompareType(zkStringBase::CaseInsensitive);
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr(""));
    ini.SetVal(name, zkStr("10.0.0.9"), zkStr(""));
    EXPECT_EQ(0, ini.CloseFW(1));
    EXPECT_EQ("[s]\nk=\n\n[IPSBEHINDFIREWALL]\n10.0.0.9\n\n", zkReadFile(path));
    EXPECT_EQ(0, ini.Close(1));
    EXPECT_EQ("", zkReadFile(path));
    EXPECT_EQ((std::set<std::string>{"a.ini"}), entries(dir.path()));
}

TEST(IniSave, KeepsPermissionsOwnerAndLinks) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    zkMappedINIFile ini;
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", "[s]\nk=1\n"));
    ASSERT_EQ(0, chmod(path.c_str(), 0640));
    const bool root = geteuid() == 0;
    if (root) {
        ASSERT_EQ(0, chown(path.c_str(), 4321, 8765));
    }
    // Through a link the target is replaced and the link stays, also when
    // the target does not exist yet.
    ASSERT_EQ(0, symlink("a.ini", dir.file("link.ini").c_str()));
    ASSERT_EQ(0, symlink("sub/../b.ini", dir.file("dangling.ini").c_str()));
    ASSERT_EQ(0, mkdir(dir.file("sub").c_str(), 0755));
    ini.SetFilename(dir.file("link.ini").c_str());
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr("2"));
    EXPECT_EQ(0, ini.Close(1));
    EXPECT_EQ("[s]\nk=2\n\n", zkReadFile(path));
    const struct stat st = statOf(path);
    EXPECT_EQ(0640u, st.st_mode & 07777);
    EXPECT_EQ(root ? 4321u : getuid(), st.st_uid);
    EXPECT_EQ(root ? 8765u : getgid(), st.st_gid);
    EXPECT_TRUE(S_ISLNK(statOf(dir.file("link.ini")).st_mode));

    // A new file gets 0666 less the umask.
    const mode_t mask = umask(027);
    ini.SetFilename(dir.file("dangling.ini").c_str());
    ini.SetVal(zkStr("d"), zkStr("k"), zkStr("v"));
    EXPECT_EQ(0, ini.Close(1));
    umask(mask);
    EXPECT_TRUE(S_ISLNK(statOf(dir.file("dangling.ini")).st_mode));
    EXPECT_EQ("[d]\nk=v\n\n", zkReadFile(dir.file("b.ini")));
    EXPECT_EQ(0640u, statOf(dir.file("b.ini")).st_mode & 07777);
    EXPECT_EQ((std::set<std::string>{"a.ini", "link.ini", "dangling.ini", "b.ini", "sub"}), entries(dir.path()));
}

TEST(IniSave, FailedSavesKeepTheFileAndTheDocument) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    const std::string old = "[s]\nk=old\n\n";
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "x"));
    // No directory to write into; a line break inside a name, key, value or
    // comment, which would read back as lines of their own.
    const struct {
        std::string file;
        const char *section, *key, *value;
    } cases[] = {
        {dir.file("missing/a.ini"), "s", "k", "v"}, {dir.file("plain/a.ini"), "s", "k", "v"}, {"", "s", "k", "v"},
        {path, "s", "k", "a\nb"}, {path, "s", "k\r", "v"}, {path, "x\ny", "k", "v"}, {path, "s", "", "; c\n[t]"},
    };
    for (const auto& c : cases) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", old));
        ini.SetVal(zkStr("s"), zkStr(""), zkStr("; comment"));
        ini.GetPropertyList("s")->back()->m_isComment = 1;
        ini.SetVal(zkStr(c.section), zkStr(c.key), zkStr(c.value));
        const std::string kept = zkDump(ini);
        ini.SetFilename(c.file.c_str());
        EXPECT_EQ(1, ini.Close(1)) << c.file << c.section << c.key << c.value;
        EXPECT_EQ(1, ini.CloseFW(1));
        EXPECT_EQ(kept, zkDump(ini));
        EXPECT_EQ(old, zkReadFile(path));
    }
    EXPECT_EQ((std::set<std::string>{"a.ini", "plain"}), entries(dir.path()));
}

TEST(IniSave, FileSizeLimitLeavesTheOldBytes) {
    zkTempDir dir;
    const std::string old = "[s]\nk=old\n\n";
    const std::string big(4000, 'v');
    zkMappedINIFile ini;
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", old));
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr(big.c_str()));
    struct rlimit saved;
    ASSERT_EQ(0, getrlimit(RLIMIT_FSIZE, &saved));
    const struct rlimit limit = {1024, saved.rlim_max};
    const sighandler_t handler = signal(SIGXFSZ, SIG_IGN);
    const int limited = setrlimit(RLIMIT_FSIZE, &limit);
    const int result = ini.Close(1);
    setrlimit(RLIMIT_FSIZE, &saved);
    signal(SIGXFSZ, handler);
    ASSERT_EQ(0, limited);
    EXPECT_EQ(1, result);
    EXPECT_EQ(old, zkReadFile(dir.file("a.ini")));
    EXPECT_EQ((std::set<std::string>{"a.ini"}), entries(dir.path()));
    EXPECT_EQ(0, ini.Close(1));  // the kept document can still be saved
    EXPECT_EQ("[s]\nk=" + big + "\n\n", zkReadFile(dir.file("a.ini")));
}

TEST(IniSave, DevicesAreWrittenInPlace) {
    // A device is written where it stands, never replaced by a regular file.
    struct stat st;
    if (stat("/dev/full", &st) != 0 || !S_ISCHR(st.st_mode)) GTEST_SKIP() << "no /dev/full";
    zkTempDir dir;
    ASSERT_EQ(0, symlink("/dev/full", dir.file("full.ini").c_str()));
    zkMappedINIFile ini(dir.file("full.ini").c_str());
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr("v"));
    EXPECT_EQ(1, ini.Close(1));
    EXPECT_TRUE(S_ISCHR(statOf("/dev/full").st_mode));
    EXPECT_EQ((std::set<std::string>{"full.ini"}), entries(dir.path()));
}

TEST(IniSave, RewritesInPlaceWhenTheDirectoryIsReadOnly) {
    zkTempDir dir;
    const std::string path = dir.file("a.ini");
    const std::string locked = dir.file("locked.ini");
    ASSERT_TRUE(zkWriteFile(path, "[s]\nk=old\n\n"));
    ASSERT_TRUE(zkWriteFile(locked, "[s]\nk=locked\n\n"));
    ASSERT_EQ(0, chmod(path.c_str(), 0666));
    ASSERT_EQ(0, chmod(locked.c_str(), 0444));
    zkMappedINIFile ini(path.c_str());
    ASSERT_EQ(0, ini.Open(0));
    ini.SetVal(zkStr("s"), zkStr("k"), zkStr("new value"));
    zkMappedINIFile other(dir.file("new.ini").c_str());
    other.SetVal(zkStr("s"), zkStr("k"), zkStr("v"));

    // Permission bits do not stop root, who acts as an unprivileged user here.
    const bool root = geteuid() == 0;
    ASSERT_EQ(0, chmod(dir.path().c_str(), root ? 0755 : 0555));
    ASSERT_EQ(0, root ? seteuid(65534) : 0);
    EXPECT_EQ(0, ini.Close(1));
    EXPECT_EQ(1, other.Close(1));  // no new file can be made there
    other.SetFilename(locked.c_str());
    EXPECT_EQ(1, other.Close(1));  // nor an unwritable one rewritten
    ASSERT_EQ(0, root ? seteuid(0) : 0);
    chmod(dir.path().c_str(), 0700);

    EXPECT_EQ("[s]\nk=new value\n\n", zkReadFile(path));
    EXPECT_EQ(0666u, statOf(path).st_mode & 07777);
    EXPECT_EQ("[s]\nk=locked\n\n", zkReadFile(locked));
    EXPECT_EQ((std::set<std::string>{"a.ini", "locked.ini"}), entries(dir.path()));
}

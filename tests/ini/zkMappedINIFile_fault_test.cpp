// INI documents under failing writes, concurrent savers and loaders, and
// input far outside the usual: every save either replaces the file whole or
// leaves it byte for byte, and every load sees a whole document.
#include <dirent.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "ini/zkIniTestSupport.h"
#include "zkMappedINIFile.h"

namespace {

// A document of several sections, written with one write per section.
std::string versionText(char tag, int sections) {
    std::string text;
    for (int s = 0; s < sections; ++s) {
        text += "[section" + std::to_string(s) + "]\n";
        for (int k = 0; k < 6; ++k) text += "key" + std::to_string(k) + "=" + std::string(12, tag) + "\n";
        text += "\n";
    }
    return text;
}

}  // namespace

TEST(IniFault, ConcurrentSaversAndLoadersSeeWholeDocuments) {
    constexpr int kSaves = 60;
    constexpr int kLoads = 400;
    zkTempDir dir;
    const std::string path = dir.file("shared.ini");
    const std::string versions[] = {versionText('a', 30), versionText('b', 30)};
    ASSERT_TRUE(zkWriteFile(path, versions[0]));
    std::vector<std::string> dumps;
    for (const std::string& text : versions) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, dir, "v.ini", text));
        dumps.push_back(zkDump(ini));
    }

    std::vector<pid_t> children;
    for (int child = 0; child < 4; ++child) {
        pid_t pid = fork();
        ASSERT_NE(-1, pid);
        if (pid != 0) {
            children.push_back(pid);
            continue;
        }
        // Two children save their own version in a loop, two load and check.
        int failures = 0;
        zkMappedINIFile ini(path.c_str());
        if (child < 2) {
            zkMappedINIFile source;
            if (zkLoad(source, dir, "v" + std::to_string(child) + ".ini", versions[child]) != 0) _exit(2);
            for (int i = 0; i < kSaves; ++i) {
                ini.MergeFrom(source);
                failures += ini.Close(1);
            }
        } else {
            for (int i = 0; i < kLoads; ++i) {
                failures += ini.Open(0);
                const std::string seen = zkDump(ini);
                failures += seen != dumps[0] && seen != dumps[1];
                ini.Clear();
            }
        }
        _exit(failures == 0 ? 0 : 1);
    }
    for (pid_t pid : children) {
        int status = 0;
        ASSERT_EQ(pid, waitpid(pid, &status, 0));
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << status;
    }
    EXPECT_EQ(4u, zkDirEntries(dir.path()).size());  // the shared file and three sources
}

TEST(IniFault, HugeNulAndOneCharacterLinesRoundTrip) {
    zkTempDir dir;
    const std::string huge(1 << 20, 'x');
    std::string text = "[" + huge + "]\n" + huge + "=" + huge + "\n\n";
    const char nul[] = "[nul\0name]\nk\0ey=va\0lue\n; \0\n\n";
    text += std::string(nul, sizeof nul - 1);
    // A lone comment character and an empty key with an empty value: lines
    // of one character would read back as nothing.
    text += "[short]\n;   \n#\t\n= \n=\n";
    zkMappedINIFile ini;
    ASSERT_EQ(0, zkLoad(ini, dir, "a.ini", text));
    const std::string loaded = zkDump(ini);
    ASSERT_EQ(3u, ini.GetSectionList()->size());
    const char nulDump[] = "[nul\0name]\nk:k\0ey|va\0lue\nc:; \0\n[short]\nc:;\nc:#\nk:|\n";
    EXPECT_EQ(std::string(nulDump, sizeof nulDump - 1), loaded.substr(loaded.find("[nul")));
    ASSERT_EQ(0, ini.Close(1));
    const std::string written = zkReadFile(dir.file("a.ini"));
    EXPECT_EQ("[short]\n; \n# \n= \n\n", written.substr(written.find("[short]")));
    ASSERT_EQ(0, ini.Open(0));
    EXPECT_EQ(loaded, zkDump(ini));

    // A name of 4096 bytes is refused, not shortened to another file.
    const std::string longName = dir.path() + std::string(4096 - dir.path().size() - 5, '/') + "a.ini";
    zkMappedINIFile refused(longName.c_str());
    EXPECT_EQ(1, refused.Open(0));
    refused.SetVal(zkStr("s"), zkStr("k"), zkStr("v"));
    EXPECT_EQ(1, refused.Close(1));
    EXPECT_EQ(loaded, zkDump(ini));
}

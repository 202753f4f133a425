// zkLogFile: the line format, levels, numbering, echo, clearing and
// concurrent writers.
#include "zkLogFile.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <sstream>
#include <string>
#include <vector>

#include "support/zkTempDir.h"
#include "zkFilename.h"

namespace {

using Level = zkLogFile::LogLevel;

// Runs make() until the local clock did not move during it, and returns the
// "HH:MM:SS MM/DD/YY" it ran under.
template <class Make>
std::string underOneStamp(Make make) {
    auto stamp = [] {
        std::time_t now = std::time(nullptr);
        struct tm local;
        char text[32];
        std::strftime(text, sizeof text, "%H:%M:%S %m/%d/%y", localtime_r(&now, &local));
        return std::string(text);
    };
    for (;;) {
        std::string before = stamp();
        make();
        if (stamp() == before) return before;
    }
}

zkLogFile plainLog(const std::string& path) {
    zkLogFile log(zkStringBase(path.c_str()), 0);
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
    return log;
}

// What body writes to standard output.
template <class Body>
std::string capturedStdout(const std::string& file, Body body) {
    std::fflush(stdout);
    int saved = dup(STDOUT_FILENO);
    int fd = open(file.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    dup2(fd, STDOUT_FILENO);
    close(fd);
    body();
    std::fflush(stdout);
    dup2(saved, STDOUT_FILENO);
    close(saved);
    return zkReadFile(file);
}

bool exists(const std::string& path) {
    return zkFilename(path.c_str()).FileExists(1) != 0;
}

}  // namespace

TEST(LogFile, LineCarriesTimeDateAndNumber) {
    zkTempDir dir;
    std::string path = dir.file("app.log");
    zkLogFile log(zkStringBase(path.c_str()), 0);
    EXPECT_STREQ(path.c_str(), log.GetFilename());
    std::string stamp = underOneStamp([&] {
        ASSERT_TRUE(zkWriteFile(path, ""));
        log.Log("hello", Level(1));
    });
    EXPECT_EQ(stamp + "  hello\n", zkReadFile(path));

    zkStringBase time, date;
    stamp = underOneStamp([&] { log.GetCurrTimeAndDate(time, date); });
    EXPECT_EQ(stamp, std::string(time.data()) + " " + date.data());

    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    int attempts = 0;
    stamp = underOneStamp([&] {
        ASSERT_TRUE(zkWriteFile(path, ""));
        log.Log("Disk full", Level(1));
        ++attempts;
    });
    EXPECT_EQ(std::to_string(attempts) + ") " + stamp + "  Disk full\n", zkReadFile(path));
}

TEST(LogFile, LevelsFilterAndOnlyWrittenEntriesTakeNumbers) {
    zkTempDir dir;
    zkLogFile log = plainLog(dir.file("n.log"));
    EXPECT_EQ(1u, zkLogFile().GetOption(zkLogFile::OptionTimeStamp));
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved) + log.GetOption(zkLogFile::OptionEntryNumber));
    EXPECT_EQ(1, log.GetLevel());
    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    log.Log("first", Level(1));
    log.Log("dropped", Level(2));
    log.Log("second", Level(0));
    log.SetLevel(Level(2));
    log.Log("third", Level(2));
    log.SetLevel(Level(0));
    log.Log("dropped", "two", Level(1));
    log.Log("dropped", 2L, Level(1));
    log.Log("fourth", Level(0));
    log.SetLevel(Level(-1));
    log.Log("dropped", Level(0));
    EXPECT_EQ("1) first\n2) second\n3) third\n4) fourth\n", zkReadFile(dir.file("n.log")));

    // A new name resets OptionReserved, a null one keeps the name; the
    // counter and the other options go on.
    log.SetOption(zkLogFile::OptionReserved, 7);
    log.SetFilename(dir.file("m.log").c_str(), 0);
    log.SetOption(zkLogFile::OptionReserved, 7);
    log.SetFilename(nullptr, 0);
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved));
    zkStringBase stamp;
    log.GetEntryStamp(stamp);
    EXPECT_STREQ("5) ", stamp.data());
    log.SetLevel(Level(1));
    log.Log("sixth", Level(1));
    EXPECT_EQ("6) sixth\n", zkReadFile(dir.file("m.log")));
    log.SetDefaults();
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionEntryNumber));
    EXPECT_EQ(1, log.GetLevel());
}

TEST(LogFile, MessageFormsAppendToWhatIsThere) {
    zkTempDir dir;
    std::string path = dir.file("m.log");
    ASSERT_TRUE(zkWriteFile(path, "kept\n"));
    zkLogFile log = plainLog(path);
    log.Log("count", 42L, Level(1));
    log.Log("neg", -5L, Level(1));
    log.Log("name", "x", Level(1));
    log.Log(nullptr, "v", Level(1));
    log.Log("t", static_cast<const char*>(nullptr), Level(1));
    log.Log(zkStringBase("50% %s %n"), Level(1));
    log.Log(static_cast<const char*>(nullptr), Level(1));
    EXPECT_EQ("kept\ncount 42\nneg -5\nname x\n v\nt \n50% %s %n\n\n", zkReadFile(path));
}

TEST(LogFile, MakeTDNumPadsWithSignedComparisons) {
    zkLogFile log;
    zkStringBase out("old");
    const struct {
        long n;
        unsigned three;
        const char* text;
    } cases[] = {{7, 0, "07"},    {12, 0, "12"},  {0, 0, "00"},     {10, 0, "10"},  {7, 1, "007"},
                 {42, 1, "042"},  {99, 1, "099"}, {123, 1, "123"},  {1234, 1, "1234"},
                 {-5, 0, "0-5"},  {-5, 1, "00-5"}, {-42, 0, "0-42"}};
    for (const auto& c : cases) {
        log.MakeTDNum(out, c.n, c.three);
        EXPECT_STREQ(c.text, out.data()) << c.n << " " << c.three;
    }
}

TEST(LogFile, EchoGoesToStandardOutputOnceAndVerbatim) {
    zkTempDir dir;
    std::string path = dir.file("e.log");
    zkLogFile log = plainLog(path);
    std::string out = capturedStdout(dir.file("stdout"), [&] {
        log.UseDisplay();
        log.Log("filtered", Level(2));
        log.Log("100% %s %n done", Level(1));
        log.Log("second", Level(1));
        // The echo does not depend on the file.
        log.SetFilename(dir.file("none/e.log").c_str(), 0);
        log.UseDisplay();
        log.Log("lost", Level(1));
    });
    EXPECT_EQ("100% %s %n done\nlost\n", out);
    EXPECT_EQ("100% %s %n done\nsecond\n", zkReadFile(path));
}

TEST(LogFile, FileThatCannotBeWrittenLosesTheEntrySilently) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("plain"), "x"));
    for (const std::string& path : {dir.file("none/a.log"), dir.file("plain/a.log"), std::string("/dev/full")}) {
        zkLogFile log(zkStringBase(path.c_str()), 0);
        log.Log("entry", Level(1));
    }
    EXPECT_FALSE(exists(dir.file("none")));
    EXPECT_EQ("x", zkReadFile(dir.file("plain")));
}

TEST(LogFile, ClearDeletesTheFileBeforeAnyEntry) {
    zkTempDir dir;
    std::string path = dir.file("c.log");
    ASSERT_TRUE(zkWriteFile(path, "old\n"));
    zkLogFile cleared(zkStringBase(path.c_str()), 1);
    EXPECT_FALSE(exists(path));
    zkLogFile missing(zkStringBase(dir.file("none.log").c_str()), 1);
    EXPECT_FALSE(exists(dir.file("none.log")));

    ASSERT_TRUE(zkWriteFile(path, "old\n"));
    cleared.SetOption(zkLogFile::OptionTimeStamp, 0);
    cleared.SetFilename(path.c_str(), 1);
    cleared.Log("fresh", Level(1));
    EXPECT_EQ("fresh\n", zkReadFile(path));
    cleared.Clear();
    cleared.Clear();
    EXPECT_FALSE(exists(path));
}

TEST(LogFile, ConcurrentProcessesKeepEveryEntryWhole) {
    constexpr int kWriters = 4;
    constexpr long kEntries = 2500;
    zkTempDir dir;
    std::string path = dir.file("shared.log");
    std::vector<std::string> expected;
    for (int w = 0; w < kWriters; ++w) {
        for (long n = 1; n <= kEntries; ++n) {
            expected.push_back(std::to_string(n) + ") writer " + std::to_string(w) + "." + std::to_string(n));
        }
        pid_t pid = fork();
        ASSERT_NE(-1, pid);
        if (pid == 0) {
            zkLogFile log = plainLog(path);
            log.SetOption(zkLogFile::OptionEntryNumber, 1);
            zkStringBase value;
            for (long n = 1; n <= kEntries; ++n) {
                value.fromLong(w);
                value.append('.').append(n);
                log.Log("writer", value.data(), Level(1));
            }
            _exit(0);
        }
    }
    for (int w = 0; w < kWriters; ++w) {
        int status = 0;
        ASSERT_NE(-1, wait(&status));
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    }

    // Each process numbers its own entries: every line appears once, whole.
    std::string text = zkReadFile(path);
    ASSERT_FALSE(text.empty());
    EXPECT_EQ('\n', text.back());
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    std::sort(lines.begin(), lines.end());
    std::sort(expected.begin(), expected.end());
    EXPECT_TRUE(lines == expected) << lines.size() << " lines";
}

// zkLogFile: the line format, levels, numbering, echo, clearing, failing
// writes and concurrent writers.
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <ctime>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "support/zkTempDir.h"
#include "zkLogFile.h"

namespace {

using Level = zkLogFile::LogLevel;

// The local clock as "HH:MM:SS MM/DD/YY".
std::string stamp() {
    std::time_t now = std::time(nullptr);
    struct tm local;
    char text[32];
    std::strftime(text, sizeof text, "%H:%M:%S %m/%d/%y", localtime_r(&now, &local));
    return text;
}

zkLogFile plainLog(const std::string& path) {
    zkLogFile log(zkStringBase(path.c_str()), 0);
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
    return log;
}

}  // namespace

TEST(LogFile, LineCarriesNumberTimeAndDate) {
    zkTempDir dir;
    const std::string path = dir.file("app.log");
    zkLogFile log(zkStringBase(path.c_str()), 0);
    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    int entries = 0;
    std::string before;
    do {  // again when the clock moved meanwhile
        before = stamp();
        ASSERT_TRUE(zkWriteFile(path, ""));
        log.Log("Disk full", Level(1));
        ++entries;
    } while (stamp() != before);
    EXPECT_EQ(std::to_string(entries) + ") " + before + "  Disk full\n", zkReadFile(path));
}

// Only entries at or below the log's level are written and numbered; the
// counter goes on under a new name.
TEST(LogFile, OnlyWrittenEntriesTakeNumbers) {
    zkTempDir dir;
    zkLogFile log = plainLog(dir.file("n.log"));
    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    log.Log("first", Level(1));
    log.Log("dropped", Level(2));
    log.Log("second", Level(0));
    log.SetLevel(Level(0));
    log.Log("dropped", "two", Level(1));
    log.Log("dropped", 2L, Level(1));
    log.SetLevel(Level(-1));
    log.Log("dropped", Level(0));
    EXPECT_EQ("1) first\n2) second\n", zkReadFile(dir.file("n.log")));
    log.SetFilename(dir.file("m.log").c_str(), 0);
    log.Log("third", Level(-1));
    EXPECT_EQ("3) third\n", zkReadFile(dir.file("m.log")));
}

TEST(LogFile, ClearDeletesTheFile) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("old.log"), "old\n"));
    ASSERT_TRUE(zkWriteFile(dir.file("new.log"), "old\n"));
    zkLogFile log(zkStringBase(dir.file("old.log").c_str()), 1);
    EXPECT_NE(0, access(dir.file("old.log").c_str(), F_OK));
    log.SetFilename(dir.file("new.log").c_str(), 1);
    EXPECT_NE(0, access(dir.file("new.log").c_str(), F_OK));
}

// The echo goes to standard output for the next written entry only, whether
// or not the file can be written.
TEST(LogFile, MessagesAreWrittenVerbatim) {
    zkTempDir dir;
    const std::string path = dir.file("m.log");
    ASSERT_TRUE(zkWriteFile(path, "kept\n"));
    zkLogFile log = plainLog(path);
    testing::internal::CaptureStdout();
    log.UseDisplay();
    log.Log("filtered", Level(2));
    log.Log(zkStringBase("50% %s %n"), Level(1));
    log.Log("count", -42L, Level(1));
    log.Log("name", "x", Level(1));
    log.Log(nullptr, "v", Level(1));
    log.Log("t", static_cast<const char*>(nullptr), Level(1));
    log.Log(static_cast<const char*>(nullptr), Level(1));
    log.SetFilename(dir.file("none/e.log").c_str(), 0);
    log.UseDisplay();
    log.Log("lost", Level(1));
    EXPECT_EQ("50% %s %n\nlost\n", testing::internal::GetCapturedStdout());
    EXPECT_EQ("kept\n50% %s %n\ncount -42\nname x\n v\nt \n\n", zkReadFile(path));
}

TEST(LogFile, MakeTDNumPadsWithSignedComparisons) {
    zkLogFile log;
    zkStringBase out("old");
    // clang-format off
    const struct {
        long n;
        unsigned three;
        const char* text;
    } rows[] = {
        {9, 0, "09"}, {10, 0, "10"}, {9, 1, "009"}, {10, 1, "010"}, {99, 1, "099"}, {100, 1, "100"},
        {1234, 1, "1234"}, {-5, 0, "0-5"}, {-5, 1, "00-5"}, {-42, 0, "0-42"},
    };
    // clang-format on
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        log.MakeTDNum(out, row.n, row.three);
        EXPECT_STREQ(row.text, out.data());
    }
}

// A write past the file size limit costs only the entries that did not fit.
TEST(LogFile, FileSizeLimitKeepsTheEarlierEntries) {
    zkTempDir dir;
    const std::string path = dir.file("limited.log");
    zkLogFile log = plainLog(path);
    log.Log("first", Level(1));
    const std::string before = zkReadFile(path);
    for (unsigned room : {0u, 4u}) {
        SCOPED_TRACE(room);
        ASSERT_TRUE(zkWithFileSizeLimit(before.size() + room, [&] { log.Log("refused entry", Level(1)); }));
        const std::string after = zkReadFile(path);
        EXPECT_LE(after.size(), before.size() + room);
        EXPECT_EQ(before, after.substr(0, before.size()));
    }
}

// Entries from several processes, each with several threads and one log
// object per thread, all arrive whole and once.
TEST(LogLoad, ProcessesAndThreadsWriteEveryEntryWholeOnce) {
    constexpr int kProcesses = 3, kThreads = 3, kEntries = 500;
    zkTempDir dir;
    const std::string path = dir.file("load.log");
    const std::string padding(200, '.');  // so that a split or interleaved write would show
    std::vector<std::string> expected;
    for (int p = 0; p < kProcesses; ++p) {
        for (int t = 0; t < kThreads; ++t)
            for (int n = 0; n < kEntries; ++n) expected.push_back(std::to_string(p * 10000 + t * 1000 + n) + padding);
        const pid_t pid = fork();
        ASSERT_NE(-1, pid);
        if (pid != 0) continue;
        std::vector<std::thread> threads;
        for (int t = 0; t < kThreads; ++t)
            threads.emplace_back([&, t] {
                zkLogFile log = plainLog(path);
                for (int n = 0; n < kEntries; ++n)
                    log.Log((std::to_string(p * 10000 + t * 1000 + n) + padding).c_str(), Level(1));
            });
        for (std::thread& thread : threads) thread.join();
        _exit(0);
    }
    for (int p = 0; p < kProcesses; ++p) {
        int status = 0;
        ASSERT_NE(-1, wait(&status));
        EXPECT_EQ(0, status);
    }
    std::vector<std::string> lines;
    std::istringstream in(zkReadFile(path));
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    std::sort(expected.begin(), expected.end());
    std::sort(lines.begin(), lines.end());
    EXPECT_EQ(expected, lines);
}

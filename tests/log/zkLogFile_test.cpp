// zkLogFile: the line format, levels, numbering, echo, clearing, failing
// writes and concurrent writers.
#include <gtest/gtest.h>
#include <sys/stat.h>
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

using Level = zkLogFile::LogLevel;

static zkLogFile plainLog(const std::string& path) {
    zkLogFile log(zkStringBase(path.c_str()), 0);
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
    return log;
}

TEST(LogFile, LineFormat) {
    zkTempDir dir;
    zkLogFile log(zkStringBase(dir.file("app.log").c_str()), 0);
    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    char before[32], after[32];
    int entries = 0;
    do {  // again when the clock moved meanwhile: local time as "HH:MM:SS MM/DD/YY"
        std::time_t now = std::time(nullptr);
        struct tm local;
        std::strftime(before, sizeof before, "%H:%M:%S %m/%d/%y", localtime_r(&now, &local));
        ASSERT_TRUE(zkWriteFile(dir.file("app.log"), ""));
        log.Log("Disk full", Level(1));
        log.Log("Disk full", Level(1));
        entries += 2;
        now = std::time(nullptr);
        std::strftime(after, sizeof after, "%H:%M:%S %m/%d/%y", localtime_r(&now, &local));
    } while (std::string(before) != after);
    const std::string line = ") " + std::string(before) + "  Disk full\n";
    EXPECT_EQ(std::to_string(entries - 1) + line + std::to_string(entries) + line, zkReadFile(dir.file("app.log")));
}

// The time stamp is on and the rest off by default; a new file name turns the
// reserved word back to 0.
TEST(LogFile, OptionDefaults) {
    zkLogFile log;
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved));
    EXPECT_EQ(1u, log.GetOption(zkLogFile::OptionTimeStamp));
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionEntryNumber));
    log.SetOption(zkLogFile::OptionReserved, 7);
    log.SetFilename("other.log", 0);
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved));
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
    ASSERT_EQ(0, mkdir(dir.file("folder").c_str(), 0700));  // files only
    log.SetFilename(dir.file("folder").c_str(), 1);
    EXPECT_EQ(0, access(dir.file("folder").c_str(), F_OK));
}

// The echo goes to standard output for the next written entry only, whether
// or not the file can be written.
TEST(LogFile, MessagesAreWrittenVerbatim) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("m.log"), "kept\n"));
    zkLogFile log = plainLog(dir.file("m.log"));
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
    EXPECT_EQ("kept\n50% %s %n\ncount -42\nname x\n v\nt \n\n", zkReadFile(dir.file("m.log")));
}

TEST(LogFile, MakeTDNumPadsWithSignedComparisons) {
    zkLogFile log;
    zkStringBase out("old");
    // clang-format off
    const struct { long n; unsigned three; const char* text; } rows[] = {
        {9, 0, "09"}, {10, 0, "10"}, {9, 1, "009"}, {10, 1, "010"}, {99, 1, "099"}, {100, 1, "100"},
        {1234, 1, "1234"}, {-5, 0, "0-5"}, {-5, 1, "00-5"}, {-42, 0, "0-42"},
    };
    // clang-format on
    for (const auto& row : rows) {
        log.MakeTDNum(out, row.n, row.three);
        EXPECT_STREQ(row.text, out.data()) << row.n;
    }
}

// A write past the file size limit costs only the entries that did not fit.
TEST(LogFile, FileSizeLimitKeepsTheEarlierEntries) {
    zkTempDir dir;
    zkLogFile log = plainLog(dir.file("limited.log"));
    log.Log("first", Level(1));
    for (unsigned room : {0u, 4u}) {
        SCOPED_TRACE(room);
        ASSERT_TRUE(zkWithFileSizeLimit(6 + room, [&] { log.Log("refused entry", Level(1)); }));
        const std::string after = zkReadFile(dir.file("limited.log"));
        EXPECT_LE(after.size(), 6 + room);
        EXPECT_EQ("first\n", after.substr(0, 6));
    }
}

// Entries from several processes, each with several threads and one log
// object per thread, all arrive whole and once.
TEST(LogLoad, EveryConcurrentEntryArrivesWholeOnce) {
    constexpr int kWriters = 2, kEntries = 500;  // per process, per thread
    zkTempDir dir;
    std::vector<std::string> expected, lines;
    for (int n = 0; n < kWriters * kWriters * kEntries; ++n)
        expected.push_back(std::to_string(n) + std::string(200, '.'));
    for (int p = 0; p < kWriters; ++p) {
        const pid_t pid = fork();
        ASSERT_NE(-1, pid);
        if (pid != 0) continue;
        std::vector<std::thread> threads;
        for (int t = p * kWriters; t < (p + 1) * kWriters; ++t)
            threads.emplace_back([&, t] {
                zkLogFile log = plainLog(dir.file("load.log"));
                for (int n = t * kEntries; n < (t + 1) * kEntries; ++n) log.Log(expected[n].c_str(), Level(1));
            });
        for (std::thread& thread : threads) thread.join();
        _exit(0);
    }
    for (int status = 0; wait(&status) > 0;) EXPECT_EQ(0, status);
    std::istringstream in(zkReadFile(dir.file("load.log")));
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    std::sort(expected.begin(), expected.end());
    std::sort(lines.begin(), lines.end());
    EXPECT_EQ(expected, lines);
}

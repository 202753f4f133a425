// zkLogFile: the line format, levels, numbering, echo, clearing, failing
// writes and concurrent writers.
#include <gtest/gtest.h>

#include <ctime>
#include <sstream>
#include <vector>

#include "support/zkTempDir.h"
#include "zkLogFile.h"

using Level = zkLogFile::LogLevel;

// By default a line is the local time "HH:MM:SS MM/DD/YY", two blanks and the
// message; with entry numbers on, the number and ") " lead it. Written again,
// to a file the constructor clears, when the clock moved meanwhile.
TEST(LogFile, LineFormat) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("app.log"), "old\n"));
    const auto clock = [] {
        char text[32];
        const std::time_t now = std::time(nullptr);
        return std::string(text, std::strftime(text, sizeof text, "%H:%M:%S %m/%d/%y", std::localtime(&now)));
    };
    std::string stamp;
    do {
        stamp = clock();
        zkLogFile log(zkStringBase(dir.file("app.log").c_str()), 1);
        log.Log("Disk full", Level(1));
        log.SetOption(zkLogFile::OptionEntryNumber, 1);
        log.Log("Disk full", Level(1));
    } while (stamp != clock());
    EXPECT_EQ(stamp + "  Disk full\n1) " + stamp + "  Disk full\n", zkReadFile(dir.file("app.log")));
}

// Only entries at or below the log's level (1 at first) are written and
// numbered, their messages verbatim. A new file name turns the reserved
// option word back to 0, and the counter goes on; a nonzero clear deletes
// the file of that name, but never a folder. The echo goes to standard
// output for the next written entry only, whether or not the file can be
// written; a failed write leaves the file as it was.
TEST(LogFile, EntriesAtOrBelowTheLevelAreWritten) {
    zkTempDir dir;
    const std::string first = dir.file("m.log"), second = dir.file("n.log"), folder = dir.file("folder");
    ASSERT_TRUE(zkWriteFile(first, "kept\n"));
    ASSERT_TRUE(zkWriteFile(second, "old\n"));
    ASSERT_TRUE(std::filesystem::create_directory(folder));
    zkLogFile log(zkStringBase(first.c_str()), 0);
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved));
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    testing::internal::CaptureStdout();
    log.UseDisplay();
    log.Log("filtered", Level(2));
    log.Log(zkStringBase("50% %s %n"), Level(1));
    log.Log("count", -42L, Level(1));
    log.Log("name", "x", Level(0));
    log.Log(nullptr, "v", Level(1));
    log.Log("t", static_cast<const char*>(nullptr), Level(1));
    log.Log(static_cast<const char*>(nullptr), Level(1));
    log.SetLevel(Level(0));
    log.Log("dropped", "two", Level(1));
    log.Log("dropped", 2L, Level(1));
    log.SetLevel(Level(-1));
    log.Log("dropped", Level(0));
    log.SetOption(zkLogFile::OptionReserved, 7);
    log.SetFilename(second.c_str(), 1);
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved));
    log.Log("third", Level(-1));
    log.SetOption(zkLogFile::OptionEntryNumber, 0);
    ASSERT_TRUE(zkWithFileSizeLimit(9, [&] { log.Log("refused", Level(-1)); }));
    log.SetFilename(folder.c_str(), 1);
    log.UseDisplay();
    log.Log("lost", Level(-1));
    EXPECT_EQ("1) 50% %s %n\nlost\n", testing::internal::GetCapturedStdout());
    EXPECT_EQ("kept\n1) 50% %s %n\n2) count -42\n3) name x\n4)  v\n5) t \n6) \n", zkReadFile(first));
    EXPECT_EQ("7) third\n", zkReadFile(second));
    EXPECT_EQ((std::set<std::string>{"folder", "m.log", "n.log"}), zkDirEntries(dir.path()));
}

// Zeros lead n to two digits, or three, by signed comparisons: a negative n
// gets them in front of its sign.
TEST(LogFile, MakeTDNumPadsWithSignedComparisons) {
    zkLogFile log;
    zkStringBase out("old");
    const std::tuple<long, unsigned, const char*> rows[] = {
        {9, 0, "09"},    {10, 0, "10"},     {9, 1, "009"},  {10, 1, "010"},  {99, 1, "099"},
        {100, 1, "100"}, {1234, 1, "1234"}, {-5, 0, "0-5"}, {-5, 1, "00-5"}, {-42, 0, "0-42"}};
    for (const auto& [n, three, text] : rows) {
        SCOPED_TRACE(text);
        log.MakeTDNum(out, n, three);
        EXPECT_STREQ(text, out.data());
    }
}

// Entries from four threads, one log object each, all arrive whole and once.
TEST(LogLoad, EveryConcurrentEntryArrivesWholeOnce) {
    zkTempDir dir;
    const std::string pad(200, '.');
    std::multiset<std::string> expected, lines;
    std::vector<std::thread> writers;
    for (int w = 0; w < 4; ++w)
        writers.emplace_back([&, w] {
            zkLogFile log(zkStringBase(dir.file("load.log").c_str()), 0);
            log.SetOption(zkLogFile::OptionTimeStamp, 0);
            for (int n = w; n < 2000; n += 4) log.Log((std::to_string(n) + pad).c_str(), Level(1));
        });
    for (int n = 0; n < 2000; ++n) expected.insert(std::to_string(n) + pad);
    for (std::thread& writer : writers) writer.join();
    std::istringstream in(zkReadFile(dir.file("load.log")));
    for (std::string line; std::getline(in, line);) lines.insert(line);
    EXPECT_EQ(expected, lines);
}

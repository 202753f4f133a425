// zkLogFile: the line format, levels, numbering, echo, clearing and failing
// writes.
#include <gtest/gtest.h>

#include <ctime>

#include "support/zkTempDir.h"
#include "zkLogFile.h"

// A line is the entry number and ") " when asked for, the local time
// "HH:MM:SS MM/DD/YY" (on by default), two blanks and the message; the
// constructor clears the file first. The zone is chosen so that the hour
// reads 10, which has a tens digit to lose.
TEST(LogFile, LineFormat) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("app.log"), "old\n"));
    const std::time_t now = std::time(nullptr);
    setenv("TZ", ("UTC" + std::to_string(std::gmtime(&now)->tm_hour - 10)).c_str(), 1);
    tzset();
    char stamp[32];
    std::strftime(stamp, sizeof stamp, "%H:%M:%S %m/%d/%y", std::localtime(&now));
    zkLogFile log(zkStringBase(dir.file("app.log").c_str()), 1);
    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    log.Log("Disk full", zkLogFile::LevelNormal);
    log.Log("Again", zkLogFile::LevelNormal);
    unsetenv("TZ");
    if (std::time(nullptr) != now) GTEST_SKIP() << "the clock moved on to the next second meanwhile";
    EXPECT_EQ("1) " + std::string(stamp) + "  Disk full\n2) " + stamp + "  Again\n", zkReadFile(dir.file("app.log")));
}

// The option words start as 0, 1 and 0. Only entries at or below the log's
// level (1 at first) are written and numbered, their messages verbatim; a
// two-part message starts afresh each time. A new file name turns the
// reserved option word back to 0, and the counter goes on; a nonzero clear
// deletes the file of that name, but never a folder. The echo goes to
// standard output at once, for the next written entry only, whether or not
// the file can be written; a failed write leaves the file as it was.
TEST(LogFile, EntriesAtOrBelowTheLevelAreWritten) {
    zkTempDir dir;
    for (const char* name : {"m.log", "n.log"}) ASSERT_TRUE(zkWriteFile(dir.file(name), "kept\n"));
    ASSERT_TRUE(std::filesystem::create_directory(dir.file("folder")));
    zkLogFile log(zkStringBase(dir.file("m.log").c_str()), 0);
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved));
    EXPECT_EQ(1u, log.GetOption(zkLogFile::OptionTimeStamp));
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
    log.SetOption(zkLogFile::OptionEntryNumber, 1);
    testing::internal::CaptureStdout();
    log.UseDisplay();
    log.Log("filtered", zkLogFile::LevelDetail);
    log.Log("filtered", "two", zkLogFile::LevelDetail);
    log.Log("filtered", 2L, zkLogFile::LevelDetail);
    log.Log(zkStringBase("50% %s %n"), zkLogFile::LevelNormal);
    log.Log("name", "x", zkLogFile::LevelError);
    log.Log("count", -42L, zkLogFile::LevelNormal);
    log.Log(nullptr, "v", zkLogFile::LevelNormal);
    log.Log("t", static_cast<const char*>(nullptr), zkLogFile::LevelNormal);
    log.Log(static_cast<const char*>(nullptr), zkLogFile::LevelNormal);
    log.SetLevel(zkLogFile::LogLevel(-1));
    log.Log("dropped", zkLogFile::LevelError);
    log.SetOption(zkLogFile::OptionReserved, 7);
    log.SetFilename(dir.file("n.log").c_str(), 1);
    EXPECT_EQ(0u, log.GetOption(zkLogFile::OptionReserved));
    log.Log("third", zkLogFile::LogLevel(-1));
    log.SetOption(zkLogFile::OptionEntryNumber, 0);
    ASSERT_TRUE(zkWithFileSizeLimit(9, [&] { log.Log("refused", zkLogFile::LogLevel(-1)); }));
    log.SetFilename(dir.file("folder").c_str(), 1);
    log.UseDisplay();
    log.Log("lost", zkLogFile::LogLevel(-1));
    ASSERT_EQ(1, write(STDOUT_FILENO, "|", 1));
    EXPECT_EQ("1) 50% %s %n\nlost\n|", testing::internal::GetCapturedStdout());
    EXPECT_EQ("kept\n1) 50% %s %n\n2) name x\n3) count -42\n4)  v\n5) t \n6) \n", zkReadFile(dir.file("m.log")));
    EXPECT_EQ("7) third\n", zkReadFile(dir.file("n.log")));
    EXPECT_EQ((std::set<std::string>{"folder", "m.log", "n.log"}), zkDirEntries(dir.path()));
    EXPECT_TRUE(std::filesystem::is_directory(dir.file("folder")));
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

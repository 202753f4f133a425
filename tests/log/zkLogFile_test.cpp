// zkLogFile: the line format, levels, numbering, echo, clearing and
// concurrent writers.
#include <gtest/gtest.h>
#include <unistd.h>

#include <ctime>
#include <string>

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

TEST(LogFile, LevelsFilterOnlyWrittenEntriesTakeNumbersAndClearDeletes) {
    zkTempDir dir;
    ASSERT_TRUE(zkWriteFile(dir.file("n.log"), "old\n"));
    zkLogFile log(zkStringBase(dir.file("n.log").c_str()), 1);  // deletes the old file
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
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
    // The counter goes on under a new name.
    log.SetFilename(dir.file("m.log").c_str(), 0);
    log.Log("third", Level(-1));
    EXPECT_EQ("3) third\n", zkReadFile(dir.file("m.log")));
    log.Clear();
    EXPECT_NE(0, access(dir.file("m.log").c_str(), F_OK));
}

TEST(LogFile, MessagesAndTheEchoAreWrittenVerbatim) {
    zkTempDir dir;
    const std::string path = dir.file("m.log");
    ASSERT_TRUE(zkWriteFile(path, "kept\n"));
    zkLogFile log(zkStringBase(path.c_str()), 0);
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
    testing::internal::CaptureStdout();
    log.UseDisplay();
    log.Log("filtered", Level(2));
    log.Log(zkStringBase("50% %s %n"), Level(1));
    log.Log("count", -42L, Level(1));
    log.Log("name", "x", Level(1));
    log.Log(nullptr, "v", Level(1));
    log.Log("t", static_cast<const char*>(nullptr), Level(1));
    log.Log(static_cast<const char*>(nullptr), Level(1));
    // The echo does not depend on the file.
    log.SetFilename(dir.file("none/e.log").c_str(), 0);
    log.UseDisplay();
    log.Log("lost", Level(1));
    EXPECT_EQ("50% %s %n\nlost\n", testing::internal::GetCapturedStdout());
    EXPECT_EQ("kept\n50% %s %n\ncount -42\nname x\n v\nt \n\n", zkReadFile(path));
}

TEST(LogFile, MakeTDNumPadsWithSignedComparisons) {
    zkLogFile log;
    zkStringBase out("old");
    const struct {
        long n;
        unsigned three;
        const char* text;
    } cases[] = {{9, 0, "09"},    {10, 0, "10"},     {9, 1, "009"},  {10, 1, "010"},  {99, 1, "099"},
                 {100, 1, "100"}, {1234, 1, "1234"}, {-5, 0, "0-5"}, {-5, 1, "00-5"}, {-42, 0, "0-42"}};
    for (const auto& c : cases) {
        log.MakeTDNum(out, c.n, c.three);
        EXPECT_STREQ(c.text, out.data()) << c.n << " " << c.three;
    }
}

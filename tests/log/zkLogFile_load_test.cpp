// zkLogFile under load and failing writes: entries from several processes,
// each with several threads, all arrive whole and once; a write that fails
// costs only the entries that could not be written.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "support/zkTempDir.h"
#include "zkLogFile.h"

namespace {

zkLogFile plainLog(const std::string& path) {
    zkLogFile log(zkStringBase(path.c_str()), 0);
    log.SetOption(zkLogFile::OptionTimeStamp, 0);
    return log;
}

std::vector<std::string> sortedLines(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    std::sort(lines.begin(), lines.end());
    return lines;
}

}  // namespace

TEST(LogLoad, ProcessesAndThreadsWriteEveryEntryWholeOnce) {
    constexpr int kProcesses = 3;
    constexpr int kThreads = 3;
    constexpr int kEntries = 1500;
    zkTempDir dir;
    const std::string path = dir.file("load.log");
    // Long entries, so that a split or interleaved write would show.
    const std::string padding(200, '.');
    std::vector<std::string> expected;
    for (int p = 0; p < kProcesses; ++p) {
        for (int t = 0; t < kThreads; ++t)
            for (int n = 0; n < kEntries; ++n)
                expected.push_back(std::to_string(p) + "." + std::to_string(t) + "." + std::to_string(n) + padding);
        pid_t pid = fork();
        ASSERT_NE(-1, pid);
        if (pid != 0) continue;
        {
            std::vector<std::thread> threads;
            for (int t = 0; t < kThreads; ++t)
                threads.emplace_back([&, t] {
                    zkLogFile log = plainLog(path);  // one object per thread
                    for (int n = 0; n < kEntries; ++n) {
                        std::string entry = std::to_string(p) + "." + std::to_string(t) + "." + std::to_string(n);
                        log.Log((entry + padding).c_str(), zkLogFile::LevelNormal);
                    }
                });
            for (std::thread& thread : threads) thread.join();
        }
        _exit(0);
    }
    for (int p = 0; p < kProcesses; ++p) {
        int status = 0;
        ASSERT_NE(-1, wait(&status));
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    }
    std::sort(expected.begin(), expected.end());
    const std::vector<std::string> lines = sortedLines(zkReadFile(path));
    EXPECT_EQ(expected.size(), lines.size());
    EXPECT_TRUE(lines == expected);
}

TEST(LogLoad, FileSizeLimitKeepsTheEarlierEntries) {
    zkTempDir dir;
    const std::string path = dir.file("limited.log");
    zkLogFile log = plainLog(path);
    log.Log("first", zkLogFile::LevelNormal);
    log.Log("second", zkLogFile::LevelNormal);
    const std::string before = zkReadFile(path);
    ASSERT_EQ("first\nsecond\n", before);

    struct rlimit saved;
    ASSERT_EQ(0, getrlimit(RLIMIT_FSIZE, &saved));
    const sighandler_t handler = signal(SIGXFSZ, SIG_IGN);
    for (rlim_t room : {rlim_t(0), rlim_t(4)}) {
        const struct rlimit limit = {before.size() + room, saved.rlim_max};
        ASSERT_EQ(0, setrlimit(RLIMIT_FSIZE, &limit));
        for (int i = 0; i < 3; ++i) log.Log("refused entry", zkLogFile::LevelNormal);
        setrlimit(RLIMIT_FSIZE, &saved);
        const std::string after = zkReadFile(path);
        EXPECT_LE(after.size(), before.size() + room);
        EXPECT_EQ(before, after.substr(0, before.size()));
    }
    signal(SIGXFSZ, handler);
}

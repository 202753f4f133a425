// zkLogFile::Log with the time stamp on against a C loop that does the same
// per entry: the local time, one formatted line, open for appending, one
// write, close. Both write the same number of entries to their own file in
// the same run; the files go to ZK_BENCH_DIR, else the current directory.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <string>

#include "zkBenchPairs.h"
#include "zkLogFile.h"

namespace {

constexpr unsigned kEntries = 100000;
constexpr unsigned kMessages = 64;
constexpr unsigned long long kSeed = 99;
// "HH:MM:SS MM/DD/YY  " and the line feed.
constexpr unsigned long long kStampAndLineFeed = 20;

std::string g_ours, g_peer;
std::string g_messages[kMessages];
unsigned long long g_expectedSize = 0;

void makeMessages() {
    zkbench::Random random(kSeed);
    for (std::string& m : g_messages) {
        unsigned words = 2 + random.below(8);
        for (unsigned w = 0; w < words; ++w) {
            if (w) m += ' ';
            unsigned n = 2 + random.below(8);
            for (unsigned i = 0; i < n; ++i) m += static_cast<char>('a' + random.below(26));
        }
    }
    for (unsigned k = 0; k < kEntries; ++k) g_expectedSize += g_messages[k % kMessages].size() + kStampAndLineFeed;
}

unsigned long long sizeOf(const std::string& path) {
    struct stat st;
    return stat(path.c_str(), &st) == 0 ? static_cast<unsigned long long>(st.st_size) : 0;
}

void logLibrary(benchmark::State& state) {
    for (auto _ : state) {
        state.PauseTiming();
        unlink(g_ours.c_str());
        state.ResumeTiming();
        zkLogFile log(zkStringBase(g_ours.c_str()), 0);
        for (unsigned k = 0; k < kEntries; ++k) log.Log(g_messages[k % kMessages].c_str(), zkLogFile::LevelNormal);
        if (sizeOf(g_ours) != g_expectedSize) state.SkipWithError("wrong result");
    }
}

void logPlainC(benchmark::State& state) {
    char line[512];
    for (auto _ : state) {
        state.PauseTiming();
        unlink(g_peer.c_str());
        state.ResumeTiming();
        for (unsigned k = 0; k < kEntries; ++k) {
            time_t now = time(nullptr);
            struct tm local;
            localtime_r(&now, &local);
            int n = std::snprintf(line, sizeof line, "%02d:%02d:%02d %02d/%02d/%02d  %s\n", local.tm_hour, local.tm_min,
                                  local.tm_sec, local.tm_mon + 1, local.tm_mday, local.tm_year % 100,
                                  g_messages[k % kMessages].c_str());
            int fd = open(g_peer.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0666);
            if (fd == -1) continue;
            if (write(fd, line, static_cast<size_t>(n)) != n) state.SkipWithError("write failed");
            close(fd);
        }
        if (sizeOf(g_peer) != g_expectedSize) state.SkipWithError("wrong result");
    }
}

BENCHMARK(logLibrary)->Iterations(1)->Repetitions(zkbench::kRepetitions)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(logPlainC)->Iterations(1)->Repetitions(zkbench::kRepetitions)->UseRealTime()->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
    const char* base = std::getenv("ZK_BENCH_DIR");
    std::string dir = std::string(base && *base ? base : ".") + "/zk_log_bench.";
    g_ours = dir + "library.log";
    g_peer = dir + "plain.log";
    makeMessages();
    zkbench::MedianReporter reporter;
    zkbench::runInterleaved(argc, argv, reporter);
    unlink(g_ours.c_str());
    unlink(g_peer.c_str());
    zkbench::printPair(reporter, "zkLogFile::Log", "logLibrary", "logPlainC", "ms", 1.15);
    benchmark::Shutdown();
    return 0;
}

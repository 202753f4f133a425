// CopyFile of one large file against the system's cp, in the same run and
// on the same file system, with the page cache warm. Prints the median time
// of each, for bench/run.sh. The files go to ZK_BENCH_DIR, else the current
// directory, and are removed at the end.
#include <spawn.h>
#include <stdio.h>
#include <stdlib.h>
#include <sys/wait.h>
#include <unistd.h>

#include <fstream>
#include <string>
#include <vector>

#include "zkBenchPairs.h"
#include "zkFileManager.h"

extern char** environ;

namespace {

constexpr size_t kFileSize = 512u << 20;
constexpr size_t kWriteChunk = 1u << 20;

std::string g_source, g_target;

bool makeSource() {
    std::vector<char> chunk(kWriteChunk);
    for (size_t i = 0; i < chunk.size(); ++i) chunk[i] = static_cast<char>(i ^ (i >> 8));
    std::ofstream out(g_source, std::ios::binary | std::ios::trunc);
    for (size_t done = 0; done < kFileSize; done += kWriteChunk) out.write(chunk.data(), chunk.size());
    out.close();
    // Read once, so every run finds the source in the page cache.
    std::ifstream in(g_source, std::ios::binary);
    while (in.read(chunk.data(), chunk.size())) {
    }
    return static_cast<bool>(out);
}

// Each run starts without a target and with no dirty pages left by the
// previous one, whose write-back would otherwise slow the next run down.
void startClean() {
    unlink(g_target.c_str());
    sync();
}

void copyWithLibrary(benchmark::State& state) {
    for (auto _ : state) {
        state.PauseTiming();
        startClean();
        state.ResumeTiming();
        zkStringBase from(g_source.c_str()), to(g_target.c_str());
        if (zkFileManager::CopyFile(from, to, 0, 0, 1, 0, 0, nullptr, nullptr) != 0)
            state.SkipWithError("CopyFile failed");
    }
    state.SetBytesProcessed(static_cast<long long>(state.iterations() * kFileSize));
}

void copyWithCp(benchmark::State& state) {
    for (auto _ : state) {
        state.PauseTiming();
        startClean();
        state.ResumeTiming();
        char* argv[] = {const_cast<char*>("cp"), &g_source[0], &g_target[0], nullptr};
        pid_t pid;
        int status = -1;
        if (posix_spawnp(&pid, "cp", nullptr, nullptr, argv, environ) != 0 || waitpid(pid, &status, 0) != pid ||
            status != 0)
            state.SkipWithError("cp failed");
    }
    state.SetBytesProcessed(static_cast<long long>(state.iterations() * kFileSize));
}

BENCHMARK(copyWithLibrary)
    ->Iterations(1)
    ->Repetitions(zkbench::kRepetitions)
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(copyWithCp)->Iterations(1)->Repetitions(zkbench::kRepetitions)->UseRealTime()->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
    const char* dir = getenv("ZK_BENCH_DIR");
    std::string base = std::string(dir && *dir ? dir : ".") + "/zk_copy_bench.";
    g_source = base + "source";
    g_target = base + "target";
    if (!makeSource()) {
        fprintf(stderr, "cannot write %s\n", g_source.c_str());
        unlink(g_source.c_str());
        return 1;
    }
    zkbench::MedianReporter reporter;
    zkbench::runInterleaved(argc, argv, reporter);
    unlink(g_source.c_str());
    unlink(g_target.c_str());
    zkbench::printPair(reporter, "CopyFile / cp", "copyWithLibrary", "copyWithCp", "ms", 1.15);
    benchmark::Shutdown();
    return 0;
}

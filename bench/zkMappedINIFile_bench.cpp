// zkMappedINIFile against SimpleIni and inih on one generated 8 MiB file:
// loading (construct, load, destroy), saving, and the peak memory of a
// loaded document, each pair in the same run. The files go to ZK_BENCH_DIR,
// else the current directory, and are removed at the end.
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

// Debian builds SimpleIni as a library with ICU as its converter.
#define SI_CONVERT_ICU
#include <SimpleIni.h>
#include <ini.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string>
#include <utility>
#include <vector>

#include "zkBenchPairs.h"
#include "zkINIBenchFile.h"
#include "zkMappedINIFile.h"

extern char** environ;

namespace {

using zkbench::kINIKeysPerSection;
using zkbench::kINISections;

constexpr char kPeakOption[] = "--peak=";

std::string g_source, g_saved;
std::string g_lastSection, g_lastKey, g_lastValue;

bool makeFile() {
    zkbench::INIBenchFile file = zkbench::makeINIBenchFile();
    g_lastSection = file.lastSection;
    g_lastKey = file.lastKey;
    g_lastValue = file.lastValue;
    std::ofstream out(g_source, std::ios::binary | std::ios::trunc);
    out << file.text;
    std::fprintf(stderr, "INI file of %zu bytes\n", file.text.size());
    return static_cast<bool>(out);
}

bool checkLibrary(zkMappedINIFile& ini) {
    return ini.GetSectionList()->size() == kINISections &&
           ini.GetVal(zkStringBase(g_lastSection.c_str()), zkStringBase(g_lastKey.c_str())).equals(g_lastValue.c_str());
}

bool checkSimpleIni(const CSimpleIniA& ini) {
    CSimpleIniA::TNamesDepend sections;
    ini.GetAllSections(sections);
    const char* value = ini.GetValue(g_lastSection.c_str(), g_lastKey.c_str());
    return sections.size() == kINISections && value && g_lastValue == value;
}

// The inih callback copies every key and value.
struct Copied {
    std::vector<std::pair<std::string, std::string>> entries;
};

int copyEntry(void* user, const char*, const char* name, const char* value) {
    static_cast<Copied*>(user)->entries.emplace_back(name, value);
    return 1;
}

// ---- Loading ----

void openLibrary(benchmark::State& state) {
    for (auto _ : state) {
        zkMappedINIFile ini(g_source.c_str());
        if (ini.Open(0) != 0 || !checkLibrary(ini)) state.SkipWithError("wrong result");
    }
}

void loadSimpleIni(benchmark::State& state) {
    for (auto _ : state) {
        CSimpleIniA ini;
        if (ini.LoadFile(g_source.c_str()) != SI_OK || !checkSimpleIni(ini)) state.SkipWithError("wrong result");
    }
}

void parseInih(benchmark::State& state) {
    for (auto _ : state) {
        Copied copied;
        if (ini_parse(g_source.c_str(), copyEntry, &copied) != 0 ||
            copied.entries.size() != kINISections * kINIKeysPerSection || copied.entries.back().second != g_lastValue)
            state.SkipWithError("wrong result");
    }
}

// ---- Saving ----

void closeLibrary(benchmark::State& state) {
    for (auto _ : state) {
        state.PauseTiming();
        zkMappedINIFile ini(g_saved.c_str());
        if (ini.Open(0) != 0) state.SkipWithError("cannot load");
        state.ResumeTiming();
        if (ini.Close(1) != 0) state.SkipWithError("cannot save");
    }
}

void saveSimpleIni(benchmark::State& state) {
    for (auto _ : state) {
        state.PauseTiming();
        auto* ini = new CSimpleIniA;
        if (ini->LoadFile(g_saved.c_str()) != SI_OK) state.SkipWithError("cannot load");
        state.ResumeTiming();
        if (ini->SaveFile(g_saved.c_str()) != SI_OK) state.SkipWithError("cannot save");
        state.PauseTiming();
        delete ini;
        state.ResumeTiming();
    }
}

#define ZK_BENCH(f) \
    BENCHMARK(f)->Iterations(1)->Repetitions(zkbench::kRepetitions)->UseRealTime()->Unit(benchmark::kMillisecond)
ZK_BENCH(openLibrary);
ZK_BENCH(loadSimpleIni);
ZK_BENCH(parseInih);
ZK_BENCH(closeLibrary);
ZK_BENCH(saveSimpleIni);

// ---- Peak memory ----

// The peak resident size of this process image, in KiB. getrusage would
// also count the parent's peak, which a spawned child inherits.
long maxResidentKiB() {
    std::ifstream status("/proc/self/status");
    std::string line;
    while (std::getline(status, line))
        if (line.compare(0, 6, "VmHWM:") == 0) return std::atol(line.c_str() + 6);
    return -1;
}

// Run in a fresh process: loads the file with one of the two and prints how
// far the peak resident size rose while the document was loaded and held.
int measurePeak(const char* which, const char* path) {
    long before = maxResidentKiB();
    bool ok;
    if (std::strcmp(which, "library") == 0) {
        zkMappedINIFile ini(path);
        ok = ini.Open(0) == 0;
        std::printf("%ld\n", maxResidentKiB() - before);
    } else {
        CSimpleIniA ini;
        ok = ini.LoadFile(path) == SI_OK;
        std::printf("%ld\n", maxResidentKiB() - before);
    }
    return ok ? 0 : 1;
}

// The peak of `which` measured in a child process, in KiB; -1 on failure.
long peakOf(const char* which) {
    std::string option = std::string(kPeakOption) + which;
    char* argv[] = {const_cast<char*>("zk_ini_bench"), &option[0], &g_source[0], nullptr};
    int out[2];
    if (pipe(out) != 0) return -1;
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, out[1], STDOUT_FILENO);
    posix_spawn_file_actions_addclose(&actions, out[0]);
    pid_t pid;
    int spawned = posix_spawn(&pid, "/proc/self/exe", &actions, nullptr, argv, environ);
    posix_spawn_file_actions_destroy(&actions);
    close(out[1]);
    char text[64] = {};
    ssize_t got = spawned == 0 ? read(out[0], text, sizeof text - 1) : -1;
    close(out[0]);
    int status = -1;
    if (spawned == 0) waitpid(pid, &status, 0);
    return got > 0 && status == 0 ? std::atol(text) : -1;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc == 3 && std::strncmp(argv[1], kPeakOption, sizeof kPeakOption - 1) == 0)
        return measurePeak(argv[1] + sizeof kPeakOption - 1, argv[2]);

    const char* base = std::getenv("ZK_BENCH_DIR");
    std::string dir = std::string(base && *base ? base : ".") + "/zk_ini_bench.";
    g_source = dir + "source.ini";
    g_saved = dir + "saved.ini";
    if (!makeFile()) {
        std::fprintf(stderr, "cannot write %s\n", g_source.c_str());
        return 1;
    }
    {
        std::ifstream in(g_source, std::ios::binary);
        std::ofstream out(g_saved, std::ios::binary | std::ios::trunc);
        out << in.rdbuf();
    }
    zkbench::MedianReporter reporter;
    zkbench::runInterleaved(argc, argv, reporter);
    unlink(g_saved.c_str());

    // The median of a few child processes for each.
    std::vector<long> ours, peer;
    for (int k = 0; k < 5; ++k) {
        ours.push_back(peakOf("library"));
        peer.push_back(peakOf("simpleini"));
    }
    unlink(g_source.c_str());
    std::sort(ours.begin(), ours.end());
    std::sort(peer.begin(), peer.end());

    using zkbench::printPair;
    printPair(reporter, "INI Open / SimpleIni LoadFile", "openLibrary", "loadSimpleIni", "ms", 1.0);
    printPair(reporter, "INI Open / inih ini_parse", "openLibrary", "parseInih", "ms", 1.0);
    printPair(reporter, "INI Close(1) / SimpleIni SaveFile", "closeLibrary", "saveSimpleIni", "ms", 1.2);
    printPair("INI peak memory / SimpleIni", static_cast<double>(ours[2]), static_cast<double>(peer[2]), "KiB", 1.0);
    benchmark::Shutdown();
    return 0;
}

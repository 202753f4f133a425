// Shared by the benchmark programs: keeps the median real time of every
// benchmark and prints the lines that run.sh turns into its table.
//
// A pair line reads "pair<TAB>name<TAB>ours<TAB>peer<TAB>unit<TAB>target":
// the median of this library's benchmark, the median of the peer's, the unit
// of both and the largest ratio ours / peer that the pair allows.
#ifndef ZK_BENCH_PAIRS_H
#define ZK_BENCH_PAIRS_H

#include <benchmark/benchmark.h>

#include <cstdio>
#include <iostream>
#include <map>
#include <string>
#include <vector>

namespace zkbench {

// Repetitions of every timed benchmark; the median of them is reported.
constexpr int kRepetitions = 9;

// The usual console report goes to standard error, so that standard output
// carries the pair lines only.
class MedianReporter : public benchmark::ConsoleReporter {
public:
    MedianReporter() {
        SetOutputStream(&std::cerr);
        SetErrorStream(&std::cerr);
    }
    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs)
            if (run.run_type == Run::RT_Aggregate && run.aggregate_name == "median") {
                medians[run.run_name.function_name] = run.GetAdjustedRealTime();
                cpuMedians[run.run_name.function_name] = run.GetAdjustedCPUTime();
            }
    }
    // Median real time and median CPU time per benchmark function, in the
    // benchmark's own unit.
    std::map<std::string, double> medians;
    std::map<std::string, double> cpuMedians;
};

inline void printPair(const char* name, double ours, double peer, const char* unit, double target) {
    std::printf("pair\t%s\t%.6g\t%.6g\t%s\t%.2f\n", name, ours, peer, unit, target);
    std::fflush(stdout);
}

// Which median a pair compares: real time for work that waits on the
// kernel or the disk, CPU time for work done in memory, which other
// processes on the machine then disturb less.
enum class Clock { Real, Cpu };

// Prints the pair of two benchmark functions from the reporter's medians.
inline void printPair(const MedianReporter& reporter, const char* name, const char* ours, const char* peer,
                      const char* unit, double target, Clock clock = Clock::Real) {
    const std::map<std::string, double>& medians = clock == Clock::Cpu ? reporter.cpuMedians : reporter.medians;
    auto o = medians.find(ours), p = medians.find(peer);
    if (o == medians.end() || p == medians.end()) {
        std::printf("pair\t%s\tmissing\tmissing\t%s\t%.2f\n", name, unit, target);
        return;
    }
    printPair(name, o->second, p->second, unit, target);
}

// Runs the registered benchmarks with their repetitions interleaved at
// random, so a slow spell of the machine does not fall on one side only.
inline void runInterleaved(int argc, char** argv, MedianReporter& reporter) {
    std::vector<char*> args(argv, argv + argc);
    static char interleave[] = "--benchmark_enable_random_interleaving=true";
    args.insert(args.begin() + 1, interleave);
    int count = static_cast<int>(args.size());
    args.push_back(nullptr);
    benchmark::Initialize(&count, args.data());
    benchmark::RunSpecifiedBenchmarks(&reporter);
}

// A small deterministic generator, so every run sees the same input.
class Random {
public:
    explicit Random(unsigned long long seed) : m_state(seed) {}
    unsigned next() {
        m_state = m_state * 6364136223846793005ull + 1442695040888963407ull;
        return static_cast<unsigned>(m_state >> 33);
    }
    // A value in [0, n).
    unsigned below(unsigned n) { return next() % n; }

private:
    unsigned long long m_state;
};

}  // namespace zkbench

#endif

// ParseCmdLine of a long command string against a plain parser of the same
// syntax that fills a std::unordered_map, on the same string in the same run.
#include <string>
#include <unordered_map>

#include "zkBenchPairs.h"
#include "zkCommandLineParser.h"

namespace {

constexpr unsigned kSwitches = 10000;
// One value in this many is quoted and holds blanks.
constexpr unsigned kQuotedEvery = 4;
constexpr unsigned kMaxValueLength = 16;
constexpr unsigned long long kSeed = 7031;

std::string g_command;
std::string g_lastName, g_lastValue;

std::string word(zkbench::Random& random, unsigned length) {
    std::string w;
    for (unsigned i = 0; i < length; ++i) w += static_cast<char>('a' + random.below(26));
    return w;
}

void makeCommand() {
    zkbench::Random random(kSeed);
    for (unsigned k = 0; k < kSwitches; ++k) {
        std::string name = "opt" + std::to_string(k) + word(random, 1 + random.below(6));
        std::string value;
        if (k % kQuotedEvery == 0) {
            value = word(random, 1 + random.below(kMaxValueLength)) + " " + word(random, 1 + random.below(8));
            g_command += "-" + name + ":\"" + value + "\" ";
        } else {
            value = word(random, 1 + random.below(kMaxValueLength));
            g_command += "-" + name + ":" + value + " ";
        }
        g_lastName = name;
        g_lastValue = value;
    }
}

// The peer: switch "-", name up to ":", then a quoted value up to the next
// quote or a bare value up to the next blank.
void parsePlain(const std::string& s, std::unordered_map<std::string, std::string>& map) {
    std::string name;
    size_t p = 0, n = s.size();
    while (p < n) {
        char c = s[p];
        if (c == '-') {
            size_t sep = s.find(':', p + 1);
            if (sep == std::string::npos) break;
            name.assign(s, p + 1, sep - p - 1);
            p = sep + 1;
        } else if (c == '"') {
            size_t close = s.find('"', p + 1);
            size_t end = close == std::string::npos ? n : close;
            if (!name.empty()) map[name].assign(s, p + 1, end - p - 1);
            name.clear();
            if (close == std::string::npos) break;
            p = close + 1;
        } else if (c == ' ') {
            ++p;
        } else {
            size_t space = s.find(' ', p);
            size_t end = space == std::string::npos ? n : space;
            if (!name.empty()) map[name].assign(s, p, end - p);
            name.clear();
            p = end;
        }
    }
}

void parseLibrary(benchmark::State& state) {
    const zkStringBase command(g_command.data(), static_cast<unsigned>(g_command.size()));
    const zkStringBase lastName(g_lastName.c_str());
    for (auto _ : state) {
        zkCommandLineParser parser(command);
        parser.ParseCmdLine();
        if (!parser.GetValue(lastName).equals(g_lastValue.c_str())) state.SkipWithError("wrong result");
    }
}

void parseUnorderedMap(benchmark::State& state) {
    for (auto _ : state) {
        std::unordered_map<std::string, std::string> map;
        parsePlain(g_command, map);
        if (map.size() != kSwitches || map[g_lastName] != g_lastValue) state.SkipWithError("wrong result");
    }
}

BENCHMARK(parseLibrary)->Repetitions(zkbench::kRepetitions)->ReportAggregatesOnly()->Unit(benchmark::kMicrosecond);
BENCHMARK(parseUnorderedMap)->Repetitions(zkbench::kRepetitions)->ReportAggregatesOnly()->Unit(benchmark::kMicrosecond);

}  // namespace

int main(int argc, char** argv) {
    makeCommand();
    zkbench::MedianReporter reporter;
    zkbench::runInterleaved(argc, argv, reporter);
    // Work in memory: the pair compares CPU time.
    zkbench::printPair(reporter, "ParseCmdLine", "parseLibrary", "parseUnorderedMap", "us", 2.0, zkbench::Clock::Cpu);
    benchmark::Shutdown();
    return 0;
}

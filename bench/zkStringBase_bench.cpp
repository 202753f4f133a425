// The string searches, comparison and tokenizer against what a user would
// write with the standard library or glibc, on the same input in the same run.
#include <strings.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <string>
#include <string_view>

#include "zkBStringTokenizer.h"
#include "zkBenchPairs.h"
#include "zkStringBase.h"

namespace {

constexpr unsigned kTextSize = 1u << 20;
constexpr unsigned kPatternSize = 16;
// The near-end pattern is copied from this far before the end.
constexpr unsigned kNearEndDistance = 100;
constexpr unsigned kTokenTextSize = 4u << 20;
constexpr unsigned kMaxTokenLength = 12;
constexpr unsigned long long kSeed = 20240601;

struct Input {
    std::string text;     // lower-case letters and spaces
    std::string absent;   // a pattern that does not occur
    std::string nearEnd;  // a pattern whose first occurrence is near the end
    size_t nearEndAt = 0;
    std::string absentUpper, nearEndUpper;  // the same in capitals
    std::string tokens;                     // comma-separated short tokens
    size_t tokenCount = 0;
    zkStringBase zText, zCopy, zAbsent, zNearEnd, zAbsentUpper, zNearEndUpper, zTokens;
};

Input* g_in = nullptr;

std::string upper(std::string s) {
    for (char& c : s) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return s;
}

zkStringBase zk(const std::string& s) {
    return zkStringBase(s.data(), static_cast<unsigned>(s.size()));
}

void makeInput(Input& in) {
    zkbench::Random random(kSeed);
    in.text.resize(kTextSize);
    for (char& c : in.text) {
        unsigned r = random.below(27);
        c = r == 26 ? ' ' : static_cast<char>('a' + r);
    }
    // A random word of 16 letters does not occur in 1 MiB of random text;
    // draw again in the unlikely case it does.
    do {
        in.absent.clear();
        for (unsigned i = 0; i < kPatternSize; ++i) in.absent += static_cast<char>('a' + random.below(26));
    } while (in.text.find(in.absent) != std::string::npos);
    in.nearEndAt = kTextSize - kNearEndDistance;
    in.nearEnd = in.text.substr(in.nearEndAt, kPatternSize);
    in.absentUpper = upper(in.absent);
    in.nearEndUpper = upper(in.nearEnd);

    while (in.tokens.size() < kTokenTextSize) {
        if (!in.tokens.empty()) in.tokens += ',';
        unsigned n = random.below(kMaxTokenLength + 1);
        for (unsigned i = 0; i < n; ++i) in.tokens += static_cast<char>('a' + random.below(26));
    }
    in.tokenCount = static_cast<size_t>(std::count(in.tokens.begin(), in.tokens.end(), ',')) + 1;

    in.zText = zk(in.text);
    in.zCopy = zk(in.text);
    in.zAbsent = zk(in.absent);
    in.zNearEnd = zk(in.nearEnd);
    in.zAbsentUpper = zk(in.absentUpper);
    in.zNearEndUpper = zk(in.nearEndUpper);
    in.zTokens = zk(in.tokens);
}

// Each benchmark checks its answer on every iteration. The clobber keeps
// the compiler from hoisting a search of unchanged input out of the loop.
void expect(benchmark::State& state, bool ok) {
    if (!ok) state.SkipWithError("wrong result");
    benchmark::ClobberMemory();
}

// ---- Exact find ----

void findAbsentLibrary(benchmark::State& state) {
    for (auto _ : state) expect(state, g_in->zText.find(g_in->zAbsent, 0, true) == zkStringBase::BadIndex);
}
void findAbsentStd(benchmark::State& state) {
    for (auto _ : state) expect(state, g_in->text.find(g_in->absent) == std::string::npos);
}
void findNearEndLibrary(benchmark::State& state) {
    unsigned at = static_cast<unsigned>(g_in->text.find(g_in->nearEnd));
    for (auto _ : state) expect(state, g_in->zText.find(g_in->zNearEnd, 0, true) == at);
}
void findNearEndStd(benchmark::State& state) {
    size_t at = g_in->text.find(g_in->nearEnd);
    for (auto _ : state) expect(state, g_in->text.find(g_in->nearEnd) == at && at != std::string::npos);
}

// ---- Folded find ----

// What a user writes without a library: std::search with a folding predicate.
size_t foldedSearch(const std::string& text, const std::string& pattern) {
    auto same = [](char a, char b) {
        return std::toupper(static_cast<unsigned char>(a)) == std::toupper(static_cast<unsigned char>(b));
    };
    auto it = std::search(text.begin(), text.end(), pattern.begin(), pattern.end(), same);
    return it == text.end() ? std::string::npos : static_cast<size_t>(it - text.begin());
}

size_t caseStr(const std::string& text, const std::string& pattern) {
    const char* hit = strcasestr(text.c_str(), pattern.c_str());
    return hit ? static_cast<size_t>(hit - text.c_str()) : std::string::npos;
}

void foldedAbsentLibrary(benchmark::State& state) {
    for (auto _ : state) expect(state, g_in->zText.find(g_in->zAbsentUpper, 0, false) == zkStringBase::BadIndex);
}
void foldedAbsentSearch(benchmark::State& state) {
    for (auto _ : state) expect(state, foldedSearch(g_in->text, g_in->absentUpper) == std::string::npos);
}
void foldedAbsentStrcasestr(benchmark::State& state) {
    for (auto _ : state) expect(state, caseStr(g_in->text, g_in->absentUpper) == std::string::npos);
}
void foldedNearEndLibrary(benchmark::State& state) {
    unsigned at = static_cast<unsigned>(g_in->text.find(g_in->nearEnd));
    for (auto _ : state) expect(state, g_in->zText.find(g_in->zNearEndUpper, 0, false) == at);
}
void foldedNearEndSearch(benchmark::State& state) {
    size_t at = g_in->text.find(g_in->nearEnd);
    for (auto _ : state) expect(state, foldedSearch(g_in->text, g_in->nearEndUpper) == at);
}
void foldedNearEndStrcasestr(benchmark::State& state) {
    size_t at = g_in->text.find(g_in->nearEnd);
    for (auto _ : state) expect(state, caseStr(g_in->text, g_in->nearEndUpper) == at);
}

// ---- Equality ----

void equalsLibrary(benchmark::State& state) {
    for (auto _ : state) expect(state, g_in->zText.equals(g_in->zCopy, true));
}
void equalsStd(benchmark::State& state) {
    static const std::string copy = g_in->text;
    for (auto _ : state) expect(state, g_in->text == copy);
}

// ---- Tokenizer ----

void tokenizeLibrary(benchmark::State& state) {
    zkStringBase token;
    for (auto _ : state) {
        zkBStringTokenizer tokenizer(g_in->zTokens, zkBStringTokenizer::m_csvToken, false);
        size_t count = 0, bytes = 0;
        while (tokenizer.GetNext(token)) {
            ++count;
            bytes += token.length();
        }
        expect(state, count == g_in->tokenCount && bytes + count - 1 == g_in->tokens.size());
    }
}
void tokenizeStringView(benchmark::State& state) {
    std::string token;
    for (auto _ : state) {
        std::string_view rest(g_in->tokens);
        size_t count = 0, bytes = 0;
        for (;;) {
            size_t comma = rest.find(',');
            token.assign(rest.substr(0, comma));
            ++count;
            bytes += token.size();
            if (comma == std::string_view::npos) break;
            rest.remove_prefix(comma + 1);
        }
        expect(state, count == g_in->tokenCount && bytes + count - 1 == g_in->tokens.size());
    }
}

#define ZK_BENCH(f) \
    BENCHMARK(f)->Repetitions(zkbench::kRepetitions)->ReportAggregatesOnly()->Unit(benchmark::kMicrosecond)
ZK_BENCH(findAbsentLibrary);
ZK_BENCH(findAbsentStd);
ZK_BENCH(findNearEndLibrary);
ZK_BENCH(findNearEndStd);
ZK_BENCH(foldedAbsentLibrary);
ZK_BENCH(foldedAbsentSearch);
ZK_BENCH(foldedAbsentStrcasestr);
ZK_BENCH(foldedNearEndLibrary);
ZK_BENCH(foldedNearEndSearch);
ZK_BENCH(foldedNearEndStrcasestr);
ZK_BENCH(equalsLibrary);
ZK_BENCH(equalsStd);
ZK_BENCH(tokenizeLibrary);
ZK_BENCH(tokenizeStringView);

}  // namespace

int main(int argc, char** argv) {
    Input in;
    makeInput(in);
    g_in = &in;
    zkbench::MedianReporter reporter;
    zkbench::runInterleaved(argc, argv, reporter);
    // All of this is work in memory: the pairs compare CPU time.
    const struct {
        const char* name;
        const char* ours;
        const char* peer;
        double target;
    } pairs[] = {
        {"find, absent", "findAbsentLibrary", "findAbsentStd", 0.5},
        {"find, near the end", "findNearEndLibrary", "findNearEndStd", 0.5},
        {"folded find, absent / std::search", "foldedAbsentLibrary", "foldedAbsentSearch", 0.5},
        {"folded find, near end / std::search", "foldedNearEndLibrary", "foldedNearEndSearch", 0.5},
        {"folded find, absent / strcasestr", "foldedAbsentLibrary", "foldedAbsentStrcasestr", 1.0},
        {"folded find, near end / strcasestr", "foldedNearEndLibrary", "foldedNearEndStrcasestr", 1.0},
        {"equals", "equalsLibrary", "equalsStd", 1.1},
        {"tokenizer", "tokenizeLibrary", "tokenizeStringView", 1.3},
    };
    for (const auto& pair : pairs)
        zkbench::printPair(reporter, pair.name, pair.ours, pair.peer, "us", pair.target, zkbench::Clock::Cpu);
    benchmark::Shutdown();
    return 0;
}

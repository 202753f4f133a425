// The line-keeping editor against the document on one generated 8 MiB file:
// changing one key with the editor (open with the lock, set, save, close)
// costs at most what the document's Open and Close(1) of the same file cost.
// Each run starts from the generated file; the files go to ZK_BENCH_DIR,
// else the current directory, and are removed at the end.
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>

#include "zkBenchPairs.h"
#include "zkINIBenchFile.h"
#include "zkINIEditor.h"
#include "zkMappedINIFile.h"

namespace {

zkbench::INIBenchFile g_file;
std::string g_path;

// Puts the generated file back, untimed.
void restore(benchmark::State& state) {
    state.PauseTiming();
    std::ofstream out(g_path, std::ios::binary | std::ios::trunc);
    out << g_file.text;
    if (!out.flush()) state.SkipWithError("cannot write the file");
    state.ResumeTiming();
}

void editorSetOneKey(benchmark::State& state) {
    const zkStringBase section(g_file.lastSection.c_str()), key(g_file.lastKey.c_str()), value("changed");
    for (auto _ : state) {
        restore(state);
        zkINIEditor editor(g_path.c_str());
        if (editor.Open(false, true) != zkINIEditor::Done || editor.SetVal(section, key, value) != zkINIEditor::Done ||
            editor.Save() != zkINIEditor::Done)
            state.SkipWithError("cannot edit");
    }
}

void documentOpenClose(benchmark::State& state) {
    for (auto _ : state) {
        restore(state);
        zkMappedINIFile ini(g_path.c_str());
        if (ini.Open(0) != 0 || ini.Close(1) != 0) state.SkipWithError("cannot load and save");
    }
}

#define ZK_BENCH(f) \
    BENCHMARK(f)->Iterations(1)->Repetitions(zkbench::kRepetitions)->UseRealTime()->Unit(benchmark::kMillisecond)
ZK_BENCH(editorSetOneKey);
ZK_BENCH(documentOpenClose);

}  // namespace

int main(int argc, char** argv) {
    const char* base = std::getenv("ZK_BENCH_DIR");
    g_path = std::string(base && *base ? base : ".") + "/zk_ini_editor_bench.ini";
    g_file = zkbench::makeINIBenchFile();
    std::fprintf(stderr, "INI file of %zu bytes\n", g_file.text.size());
    zkbench::MedianReporter reporter;
    zkbench::runInterleaved(argc, argv, reporter);
    unlink(g_path.c_str());
    zkbench::printPair(reporter, "INI editor set one key / Open + Close(1)", "editorSetOneKey", "documentOpenClose",
                       "ms", 1.0);
    benchmark::Shutdown();
    return 0;
}

// GetFileList of a large directory against a C readdir + stat loop that
// collects the same records, in the same run and on the same directory. The
// directory goes to ZK_BENCH_DIR, else the current directory, and is removed
// at the end.
#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <list>
#include <string>

#include "zkBenchPairs.h"
#include "zkFileManager.h"

namespace {

constexpr unsigned kFiles = 50000;
// One file in this many has the other extension and is not listed.
constexpr unsigned kOtherEvery = 10;
constexpr unsigned kListed = kFiles - kFiles / kOtherEvery;
constexpr unsigned long long kSeed = 424242;

std::string g_dir;

std::string fileName(unsigned k, zkbench::Random& random) {
    char name[64];
    std::snprintf(name, sizeof name, "file%05u_%u.%s", k, random.below(1000000), k % kOtherEvery ? "dat" : "txt");
    return name;
}

bool makeDirectory() {
    if (mkdir(g_dir.c_str(), 0755) != 0) return false;
    zkbench::Random random(kSeed);
    for (unsigned k = 0; k < kFiles; ++k) {
        std::string path = g_dir + "/" + fileName(k, random);
        int fd = open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0644);
        if (fd == -1) return false;
        close(fd);
    }
    return true;
}

void removeDirectory() {
    DIR* dir = opendir(g_dir.c_str());
    if (dir) {
        while (const dirent* entry = readdir(dir))
            if (entry->d_name[0] != '.') unlinkat(dirfd(dir), entry->d_name, 0);
        closedir(dir);
    }
    rmdir(g_dir.c_str());
}

// What the peer keeps of a file: a copy of its name and its stat values.
struct Record {
    char* name;
    unsigned long long size;
    long long ctime, atime, mtime;
    unsigned mode;
};

// The peer: readdir, skip folders, compare the extension, stat, keep a record.
size_t listPlain(const char* path, const char* extension, Record** out) {
    size_t count = 0, room = 0;
    Record* records = nullptr;
    DIR* dir = opendir(path);
    if (dir == nullptr) return 0;
    while (const dirent* entry = readdir(dir)) {
        if (entry->d_type == DT_DIR) continue;
        const char* dot = std::strrchr(entry->d_name, '.');
        if (dot == nullptr || dot == entry->d_name || std::strcmp(dot + 1, extension) != 0) continue;
        struct stat st;
        if (fstatat(dirfd(dir), entry->d_name, &st, 0) != 0 || S_ISDIR(st.st_mode)) continue;
        if (count == room) {
            room = room ? 2 * room : 64;
            records = static_cast<Record*>(std::realloc(records, room * sizeof *records));
        }
        records[count++] = Record{strdup(entry->d_name),
                                  static_cast<unsigned long long>(st.st_size),
                                  static_cast<long long>(st.st_ctime),
                                  static_cast<long long>(st.st_atime),
                                  static_cast<long long>(st.st_mtime),
                                  static_cast<unsigned>(st.st_mode)};
    }
    closedir(dir);
    *out = records;
    return count;
}

void listLibrary(benchmark::State& state) {
    for (auto _ : state) {
        std::list<zkFileInfo> files;
        if (zkFileManager::GetFileList(g_dir.c_str(), "*.dat", files, 0) != 0 || files.size() != kListed)
            state.SkipWithError("wrong result");
    }
}

void listReaddirStat(benchmark::State& state) {
    for (auto _ : state) {
        Record* records = nullptr;
        size_t count = listPlain(g_dir.c_str(), "dat", &records);
        for (size_t i = 0; i < count; ++i) std::free(records[i].name);
        std::free(records);
        if (count != kListed) state.SkipWithError("wrong result");
    }
}

BENCHMARK(listLibrary)
    ->Repetitions(zkbench::kRepetitions)
    ->ReportAggregatesOnly()
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(listReaddirStat)
    ->Repetitions(zkbench::kRepetitions)
    ->ReportAggregatesOnly()
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
    const char* base = std::getenv("ZK_BENCH_DIR");
    g_dir = std::string(base && *base ? base : ".") + "/zk_list_bench.dir";
    removeDirectory();
    if (!makeDirectory()) {
        std::fprintf(stderr, "cannot fill %s\n", g_dir.c_str());
        removeDirectory();
        return 1;
    }
    zkbench::MedianReporter reporter;
    zkbench::runInterleaved(argc, argv, reporter);
    removeDirectory();
    zkbench::printPair(reporter, "GetFileList", "listLibrary", "listReaddirStat", "ms", 1.3);
    benchmark::Shutdown();
    return 0;
}

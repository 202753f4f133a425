// Test helpers: a temporary directory that removes itself, whole-file reads
// and writes for comparing exact bytes, directory listings, and a file size
// limit for provoking failed writes.
#ifndef ZK_TESTS_TEMP_DIR_H
#define ZK_TESTS_TEMP_DIR_H

#include <dirent.h>
#include <fcntl.h>
#include <ftw.h>
#include <pthread.h>
#include <signal.h>
#include <stdio.h>
#include <stdlib.h>
#include <sys/ioctl.h>
#include <sys/resource.h>
#include <unistd.h>

#include <atomic>
#include <fstream>
#include <iterator>
#include <set>
#include <sstream>
#include <string>
#include <thread>

class zkTempDir {
public:
    zkTempDir() {
        const char* base = getenv("TMPDIR");
        std::string pattern = std::string(base && *base ? base : "/tmp") + "/zkutil-test-XXXXXX";
        // Without the directory every path would name a file in the root.
        if (mkdtemp(&pattern[0]) == nullptr) {
            perror(pattern.c_str());
            abort();
        }
        m_path = pattern;
    }
    ~zkTempDir() {
        if (!m_path.empty()) nftw(m_path.c_str(), removeEntry, 16, FTW_DEPTH | FTW_PHYS);
    }
    zkTempDir(const zkTempDir&) = delete;
    zkTempDir& operator=(const zkTempDir&) = delete;

    // The directory, without a trailing slash.
    const std::string& path() const { return m_path; }
    // The path of `name` inside the directory.
    std::string file(const std::string& name) const { return m_path + "/" + name; }

private:
    static int removeEntry(const char* path, const struct stat*, int, struct FTW*) {
        ::remove(path);
        return 0;
    }
    std::string m_path;
};

// The whole content of a file, or "" when it cannot be read.
inline std::string zkReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

// Replaces a file's content with `bytes`; true when written.
inline bool zkWriteFile(const std::string& path, const std::string& bytes) {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out << bytes;
    return static_cast<bool>(out.flush());
}

// The names in a directory, "." and ".." left out; empty when it cannot be read.
inline std::set<std::string> zkDirEntries(const std::string& path) {
    std::set<std::string> names;
    DIR* dir = opendir(path.c_str());
    while (const dirent* entry = dir ? readdir(dir) : nullptr) names.insert(entry->d_name);
    if (dir) closedir(dir);
    names.erase(".");
    names.erase("..");
    return names;
}

// Runs body with writes past `bytes` failing with EFBIG instead of raising
// SIGXFSZ, then restores the limit and the signal's handling. False when the
// limit could not be set (body then does not run).
template <class Body>
bool zkWithFileSizeLimit(unsigned long long bytes, Body body) {
    struct rlimit saved;
    if (getrlimit(RLIMIT_FSIZE, &saved) != 0) return false;
    const struct rlimit limit = {static_cast<rlim_t>(bytes), saved.rlim_max};
    const sighandler_t handler = signal(SIGXFSZ, SIG_IGN);
    const bool set = setrlimit(RLIMIT_FSIZE, &limit) == 0;
    if (set) body();
    setrlimit(RLIMIT_FSIZE, &saved);
    signal(SIGXFSZ, handler);
    return set;
}

// Whether the tests run under a user-mode emulator (the i386 build under
// qemu-i386), whose signal delivery into blocking calls differs from the
// kernel's: a thread joined after such a signal fails there.
inline bool zkUnderEmulator() {
    return getenv("ZK_TEST_UNDER_EMULATOR") != nullptr;
}

// Runs write with the write end of a pipe whose reader interrupts the
// writer with a signal whenever the pipe is full, so that writes of more
// than the pipe holds return short. Returns all that the reader got and
// puts the signal's handling back.
template <class Write>
std::string zkReadFromShortWrites(Write write) {
    struct sigaction action = {}, saved;
    action.sa_handler = [](int) {};  // without SA_RESTART
    int ends[2];
    if (sigaction(SIGUSR1, &action, &saved) != 0 || pipe2(ends, O_CLOEXEC) != 0) return "";
    const int capacity = fcntl(ends[1], F_GETPIPE_SZ);
    const pthread_t writer = pthread_self();
    std::atomic<bool> finished{false};
    std::string got;
    std::thread reader([&] {
        char block[4096];
        for (ssize_t n = 1; n > 0; got.append(block, n > 0 ? static_cast<size_t>(n) : 0)) {
            int queued = 0;
            while (!finished && ioctl(ends[0], FIONREAD, &queued) == 0 && queued < capacity) usleep(100);
            if (!finished) pthread_kill(writer, SIGUSR1);
            n = read(ends[0], block, sizeof block);
        }
    });
    write(ends[1]);
    finished = true;
    close(ends[1]);
    reader.join();
    close(ends[0]);
    sigaction(SIGUSR1, &saved, nullptr);
    return got;
}

#endif

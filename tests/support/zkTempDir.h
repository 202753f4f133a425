// Test helpers: a temporary directory that removes itself, whole-file reads
// and writes for comparing exact bytes, directory listings, a file size
// limit for provoking failed writes, and a pipe that takes writes in pieces.
#pragma once

#include <errno.h>
#include <fcntl.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/ioctl.h>
#include <sys/resource.h>
#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>
#include <string>
#include <thread>

// A new directory under $TMPDIR (or /tmp), removed with all it holds.
class zkTempDir {
    std::string m_path;
    std::error_code m_removeError;  // a tree that cannot go is left behind

public:
    zkTempDir() : m_path(std::filesystem::temp_directory_path().string() + "/zkutil-test-XXXXXX") {
        // Without the directory every path would name a file in the root.
        if (mkdtemp(&m_path[0]) == nullptr) throw std::system_error(errno, std::generic_category(), m_path);
    }
    ~zkTempDir() { std::filesystem::remove_all(m_path, m_removeError); }

    // The directory, without a trailing slash.
    const std::string& path() const { return m_path; }
    // The path of `name` inside the directory.
    std::string file(const std::string& name) const { return m_path + "/" + name; }
};

// The whole content of a file, or "" when it cannot be read.
inline std::string zkReadFile(const std::string& path) {
    return std::string(std::istreambuf_iterator<char>(std::ifstream(path, std::ios::binary).rdbuf()), {});
}

// Replaces a file's content with `bytes`; true when written.
inline bool zkWriteFile(const std::string& path, const std::string& bytes) {
    return static_cast<bool>(std::ofstream(path, std::ios::binary) << bytes << std::flush);
}

// The names in a directory, "." and ".." left out; throws when it cannot be
// read.
inline std::set<std::string> zkDirEntries(const std::string& path) {
    std::set<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(path)) names.insert(entry.path().filename());
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

// Runs write on another thread with the write end of a pipe, and interrupts
// that thread with a signal whenever the pipe is full, so that writes of
// more than the pipe holds return short. Returns all that came through the
// pipe, and puts the signal's handling back.
template <class Write>
std::string zkReadFromShortWrites(Write write) {
    struct sigaction action = {}, saved;
    action.sa_handler = [](int) {};  // without SA_RESTART
    int ends[2], queued = 0;
    if (sigaction(SIGUSR1, &action, &saved) != 0 || pipe2(ends, O_CLOEXEC) != 0) return "";
    const int capacity = fcntl(ends[1], F_GETPIPE_SZ);
    std::atomic<bool> finished{false};
    std::thread writer([&] {
        write(ends[1]);
        finished = true;
        close(ends[1]);
    });
    std::string got;
    char block[4096];
    for (ssize_t n = 1; n > 0; got.append(block, n > 0 ? static_cast<size_t>(n) : 0)) {
        while (!finished && ioctl(ends[0], FIONREAD, &queued) == 0 && queued < capacity) usleep(100);
        if (!finished) pthread_kill(writer.native_handle(), SIGUSR1);
        n = read(ends[0], block, sizeof block);
    }
    writer.join();
    close(ends[0]);
    sigaction(SIGUSR1, &saved, nullptr);
    return got;
}

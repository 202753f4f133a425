// Test helpers: a temporary directory that removes itself, whole-file reads
// and writes for comparing exact bytes, directory listings, and a file size
// limit for provoking failed writes.
#pragma once

#include <errno.h>
#include <fcntl.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/resource.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>
#include <string>

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

// Test helpers: a temporary directory that removes itself, whole-file reads
// and writes for comparing exact bytes, directory listings, a file size
// limit for provoking failed writes, and a save made to rewrite its file in
// place as a user without privilege would.
#pragma once

#include <errno.h>
#include <fcntl.h>
#include <linux/capability.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
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

// Sets the calling thread's effective capabilities to none, or back to all
// it is permitted; false when that could not be done.
inline bool zkSetEffectiveCapabilities(bool on) {
    __user_cap_header_struct header = {_LINUX_CAPABILITY_VERSION_3, 0};
    __user_cap_data_struct data[_LINUX_CAPABILITY_U32S_3] = {};
    if (syscall(SYS_capget, &header, data) != 0) return false;
    for (auto& each : data) each.effective = on ? each.permitted : 0;
    return syscall(SYS_capset, &header, data) == 0;
}

// Runs body, a save of a file of dir, with writes past limit bytes failing:
// as it is, or, inPlace, with dir closed to new files, so that the save
// rewrites the file in place. Root is held to the permission bits as dir's
// owner by giving up its capabilities meanwhile (a user switch would need
// every directory above dir open to that user). False when that could not
// be arranged.
template <class Body>
bool zkSave(const zkTempDir& dir, bool inPlace, unsigned long long limit, Body body) {
    if (!inPlace) return zkWithFileSizeLimit(limit, body);
    if (chmod(dir.path().c_str(), 0555) != 0 || !zkSetEffectiveCapabilities(false)) return false;
    // A directory that could be added to would let the save replace the file.
    const bool done =
        mkdir(dir.file("probe").c_str(), 0700) != 0 && errno == EACCES && zkWithFileSizeLimit(limit, body);
    return zkSetEffectiveCapabilities(true) && chmod(dir.path().c_str(), 0755) == 0 && done;
}

// Writing the document back to its file.
#include <fcntl.h>
#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <string>

#include "zkBasicFile.h"
#include "zkMappedINIFile.h"

namespace {

// The section whose key lines CloseFW writes without "=".
constexpr char kFirewallSection[] = "IPsBehindFirewall";

// The blank that may follow a line of one character.
constexpr unsigned long long kLinePad = 1;

// The longest text a zkStringBase can hold.
constexpr unsigned long long kMaxStringLength = 0xFFFFFFFEull;

// Symbolic links followed before giving up, as the kernel does.
constexpr int kMaxLinkDepth = 40;
// Room for a link's target.
constexpr size_t kLinkTargetSize = 4096;

// Names tried for the temporary file before giving up.
constexpr int kTempNameAttempts = 64;
// Bytes of the file's own name kept in the temporary file's name, which
// must stay within the limit of one path component.
constexpr size_t kTempNameKeep = 64;

// The permission bits, set-id and sticky bits included, that a replacement
// file takes over.
constexpr mode_t kPermissionBits = 07777;

bool hasLineBreak(const zkStringBase& s) {
    for (unsigned i = 0; i < s.length(); ++i)
        if (s[i] == '\r' || s[i] == '\n') return true;
    return false;
}

// Writes the whole text, continuing after short and interrupted writes.
int writeAll(zkBasicFile& file, const zkStringBase& text) {
    const char* p = text.data();
    unsigned long left = text.length();
    while (left != 0) {
        unsigned long put = 0;
        if (file.Write(p, left, &put) != 0) {
            if (errno == EINTR) continue;
            return 1;
        }
        if (put == 0) {
            errno = EIO;
            return 1;
        }
        p += put;
        left -= put;
    }
    return 0;
}

// Writes every section, each with its text built in one buffer sized for it
// before the first append. The buffer is reused, so it grows only for a
// section longer than all before it.
int writeSections(zkBasicFile& file, const std::list<INISection*>& sections, bool firewall) {
    const zkStringBase firewallName(kFirewallSection);
    zkStringBase text;
    for (const INISection* section : sections) {
        // The test of the name follows its compare type: a name copied from
        // a case-insensitive string matches in any case.
        const bool bare = firewall && section->m_name == firewallName;
        // "[", name, "]", LF, then the lines, then the empty line.
        unsigned long long size = section->m_name.length() + 4ull;
        for (const INILine* line : *section->m_lines) {
            unsigned long long length = line->m_value.length();
            if (!line->m_isComment) length += line->m_key.length() + (bare ? 0ull : 1ull);
            size += length + (!bare && length == 1 ? kLinePad : 0ull) + 1ull;
        }
        if (size > kMaxStringLength) {
            errno = EOVERFLOW;
            return 1;
        }
        text.makeNull();
        if (size >= text.capacity()) text.reserve(static_cast<unsigned>(size + 1));

        text.append('[').append(section->m_name).append(']').append('\n');
        for (const INILine* line : *section->m_lines) {
            const unsigned start = text.length();
            if (!line->m_isComment) {
                text.append(line->m_key);
                if (!bare) text.append('=');
            }
            text.append(line->m_value);
            // Loading ignores a line of one character, so a lone comment
            // character or a lone "=" would be lost; a blank after it is cut
            // off again when the line is read. The bare keys of the firewall
            // form are written as they are.
            if (!bare && text.length() - start == 1) text.append(' ');
            text.append('\n');
        }
        text.append('\n');
        if (writeAll(file, text) != 0) return 1;
    }
    return 0;
}

// Follows path through symbolic links to the name of the file itself (which
// may not exist yet); false when the chain is too long or unreadable.
bool resolveLinks(std::string& path) {
    for (int depth = 0; depth < kMaxLinkDepth; ++depth) {
        struct stat st;
        if (::lstat(path.c_str(), &st) != 0 || !S_ISLNK(st.st_mode)) return true;
        std::string target(kLinkTargetSize, '\0');
        ssize_t n = ::readlink(path.c_str(), &target[0], target.size());
        if (n < 0) return false;
        if (static_cast<size_t>(n) >= target.size()) {
            errno = ENAMETOOLONG;
            return false;
        }
        target.resize(static_cast<size_t>(n));
        // A relative target is relative to the link's directory.
        size_t slash = path.rfind('/');
        if (!target.empty() && target[0] != '/' && slash != std::string::npos) target.insert(0, path, 0, slash + 1);
        path.swap(target);
    }
    errno = ELOOP;
    return false;
}

// A name for the temporary file, unlikely to be taken: the process, the
// time and a counter shared by all documents of the process.
std::string tempName(const std::string& directory, const std::string& base) {
    static std::atomic<unsigned> counter{0};
    struct timespec now = {};
    ::clock_gettime(CLOCK_REALTIME, &now);
    unsigned long long mix = static_cast<unsigned long long>(now.tv_nsec) ^
                             (static_cast<unsigned long long>(now.tv_sec) << 30) ^
                             (static_cast<unsigned long long>(::getpid()) << 40) ^
                             (counter.fetch_add(1) * 0x9E3779B97F4A7C15ull);
    char suffix[24];
    std::snprintf(suffix, sizeof suffix, ".%012llx", mix & 0xFFFFFFFFFFFFull);
    return directory + "." + base.substr(0, kTempNameKeep) + suffix;
}

// Makes a durable record of the rename in the directory; failures only cost
// durability, not the new content, and are not reported.
void syncDirectory(const std::string& directory) {
    zkBasicFile dir(directory.empty() ? "." : directory.c_str(), 0, O_RDONLY, O_DIRECTORY);
    if (dir.Open() == 0) dir.Sync();
}

// Rewrites the file where it stands: for files that are not regular files,
// and for a directory where no new file can be made.
int rewriteInPlace(const std::string& path, const std::list<INISection*>& sections, bool firewall) {
    zkBasicFile file(path.c_str(), O_TRUNC, O_WRONLY, 0);
    if (file.Open() != 0) return 1;
    if (writeSections(file, sections, firewall) != 0) return 1;
    // Devices and pipes cannot be synchronised and say so with EINVAL.
    if (file.Sync() != 0 && errno != EINVAL) return 1;
    return file.Close() == 0 ? 0 : 1;
}

}  // namespace

int zkMappedINIFile::Close(unsigned int save) {
    if (save && Save(false) != 0) return 1;
    Clear();
    return 0;
}

int zkMappedINIFile::CloseFW(unsigned int save) {
    if (save && Save(true) != 0) return 1;
    Clear();
    return 0;
}

bool zkMappedINIFile::HasLineBreaks() const {
    for (const INISection* section : m_sections) {
        if (hasLineBreak(section->m_name)) return true;
        for (const INILine* line : *section->m_lines)
            if (hasLineBreak(line->m_key) || hasLineBreak(line->m_value)) return true;
    }
    return false;
}

// The new text goes to a new file in the same directory, created
// exclusively, given the old file's owner and permissions before any byte is
// written, flushed to disk, and renamed over the old file: at every moment
// the name holds either the whole old file or the whole new one.
int zkMappedINIFile::Save(bool firewall) {
    if (HasLineBreaks()) {
        errno = EINVAL;
        return 1;
    }
    std::string target(m_filename.data());
    if (target.empty()) {
        errno = ENOENT;
        return 1;
    }
    if (!resolveLinks(target)) return 1;

    struct stat old;
    const bool exists = ::stat(target.c_str(), &old) == 0;
    if (exists && !S_ISREG(old.st_mode)) return rewriteInPlace(target, m_sections, firewall);

    const size_t slash = target.rfind('/');
    const std::string directory = slash == std::string::npos ? std::string() : target.substr(0, slash + 1);
    const std::string base = slash == std::string::npos ? target : target.substr(slash + 1);

    zkBasicFile file(nullptr, O_CREAT | O_EXCL, O_WRONLY, 0);
    std::string temp;
    int opened = 1;
    for (int attempt = 0; attempt < kTempNameAttempts && opened != 0; ++attempt) {
        temp = tempName(directory, base);
        file.SetFilename(temp.c_str());
        opened = file.Open();
        if (opened != 0 && errno != EEXIST) break;
    }
    if (opened != 0) {
        // A directory the process may not write can still hold a file it may.
        if (exists && (errno == EACCES || errno == EPERM)) return rewriteInPlace(target, m_sections, firewall);
        return 1;
    }

    bool failed = false;
    if (exists) {
        // The owner first: a change of owner clears the set-id bits that
        // the permissions then restore. Only the group may be ours to give.
        if (::lchown(temp.c_str(), old.st_uid, old.st_gid) != 0)
            (void)::lchown(temp.c_str(), static_cast<uid_t>(-1), old.st_gid);
        failed = ::chmod(temp.c_str(), old.st_mode & kPermissionBits) != 0;
    }
    if (!failed) failed = writeSections(file, m_sections, firewall) != 0 || file.Sync() != 0;
    if (file.Close() != 0) failed = true;
    if (!failed) failed = ::rename(temp.c_str(), target.c_str()) != 0;
    if (failed) {
        int error = errno;
        ::unlink(temp.c_str());
        errno = error;
        return 1;
    }
    syncDirectory(directory);
    return 0;
}

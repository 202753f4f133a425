#include "zkFileManager.h"

#include <dirent.h>
#include <errno.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>
#include <string>
#include <vector>

#include "internal/zkFileSystem.h"
#include "internal/zkPathRules.h"

namespace {

// The fallback copy moves data through one stack buffer of this size.
constexpr unsigned kBlockSize = 16384;
// The most one copy_file_range call is asked for; it fits a 32-bit size_t.
constexpr unsigned long long kKernelChunk = 1ull << 30;
// The first buffer for a symbolic link's target; it doubles until the target fits.
constexpr size_t kFirstLinkBuffer = 256;

constexpr unsigned kReadAccess = 0444;
// A new copy's mode, less the umask and the bits its source lacks.
constexpr mode_t kCreatedMode = 0664;

constexpr const char* kAllEntries = "*";

struct Options {
    unsigned recursive;
    unsigned makeDir;
    unsigned overwrite;
    unsigned symLink;
    unsigned deleteSource;
};

// The directory that the outermost directory copy fills. Entries that are
// this directory are skipped, so a destination inside the source tree is
// never copied into itself.
struct OutermostDestination {
    bool known = false;
    dev_t dev = 0;
    ino_t ino = 0;
};

int copyEntries(zkFilename& source, zkFilename& destination, const Options& options, OutermostDestination& outermost);

bool hasWildcard(const char* path) {
    return std::strpbrk(path, "*?") != nullptr;
}

bool isReadableDirectory(const std::string& path) {
    DIR* stream = opendir(path.empty() ? "." : path.c_str());
    if (stream == nullptr) return false;
    closedir(stream);
    return true;
}

std::string asDirectory(const char* path) {
    std::string dir(path);
    if (dir.empty() || dir.back() != kZkPathSeparator) dir += kZkPathSeparator;
    return dir;
}

// Moves what copy_file_range or, where the kernel refuses it (another file
// system, an old kernel, an emulator), read and write can move: at most
// remaining bytes. The number moved, 0 when the source has ended, or -1 on
// an error.
long long moveSome(int in, int out, unsigned long long remaining, bool& kernelCopy) {
    while (kernelCopy) {
        size_t chunk = static_cast<size_t>(remaining < kKernelChunk ? remaining : kKernelChunk);
        ssize_t n = copy_file_range(in, nullptr, out, nullptr, chunk, 0);
        if (n > 0) return n;
        if (n < 0 && errno == EINTR) continue;
        // Nothing was moved, so the block loop takes over from the same
        // positions. A real error shows there again, and so does a real end
        // of the source: some file systems report an end to copy_file_range
        // while read still delivers data.
        kernelCopy = false;
    }
    char buffer[kBlockSize];
    unsigned wanted = remaining < kBlockSize ? static_cast<unsigned>(remaining) : kBlockSize;
    unsigned got = 0;
    if (!ReadFile(in, buffer, wanted, &got, nullptr)) return -1;
    if (got != 0 && !WriteFile(out, buffer, got, nullptr, nullptr)) return -1;
    return got;
}

// Copies size bytes; false when the source ended early or an error stopped
// the copy. Each step moves at least one byte or ends the loop.
bool copyData(int in, int out, unsigned long long size) {
    bool kernelCopy = true;
    while (size != 0) {
        long long moved = moveSome(in, out, size, kernelCopy);
        if (moved <= 0) return false;
        size -= static_cast<unsigned long long>(moved);
    }
    return true;
}

// Opens the source of a file copy; -1 when it is no regular file or the
// destination is the source itself under another name, or a FIFO, whose
// open would wait for a reader.
int openSource(zkFilename& source, zkFilename& destination, struct stat& from) {
    int in = CreateFile(source.m_path, O_RDONLY, kReadAccess, 0, 0, kCreatedMode, nullptr);
    if (in == -1) return -1;
    struct stat to;
    bool refused = fstat(in, &from) != 0 || !S_ISREG(from.st_mode);
    if (!refused && stat(destination.GetFullPath(), &to) == 0) refused = zkSameFile(from, to) || S_ISFIFO(to.st_mode);
    if (!refused) return in;
    CloseHandle(in);
    return -1;
}

// The copy of one regular file. An overwritten destination is replaced only
// once the new copy is whole, keeping its mode and owner; a new one is never
// more open than its source. The source of a move goes only once its copy is
// on disk.
int copyContents(zkFilename& source, zkFilename& destination, const Options& options) {
    struct stat from;
    int in = openSource(source, destination, from);
    if (in == -1) return 1;
    const unsigned long long size = static_cast<unsigned long long>(from.st_size);
    const mode_t mode = kCreatedMode & from.st_mode;
    // The writer may run twice, beside the file and then in place when the
    // rename is refused, so each run starts from the source's first byte.
    auto copy = [in, size](int out) { return lseek(in, 0, SEEK_SET) == 0 && copyData(in, out, size); };
    int failed = options.overwrite ? zkReplaceFile(destination.GetFullPath(), mode, size, copy)
                                   : zkCreateNewFile(destination.GetFullPath(), mode, options.deleteSource != 0, copy);
    CloseHandle(in);
    if (failed) return 1;
    if (options.deleteSource && unlink(source.GetFullPath()) != 0) return 1;
    return 0;
}

int copyOne(zkFilename& source, zkFilename& destination, const Options& options, OutermostDestination& outermost) {
    const int type = source.GetType();
    if (type == zkFilename::NoEntry) return 1;
    if (type == zkFilename::DirectoryEntry) {
        // The whole path becomes the directory part, so that /a/src and
        // /a/src/ both copy the entries of src.
        std::string dir = asDirectory(source.GetFullPath());
        zkFilename::Dup(&source.m_dir, dir.c_str(), -1);
        zkFilename::Dup(&source.m_fname, kAllEntries, -1);
        zkFilename::Dup(&source.m_ext, nullptr, -1);
        source.Rebuild(0, 0, 0, 0, 0);
        return copyEntries(source, destination, options, outermost);
    }
    // An empty directory part is the current directory, which exists.
    const char* destinationDir = destination.GetDirectory();
    if (options.makeDir == 1 && *destinationDir != '\0' && !zkFileManager::CreateDirectory(destinationDir, nullptr))
        return 1;
    zkStringBase protocol(source.GetProtocol());
    if (protocol.equals("ftp", true) || protocol.equals("http", true)) return 1;
    if (options.symLink) return symlink(source.GetFullPath(), destination.GetFullPath()) == 0 ? 0 : 1;

    if (std::strchr(destination.GetName(), '*')) destination.SetName(source.GetName());
    if (std::strchr(destination.GetName(), '?')) destination.SetName(source.GetName());
    if (*destination.GetName() == '\0') {
        // Both parts before the one Rebuild, so a dotted name stays whole.
        zkFilename::Dup(&destination.m_fname, source.GetName(), -1);
        zkFilename::Dup(&destination.m_ext, source.GetExtension(), -1);
        destination.Rebuild(0, 0, 0, 0, 0);
    }
    if (zkStringBase::equalStrings(destination.GetFullPath(), source.GetFullPath(), false)) return 1;
    if (type != zkFilename::RegularFileEntry) return 1;
    return copyContents(source, destination, options);
}

// A symbolic link of a copied tree that leads to a directory is made again
// with the same target text instead of being followed, so links that point
// back up the tree cannot make the copy endless.
int copyLink(const std::string& from, const std::string& to, const Options& options) {
    std::vector<char> target(kFirstLinkBuffer);
    ssize_t n;
    while ((n = readlink(from.c_str(), target.data(), target.size())) == static_cast<ssize_t>(target.size()))
        target.resize(target.size() * 2);
    if (n < 0) return 1;
    target[static_cast<size_t>(n)] = '\0';

    struct stat old, link;
    if (options.overwrite && lstat(to.c_str(), &old) == 0 && !S_ISDIR(old.st_mode)) {
        if (lstat(from.c_str(), &link) != 0 || zkSameFile(old, link) || unlink(to.c_str()) != 0) return 1;
    }
    if (symlink(target.data(), to.c_str()) != 0) return 1;
    if (options.deleteSource && unlink(from.c_str()) != 0) return 1;
    return 0;
}

// Copies one entry of a directory copy: the number of entries that failed,
// 0 when it was copied or passed by.
int copyEntry(const std::string& from, const std::string& to, const Options& options, OutermostDestination& outermost) {
    struct stat st;
    if (lstat(from.c_str(), &st) != 0) return 1;
    bool link = S_ISLNK(st.st_mode);
    bool directory = link ? zkFilename::IsDirectory(from.c_str()) != 0 : S_ISDIR(st.st_mode);
    if (directory && !options.recursive) return 0;
    if (directory && link) return copyLink(from, to, options);
    if (directory && st.st_dev == outermost.dev && st.st_ino == outermost.ino) return 0;
    // Entry names are taken literally: a name holding '*' or '?' is one file.
    zkFilename entry(from.c_str());
    zkFilename target(to.c_str());
    return copyOne(entry, target, options, outermost);
}

// The directory copy: destination becomes a directory and receives every
// entry of source's directory that matches source's name part.
int copyEntries(zkFilename& source, zkFilename& destination, const Options& options, OutermostDestination& outermost) {
    // A link for the whole directory is tried first. Its path is the
    // destination's directory part, which ends in '/', and symlink refuses a
    // new path that ends so; the entries are then linked one by one below.
    if (options.symLink && symlink(source.GetDirectory(), destination.GetDirectory()) == 0) return 0;
    if (!zkFileManager::CreateDirectory(destination.GetFullPath(), nullptr)) return 1;
    // The entries go inside the destination also when its path does not end in '/'.
    std::string destinationDir = asDirectory(destination.GetFullPath());
    if (!outermost.known) {
        struct stat st;
        if (stat(destinationDir.c_str(), &st) != 0) return 1;
        outermost.known = true;
        outermost.dev = st.st_dev;
        outermost.ino = st.st_ino;
    }

    std::string sourceDir = source.GetDirectory();
    // A directory that cannot be read (no permission, or a path past the
    // system's limit) fails; the listing below would only find it empty.
    if (!isReadableDirectory(sourceDir)) return 1;
    int failed = 0;
    for (zkDirIterator it(source.GetFullPath()), end; it != end; ++it) {
        const char* name = it.GetName();
        if (std::strcmp(name, ".") == 0 || std::strcmp(name, "..") == 0) continue;
        failed += copyEntry(sourceDir + name, destinationDir + name, options, outermost);
    }
    return failed;
}

}  // namespace

int zkFileManager::CopyFile(zkFilename& source, zkFilename& destination, unsigned recursive, unsigned makeDir,
                            unsigned overwrite, unsigned symLink, unsigned deleteSource, const char*, const char*) {
    Options options{recursive, makeDir, overwrite, symLink, deleteSource};
    OutermostDestination outermost;
    if (hasWildcard(source.GetFullPath())) return copyEntries(source, destination, options, outermost);
    return copyOne(source, destination, options, outermost);
}

int zkFileManager::CopyFile(zkStringBase& source, zkStringBase& destination, unsigned recursive, unsigned makeDir,
                            unsigned overwrite, unsigned symLink, unsigned deleteSource, const char* reserved1,
                            const char* reserved2) {
    zkFilename from(source.data());
    zkFilename to(destination.data());
    return CopyFile(from, to, recursive, makeDir, overwrite, symLink, deleteSource, reserved1, reserved2);
}

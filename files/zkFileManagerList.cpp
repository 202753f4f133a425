#include "zkFileManager.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>
#include <new>

#include "internal/zkOutOfMemory.h"
#include "internal/zkPathRules.h"

namespace {

bool isDotOrDotDot(const char* name) {
    return name[0] == '.' && (name[1] == '\0' || (name[1] == '.' && name[2] == '\0'));
}

// A directory stream over a descriptor, which it owns from construction
// on (also when the stream cannot be made) and closes with the stream.
class Directory {
public:
    // -1 gives a directory without a stream.
    explicit Directory(int fd) : m_stream(fd == -1 ? nullptr : fdopendir(fd)) {
        if (fd != -1 && m_stream == nullptr) close(fd);
    }
    ~Directory() {
        if (m_stream) closedir(m_stream);
    }
    Directory(const Directory&) = delete;
    Directory& operator=(const Directory&) = delete;

    static int openPath(const char* path) { return open(path, O_RDONLY | O_DIRECTORY | O_CLOEXEC); }

    DIR* stream() const { return m_stream; }
    int fd() const { return dirfd(m_stream); }

private:
    DIR* m_stream;
};

// The folders of one directory, opened as fd, whose names relative to root
// start with relative.
void listFolders(int fd, const zkStringBase& root, const zkStringBase& relative, std::list<zkStringBase>& folders,
                 unsigned recursive, unsigned fullPaths) {
    Directory dir(fd);
    if (dir.stream() == nullptr) return;
    while (const dirent* entry = readdir(dir.stream())) {
        if (isDotOrDotDot(entry->d_name)) continue;
        // The entry type from readdir saves a stat for everything but links
        // and file systems that leave it unknown.
        bool folder = entry->d_type == DT_DIR;
        bool viaLink = entry->d_type == DT_LNK;
        struct stat st;
        if (entry->d_type == DT_UNKNOWN) {
            if (fstatat(dir.fd(), entry->d_name, &st, AT_SYMLINK_NOFOLLOW) != 0) continue;
            viaLink = S_ISLNK(st.st_mode);
            folder = S_ISDIR(st.st_mode);
        }
        if (viaLink) folder = fstatat(dir.fd(), entry->d_name, &st, 0) == 0 && S_ISDIR(st.st_mode);
        if (!folder) continue;

        zkStringBase name(entry->d_name);
        zkStringBase below;
        zkFileManager::MakePath(below, relative, name, 0u);
        if (fullPaths) {
            zkStringBase full;
            zkFileManager::MakePath(full, root, relative, name);
            zkAppendNode(folders, full);
        } else {
            zkAppendNode(folders, below);
        }
        // A folder reached through a link is listed but not entered, so a
        // link back up the tree cannot make the walk endless. The folder is
        // opened by its entry, which no separator rewriting can misname.
        if (recursive && !viaLink) {
            int child = openat(dir.fd(), entry->d_name, O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
            if (child != -1) listFolders(child, root, below, folders, recursive, fullPaths);
        }
    }
}

}  // namespace

int zkFileManager::GetFileList(const char* dir, const char* pattern, std::list<zkFileInfo>& files, unsigned fullPaths) {
    zkFilename filter(nullptr);
    zkFilename::Dup(&filter.m_dir, dir, -1);
    filter.Rebuild(0, 0, 0, 0, 0);
    if (access(filter.GetFullPath(), F_OK) != 0) return 1;
    // Only the pattern's extension counts: a folder part in it must not
    // move the listing out of dir.
    const char* slash = pattern != nullptr ? std::strrchr(pattern, kZkPathSeparator) : nullptr;
    zkFilename::Dup(&filter.m_fname, slash != nullptr ? slash + 1 : pattern, -1);
    filter.Rebuild(0, 0, 0, 0, 0);

    Directory listing(Directory::openPath(filter.GetDirectory()));
    if (listing.stream() == nullptr) return 0;
    const char* const wanted = filter.GetExtension();
    while (const dirent* entry = readdir(listing.stream())) {
        // Folders are known from readdir without a stat, and the extension
        // is compared before the one stat of a candidate.
        if (entry->d_type == DT_DIR) continue;
        const char* const name = entry->d_name;
        const size_t length = std::strlen(name);
        const size_t dot = zkExtensionDot(name, length);
        if (std::strcmp(dot < length ? name + dot + 1 : "", wanted) != 0) continue;
        struct stat st;
        if (fstatat(listing.fd(), name, &st, 0) == 0) {
            if (S_ISDIR(st.st_mode)) continue;
        } else if (fstatat(listing.fd(), name, &st, AT_SYMLINK_NOFOLLOW) != 0) {
            // Gone since readdir: nothing left to describe.
            continue;
        }
        // A link whose target is missing is described by the link itself.
        // The record is made in its list node rather than copied there; its
        // parts are set and rebuilt as on any fresh record.
        zkFileInfo& record = zkAppendNode(files);
        zkFilename::Dup(&record.m_file.m_ext, dot < length ? name + dot + 1 : "", -1);
        zkFilename::Dup(&record.m_file.m_fname, name, static_cast<int>(dot));
        record.m_file.Rebuild(0, 0, 0, 0, 0);
        record.m_size = static_cast<unsigned long long>(st.st_size);
        record.m_ctime = static_cast<long long>(st.st_ctime);
        record.m_atime = static_cast<long long>(st.st_atime);
        record.m_mtime = static_cast<long long>(st.st_mtime);
        record.m_mode = static_cast<unsigned>(st.st_mode);
        if (fullPaths) record.m_file.SetDirectory(dir);
    }
    return 0;
}

int zkFileManager::GetFolderList(const char* root, const char* relative, std::list<zkStringBase>& folders,
                                 unsigned recursive, unsigned fullPaths) {
    zkStringBase rootPath(root);
    zkStringBase relativePath(relative);
    zkStringBase path;
    MakePath(path, rootPath, relativePath, 0u);
    zkFilename folder(nullptr);
    zkFilename::Dup(&folder.m_dir, path.data(), -1);
    folder.Rebuild(0, 0, 0, 0, 0);
    if (access(folder.GetFullPath(), F_OK) != 0) return 1;
    listFolders(Directory::openPath(folder.GetDirectory()), rootPath, relativePath, folders, recursive, fullPaths);
    return 0;
}

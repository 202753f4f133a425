#include "zkFileManager.h"

#include <errno.h>
#include <sys/statfs.h>
#include <unistd.h>

#include <memory>

namespace {

// The first buffer tried for the current directory; it doubles until the
// path fits, so no length is too long.
constexpr size_t kFirstCwdBuffer = 512;

// path becomes the current directory; false (and path empty) when getcwd
// fails for another reason than a short buffer.
bool currentDirectory(zkStringBase& path) {
    for (size_t size = kFirstCwdBuffer;; size *= 2) {
        std::unique_ptr<char[]> buffer(new char[size]);
        if (getcwd(buffer.get(), size) != nullptr) {
            path = buffer.get();
            return true;
        }
        if (errno != ERANGE) break;
    }
    path.makeNull();
    return false;
}

}  // namespace

int zkFileManager::CreateDirectory(const char* path, void* attributes) {
    return zkCreateDir(path, attributes);
}

int zkFileManager::DeleteFile(zkStringBase& path, unsigned flag) {
    return zkUnlink(path.data(), flag);
}

int zkFileManager::DeleteFile(zkFilename& file, unsigned flag) {
    return zkUnlink(file.GetFullPath(), flag);
}

void zkFileManager::GetCurrentDirectory(zkStringBase& path) {
    currentDirectory(path);
}

void zkFileManager::GetModuleDirectory(zkStringBase& path) {
    if (!currentDirectory(path)) return;
    zkFilename cwd(path.data());
    path = cwd.GetDirectory();
    if (path.isNull() || path.getLast() != m_slash) path.append(m_slash);
}

long long zkFileManager::GetFreeDiskSpace(const char* path) {
    struct statfs fs;
    if (path == nullptr || statfs(path, &fs) != 0) return 0;
    return static_cast<long long>(static_cast<unsigned long long>(fs.f_bsize) *
                                  static_cast<unsigned long long>(fs.f_bavail));
}

#include "zkFileInfo.h"

#include <sys/stat.h>

zkFileInfo::zkFileInfo() : m_file(nullptr), m_size(0), m_ctime(0), m_atime(0), m_mtime(0), m_mode(0) {}

zkFileInfo::zkFileInfo(zkFilename file) : zkFileInfo() {
    SetFrom(file);
}

zkFileInfo::zkFileInfo(const zkFileInfo& other) : zkFileInfo() {
    *this = other;
}

void zkFileInfo::SetFrom(zkFilename& file) {
    fill(file);
}

bool zkFileInfo::fill(zkFilename& file) {
    struct stat st;
    if (stat(file.GetFullPath(), &st) != 0) return false;
    // Both parts change before the one Rebuild: rebuilding in between would
    // split a dotted name left over from the previous file.
    zkFilename::Dup(&m_file.m_ext, file.GetExtension(), -1);
    zkFilename::Dup(&m_file.m_fname, file.GetName(), -1);
    m_file.Rebuild(0, 0, 0, 0, 0);
    m_size = static_cast<unsigned long long>(st.st_size);
    m_ctime = static_cast<long long>(st.st_ctime);
    m_atime = static_cast<long long>(st.st_atime);
    m_mtime = static_cast<long long>(st.st_mtime);
    m_mode = static_cast<unsigned>(st.st_mode);
    return true;
}

zkFileInfo& zkFileInfo::operator=(const zkFileInfo& other) {
    if (this == &other) return *this;
    m_file = other.m_file;
    m_size = other.m_size;
    m_ctime = other.m_ctime;
    m_atime = other.m_atime;
    m_mtime = other.m_mtime;
    m_mode = other.m_mode;
    return *this;
}

bool zkFileInfo::operator==(const zkFileInfo& other) const {
    return m_file == other.m_file && m_size == other.m_size && m_ctime == other.m_ctime && m_atime == other.m_atime &&
           m_mtime == other.m_mtime && m_mode == other.m_mode;
}

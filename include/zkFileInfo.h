/// zkFileInfo: a small value record describing one file.
///
/// A record holds the file's name as a zkFilename (owned by value) and the
/// size, times and mode that stat reports for it. SetFrom takes only the name
/// and extension parts of the file it examines; the record's directory part
/// stays as it was, empty for a fresh record. Sizes and times are 64-bit on
/// every build, so large files and dates past 2038 keep their values. Records
/// are copied by value and hold nothing else. One object is used by one thread at a time.
#ifndef ZK_FILE_INFO_H
#define ZK_FILE_INFO_H

#include "zkExport.h"
#include "zkFilename.h"

class ZK_API zkFileInfo {
public:
    /// An empty name and all numbers 0.
    zkFileInfo();
    /// An empty record filled with SetFrom(file); a file that cannot be
    /// examined leaves it empty.
    zkFileInfo(zkFilename file);
    /// A copy of other.
    zkFileInfo(const zkFileInfo& other);

    /// Fills the record from stat of file's full path: the name and extension
    /// parts and the five numbers. A file that cannot be examined leaves the
    /// whole record as it was.
    void SetFrom(zkFilename& file);

    /// Copies the name and the five numbers; self-assignment changes nothing.
    zkFileInfo& operator=(const zkFileInfo& other);
    /// True when the names are equal (zkFilename::operator==) and so are the
    /// size, the three times and the mode.
    bool operator==(const zkFileInfo& other) const;
    bool operator!=(const zkFileInfo& other) const { return !(*this == other); }

    zkFilename m_file;          ///< the file's name and extension
    unsigned long long m_size;  ///< size in bytes (st_size)
    long long m_ctime;          ///< last status change, seconds since the epoch (st_ctime)
    long long m_atime;          ///< last access (st_atime)
    long long m_mtime;          ///< last modification (st_mtime)
    unsigned m_mode;            ///< file type and permission bits (st_mode)

private:
    friend class zkFileManager;
    /// SetFrom, telling whether the file could be examined.
    bool fill(zkFilename& file);
};

#endif

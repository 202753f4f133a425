/// The platform file layer: the small set of path and file primitives that
/// the rest of the library stands on.
///
/// zkFilename is a path split into its directory, name and extension parts;
/// each part and the full path are zero-terminated copies that the object owns
/// (allocated with array new, released by the object). zkDirIterator walks the
/// entries of one directory whose names match a wildcard pattern. The free
/// functions make and remove directory entries and read and write files
/// through integer handles, which are POSIX descriptors opened with
/// O_CLOEXEC. Nothing here prints or throws, apart from std::bad_alloc when
/// array new fails.
///
/// Paths are split at '/' only. One object is used by one thread at a time;
/// the free functions share nothing.
#ifndef ZK_FILENAME_H
#define ZK_FILENAME_H

#include "zkExport.h"

/// A path and its parts.
///
/// /opt/app/bin is split into the directory /opt/app/ (the directory part
/// keeps its trailing separator) and the name bin; a.txt has the name a and
/// the extension txt. The extension is the text after the last dot of the
/// final component when that dot is neither its first nor its last character,
/// so .profile, "." and ".." are names without an extension and a.tar.gz has
/// the name a.tar and the extension gz. A path that ends in a separator has an
/// empty name. The protocol is the lower-cased scheme in front of "://"
/// (ftp://host/x gives "ftp"), or "file" when there is none; it stays part of
/// the directory.
///
/// The four part members may be changed directly, with Dup, as long as Rebuild
/// follows; a member holding null reads as "".
class ZK_API zkFilename {
public:
    /// Splits path into its parts; a null or empty path leaves every part empty.
    zkFilename(const char* path = nullptr);
    /// A deep copy of other.
    zkFilename(const zkFilename& other);
    /// Becomes a deep copy of other; self-assignment changes nothing.
    zkFilename& operator=(const zkFilename& other);
    /// Releases the path and the parts.
    virtual ~zkFilename();

    /// Whether both full paths are the same, byte for byte.
    bool operator==(const zkFilename& other) const;
    bool operator!=(const zkFilename& other) const { return !(*this == other); }

    /// Replaces *target (null or a buffer from array new) with a copy of the
    /// first length bytes of text, of the whole text when length is negative,
    /// or with null when text is null; returns the new *target.
    static char* Dup(char** target, const char* text, int length);

    /// Makes the path from the parts after a part member was changed: text up
    /// to a separator in the name moves to the directory, a name with a dot is
    /// split when the extension is empty, a leading dot of the extension is
    /// dropped, a non-empty directory gets a trailing separator, and empty
    /// parts become null. Afterwards splitting the path gives the parts back,
    /// except for an empty name with an extension (".txt" reads back as a
    /// name). To change both name and extension, change both, then rebuild
    /// once. The five arguments are reserved; pass 0.
    virtual void Rebuild(int, int, int, int, int);

    /// The full path; never null.
    virtual const char* GetFullPath() const;
    /// "file", or the lower-cased scheme of a path such as ftp://host/x.
    virtual const char* GetProtocol() const;
    /// The directory part with its trailing separator, or "".
    virtual const char* GetDirectory() const;
    /// The name without its extension, or "".
    virtual const char* GetName() const;
    /// The extension without its dot, or "".
    virtual const char* GetExtension() const;
    /// Replace one part (null empties it) and remake the path as Rebuild does.
    virtual void SetDirectory(const char* dir);
    virtual void SetName(const char* name);
    virtual void SetExtension(const char* ext);
    /// The results of GetType.
    enum EntryType : int { NoEntry = 0, DirectoryEntry = 1, RegularFileEntry = 2, OtherEntry = 3 };
    /// DirectoryEntry (1) for a directory, RegularFileEntry (2) for a regular
    /// file, OtherEntry (3) for another existing entry, NoEntry (0) when the
    /// path cannot be examined; symbolic links are followed.
    virtual int GetType() const;
    /// Nonzero when the path names an existing entry: with noFollow 0 a
    /// symbolic link counts only when its target exists, with any other value
    /// the link itself is enough.
    virtual int FileExists(int noFollow) const;

    /// 1 when path names a directory (following symbolic links), 0 otherwise
    /// or for a null path.
    static int IsDirectory(const char* path);

    char* m_path;   ///< the full path
    char* m_dir;    ///< the directory part, ending with a separator
    char* m_fname;  ///< the name without its extension
    char* m_ext;    ///< the extension without its dot

private:
    void split(const char* path);
    void updateProtocol();
    void release();

    char* m_protocol;  ///< derived from m_path whenever it changes
};

/// The entries of one directory whose names match a pattern.
///
/// zkDirIterator("/d/*.txt") reads the directory /d/ once and stands on the
/// first entry whose name matches *.txt as fnmatch matches it (no flags: '*'
/// and '?' also match a leading dot, so "." and ".." come along with "*").
/// The entries come in byte order of their names; the wildcards work only in
/// the name part. An empty name part matches every entry, a path without a
/// separator names an entry of the current directory, and a directory that
/// cannot be read gives no entries. The iterator owns a copy of the matching
/// names, so copies are independent and later changes to the directory are
/// not seen.
class ZK_API zkDirIterator {
public:
    /// The end: stands on no entry.
    zkDirIterator();
    /// Reads the directory part of pattern and stands on the first match, or
    /// at the end when there is none (also for a null pattern).
    explicit zkDirIterator(const char* pattern);
    /// A copy standing on the same entry.
    zkDirIterator(const zkDirIterator& other);
    zkDirIterator& operator=(const zkDirIterator& other);
    ~zkDirIterator();

    /// True when both are at the end, or both stand on entries of the same name.
    bool operator==(const zkDirIterator& other) const;
    bool operator!=(const zkDirIterator& other) const { return !(*this == other); }
    /// Moves to the next match; at the end it stays there.
    zkDirIterator& operator++();
    /// The current entry's name, or null at the end.
    const char* GetName() const { return m_name; }

    char* m_names;  ///< the matching names, each zero-terminated, back to back
    char* m_end;    ///< one past the last byte of m_names
    char* m_name;   ///< the current entry's name inside m_names, null at the end
};

/// Makes the directory path and every missing directory above it, with the
/// permission bits *(const unsigned*)attributes, or 0777 when attributes is
/// null (the umask applies). Nonzero when path is a directory afterwards,
/// also when it already was one; 0 otherwise.
ZK_API int zkCreateDir(const char* path, void* attributes);

/// Removes path: with flag 0 only a file (or symbolic link, not followed),
/// with any other flag also an empty directory. Nonzero when removed, 0
/// otherwise (for a missing path too).
ZK_API int zkUnlink(const char* path, unsigned flag);

/// Opens path with open(2) and returns the descriptor as a handle, or -1.
/// The open flags are flags | creation | O_CLOEXEC, e.g. O_CREAT | O_WRONLY
/// with O_TRUNC or O_EXCL; mode gives the permission bits of a created file.
/// access (0444 to read, 0222 to write), share and reserved describe the
/// caller's intent and do not change the open.
ZK_API int CreateFile(const char* path, unsigned flags, unsigned access, unsigned share, unsigned creation,
                      unsigned mode, void* reserved);

/// Reads up to count bytes at the handle's position with one read (repeated
/// only when interrupted by a signal); *done (when not null) gets the number
/// read, 0 at the end of the file. Nonzero on success; reserved must be 0.
ZK_API int ReadFile(int handle, void* buffer, unsigned count, unsigned* done, void* reserved);

/// Writes all count bytes, repeating after short or interrupted writes;
/// *done (when not null) gets the number written. Nonzero when every byte was
/// written, 0 on an error (then *done tells how far it got); reserved must be 0.
ZK_API int WriteFile(int handle, const void* buffer, unsigned count, unsigned* done, void* reserved);

/// The low 32 bits of the file's size; the high 32 bits go to *high when it is
/// not null. On failure both are 0xFFFFFFFF.
ZK_API unsigned GetFileSize(int handle, unsigned* high);

/// Closes the handle; nonzero when it was open.
ZK_API int CloseHandle(int handle);

/// Compares two zero-terminated strings without regard to letter case (the
/// current locale's tolower): 0 when equal, else negative or positive as a
/// sorts before or after b.
ZK_API int _stricmp(const char* a, const char* b);

#endif

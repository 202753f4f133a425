/// zkFileManager: static file and path operations.
///
/// The class is never instantiated. Paths are zkStringBase or plain
/// zero-terminated text; a character counts as a separator when it is '/' or
/// '\\', and m_slash is the separator that the operations insert.
///
/// Every operation works on its arguments alone; m_slash is the one value
/// shared by all threads, so change it only while no other thread uses the
/// class. Nothing here prints or throws, except std::bad_alloc from a string
/// that cannot grow; a list node that cannot be allocated ends the process
/// with "out of memory", as all the library's containers do.
#ifndef ZK_FILE_MANAGER_H
#define ZK_FILE_MANAGER_H

#include <list>

#include "zkExport.h"
#include "zkFileInfo.h"
#include "zkFilename.h"
#include "zkStringBase.h"

class ZK_API zkFileManager {
public:
    zkFileManager() = delete;

    /// The separator inserted by MakePath, TranslatePathSeparators and
    /// GetModuleDirectory; '/' at start.
    static char m_slash;

    /// result becomes dir joined with name, without a trailing separator when
    /// noTrailing is nonzero and with one when it is 0; an empty dir stands for
    /// the root. A leading separator of name is not doubled, leading "./"
    /// steps are dropped, a name starting with any other dot (.profile) is
    /// kept whole, and each leading "../" step removes the last component of
    /// dir, stopping at the root; the root is "/" in both forms. Backslashes
    /// become m_slash at the end.
    static void MakePath(zkStringBase& result, const zkStringBase& dir, const zkStringBase& name, unsigned noTrailing);
    /// result becomes the directory path MakePath(result, dir, subdir, 0)
    /// followed by file (without its leading separator, otherwise unchanged).
    static void MakePath(zkStringBase& result, const zkStringBase& dir, const zkStringBase& subdir,
                         const zkStringBase& file);
    /// Replaces every backslash of path with m_slash (useSlash nonzero) or '/'
    /// (useSlash 0); other characters stay.
    static void TranslatePathSeparators(zkStringBase& path, unsigned useSlash);

    /// Fills info as SetFrom does and returns 0; returns 1 and leaves info
    /// alone for a null or empty name or a file that cannot be examined.
    static int GetFileInfo(const char* name, zkFileInfo& info);

    /// Copies source to destination and returns 0, or nonzero when something
    /// was refused or failed. A '*' or '?' anywhere in source's path makes a
    /// directory copy of the matching entries of its directory; otherwise one
    /// file is copied.
    ///
    /// One file: a missing source, or one that is neither a directory nor a
    /// regular file, gives 1. A directory source copies its own entries, as
    /// with the pattern dir/*, whether or not its path ends in '/'. With
    /// makeDir exactly 1, destination's directory part (if any) is made
    /// first. An "ftp" or "http" source gives 1. With symLink nonzero a
    /// symbolic link to source's path is made at destination's path instead:
    /// 0 when made, 1 when not. A '*' or '?' in destination's name part is replaced by
    /// source's name part (*.bak with a.txt gives a.bak), and an empty name
    /// part takes source's name and extension (dir/ gives dir/a.txt). A
    /// destination that names source itself, by the same path ignoring case
    /// or as the same file through links or "." and "..", gives 1 and changes
    /// nothing. An existing destination is left alone with result 1 when
    /// overwrite is 0. When it is nonzero, an existing regular file is
    /// replaced only once the copy is whole (written beside it, flushed and
    /// renamed over it, or, where its directory admits no new file, rewritten
    /// in place with the old bytes put back on failure): it keeps its mode,
    /// set-id bits included, and where the process may its owner; through a
    /// symbolic link the link's final target is replaced and the link stays;
    /// a device is written through. A created file gets mode 0664 less the
    /// umask and less any permission its source lacks. A copy that cannot
    /// finish (a read or write error, a source that ends early, an error on
    /// closing) leaves an overwritten destination as it was, removes a
    /// created one, keeps source and gives 1, with errno telling why. With
    /// deleteSource nonzero a completed copy is flushed to disk and then
    /// source is removed; 1 when that fails.
    ///
    /// Directory copy: destination is made as a directory (with any missing
    /// parents) and each matching entry except "." and ".." is copied into
    /// it under its own name with the same options; destination need not end
    /// in '/'. Subdirectories are skipped when recursive is 0 and copied
    /// whole when it is nonzero; a symbolic link to a directory is then made
    /// again as a link with the same target, never followed, and the
    /// destination directory is skipped when it lies inside the copied tree.
    /// In symLink mode a link to the whole source directory is tried first
    /// (Linux refuses its path, which ends in '/', so the entries are linked
    /// one by one). The result is 0 when every entry was copied, else the
    /// number of entries in the whole tree that failed; 1 when destination
    /// cannot be made a directory. A move leaves the source directories in
    /// place.
    ///
    /// source and destination may be changed: a directory source becomes its
    /// pattern dir/*, a destination gets its completed name. reserved1 and
    /// reserved2 have no effect.
    static int CopyFile(zkFilename& source, zkFilename& destination, unsigned recursive, unsigned makeDir,
                        unsigned overwrite, unsigned symLink, unsigned deleteSource, const char* reserved1,
                        const char* reserved2);
    /// The first form with zkFilename copies of both paths; the strings stay
    /// as they are.
    static int CopyFile(zkStringBase& source, zkStringBase& destination, unsigned recursive, unsigned makeDir,
                        unsigned overwrite, unsigned symLink, unsigned deleteSource, const char* reserved1,
                        const char* reserved2);

    /// Appends to files a record for each entry of dir, in readdir order,
    /// that is not a directory (symbolic links followed) and whose extension
    /// equals pattern's extension byte for byte: only the text after the last
    /// dot of pattern counts, so *.txt lists a.txt but not a.TXT, and a
    /// pattern without an extension lists the files without one. A record
    /// holds the entry's name and extension and its stat values; for a
    /// symbolic link whose target is missing, the values of the link itself.
    /// With fullPaths nonzero the record's directory part is dir (with a
    /// trailing '/' added). Returns 1, list untouched, when dir does not
    /// exist; 0 otherwise, also when it cannot be read.
    static int GetFileList(const char* dir, const char* pattern, std::list<zkFileInfo>& files, unsigned fullPaths);
    /// Appends to folders each subdirectory of root/relative (an empty root
    /// is "/"), "." and ".." left out, in readdir order. Names are
    /// relative/name/ (/name/ for an empty relative), or root/relative/name
    /// with fullPaths nonzero, joined by MakePath. With recursive nonzero each
    /// folder is followed by the folders below it, depth first; a symbolic
    /// link to a folder is listed but not entered. Returns 1, list untouched,
    /// when the directory does not exist; 0 otherwise, even when it or a
    /// folder below cannot be read (nothing more is listed from there).
    static int GetFolderList(const char* root, const char* relative, std::list<zkStringBase>& folders,
                             unsigned recursive, unsigned fullPaths);

    /// zkCreateDir(path, attributes): nonzero when path is a directory
    /// afterwards, missing parents made, also when it already existed.
    static int CreateDirectory(const char* path, void* attributes);
    /// zkUnlink of the path (flag 0: files only, else also an empty
    /// directory): nonzero when removed.
    static int DeleteFile(zkStringBase& path, unsigned flag);
    static int DeleteFile(zkFilename& file, unsigned flag);

    /// path becomes the current working directory, of any length, or empty
    /// when it cannot be determined.
    static void GetCurrentDirectory(zkStringBase& path);
    /// path becomes the directory part of the current working directory,
    /// ending with m_slash (/opt/app/bin gives /opt/app/), or empty when the
    /// current directory cannot be determined. The module's own location is
    /// not consulted.
    static void GetModuleDirectory(zkStringBase& path);
    /// The bytes available to unprivileged users on the file system holding
    /// path, or 0 when it cannot be examined.
    static long long GetFreeDiskSpace(const char* path);
};

#endif

/// zkINIEditor: edits an INI file line by line, keeping every byte it does
/// not change.
///
/// The editor holds the file's lines exactly as they are: line ends (LF,
/// CR LF or CR), a byte-order mark, blank lines, comments, spacing and lines
/// it cannot parse. Sections and keys are found by the same reading rules as
/// zkMappedINIFile (see zkMappedINIFile.h): the first section and the first
/// key whose names match without regard to case win. Lines before the first
/// section header form a section with the empty name, addressed like any
/// other; it exists while a key or comment line is among them, and the empty
/// name finds it before any header of the empty name ("[]").
///
/// A change touches only the lines it must: a set of an existing key
/// replaces its value and keeps its key text, spacing around "=" and line
/// end; a new key is one line after the last key or comment line of the
/// section, or else its header, with that line's line end; a new section
/// goes at the end after one blank line, in the line end of the file's first
/// line; a delete removes the key's line, or a section's header and lines.
/// Text that would not read back unchanged is refused and nothing changes.
///
/// Save replaces the file through the library's safe replace path: the old
/// file stays whole on failure, its mode, owner and symbolic links are kept.
/// With Open's lock, the editor holds an exclusive lock on the file from
/// Open until Close, so editors in other processes and threads serialise;
/// the lock dies with its holder and leaves no file behind.
///
/// Results: 0 done; 1 the section or key did not exist (SetVal then added
/// it, the others changed nothing); 2 refused (nothing changed); -1 a file
/// error, errno telling why.
///
/// One object is used by one thread at a time.
#ifndef ZK_INI_EDITOR_H
#define ZK_INI_EDITOR_H

#include <list>
#include <utility>
#include <vector>

#include "zkExport.h"
#include "zkStringBase.h"

class ZK_API zkINIEditor {
public:
    /// The results of the operations below.
    enum Result : int { Done = 0, Missing = 1, Refused = 2, FileError = -1 };

    /// How long Open waits for another holder's lock by default.
    static constexpr unsigned kDefaultLockWaitMs = 10000;

    /// An empty editor on no file.
    zkINIEditor();
    /// An empty editor on the named file; nothing is read.
    explicit zkINIEditor(const char* filename);
    /// Releases the lock, if held; writes nothing.
    ~zkINIEditor();

    zkINIEditor(const zkINIEditor&) = delete;
    zkINIEditor& operator=(const zkINIEditor&) = delete;

    /// Sets the file that Open and Save use; reads nothing.
    void SetFilename(const char* filename);

    /// Reads the file, replacing what the editor held (after a failure it
    /// holds nothing). create: a missing file reads as empty. lock: first
    /// takes an exclusive lock on the file, the final target of its links
    /// (made empty when missing and create is set), waiting at most
    /// lockWaitMs. Done, or FileError with errno (EWOULDBLOCK: the lock could
    /// not be had in time).
    int Open(bool create, bool lock, unsigned lockWaitMs = kDefaultLockWaitMs);
    /// Takes a copy of length bytes of text as the file's contents; the file
    /// name and the lock stay as they are.
    void Load(const char* text, unsigned long length);
    /// Writes the lines to the file through the safe replace path: Done, or
    /// FileError with errno (the file as it was). A missing file is made with
    /// mode 0666 less the umask. The lock, if held, stays held on the file
    /// now at the path.
    int Save();
    /// Releases the lock, if held, and empties the editor; writes nothing.
    void Close();

    /// The whole text as it would be saved.
    void GetText(zkStringBase& text) const;

    /// Whether a section of that name exists.
    bool HasSection(const zkStringBase& section) const;
    /// Done with the value assigned, or Missing with value left alone.
    int GetVal(const zkStringBase& section, const zkStringBase& key, zkStringBase& value) const;
    /// Appends the names of the sections in file order, the empty name first
    /// when the lines before the first header exist as a section.
    void GetSectionNames(std::list<zkStringBase>& names) const;
    /// Appends the section's key-value pairs in file order: Done or Missing.
    int GetKeyValues(const zkStringBase& section, std::list<std::pair<zkStringBase, zkStringBase> >& pairs) const;

    /// Sets the key: Done when it existed, Missing when it (or its section)
    /// was added; Refused for text that would not read back unchanged. A key
    /// of the empty name with no lines before the first header to hold it
    /// becomes the file's first line.
    int SetVal(const zkStringBase& section, const zkStringBase& key, const zkStringBase& value);
    /// Removes the key's line: Done, or Missing when there is none.
    int RemoveKey(const zkStringBase& section, const zkStringBase& key);
    /// Removes the section's header and lines up to the next header (for the
    /// empty name, every line before the first header): Done, or Missing.
    int RemoveSection(const zkStringBase& section);
    /// Sets every key of other in this file, section by section: Done, or
    /// Refused (nothing changed) when one of them would be refused.
    int MergeFrom(const zkINIEditor& other);

    /// Whether SetVal takes the text. Refused: a section name holding "]"
    /// or a line end; a key that is empty, holds "=" or a line end, or
    /// starts with "[", ";" or "#"; a value holding a line end; any of them
    /// with whitespace at either end.
    static bool IsValidSection(const zkStringBase& section);
    static bool IsValidKey(const zkStringBase& key);
    static bool IsValidValue(const zkStringBase& value);

private:
    // The held lines, the file name and the lock.
    struct Impl;
    Impl* m_impl;
};

#endif

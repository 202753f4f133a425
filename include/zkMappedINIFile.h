/// zkMappedINIFile: an INI configuration file held in memory.
///
/// A document is an ordered list of sections (INISection), each holding an
/// ordered list of lines (INILine): key lines and comment lines, in file
/// order. Open reads a file and appends its sections; the operations below
/// read, set, add and remove values by section name and key, both matched
/// without regard to case, the first match in list order winning; Close and
/// CloseFW write the document back and empty it.
///
/// Reading. Lines end at CR, LF or CR LF. Leading blanks are dropped and
/// trailing whitespace cut; a line left with at most one character is
/// ignored. A line starting with "[" opens a section: its name is the text
/// between "[" and the closing "]" at the end of the line, or, when the line
/// does not end with "]", up to its first "]" (to the end of the line when it
/// has none); "[net] ; note" names the section net. A line starting with ";"
/// or "#" is a comment, stored whole. Any other line is a key line split at
/// its first "=": key and value are trimmed, and a line without "=" is a key
/// with an empty value. Blank lines and lines before the first section are
/// not stored. A UTF-8 byte-order mark at the start of the file is skipped.
///
/// Writing. Each section as "[name]", then its lines as "key=value" or as the
/// comment text, then one empty line; every line ends with LF. A line that
/// would be one character long (a lone comment character, or "=" for an empty
/// key and value) gets a blank after it, since loading ignores such a line;
/// the firewall form's bare keys are written as they are. The file is
/// replaced as a whole: the text goes to a new file in the same directory,
/// which is flushed to disk and renamed over the old one, so a failed save
/// leaves the old file as it was. The new file keeps the old one's permission
/// bits and, where the process may, its owner; through a symbolic link the
/// link's target is replaced. Where the directory admits no new file, a
/// writable file is rewritten in place, its old bytes read first and put
/// back if a write fails; a device or other file that is not a regular file
/// is written through.
///
/// The document owns its sections, each section its line list and lines;
/// pointers and references handed out stay valid until that entry is
/// removed or the document is cleared or destroyed. A document cannot be
/// copied. Stored strings are copies sized to their text.
///
/// One object is used by one thread at a time.
#ifndef ZK_MAPPED_INI_FILE_H
#define ZK_MAPPED_INI_FILE_H

#include <list>

#include "zkExport.h"
#include "zkStringBase.h"

/// One stored line of a section: a key line or a comment line.
class ZK_API INILine {
public:
    /// Answers whether a line's key equals the held key without regard to
    /// case; comment lines are not skipped (their key is empty).
    class ZK_API KeyCompare {
    public:
        /// Holds a copy of key.
        explicit KeyCompare(const zkStringBase& key);
        /// Whether line's m_key has the held key's length and equals it
        /// byte by byte after upper-casing.
        bool operator()(const INILine* line) const;

    private:
        zkStringBase m_key;
    };

    /// An empty key line.
    INILine();

    /// The trimmed key of a key line; empty for a comment line.
    zkStringBase m_key;
    /// The trimmed value of a key line, or a comment's whole text beginning
    /// with its comment character.
    zkStringBase m_value;
    /// 1 for a comment line, 0 for a key line.
    int m_isComment;
};

/// One section: a name and its property list.
class ZK_API INISection {
public:
    /// An empty name and an empty property list.
    INISection();
    /// A copy of name (with its compare type) and an empty property list.
    explicit INISection(const zkStringBase& name);
    /// Deletes every line and the property list.
    ~INISection();

    INISection(const INISection&) = delete;
    INISection& operator=(const INISection&) = delete;

    /// The name without brackets, trimmed.
    zkStringBase m_name;
    /// The lines in file order; never null.
    std::list<INILine*>* m_lines;
};

class ZK_API zkMappedINIFile {
public:
    /// An empty document with an empty file name.
    zkMappedINIFile();
    /// An empty document on the named file; nothing is read.
    explicit zkMappedINIFile(const char* filename);
    /// Frees the document without writing it.
    virtual ~zkMappedINIFile();

    zkMappedINIFile(const zkMappedINIFile&) = delete;
    zkMappedINIFile& operator=(const zkMappedINIFile&) = delete;

    /// Frees every section and line; the file name stays.
    void Clear();
    /// Sets the file name that Open, Close and CloseFW use; reads nothing.
    void SetFilename(const char* filename);

    /// Reads the file and appends its sections after those already held.
    /// create 0: the file must exist and be writable; nonzero: it is opened
    /// read-only and created empty when missing. Returns 0 when loaded, 1 when
    /// the file cannot be opened or read (the document is then unchanged;
    /// errno tells why).
    virtual int Open(unsigned int create);
    /// save 0: empties the document and returns 0, the file untouched.
    /// Nonzero: replaces the file with the document's text and then empties
    /// the document, returning 0; returns 1 and keeps the document when it
    /// could not be saved (the file untouched), or when a name, key or value
    /// holds a CR or LF, which would read back as lines of their own; errno
    /// then tells why (EINVAL for a line break).
    virtual int Close(unsigned int save);
    /// As Close, but in the section named exactly "IPsBehindFirewall" each
    /// key line is written as the key directly followed by the value (a
    /// comment line of one character is padded as Close pads it).
    virtual int CloseFW(unsigned int save);

    /// The document's own section list, in document order.
    std::list<INISection*>* GetSectionList();
    /// Appends a copy of every section's name to names, in document order.
    void GetSectionNameList(std::list<zkStringBase>& names);
    /// The property list of the first section whose name matches, or null.
    /// Requires: name is not null.
    std::list<INILine*>* GetPropertyList(const char* name);
    /// The first line of lines whose key matches, or lines->end().
    /// Requires: lines is not null.
    std::list<INILine*>::iterator FindKey(std::list<INILine*>* lines, const zkStringBase& key);

    /// The value of the first matching key in the first matching section, or
    /// zkStringBase::NullStr when either is missing.
    const zkStringBase& GetVal(const zkStringBase& section, const zkStringBase& key);
    /// The same lookup: 0 with the value assigned to value, or 1 with value
    /// left alone.
    int GetVal(const zkStringBase& section, const zkStringBase& key, zkStringBase& value);
    /// The value of the first matching key of lines, or zkStringBase::NullStr
    /// when lines is null or no key matches.
    const zkStringBase& GetVal(std::list<INILine*>* lines, const zkStringBase& key);

    /// In every section whose name matches: sets the first matching line's
    /// value in place, or appends a new key line. Without such a section,
    /// appends a new section holding the one key line.
    void SetVal(const zkStringBase& section, const zkStringBase& key, const zkStringBase& value);
    /// SetVal with the decimal text of value.
    void SetVal(const zkStringBase& section, const zkStringBase& key, long value);
    /// Removes the first matching line of the first matching section, if any.
    void RemoveKey(const zkStringBase& section, const zkStringBase& key);

    /// Appends a new section of that name, even when one exists, and maps
    /// lines (may be null) into it.
    void AddMapSection(const zkStringBase& name, std::list<INILine*>* lines);
    /// Maps lines into the first section whose name matches; nothing without one.
    void UpdateMapSection(const zkStringBase& name, std::list<INILine*>* lines);
    /// For each source line with a non-empty key: sets the value of the first
    /// target key line (comments skipped) of that key, or appends a copy of
    /// the line. The source is not changed; a null list does nothing.
    void DoUpdateMapSection(std::list<INILine*>* target, std::list<INILine*>* source);
    /// Maps every section of other into this document (other's values win,
    /// its missing sections are appended, its comments are not taken);
    /// other is not changed. Returns 0.
    int MergeFrom(zkMappedINIFile& other);

private:
    /// Writes the document to the file: 0 saved, 1 not saved.
    int Save(bool firewall);
    /// Whether a name, key or value holds a CR or LF.
    bool HasLineBreaks() const;

    std::list<INISection*> m_sections;
    zkStringBase m_filename;
};

#endif

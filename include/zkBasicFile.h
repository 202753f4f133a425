/// zkBasicFile: one file over a POSIX file descriptor.
///
/// The object remembers a file name (held inline, at most 4095 bytes), three
/// words of open flags that Open joins with a bitwise OR, and the permission
/// mode 0666 for a file that the open creates (the umask applies). It opens
/// the file on request and then reads, writes, positions and measures it with
/// the plain POSIX calls, without buffering of its own. Every descriptor it
/// opens carries O_CLOEXEC.
///
/// The object owns its descriptor and closes it when destroyed; it cannot be
/// copied. It uses no heap memory. Status results are 0 for success and 1 for
/// failure; positions and sizes are 64-bit on every build, and a position or
/// size with all bits set means failure. errno is left as the failing call set
/// it. Nothing is thrown.
///
/// One object is used by one thread at a time.
#ifndef ZK_BASIC_FILE_H
#define ZK_BASIC_FILE_H

#include "zkExport.h"

class zkStringBase;

class ZK_API zkBasicFile {
public:
    /// The origin of a seek, passed to lseek as its whence.
    enum SeekMode : int { SeekBegin = 0, SeekCurrent = 1, SeekEnd = 2 };

    /// Room for a name and its terminator: names of this many bytes or more
    /// are refused.
    static constexpr unsigned kNameSize = 4096;

    /// The result of a position or size operation that failed.
    static constexpr unsigned long long kBadPosition = ~0ull;

    /// No name, closed, flags O_CREAT, O_RDWR and 0, mode 0666.
    zkBasicFile();
    /// Sets the name as SetFilename does and the three flag words in this
    /// order; opens nothing.
    zkBasicFile(const char* filename, unsigned long creation, unsigned long access, unsigned long extraFlags);
    /// Closes the file if it is open.
    ~zkBasicFile();

    zkBasicFile(const zkBasicFile&) = delete;
    zkBasicFile& operator=(const zkBasicFile&) = delete;

    /// Copies the name (null: the empty name) for the next Open; a name of
    /// kNameSize bytes or more is refused, and the next Open then fails.
    void SetFilename(const char* filename);

    /// Opens the named file with the three flag words, O_CLOEXEC and mode
    /// 0666: 0 opened; 1 already open (the first descriptor stays), name
    /// refused (errno ENAMETOOLONG) or open failed.
    int Open();
    /// Closes the file: 1 when nothing was open, else what close returned
    /// (0, or -1); the object is closed afterwards in either case.
    int Close();

    /// One read of at most `length` bytes into buffer: 0 with the count of
    /// bytes read (0 at the end of the file); 1 when not open (count left
    /// alone) or when read failed (count 0). A null count is not delivered.
    int Read(char* buffer, unsigned long length, unsigned long* count);
    /// One write of `length` bytes (0: strlen(buffer)): 0 with the count
    /// written, which may be short; 1 when not open (count left alone) or when
    /// write failed (count all ones). A null count is not delivered.
    int Write(const char* buffer, unsigned long length, unsigned long* count);
    /// Writes the string's characters as the first Write does.
    int Write(const zkStringBase& text, unsigned long* count);
    /// Appends everything from the current position to the end of the file to
    /// text, retrying interrupted reads: 0 done; 1 when not open, when a read
    /// failed (what was read stays appended) or when the rest of the file
    /// would not fit in a string (nothing is appended).
    int ReadAll(zkStringBase& text);
    /// Flushes the file's data to the storage device: 0 done; 1 not open or
    /// fsync failed.
    int Sync();

    /// Moves the position by `offset` (taken as signed) from the origin:
    /// the new position from the start, or kBadPosition.
    unsigned long long SetFilePointer(unsigned long long offset, SeekMode mode);
    /// The current position, or kBadPosition.
    unsigned long long GetCurrentFilePointer();
    /// The size of the open file, or kBadPosition.
    unsigned long long GetSize();

private:
    unsigned m_creation;
    unsigned m_access;
    unsigned m_extraFlags;
    unsigned m_mode;
    char m_filename[kNameSize];
    int m_fd;
    bool m_nameRefused;
};

#endif

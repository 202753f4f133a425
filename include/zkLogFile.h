/// zkLogFile: a text log that appends one line per message to a named file.
///
/// A line is, in this order: the entry number and ") " when OptionEntryNumber
/// is on; the local time "HH:MM:SS", a blank, the date "MM/DD/YY" and two
/// blanks when OptionTimeStamp is on (the default); the message; a line feed.
/// So the twelfth entry at 09:05:03 on 7 March 2001 reads
/// "12) 09:05:03 03/07/01  Disk full\n". A message is written when its level
/// is at most the log's level (1 at start).
///
/// The object owns its file name and work strings and keeps no file open:
/// each entry opens the file for appending, writes the whole line and its
/// line feed in one write, and closes it. Entries made at the same time by
/// other objects, threads or processes on the same file therefore never
/// overwrite or split one another. Failures lose the entry silently; nothing
/// is thrown. One object is used by one thread at a time; give each thread its
/// own object, or lock around each call.
#ifndef ZK_LOG_FILE_H
#define ZK_LOG_FILE_H

#include "zkExport.h"
#include "zkStringBase.h"

class ZK_API zkLogFile {
public:
    /// The index of an option word.
    enum LogOption : unsigned {
        OptionReserved = 0,     ///< no meaning here; kept for the caller
        OptionTimeStamp = 1,    ///< nonzero: each line carries the time and date
        OptionEntryNumber = 2,  ///< nonzero: each line starts with its entry number
    };

    /// Message levels; only their order matters, and any int may be used.
    enum LogLevel : int {
        LevelError = 0,
        LevelNormal = 1,
        LevelDetail = 2,
        LevelDebug = 3,
    };

    /// No file name, level LevelNormal, entry counter 0, no echo, default options.
    zkLogFile();
    /// The same with a copy of filename; a nonzero clear deletes the file.
    zkLogFile(const zkStringBase& filename, unsigned clear);
    /// Releases the strings; the file is not touched.
    virtual ~zkLogFile();

    /// Options back to their defaults: OptionReserved 0, OptionTimeStamp 1,
    /// OptionEntryNumber 0. Level, counter and echo stay.
    void SetDefaults();
    /// Takes a new file name (null keeps the old one) and sets OptionReserved
    /// to 0; a nonzero clear then deletes the file. The counter goes on.
    void SetFilename(const char* filename, unsigned clear);
    /// The file name's text.
    const char* GetFilename() const;

    /// Writes one entry of message (null: an empty message) when level is at
    /// most the log's level; a dropped message takes no entry number.
    void Log(const char* message, LogLevel level);
    void Log(const zkStringBase& message, LogLevel level);
    /// Writes text (null: empty), a blank and value as one message.
    void Log(const char* text, const char* value, LogLevel level);
    /// Writes text (null: empty), a blank and value in decimal as one message.
    void Log(const char* text, long value, LogLevel level);

    /// Appends line and a line feed to the file in one write, and echoes the
    /// line to standard output when UseDisplay asked for it.
    void DoLog(const zkStringBase& line);
    /// Deletes the log file; a missing file is no error.
    void Clear();
    /// The next entry written, and only that one, also goes to standard
    /// output, verbatim.
    void UseDisplay();

    LogLevel GetLevel() const { return m_level; }
    void SetLevel(LogLevel level) { m_level = level; }
    /// Reads or sets one option word. Requires: option is one of the three.
    unsigned GetOption(LogOption option) const;
    void SetOption(LogOption option, unsigned value);

    /// time becomes the local time "HH:MM:SS" and date "MM/DD/YY" (the year's
    /// last two digits when it has four, else the whole year); both become
    /// empty when the clock cannot be read.
    void GetCurrTimeAndDate(zkStringBase& time, zkStringBase& date);
    /// out becomes n in decimal, led by zeros to two digits, or to three when
    /// threeDigits is nonzero; a negative n gets them in front of its sign.
    void MakeTDNum(zkStringBase& out, long n, unsigned threeDigits);
    /// Adds 1 to the entry counter; out becomes the new number and ") ".
    void GetEntryStamp(zkStringBase& out);

private:
    static constexpr unsigned kOptionCount = 3;

    unsigned m_options[kOptionCount];
    zkStringBase m_filename;
    LogLevel m_level;
    int m_entries;
    unsigned m_display;
    /// Work strings, reused from entry to entry.
    zkStringBase m_line;     ///< the line being built
    zkStringBase m_number;   ///< one padded number of the time or date
    zkStringBase m_message;  ///< the joined text of a two-part message
    zkStringBase m_stamp;    ///< the entry stamp, then the time
    zkStringBase m_date;     ///< the date
    zkStringBase m_record;   ///< the line and its line feed, as written
};

#endif

/// zkCommandLineParser: turns a program's command line into a table of named
/// values.
///
/// The parser reads either one command string or the argc/argv vector a
/// program receives. Each switch of the form switch character, name, separator
/// character, value ("-name:value" by default) becomes one entry: the name is
/// the key and the value its text. In a command string only the space separates
/// items, a value may be quoted with double quotes (no escape), and a word that
/// no switch precedes is dropped. In a vector each element is one switch, taken
/// as it stands. No constructor parses; ParseCommand or SetCommand does.
///
/// The parser owns its table and its copy of the command string. The table only
/// grows: a later parse or SetValue overwrites equal names and keeps all others;
/// nothing removes an entry. The vector is borrowed, never copied, changed or
/// freed, and must stay alive for as long as the parser may parse it.
///
/// Names compare exactly, unless a lookup is made with a CaseInsensitive
/// zkStringBase: such a lookup finds an entry whose name matches without regard
/// to case (any one of them when several do). Names the parser makes, and names
/// given as const char*, are CaseSensitive.
///
/// Every parse ends by calling the virtual Validate, whose result is the result
/// of the parse; a derived class overrides it to insist on switches or check
/// values. The base Validate accepts every parse.
///
/// One object is used by one thread at a time; separate objects share nothing.
#ifndef ZK_COMMAND_LINE_PARSER_H
#define ZK_COMMAND_LINE_PARSER_H

#include "zkExport.h"
#include "zkStringBase.h"

class ZK_API zkCommandLineParser {
public:
    /// The switch and separator characters of the default constructor.
    static constexpr char DefaultSwitchChar = '-';
    static constexpr char DefaultSeparatorChar = ':';

    /// Empty command string, string mode, no vector, "-" and ":", empty table.
    zkCommandLineParser();
    /// Copies the command string and the two characters; string mode, no vector.
    explicit zkCommandLineParser(const zkStringBase& command, char switchChar = DefaultSwitchChar,
                                 char separatorChar = DefaultSeparatorChar);
    /// Borrows argv (argc elements, the program name first); vector mode, empty command string.
    zkCommandLineParser(int argc, char** argv, char switchChar = DefaultSwitchChar,
                        char separatorChar = DefaultSeparatorChar);
    /// Frees the table and the command string; leaves the vector alone.
    virtual ~zkCommandLineParser();

    /// The parser owns its table and borrows a vector: it is not copied.
    zkCommandLineParser(const zkCommandLineParser&) = delete;
    zkCommandLineParser& operator=(const zkCommandLineParser&) = delete;

    /// Parses the vector in vector mode, the command string in string mode, and
    /// returns that parse's result.
    virtual int ParseCommand();
    /// Adds the switches of the command string to the table and returns Validate().
    int ParseCmdLine();
    /// Adds the switches of argv[1] to argv[argc - 1] to the table and returns Validate().
    int ParseArgcArgv();

    /// Copies command, forgets any vector, switches to string mode, clears the
    /// valid flag and returns ParseCommand().
    int SetCommand(const zkStringBase& command);
    /// Empties the command string, borrows the new vector, clears the valid flag
    /// and returns ParseArgcArgv(); the mode stays as it was.
    int SetCommand(int argc, char** argv);

    /// Called at the end of every parse; the base version sets the valid flag and returns 1.
    virtual int Validate();
    /// 1 once Validate has accepted a parse since construction or the last SetCommand, else 0.
    int IsValid() const { return m_valid; }
    /// The command string; empty in vector mode.
    const zkStringBase& GetCommand() const { return m_command; }

    /// The value stored under name, or zkStringBase::NullStr; valid until the
    /// parser is destroyed, and changed in place by later parses and SetValue.
    const zkStringBase& GetValue(const zkStringBase& name) const;
    /// Assigns the value stored under name to value and returns 1; returns 0
    /// and leaves value untouched when there is none.
    int GetValue(const zkStringBase& name, zkStringBase& value) const;
    /// As GetValue(const zkStringBase&), with a CaseSensitive name.
    const zkStringBase& GetValue(const char* name) const;
    /// As GetValue(const zkStringBase&, zkStringBase&), with a CaseSensitive name.
    int GetValue(const char* name, zkStringBase& value) const;
    /// Stores a copy of value under name, adding the entry or replacing its value.
    void SetValue(const char* name, const zkStringBase& value);
    /// Whether an entry with this name exists, whatever its value (an empty one too).
    bool Exists(const zkStringBase& name) const;

protected:
    zkStringBase m_command;
    int m_valid;
    char m_switchChar;
    char m_separatorChar;
    int m_argc;
    char** m_argv;
    int m_useArgv;

private:
    /// The hash map of names to values, defined where it is filled.
    struct Table;

    /// Stores value under name, adding or replacing.
    void store(const zkStringBase& name, const zkStringBase& value);
    /// The stored value under name, or null.
    const zkStringBase* lookUp(const zkStringBase& name) const;

    Table* m_values;
};

#endif

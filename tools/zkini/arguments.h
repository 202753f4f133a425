// zkini's command line, checked word by word.
//
// The values are read by the library's parser ("-name:value", one switch per
// word); Validate, which every parse ends with, checks each word against the
// full spelling of zkini's switches, so nothing is recognised by a prefix or
// a first letter, and then checks the combination: one action, the switches
// it needs, none it does not use, each switch at most once.
#ifndef ZKINI_ARGUMENTS_H
#define ZKINI_ARGUMENTS_H

#include <initializer_list>

#include "zkCommandLineParser.h"
#include "zkStringBase.h"

class Arguments : public zkCommandLineParser {
public:
    // The actions come first; -merge: and -batch: are actions that take a value.
    enum Switch : unsigned {
        Get,
        Set,
        Delete,
        List,
        Normalize,
        Firewall,
        Merge,
        Batch,
        Version,
        Help,
        File,
        Section,
        Key,
        Value,
        Out,
        Log,
        Format,
        Existing,
        Quiet,
        SwitchCount
    };

    // Borrows argv as the library's parser does; nothing is read yet.
    Arguments(int argc, char** argv);

    // 1 when every word and their combination are valid, else 0 with Error() set.
    int Validate() override;

    // The one action given; meaningful after a valid parse.
    Switch GetAction() const { return m_action; }
    // Whether the switch was given.
    bool Has(Switch s) const { return (m_given & (1u << s)) != 0; }
    // The value of a valued switch, or NullStr when it was not given.
    const zkStringBase& ValueOf(Switch s) const;
    // Why the last parse was refused, naming the word.
    const zkStringBase& Error() const { return m_error; }

private:
    // Sets Error() to the parts joined and returns 0.
    int Refuse(std::initializer_list<const char*> parts);
    // Checks one word and records the switch: 1, or 0 refused.
    int CheckWord(const char* word);
    int CheckCombination();
    int CheckValues();

    unsigned m_given = 0;
    Switch m_action = Help;
    zkStringBase m_error;
};

#endif

// zkini's batch of changes: one change per line, its words separated by tabs.
//
//   set<TAB>SECTION<TAB>KEY<TAB>VALUE   (the value is the rest of the line)
//   delete<TAB>SECTION<TAB>KEY
//   delete<TAB>SECTION
//
// Lines end with LF or CR LF; empty lines and lines starting with "#" are
// skipped. An empty SECTION names the lines before the first header.
#ifndef ZKINI_BATCH_H
#define ZKINI_BATCH_H

#include <vector>

#include "zkStringBase.h"

struct BatchChange {
    enum Kind { SetKey, DeleteKey, DeleteSection };
    Kind kind;
    zkStringBase section;
    zkStringBase key;
    zkStringBase value;
    unsigned line;  // counted from 1
};

// Appends the changes of text to changes and returns true; or returns false
// at the first bad line, error saying which and why (changes then partial).
// A set the INI editor would refuse is a bad line.
bool ParseBatch(const zkStringBase& text, std::vector<BatchChange>& changes, zkStringBase& error);

#endif

// The output formats of -get and -list.
//
// lines: the value; the section names; or "key=value" lines, as they are.
// sh: "name='value'" lines that eval assigns safely whatever the bytes (a
// name that is not a shell name is refused); the section names as one line
// of quoted words for "eval set --".
// json: one object: {"key": "value"}; a section's keys; or every section as
// an object of its keys.
// sh and json take each key and section once, at its first appearance, as
// the reading rules find the first match; json refuses text that is not
// UTF-8. The lines before the first header are listed as the section with the
// empty name when they hold keys.
#ifndef ZKINI_FORMATS_H
#define ZKINI_FORMATS_H

#include "zkINIEditor.h"
#include "zkStringBase.h"

enum class Format { Lines, Sh, Json };

// The format named by text ("" for the default, lines).
Format FormatNamed(const zkStringBase& text);

// Each appends the text to out and returns true, or returns false with
// error naming what the format cannot carry.
bool FormatValue(Format format, const zkStringBase& key, const zkStringBase& value, zkStringBase& out,
                 zkStringBase& error);
bool FormatSection(Format format, const zkINIEditor& editor, const zkStringBase& section, zkStringBase& out,
                   zkStringBase& error);
bool FormatSectionNames(Format format, const zkINIEditor& editor, zkStringBase& out, zkStringBase& error);

#endif

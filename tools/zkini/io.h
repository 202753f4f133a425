// zkini's own reads and writes: standard input and output, whole files, and
// a private temporary file for the actions that only write to a path.
// Each function returns 0 or the errno that stopped it.
#ifndef ZKINI_IO_H
#define ZKINI_IO_H

#include "zkStringBase.h"

// The path that stands for standard input or output.
bool IsStdStream(const zkStringBase& path);
// Reads the whole file ("-": standard input) into text.
int ReadPath(const zkStringBase& path, zkStringBase& text);
// Replaces the file's contents with text.
int WritePath(const char* path, const zkStringBase& text);
// Writes all of text to the descriptor.
int WriteAll(int fd, const zkStringBase& text);

// An empty file of its own in $TMPDIR (or /tmp), removed by the destructor.
class TempFile {
public:
    TempFile() = default;
    ~TempFile();
    TempFile(const TempFile&) = delete;
    TempFile& operator=(const TempFile&) = delete;

    // Makes the file: 0 or errno.
    int Create();
    const char* Path() const { return m_path.data(); }

private:
    zkStringBase m_path;
};

#endif

// Helpers for the INI tests: a document as readable text, and loading given bytes.
#ifndef ZK_TESTS_INI_TEST_SUPPORT_H
#define ZK_TESTS_INI_TEST_SUPPORT_H

#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "support/zkStringText.h"
#include "support/zkTempDir.h"
#include "zkMappedINIFile.h"

inline std::string zkTestData(const std::string& name) {
    return zkReadFile(std::string(ZK_TEST_DATA_DIR) + "/" + name);
}

// "[name]" per section, then "k:key|value" per key line and "c:text" per comment.
inline std::string zkDump(zkMappedINIFile& ini) {
    std::string out;
    for (const INISection* section : *ini.GetSectionList()) {
        out += "[" + zkText(section->m_name) + "]\n";
        for (const INILine* line : *section->m_lines)
            out += line->m_isComment ? "c:" + zkText(line->m_value) + "\n"
                                     : "k:" + zkText(line->m_key) + "|" + zkText(line->m_value) + "\n";
    }
    return out;
}

// Writes bytes to the file `name` of dir, names it in ini and opens it.
inline int zkLoad(zkMappedINIFile& ini, const zkTempDir& dir, const std::string& name, const std::string& bytes) {
    if (!zkWriteFile(dir.file(name), bytes)) return -1;
    ini.SetFilename(dir.file(name).c_str());
    return ini.Open(0);
}

// Runs body under a file size limit of limit bytes as a user who may not
// write into dir, so that a save rewrites its file in place (root acts as
// nobody, as permission bits do not stop root); the file must be writable
// by all. False when that could not be arranged.
template <class Body>
bool zkInPlaceWithLimit(const zkTempDir& dir, unsigned long long limit, Body body) {
    const bool root = geteuid() == 0;
    if (chmod(dir.path().c_str(), 0555) != 0) return false;
    bool done = !root || seteuid(65534) == 0;
    done = done && zkWithFileSizeLimit(limit, body);
    if (root && seteuid(0) != 0) return false;
    return chmod(dir.path().c_str(), 0755) == 0 && done;
}

#endif

// Helpers for the INI tests: data files, a document as readable text, and
// loading given bytes.
#ifndef ZK_TESTS_INI_TEST_SUPPORT_H
#define ZK_TESTS_INI_TEST_SUPPORT_H

#include <sys/stat.h>

#include <string>

#include "support/zkStringText.h"
#include "support/zkTableFile.h"
#include "support/zkTempDir.h"
#include "zkMappedINIFile.h"

// The bytes of the file `name` of tests/data or, where there is none, name
// itself.
inline std::string zkTestText(const std::string& name) {
    const std::string path = std::string(ZK_TEST_DATA_DIR) + "/" + name;
    struct stat st;
    return stat(path.c_str(), &st) == 0 && S_ISREG(st.st_mode) ? zkReadFile(path) : name;
}

// "[name]" per section, then "c:text" per comment line (m_isComment 1) and
// "k:key|value" per other line.
inline std::string zkDump(zkMappedINIFile& ini) {
    std::string out;
    for (const INISection* section : *ini.GetSectionList()) {
        out += "[" + zkText(section->m_name) + "]\n";
        for (const INILine* line : *section->m_lines)
            out += line->m_isComment == 1 ? "c:" + zkText(line->m_value) + "\n"
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

#endif

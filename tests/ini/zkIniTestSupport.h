// Helpers for the INI tests: data files, a document as readable text,
// loading given bytes, and a save that must rewrite its file in place.
#ifndef ZK_TESTS_INI_TEST_SUPPORT_H
#define ZK_TESTS_INI_TEST_SUPPORT_H

#include <linux/capability.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <iomanip>
#include <sstream>
#include <string>
#include <vector>

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

// Sets the calling thread's effective capabilities to none, or back to all
// it is permitted; false when that could not be done.
inline bool zkSetEffectiveCapabilities(bool on) {
    __user_cap_header_struct header = {_LINUX_CAPABILITY_VERSION_3, 0};
    __user_cap_data_struct data[_LINUX_CAPABILITY_U32S_3] = {};
    if (syscall(SYS_capget, &header, data) != 0) return false;
    for (auto& each : data) each.effective = on ? each.permitted : 0;
    return syscall(SYS_capset, &header, data) == 0;
}

// Runs body, a save of a file of dir: as it is, or, inPlace, with dir closed
// to new files, so that the save rewrites the file in place, and with writes
// past limit bytes failing. Root is held to the permission bits as dir's
// owner by giving up its capabilities meanwhile (a user switch would need
// every directory above dir open to that user). False when that could not
// be arranged.
template <class Body>
bool zkSave(const zkTempDir& dir, bool inPlace, unsigned long long limit, Body body) {
    if (!inPlace) {
        body();
        return true;
    }
    if (chmod(dir.path().c_str(), 0555) != 0 || !zkSetEffectiveCapabilities(false)) return false;
    // A directory that could be added to would let the save replace the file.
    const bool done =
        mkdir(dir.file("probe").c_str(), 0700) != 0 && errno == EACCES && zkWithFileSizeLimit(limit, body);
    return zkSetEffectiveCapabilities(true) && chmod(dir.path().c_str(), 0755) == 0 && done;
}

#endif

// Helpers of the file tests: a tree of files, folders and links made from
// and read back as one line of text, and case tables from tests/data.
#ifndef ZK_TESTS_FILES_TEST_H
#define ZK_TESTS_FILES_TEST_H

#include <sys/stat.h>

#include <vector>

#include "support/zkStringText.h"
#include "support/zkTempDir.h"
#include "zkBasicFile.h"
#include "zkFileManager.h"

// Makes the entries of spec below dir, in order, written as zkTree writes
// them: "name/" a folder, "name->target" a symbolic link, "name=text" a file;
// also "name=>other" a hard link to the entry other, and "name|" a FIFO.
inline void zkPlant(const std::string& dir, const std::string& spec) {
    std::istringstream entries(spec);
    for (std::string entry; entries >> entry;) {
        const size_t link = entry.find("->"), hard = entry.find("=>"), text = entry.find('=');
        const std::string path = dir + "/" + entry.substr(0, std::min(link, text));
        if (link != std::string::npos)
            ASSERT_EQ(0, symlink(entry.substr(link + 2).c_str(), path.c_str())) << entry;
        else if (hard != std::string::npos)
            ASSERT_EQ(0, ::link((dir + "/" + entry.substr(hard + 2)).c_str(), path.c_str())) << entry;
        else if (text != std::string::npos)
            ASSERT_TRUE(zkWriteFile(path, entry.substr(text + 1))) << entry;
        else if (entry.back() == '|')
            ASSERT_EQ(0, mkfifo(path.substr(0, path.size() - 1).c_str(), 0666)) << entry;
        else
            ASSERT_EQ(0, mkdir(path.c_str(), 0777)) << entry;
    }
}

// The entries below dir in byte order, each followed by a space:
// "name=content", "name/" and then the folder's entries, or "name->target".
inline std::string zkTree(const std::string& dir, const std::string& prefix = "") {
    std::string out;
    for (zkDirIterator it((dir + "/*").c_str()); it != zkDirIterator(); ++it) {
        const std::string name = it.GetName(), path = dir + "/" + name;
        char target[512] = {};
        if (name == "." || name == "..") continue;
        if (readlink(path.c_str(), target, sizeof target - 1) >= 0)
            out += prefix + name + "->" + target + " ";
        else if (zkFilename::IsDirectory(path.c_str()))
            out += prefix + name + "/ " + zkTree(path, prefix + name + "/");
        else
            out += prefix + name + "=" + zkReadFile(path) + " ";
    }
    return out;
}

// The cases of tests/data/<name>: one a line, its fields split at spaces,
// "-" standing for an empty field; lines starting with '#' are comments.
inline std::vector<std::vector<std::string>> zkCases(const std::string& name) {
    std::ifstream in(std::string(ZK_TEST_DATA_DIR) + "/" + name);
    std::vector<std::vector<std::string>> rows;
    for (std::string line; std::getline(in, line);) {
        std::istringstream fields(line);
        std::vector<std::string> row;
        for (std::string field; fields >> field;) row.push_back(field == "-" ? "" : field);
        if (!row.empty() && row[0][0] != '#') rows.push_back(row);
    }
    EXPECT_FALSE(rows.empty()) << name;
    return rows;
}

#endif

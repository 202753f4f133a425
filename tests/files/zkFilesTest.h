// Helpers of the file tests: a tree of files, folders and links made from
// and read back as one line of text, case tables from tests/data, and steps
// on a tree run from such a table.
#ifndef ZK_TESTS_FILES_TEST_H
#define ZK_TESTS_FILES_TEST_H

#include <sys/stat.h>
#include <sys/sysmacros.h>

#include <algorithm>
#include <vector>

#include "support/zkStringText.h"
#include "support/zkTableFile.h"
#include "support/zkTempDir.h"
#include "zkBasicFile.h"
#include "zkFileManager.h"

// Makes the entries of layout below dir, in order, written as zkTree writes
// them: "name/" a folder, "name->target" a symbolic link, "name=text" a file;
// also "name=>other" a hard link to the entry other, "name|" a FIFO and
// "name%N" the memory device of minor N (3 as /dev/null, 7 as /dev/full).
inline void zkPlant(const std::string& dir, const std::string& layout) {
    std::istringstream entries(layout);
    for (std::string entry; entries >> entry;) {
        const size_t link = entry.find("->"), hard = entry.find("=>"), text = entry.find('='), device = entry.find('%');
        const std::string path = dir + "/" + entry.substr(0, std::min({link, text, device}));
        if (link != std::string::npos)
            ASSERT_EQ(0, symlink(entry.substr(link + 2).c_str(), path.c_str())) << entry;
        else if (hard != std::string::npos)
            ASSERT_EQ(0, ::link((dir + "/" + entry.substr(hard + 2)).c_str(), path.c_str())) << entry;
        else if (text != std::string::npos)
            ASSERT_TRUE(zkWriteFile(path, entry.substr(text + 1))) << entry;
        else if (entry.back() == '|')
            ASSERT_EQ(0, mkfifo(path.substr(0, path.size() - 1).c_str(), 0666)) << entry;
        else if (device != std::string::npos)
            ASSERT_EQ(0, mknod(path.c_str(), S_IFCHR | 0666, makedev(1, std::stoi(entry.substr(device + 1))))) << entry;
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

// The fields of a row of a table file.
using zkRow = std::vector<std::string>;

// The fields of row from index `from` on, each followed by a space.
inline std::string zkFields(const zkRow& row, size_t from) {
    std::string text;
    for (size_t i = from; i < row.size(); ++i) text += row[i] + " ";
    return text;
}

// One step of zkRunSteps.
inline void zkStep(const zkRow& row) {
    const auto number = [&](size_t i) { return std::stoi(row.at(i)); };
    const auto flag = [&](char c) { return row.at(3).find(c) != std::string::npos ? 1u : 0u; };
    zkStringBase first(row.at(1).c_str()), second(row.size() > 2 ? row[2].c_str() : "");
    zkFilename path(row[1].c_str());
    std::list<zkFileInfo> files(1);  // the record already there stays first
    std::list<zkStringBase> folders;
    zkRow listed;
    if (row[0] == "plant") {
        zkPlant(".", zkFields(row, 1));
    } else if (row[0] == "tree") {
        EXPECT_EQ(zkFields(row, 2), zkTree(row[1]));
    } else if (row[0] == "copy") {
        EXPECT_EQ(number(4), zkFileManager::CopyFile(first, second, flag('r'), flag('m'), flag('o'), flag('s'),
                                                     flag('d'), nullptr, nullptr));
    } else if (row[0] == "chmod") {
        EXPECT_EQ(0, chmod(row[1].c_str(), static_cast<mode_t>(std::stoi(row.at(2), nullptr, 8))));
    } else if (row[0] == "mode") {
        struct stat st = {};
        EXPECT_EQ(0, stat(row[1].c_str(), &st));
        EXPECT_EQ(std::stoi(row.at(2), nullptr, 8), static_cast<int>(st.st_mode & 07777));
    } else if (row[0] == "mkdir") {
        EXPECT_EQ(number(2), zkFileManager::CreateDirectory(row[1].c_str(), nullptr) != 0 ? 1 : 0);
    } else if (row[0] == "delete") {
        EXPECT_EQ(number(3), zkFileManager::DeleteFile(first, number(2)));
    } else if (row[0] == "delete-name") {
        EXPECT_EQ(number(3), zkFileManager::DeleteFile(path, number(2)));
    } else if (row[0] == "type") {
        EXPECT_EQ(number(2), path.GetType());
        EXPECT_EQ(number(3), path.FileExists(1));
        EXPECT_EQ(number(4), path.FileExists(0));
    } else if (row[0] == "files") {
        EXPECT_EQ(number(4), zkFileManager::GetFileList(row[1].c_str(), row[2].c_str(), files, number(3)));
        for (auto it = std::next(files.begin()); it != files.end(); ++it)
            listed.push_back(std::string(it->m_file.GetFullPath()) + ":" + std::to_string(it->m_size));
        std::sort(listed.begin(), listed.end());  // readdir has no fixed order
        EXPECT_EQ(zkFields(row, 5), zkFields(listed, 0));
    } else if (row[0] == "folders") {
        EXPECT_EQ(number(5),
                  zkFileManager::GetFolderList(row[1].c_str(), row[2].c_str(), folders, number(3), number(4)));
        for (const zkStringBase& folder : folders) listed.push_back(folder.data());
        // Depth first: each folder comes before, and right before, all those below it.
        for (auto it = listed.begin(); it != listed.end(); ++it) {
            const auto below = [&](const std::string& other) { return other.rfind(*it, 0) == 0; };
            EXPECT_EQ(0, std::count_if(listed.begin(), it, below)) << *it;
            EXPECT_TRUE(std::all_of(it, it + std::count_if(it, listed.end(), below), below)) << *it;
        }
        std::sort(listed.begin(), listed.end());
        EXPECT_EQ(zkFields(row, 6), zkFields(listed, 0));
    } else {
        ADD_FAILURE() << "no such step";
    }
}

// Runs the steps of tests/data/<name>, read as zkForEachRow reads it, in a new
// temporary directory that is the current directory meanwhile. A step is a
// verb and its fields:
//   plant ENTRIES...          makes the entries as zkPlant does
//   tree DIR ENTRIES...       DIR holds the entries, as zkTree writes them
//   copy FROM TO FLAGS RESULT CopyFile with FLAGS of r (recursive), o
//                             (overwrite), d (delete the source), m (make the
//                             directory) and s (link instead of a copy)
//   chmod PATH MODE           sets the mode (octal); the umask is 0 meanwhile
//   mode PATH MODE            the permission bits of PATH are MODE (octal)
//   mkdir PATH RESULT         CreateDirectory, RESULT 1 when made
//   delete PATH FLAG RESULT   DeleteFile of the path as a string, and
//   delete-name ...           of the path as a zkFilename
//   type PATH TYPE EXISTS FOLLOWED   GetType, FileExists(1), FileExists(0)
//   files DIR PATTERN FULL RESULT RECORDS...   GetFileList, and "path:size"
//                             of each record it appended, in byte order
//   folders ROOT SUB RECURSIVE FULL RESULT FOLDERS...   GetFolderList, and
//                             the folders it listed, in byte order
inline void zkRunSteps(const std::string& name) {
    zkTempDir dir;
    const int home = open(".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    const mode_t mask = umask(0);
    zkForEachRow(name, [](const zkRow& row) {
        const int next = dup(0);  // the lowest free descriptor, free again after each step
        close(next);
        zkStep(row);
        EXPECT_EQ(-1, fcntl(next, F_GETFD)) << "a descriptor was left open";
    });
    EXPECT_EQ(0, fchdir(home));
    close(home);
    umask(mask);
}

#endif

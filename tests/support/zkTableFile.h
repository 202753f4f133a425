// Test helper: tables of cases kept as text files under tests/data, one row a
// line, so that a table reads as its inputs and expected results.
#ifndef ZK_TESTS_TABLE_FILE_H
#define ZK_TESTS_TABLE_FILE_H

#include <gtest/gtest.h>

#include <fstream>
#include <iomanip>
#include <sstream>
#include <string>
#include <vector>

// The bytes a field stands for: the escapes of a C string literal (\0 \t \n
// \r \v \f \\ \xHH) are replaced by their bytes.
inline std::string zkUnescape(const std::string& field) {
    static const std::string named("0\0t\tn\nr\rv\vf\f", 12);
    std::string out;
    for (std::size_t i = 0; i < field.size(); ++i) {
        char c = field[i];
        if (c == '\\' && field[i + 1] == 'x') {
            c = static_cast<char>(std::stoi(field.substr(i + 2, 2), nullptr, 16));
            i += 3;
        } else if (c == '\\') {
            const std::size_t k = named.find(field[++i]);
            c = k == std::string::npos ? field[i] : named[k + 1];
        }
        out += c;
    }
    return out;
}

// Calls check(fields) for each row of tests/data/<name>, under a trace that
// names the file and the row. Blank lines and lines starting with '#' are
// skipped. Fields are separated by blanks; a field in single quotes may hold
// blanks and double quotes.
template <class Check>
void zkForEachRow(const std::string& name, Check check) {
    std::ifstream in(std::string(ZK_TEST_DATA_DIR) + "/" + name);
    ASSERT_TRUE(in.is_open()) << name;
    for (std::string line; std::getline(in, line);) {
        std::istringstream text(line);
        std::vector<std::string> fields;
        for (std::string f; line[0] != '#' && text >> std::quoted(f, '\'', '\0');) fields.push_back(zkUnescape(f));
        if (fields.empty()) continue;
        SCOPED_TRACE(name + ": " + line);
        check(fields);
    }
}

#endif

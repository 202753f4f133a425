// zkdemo: reads a comma-separated text and shows the string class at work.
// Each line is split into fields, which are stripped and printed as they
// stand, in capitals, with capital initials, and as numbers where they are.
#include <cstdio>
#include <fstream>
#include <iterator>
#include <string>

#include "zkBStringTokenizer.h"
#include "zkStringBase.h"

namespace {

void showField(const zkStringBase& field) {
    zkStringBase upper(field);
    upper.toUpper();
    zkStringBase initials(field);
    initials.firstUpper();
    std::printf("  %-24s %-24s %-24s", field.data(), upper.data(), initials.data());
    if (field.isNumber()) std::printf(" number %g", field.asDouble());
    std::printf("\n");
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: %s FILE\n", argv[0]);
        return 2;
    }
    std::ifstream in(argv[1], std::ios::binary);
    if (!in) {
        std::perror(argv[1]);
        return 2;
    }
    std::string bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    zkStringBase text(bytes.data(), static_cast<unsigned>(bytes.size()));

    zkBStringTokenizer lines(text, zkBStringTokenizer::m_crlfToken, true);
    zkStringBase line;
    unsigned number = 0;
    while (lines.GetNext(line)) {
        if (line.isNull() || line[0] == '#') continue;
        std::printf("line %u: \"%s\"\n", ++number, line.data());
        zkBStringTokenizer fields(line, zkBStringTokenizer::m_csvToken, true);
        zkStringBase field;
        while (fields.GetNext(field)) showField(field);
    }
    return 0;
}

// The command-line parser in string mode on arbitrary text, and in vector
// mode on the input split at zero bytes, checked against a plain table.
#include <string.h>

#include <map>
#include <vector>

#include "zkCommandLineParser.h"
#include "zkFuzzInput.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    zkFuzzInput in(data, size);
    const char switchChar = static_cast<char>(in.byte() % 2 ? '-' : in.byte());
    const char separatorChar = static_cast<char>(in.byte() % 2 ? ':' : in.byte());
    const std::string text = in.rest();

    {
        zkCommandLineParser parser(zkStringBase(text.data(), static_cast<unsigned>(text.size())), switchChar,
                                   separatorChar);
        ZK_FUZZ_CHECK(parser.ParseCommand() == 1 && parser.IsValid());
        zkStringBase folded("a");
        folded.setCompareType(zkStringBase::CaseInsensitive);
        zkStringBase value;
        if (parser.GetValue(folded, value)) ZK_FUZZ_CHECK(parser.Exists(folded));
        ZK_FUZZ_CHECK(parser.SetCommand(parser.GetCommand()) == 1);
    }

    // argv[0] is the program name; each zero byte starts a new element.
    std::vector<std::string> items(1, "prog");
    items.emplace_back();
    for (char c : text) {
        if (c == '\0')
            items.emplace_back();
        else
            items.back() += c;
    }
    std::vector<char*> argv;
    for (std::string& item : items) argv.push_back(&item[0]);
    argv.push_back(nullptr);

    std::map<std::string, std::string> model;
    for (size_t k = 1; k < items.size(); ++k) {
        const std::string& a = items[k];
        if (a.size() < 2 || a[0] != switchChar) continue;
        size_t sep = separatorChar ? a.find(separatorChar, 1) : std::string::npos;
        if (sep == std::string::npos)
            model[a.substr(1, 1)] = "";
        else
            model[a.substr(1, sep - 1)] = a.substr(sep + 1);
    }

    zkCommandLineParser parser(static_cast<int>(items.size()), argv.data(), switchChar, separatorChar);
    ZK_FUZZ_CHECK(parser.ParseCommand() == 1);
    for (const auto& entry : model) {
        zkStringBase name(entry.first.data(), static_cast<unsigned>(entry.first.size()));
        ZK_FUZZ_CHECK(parser.Exists(name));
        const zkStringBase& value = parser.GetValue(name);
        ZK_FUZZ_CHECK(std::string(value.data(), value.length()) == entry.second);
    }
    return 0;
}

// Parsing command strings and argument vectors with zkCommandLineParser.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "support/zkStringText.h"
#include "support/zkTableFile.h"
#include "zkCommandLineParser.h"

// Checks the value under each name of names and values given in turn;
// "<none>" stands for a missing entry.
static void expectEntries(const zkCommandLineParser& p, const std::vector<std::string>& namesAndValues) {
    for (std::size_t i = 0; i + 1 < namesAndValues.size(); i += 2) {
        const std::string& name = namesAndValues[i];
        SCOPED_TRACE(name);
        const bool exists = p.Exists(zkStr(name));
        EXPECT_EQ(namesAndValues[i + 1], exists ? std::string(p.GetValue(name.c_str()).data()) : "<none>");
    }
}

// An element of an argument vector.
const auto arg = [](const char* s) { return const_cast<char*>(s); };

// Refuses every parse, and shows the vector state a derived class sees.
struct Refusing : zkCommandLineParser {
    using zkCommandLineParser::zkCommandLineParser;
    int Validate() override { return 0; }
    std::vector<int> vectorState() const { return {m_argc, m_argv != nullptr, m_useArgv}; }
};

TEST(CommandLineString, SwitchesBecomeEntries) {
    zkForEachRow("str_command_lines.txt", [](const auto& row) {
        zkCommandLineParser p(zkStringBase(row[0].c_str()), row[1][0], row[2][0]);
        EXPECT_EQ(1, p.ParseCmdLine());
        EXPECT_EQ(1, p.IsValid());
        expectEntries(p, std::vector<std::string>(row.begin() + 3, row.end()));
    });
}

// argv[0] is skipped; without a separator the first character names the
// switch and the value is empty; a lone switch character and an element that
// does not start with one are no switches.
TEST(CommandLineVector, EachElementIsOneSwitch) {
    // clang-format off
    char* argv[] = {arg("-ignored:1"), arg("-in:data.ini"), arg("-out:a:b"), arg("-level"), arg("-o:"), arg("-:x"),
                    arg("-"), arg("-q"), nullptr, arg(""), arg("file.ini"), arg("-in:other"), arg("/path=out"),
                    arg("-z:past")};
    // clang-format on
    zkCommandLineParser p(13, argv);
    EXPECT_EQ(1, p.ParseCommand());
    // clang-format off
    expectEntries(p, {"in", "other", "out", "a:b", "o", "", "l", "", "", "x", "q", "", std::string(1, '\0'), "<none>",
                      "ignored", "<none>", "file.ini", "<none>", "i", "<none>", "p", "<none>", "z", "<none>"});
    // clang-format on
    EXPECT_EQ(1, p.SetCommand(zkStringBase("-s:1")));
    expectEntries(p, {"s", "1", "in", "other"});
    zkCommandLineParser slash(13, argv, '/', '=');
    EXPECT_EQ(1, slash.ParseArgcArgv());
    expectEntries(slash, {"path", "out", "in", "<none>"});
}

// A refusing Validate makes every parse return 0; the entries stay, and the
// table only grows. A vector set on a string-mode parser is parsed once, and
// ParseCommand then parses the emptied string.
TEST(CommandLineParser, ValidateGivesTheResult) {
    char* argv[] = {arg("prog"), arg("-in:data.ini")};
    const Refusing fresh, byString(zkStringBase("-a:1")), byVector(2, argv);
    for (const Refusing* unparsed : {&fresh, &byString, &byVector}) EXPECT_EQ(0, unparsed->IsValid());
    EXPECT_EQ((std::vector<int>{0, 0, 0}), fresh.vectorState());
    EXPECT_EQ((std::vector<int>{0, 0, 0}), byString.vectorState());
    EXPECT_EQ((std::vector<int>{2, 1, 1}), byVector.vectorState());
    Refusing r(zkStringBase("-a:1 -b:0"));
    EXPECT_EQ(0, r.ParseCommand());
    EXPECT_EQ(0, r.SetCommand(zkStringBase("-b:2")));
    EXPECT_EQ(0, r.IsValid());
    EXPECT_EQ(0, r.SetCommand(2, argv));
    expectEntries(r, {"a", "1", "b", "2", "in", "data.ini"});
    r.SetValue("b", zkStringBase("set"));
    r.SetValue("in", zkStringBase("set"));
    EXPECT_EQ(0, r.ParseCommand());
    EXPECT_EQ(0, r.IsValid());
    expectEntries(r, {"a", "1", "b", "set", "in", "set"});
    EXPECT_EQ(0, r.SetCommand(zkStringBase("-c:3")));
    EXPECT_EQ((std::vector<int>{0, 0, 0}), r.vectorState());
}

// A CaseInsensitive name finds an entry written in capitals. Entries get
// buffers of their own size, not that of the longest item parsed.
TEST(CommandLineParser, CaseInsensitiveLookupFindsCapitals) {
    std::string command = "-big:" + std::string(100000, 'v');
    for (int i = 0; i < 10000; ++i) command += " -Name" + std::to_string(i) + "XYZ:" + std::to_string(i);
    zkCommandLineParser p(zkStringBase(command.c_str()));
    EXPECT_EQ(1, p.ParseCommand());
    EXPECT_EQ(5u, p.GetValue("Name9999XYZ").capacity());
    for (int i = 0; i < 10000; i += 250) {
        SCOPED_TRACE(i);
        zkStringBase name(("name" + std::to_string(i) + "xyz").c_str()), out("kept");
        EXPECT_EQ(0, p.GetValue(name, out));
        name.setCompareType(zkStringBase::CaseInsensitive);
        EXPECT_EQ(1, p.GetValue(name, out));
        EXPECT_EQ(std::to_string(i), out.data());
    }
    zkStringBase folded("v");  // a value keeps its compare type
    folded.setCompareType(zkStringBase::CaseInsensitive);
    p.SetValue("folded", folded);
    EXPECT_EQ(zkStringBase::CaseInsensitive, p.GetValue("folded").getCompareType());
}

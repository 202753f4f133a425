// Parsing command strings and argument vectors with zkCommandLineParser.
#include <gtest/gtest.h>

#include <initializer_list>
#include <string>

#include "zkCommandLineParser.h"

namespace {

using Names = std::initializer_list<const char*>;

// The values under names, joined by "|"; "<none>" stands for a missing entry.
std::string entries(const zkCommandLineParser& p, Names names) {
    std::string out;
    for (const char* n : names) out += "|" + std::string(p.Exists(zkStringBase(n)) ? p.GetValue(n).data() : "<none>");
    return out.substr(1);
}

char* arg(const char* s) {
    return const_cast<char*>(s);
}

struct Refusing : zkCommandLineParser {
    using zkCommandLineParser::zkCommandLineParser;
    int Validate() override { return 0; }
};

}  // namespace

TEST(CommandLineString, OnlySpacesSeparateAndASwitchBeforeASwitchStoresNothing) {
    const struct {
        const char* command;
        char switchChar, separator;
        Names names;
        const char* values;
    } cases[] = {
        {"prog -in:data.ini -out:\"my file.ini\"", '-', ':', {"in", "out", "prog"}, "data.ini|my file.ini|<none>"},
        {"-n: 5 -n:6 -a:1-b:2", '-', ':', {"n", "a", "b"}, "6|1-b:2|<none>"},
        {"-v -x:1 -a:\"\" -b:\"x y", '-', ':', {"v -x", "x", "a", "b"}, "1|<none>||x y"},
        {"-:x \"y\" z -a:", '-', ':', {"", "x", "y", "z", "a"}, "<none>|<none>|<none>|<none>|<none>"},
        {"  -p:   ab  -q:\" a b \" -r:ab\t -s:\t\r\nab", '-', ':', {"p", "q", "r", "s"}, "ab| a b |ab|ab"},
        {"-p:a\tb -q:a\"b -r", '-', ':', {"p", "q", "r"}, "a\tb|a\"b|<none>"},
        {"-a:-b:1 -c: -d:2", '-', ':', {"b", "ab", "a", "d", "c"}, "1|<none>|<none>|2|<none>"},
        {"/path=out -path=x /q=1", '/', '=', {"path", "q"}, "out|1"},
    };
    for (const auto& c : cases) {
        zkCommandLineParser p(zkStringBase(c.command), c.switchChar, c.separator);
        EXPECT_TRUE(p.ParseCmdLine() == 1 && p.IsValid() == 1) << c.command;
        EXPECT_EQ(c.values, entries(p, c.names)) << c.command;
    }
}

TEST(CommandLineVector, EachElementIsOneSwitchAndValidateGivesTheResult) {
    char* argv[] = {arg("-ignored:1"), arg("-in:data.ini"), arg("-out:a:b"), arg("-o:"),
                    arg("-level"),     arg("-:x"),          arg("-"),        arg("file.ini"),
                    arg("-in:other"),  arg("/path=out")};
    zkCommandLineParser p(10, argv);
    EXPECT_EQ(1, p.ParseCommand());
    EXPECT_EQ("other|a:b|||x|<none>|<none>", entries(p, {"in", "out", "o", "l", "", "ignored", "file.ini"}));
    EXPECT_TRUE(p.SetCommand(zkStringBase("-s:1")) == 1 && entries(p, {"s", "in"}) == "1|other");
    zkCommandLineParser slash(10, argv, '/', '=');
    EXPECT_TRUE(slash.ParseArgcArgv() == 1 && entries(slash, {"path", "in"}) == "out|<none>");

    // A refusing Validate makes every parse return 0; the entries stay, and the
    // table only grows. A vector set on a string-mode parser is parsed once, and
    // ParseCommand then parses the emptied string.
    Refusing r(zkStringBase("-a:1 -b:0"));
    EXPECT_TRUE(r.ParseCommand() == 0 && r.SetCommand(zkStringBase("-b:2")) == 0 && r.SetCommand(2, argv) == 0);
    EXPECT_EQ("data.ini", entries(r, {"in"}));
    r.SetValue("b", zkStringBase("set"));
    r.SetValue("in", zkStringBase("set"));
    EXPECT_TRUE(r.ParseCommand() == 0 && r.IsValid() == 0);
    EXPECT_EQ("1|set|set", entries(r, {"a", "b", "in"}));
}

// A CaseInsensitive name finds an entry written in capitals. Entries get
// buffers of their own size, not that of the longest item parsed.
TEST(CommandLineParser, CaseInsensitiveLookupAndEntriesSizedToTheirText) {
    std::string command = "-big:" + std::string(100000, 'v');
    for (int i = 0; i < 10000; ++i) command += " -Name" + std::to_string(i) + "XYZ:" + std::to_string(i);
    zkCommandLineParser p(zkStringBase(command.c_str()));
    EXPECT_EQ(1, p.ParseCommand());
    EXPECT_LT(p.GetValue("Name9999XYZ").capacity(), 1000u);
    for (int i = 0; i < 10000; i += 250) {
        zkStringBase name(("name" + std::to_string(i) + "xyz").c_str()), out("kept");
        EXPECT_TRUE(p.GetValue(name, out) == 0 && std::string(out.data()) == "kept") << i;
        name.setCompareType(zkStringBase::CaseInsensitive);
        EXPECT_TRUE(p.GetValue(name, out) == 1 && std::to_string(i) == out.data()) << i;
    }
}

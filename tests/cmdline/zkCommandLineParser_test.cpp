// Parsing command strings and argument vectors with zkCommandLineParser.
#include <gtest/gtest.h>

#include <initializer_list>
#include <string>

#include "zkCommandLineParser.h"

// The values under names, joined by "|"; "<none>" stands for a missing entry.
static std::string entries(const zkCommandLineParser& p, std::initializer_list<const char*> names) {
    std::string out;
    for (const char* n : names) out += "|" + std::string(p.Exists(zkStringBase(n)) ? p.GetValue(n).data() : "<none>");
    return out.substr(1);
}

static char* arg(const char* s) {
    return const_cast<char*>(s);
}

struct Refusing : zkCommandLineParser {
    using zkCommandLineParser::zkCommandLineParser;
    int Validate() override { return 0; }
};

// Only spaces separate items; a switch before a switch stores nothing.
TEST(CommandLineString, SwitchesBecomeEntries) {
    // clang-format off
    const struct { const char* command; char switchChar, separator; std::initializer_list<const char*> names;
                   const char* values; } cases[] = {
        {"prog -in:data.ini -out:\"my file.ini\"", '-', ':', {"in", "out", "prog"}, "data.ini|my file.ini|<none>"},
        {"-n: 5 -n:6 x -a:1-b:2", '-', ':', {"n", "a", "b"}, "6|1-b:2|<none>"},
        {"-v -x:1 -a:\"\" w -b:\"x y", '-', ':', {"v -x", "x", "a", "b"}, "1|<none>||x y"},
        {"-:x -b:2", '-', ':', {"b", ":x -b", ""}, "2|<none>|<none>"},
        {"-:x \"y\" z -a:", '-', ':', {"", "x", "y", "z", "a"}, "<none>|<none>|<none>|<none>|<none>"},
        {"  -p:   ab  -q:\" a b \" -r:ab\t -s:\t\r\nab", '-', ':', {"p", "q", "r", "s"}, "ab| a b |ab|ab"},
        {"-p:a\tb -q:a\"b -r", '-', ':', {"p", "q", "r"}, "a\tb|a\"b|<none>"},
        {"-a:-b:1 -c: -d:2", '-', ':', {"b", "ab", "a", "d", "c"}, "1|<none>|<none>|2|<none>"},
        {"/path=out -path=x /q=1", '/', '=', {"path", "q"}, "out|1"},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(c.command);
        zkCommandLineParser p(zkStringBase(c.command), c.switchChar, c.separator);
        EXPECT_EQ(1, p.ParseCmdLine());
        EXPECT_EQ(1, p.IsValid());
        EXPECT_EQ(c.values, entries(p, c.names));
    }
}

// argv[0] is skipped; without a separator the first character names the switch.
TEST(CommandLineVector, EachElementIsOneSwitch) {
    // clang-format off
    char* argv[] = {arg("-ignored:1"), arg("-in:data.ini"), arg("-out:a:b"), arg("-o:"), arg("-level"), arg("-:x"),
                    arg("-"), nullptr, arg(""), arg("file.ini"), arg("-in:other"), arg("/path=out"), arg("-z:past")};
    // clang-format on
    zkCommandLineParser p(12, argv);
    EXPECT_EQ(1, p.ParseCommand());
    EXPECT_EQ("other|a:b|||x|<none>|<none>|<none>",
              entries(p, {"in", "out", "o", "l", "", "ignored", "file.ini", "z"}));
    EXPECT_EQ(1, p.SetCommand(zkStringBase("-s:1")));
    EXPECT_EQ("1|other", entries(p, {"s", "in"}));
    zkCommandLineParser slash(12, argv, '/', '=');
    EXPECT_EQ(1, slash.ParseArgcArgv());
    EXPECT_EQ("out|<none>", entries(slash, {"path", "in"}));
}

// A refusing Validate makes every parse return 0; the entries stay, and the
// table only grows. A vector set on a string-mode parser is parsed once, and
// ParseCommand then parses the emptied string.
TEST(CommandLineParser, ValidateGivesTheResult) {
    char* argv[] = {arg("prog"), arg("-in:data.ini")};
    zkCommandLineParser fresh, byString(zkStringBase("-a:1")), byVector(2, argv);
    for (zkCommandLineParser* unparsed : {&fresh, &byString, &byVector}) EXPECT_EQ(0, unparsed->IsValid());
    Refusing r(zkStringBase("-a:1 -b:0"));
    EXPECT_EQ(0, r.ParseCommand());
    EXPECT_EQ(0, r.SetCommand(zkStringBase("-b:2")));
    EXPECT_EQ(0, r.IsValid());
    EXPECT_EQ(0, r.SetCommand(2, argv));
    EXPECT_EQ("1|2|data.ini", entries(r, {"a", "b", "in"}));
    r.SetValue("b", zkStringBase("set"));
    r.SetValue("in", zkStringBase("set"));
    EXPECT_EQ(0, r.ParseCommand());
    EXPECT_EQ(0, r.IsValid());
    EXPECT_EQ("1|set|set", entries(r, {"a", "b", "in"}));
}

// A CaseInsensitive name finds an entry written in capitals. Entries get
// buffers of their own size, not that of the longest item parsed.
TEST(CommandLineParser, CaseInsensitiveLookupFindsCapitals) {
    std::string command = "-big:" + std::string(100000, 'v');
    for (int i = 0; i < 10000; ++i) command += " -Name" + std::to_string(i) + "XYZ:" + std::to_string(i);
    zkCommandLineParser p(zkStringBase(command.c_str()));
    EXPECT_EQ(1, p.ParseCommand());
    EXPECT_LT(p.GetValue("Name9999XYZ").capacity(), 1000u);
    for (int i = 0; i < 10000; i += 250) {
        SCOPED_TRACE(i);
        zkStringBase name(("name" + std::to_string(i) + "xyz").c_str()), out("kept");
        EXPECT_EQ(0, p.GetValue(name, out));
        EXPECT_STREQ("kept", out.data());
        name.setCompareType(zkStringBase::CaseInsensitive);
        EXPECT_EQ(1, p.GetValue(name, out));
        EXPECT_EQ(std::to_string(i), out.data());
    }
    zkStringBase folded("v");  // a value keeps its compare type
    folded.setCompareType(zkStringBase::CaseInsensitive);
    p.SetValue("folded", folded);
    EXPECT_EQ(zkStringBase::CaseInsensitive, p.GetValue("folded").getCompareType());
}

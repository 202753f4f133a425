// Parsing command strings and argument vectors with zkCommandLineParser.
#include "zkCommandLineParser.h"

#include <gtest/gtest.h>

#include <initializer_list>
#include <string>

namespace {

using Names = std::initializer_list<const char*>;

// The values under names, joined by "|"; "<none>" stands for a missing entry.
std::string entries(const zkCommandLineParser& p, Names names) {
    std::string out;
    for (const char* name : names) {
        const zkStringBase& v = p.GetValue(name);
        out += "|" + (p.Exists(zkStringBase(name)) ? std::string(v.data(), v.length()) : "<none>");
    }
    return out.substr(1);
}

// The entries after parsing command alone.
std::string parsed(const char* command, Names names) {
    zkCommandLineParser p{zkStringBase(command)};
    EXPECT_EQ(1, p.ParseCmdLine());
    return entries(p, names);
}

char* arg(const char* s) {
    return const_cast<char*>(s);
}

struct Refusing : zkCommandLineParser {
    using zkCommandLineParser::zkCommandLineParser;
    int Validate() override { return 0; }
};

}  // namespace

TEST(CommandLineParser, FreshParserHasNothing) {
    zkCommandLineParser p(zkStringBase("-a:1"));
    EXPECT_EQ(0, p.IsValid());
    EXPECT_EQ(&zkStringBase::NullStr, &p.GetValue("a"));
    zkStringBase out("kept");
    EXPECT_EQ(0, p.GetValue("a", out));
    EXPECT_STREQ("kept", out.data());
    zkCommandLineParser empty;
    EXPECT_EQ(1, empty.ParseCommand());
    EXPECT_EQ(1, empty.IsValid());
}

TEST(CommandLineString, ExamplesTable) {
    EXPECT_EQ("data.ini|my file.ini|<none>", parsed("prog -in:data.ini -out:\"my file.ini\"", {"in", "out", "prog"}));
    EXPECT_EQ("6", parsed("-n: 5 -n:6", {"n"}));
    EXPECT_EQ("1-b:2|<none>", parsed("-a:1-b:2", {"a", "b"}));
    EXPECT_EQ("1|<none>", parsed("-v -x:1", {"v -x", "x"}));
    EXPECT_EQ("x|y", parsed("-a:\"x\" -b:\"y\"", {"a", "b"}));
    EXPECT_EQ("", parsed("-a:\"\"", {"a"}));
    EXPECT_EQ("x y", parsed("-a:\"x y", {"a"}));
    EXPECT_EQ("<none>|<none>", parsed("-a:", {"a", ""}));
    EXPECT_EQ("<none>|<none>", parsed("-:x", {"", "x"}));
    EXPECT_EQ("<none>|<none>|<none>", parsed("\"x\" y -z", {"x", "y", "z"}));
}

TEST(CommandLineString, OnlySpacesSeparateAndUnquotedValuesAreStripped) {
    EXPECT_EQ("ab| a b |ab|ab", parsed("  -p:   ab  -q:\" a b \" -r:ab\t -s:\t\r\nab", {"p", "q", "r", "s"}));
    EXPECT_EQ("a\tb|a\"b|<none>", parsed("-p:a\tb -q:a\"b -r", {"p", "q", "r"}));
    EXPECT_EQ("<none>", parsed("-q -p:1", {"p"}));
}

TEST(CommandLineString, SwitchWithoutValueBeforeAnotherSwitchStoresNothing) {
    EXPECT_EQ("1|<none>|<none>", parsed("-a:-b:1", {"b", "ab", "a"}));
    EXPECT_EQ("1|<none>|<none>", parsed("-a: -b:1", {"b", "ab", "a"}));
    EXPECT_EQ("1|<none>|<none>", parsed("-a:   -b:1", {"b", "ab", "a"}));
}

TEST(CommandLineString, ChosenCharactersAndTheTableOnlyGrows) {
    zkCommandLineParser p(zkStringBase("/path=out -path=x /q=1"), '/', '=');
    p.ParseCommand();
    EXPECT_EQ("out|1", entries(p, {"path", "q"}));
    p.SetValue("path", zkStringBase("set"));
    p.SetValue("new", zkStringBase());
    EXPECT_EQ(1, p.SetCommand(zkStringBase("/path=again")));
    EXPECT_EQ("again|1|", entries(p, {"path", "q", "new"}));
    p.SetValue("path", zkStringBase("set"));
    p.ParseCommand();
    EXPECT_EQ("again", entries(p, {"path"}));
}

TEST(CommandLineVector, ExamplesTableInOrder) {
    char* argv[] = {arg("-ignored:1"), arg("-in:data.ini"), arg("-out:a:b"), arg("-o:"), arg("-level"),
                    arg("-:x"),        arg("-"),            arg("file.ini"), arg("-in:other")};
    zkCommandLineParser p(9, argv);
    EXPECT_EQ(1, p.ParseCommand());
    EXPECT_EQ("other|a:b|||x|<none>|<none>|<none>",
              entries(p, {"in", "out", "o", "l", "", "ignored", "-", "file.ini"}));
    EXPECT_STREQ("-in:data.ini", argv[1]);

    char* more[] = {arg("prog"), arg("-l:1"), arg("/path=out"), arg("-path=x")};
    EXPECT_EQ(1, p.SetCommand(2, more));
    EXPECT_EQ("1|other", entries(p, {"l", "in"}));
    zkCommandLineParser slash(4, more, '/', '=');
    slash.ParseArgcArgv();
    EXPECT_EQ("out", entries(slash, {"path"}));
    zkCommandLineParser one(1, more);
    EXPECT_EQ(1, one.ParseCommand());
    EXPECT_EQ("<none>", entries(one, {"l"}));
    // A vector set on a string-mode parser is parsed once; ParseCommand then
    // parses the emptied string.
    zkCommandLineParser str(zkStringBase("-s:1"));
    EXPECT_EQ(1, str.SetCommand(2, more));
    str.SetValue("l", zkStringBase("2"));
    EXPECT_EQ(1, str.ParseCommand());
    EXPECT_EQ("2|<none>", entries(str, {"l", "s"}));
}

TEST(CommandLineParser, RefusingValidateMakesParsesReturnZeroButKeepsEntries) {
    char* argv[] = {arg("prog"), arg("-v:1")};
    Refusing p(zkStringBase("-a:1"));
    EXPECT_EQ(0, p.ParseCommand());
    EXPECT_EQ(0, p.SetCommand(zkStringBase("-b:2")));
    EXPECT_EQ(0, p.SetCommand(2, argv));
    EXPECT_EQ(0, p.IsValid());
    EXPECT_EQ("1|2|1", entries(p, {"a", "b", "v"}));
}

TEST(CommandLineParser, CaseInsensitiveLookupFindsCapitalisedNames) {
    zkCommandLineParser p(zkStringBase("-MiXeD:y"));
    p.ParseCommand();
    for (int i = 0; i < 40; ++i) p.SetValue(("Name" + std::to_string(i) + "XYZ").c_str(), zkStringBase("v"));
    for (int i = -1; i < 40; ++i) {
        zkStringBase name(i < 0 ? "MIXED" : ("name" + std::to_string(i) + "xyz").c_str()), out;
        EXPECT_FALSE(p.Exists(name));
        name.setCompareType(zkStringBase::CaseInsensitive);
        EXPECT_EQ(1, p.GetValue(name, out)) << i;
        EXPECT_STREQ(i < 0 ? "y" : "v", out.data());
    }
}

TEST(CommandLineString, LongLinesParseWhole) {
    std::string command = "-big:" + std::string(100000, 'v');
    for (int i = 0; i < 10000; ++i) command += " -k" + std::to_string(i) + ":" + std::to_string(i);
    zkCommandLineParser p(zkStringBase(command.c_str()));
    EXPECT_EQ(1, p.ParseCommand());
    EXPECT_EQ(100000u, p.GetValue("big").length());
    EXPECT_EQ("0|4985|9999", entries(p, {"k0", "k4985", "k9999"}));
    // Entries get buffers of their own size, not that of the longest item parsed.
    EXPECT_LT(p.GetValue("k9999").capacity(), 1000u);
}

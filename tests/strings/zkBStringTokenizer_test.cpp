// Splitting a string with zkBStringTokenizer.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "support/zkStringText.h"
#include "zkBStringTokenizer.h"

// A source with k separator bytes gives k + 1 tokens; an empty source none.
// One separator and several take different paths; the rows cover both.
TEST(Tokenizer, OneMoreTokenThanSeparators) {
    const std::string crlf = zkText(zkBStringTokenizer::m_crlfToken), comma = zkText(zkBStringTokenizer::m_csvToken);
    // clang-format off
    const struct { std::string source, seps; bool strip; std::vector<std::string> tokens; } cases[] = {
        {"a,b,d", comma, false, {"a", "b", "d"}}, {"abc", comma, false, {"abc"}}, {"", comma, false, {}},
        {"", ",;", false, {}}, {"a,,b", comma, false, {"a", "", "b"}}, {",a", comma, false, {"", "a"}},
        {"a,", comma, false, {"a", ""}}, {"a;", ",;", false, {"a", ""}}, {",,,", comma, false, {"", "", "", ""}},
        {"x\r\ny", crlf, false, {"x", "", "y"}}, {"a,b", "", false, {"a,b"}}, {"k=v;w", "=;", false, {"k", "v", "w"}},
        {" a , b ", comma, true, {"a", "b"}}, {" a , b ", comma, false, {" a ", " b "}},
        {" \t;\tx y\n;\r", ";", true, {"", "x y", ""}}, {" \t;\tx y\n,\r", ",;", true, {"", "x y", ""}},
        {"one two", zkText(zkBStringTokenizer::m_spToken), false, {"one", "two"}},
        {{"a\0b", 3}, {"\0", 1}, false, {"a", "b"}}, {{"a\0b", 3}, comma, false, {{"a\0b", 3}}},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(c.source + " split at " + c.seps);
        const zkStringBase source = zkStr(c.source), seps = zkStr(c.seps);
        zkBStringTokenizer tok(source, seps, c.strip);
        std::vector<std::string> out;
        zkStringBase token("junk");
        while (out.size() < 64 && tok.GetNext(token)) out.push_back(zkText(token));
        EXPECT_EQ(c.tokens, out);
    }
}

// The source and the separators are read at each call; false leaves the
// token alone. A source cut below the position gives one empty token more.
TEST(Tokenizer, InputsAreReadAtEachCall) {
    zkStringBase source("a,b;c;d"), seps(","), token;
    zkBStringTokenizer tok(source, seps, false);
    EXPECT_TRUE(tok.GetNext(token));
    EXPECT_EQ("a", zkText(token));
    seps = ";";
    EXPECT_TRUE(tok.GetNext(token));
    EXPECT_EQ("b", zkText(token));
    source.cut(3);
    EXPECT_TRUE(tok.GetNext(token));
    EXPECT_EQ("", zkText(token));
    token = "kept";
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_EQ("kept", zkText(token));
}

// A token that is the source empties it first, which ends the walk; a token
// that is the separator set empties it, which leaves no separator.
TEST(Tokenizer, TokenMayBeTheSourceOrTheSeparators) {
    for (const char* sepText : {",", ",;"}) {
        SCOPED_TRACE(sepText);
        zkStringBase source("a,b"), seps(sepText);
        zkBStringTokenizer bySource(source, seps, false);
        EXPECT_TRUE(bySource.GetNext(source));
        EXPECT_EQ("", zkText(source));
        EXPECT_FALSE(bySource.GetNext(source));
        source = "a,b";
        zkBStringTokenizer bySeps(source, seps, false);
        EXPECT_TRUE(bySeps.GetNext(seps));
        EXPECT_EQ("a,b", zkText(seps));
        EXPECT_FALSE(bySeps.GetNext(seps));
    }
}

// Splitting a string with zkBStringTokenizer.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "zkBStringTokenizer.h"
#include "zkStringBase.h"

namespace {

zkStringBase str(const std::string& text) {
    return zkStringBase(text.data(), static_cast<unsigned>(text.size()));
}

std::string text(const zkStringBase& s) {
    EXPECT_EQ('\0', s.data()[s.length()]);
    return std::string(s.data(), s.length());
}

}  // namespace

// A source with k separator bytes gives k + 1 tokens; an empty source none.
TEST(Tokenizer, OneMoreTokenThanSeparatorsReadAtEachCall) {
    const std::string crlf = text(zkBStringTokenizer::m_crlfToken), comma = text(zkBStringTokenizer::m_csvToken);
    const struct {
        std::string source, seps;
        bool strip;
        std::vector<std::string> tokens;
    } cases[] = {
        {"a,b,d", comma, false, {"a", "b", "d"}},
        {"abc", comma, false, {"abc"}},
        {"", comma, false, {}},
        {"a,,b", comma, false, {"a", "", "b"}},
        {",a", comma, false, {"", "a"}},
        {"a,", comma, false, {"a", ""}},
        {",,,", comma, false, {"", "", "", ""}},
        {"x\r\ny", crlf, false, {"x", "", "y"}},
        {"a,b", "", false, {"a,b"}},
        {" a , b ", comma, true, {"a", "b"}},
        {" a , b ", comma, false, {" a ", " b "}},
        {" \t;\tx y\n;\r", ";", true, {"", "x y", ""}},
        {"k=v;w", "=;", false, {"k", "v", "w"}},
        {"one two", text(zkBStringTokenizer::m_spToken), false, {"one", "two"}},
        {{"a\0b", 3}, {"\0", 1}, false, {"a", "b"}},
        {{"a\0b", 3}, comma, false, {{"a\0b", 3}}},
    };
    for (const auto& c : cases) {
        const zkStringBase source = str(c.source), seps = str(c.seps);
        zkBStringTokenizer tok(source, seps, c.strip);
        std::vector<std::string> out;
        zkStringBase token("junk");
        while (out.size() < 64 && tok.GetNext(token)) out.push_back(text(token));
        EXPECT_EQ(c.tokens, out) << c.source;
    }

    // The source and the separators are read at each call; false leaves the
    // token alone. A source cut below the position gives one empty token more.
    zkStringBase source("a,b;c;d"), seps(","), token;
    zkBStringTokenizer tok(source, seps, false);
    EXPECT_TRUE(tok.GetNext(token) && text(token) == "a");
    seps = ";";
    EXPECT_TRUE(tok.GetNext(token) && text(token) == "b");
    source.cut(3);
    EXPECT_TRUE(tok.GetNext(token) && text(token).empty());
    token = "kept";
    EXPECT_FALSE(tok.GetNext(token) || tok.GetNext(token));
    EXPECT_EQ("kept", text(token));
}

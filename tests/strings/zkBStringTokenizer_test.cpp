// Splitting a string with zkBStringTokenizer.
#include "zkBStringTokenizer.h"
#include "zkStringBase.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using Tokens = std::vector<std::string>;

const zkStringBase& kComma = zkBStringTokenizer::m_csvToken;

// Every token the tokenizer hands out, in order, until it reports false.
Tokens tokens(const zkStringBase& source, const zkStringBase& seps, bool strip = false) {
    zkBStringTokenizer tok(source, seps, strip);
    Tokens out;
    zkStringBase token("junk");
    while (out.size() < 64 && tok.GetNext(token)) {
        EXPECT_EQ('\0', token.data()[token.length()]);
        out.emplace_back(token.data(), token.length());
    }
    return out;
}

std::string text(const zkStringBase& s) { return std::string(s.data(), s.length()); }

}  // namespace

TEST(Tokenizer, SharedSeparatorSets) {
    EXPECT_EQ(" ", text(zkBStringTokenizer::m_spToken));
    EXPECT_EQ("\r\n", text(zkBStringTokenizer::m_crlfToken));
    EXPECT_EQ(",", text(kComma));
}

TEST(Tokenizer, OneMoreTokenThanSeparators) {
    EXPECT_EQ((Tokens{"a", "b", "d"}), tokens(zkStringBase("a,b,d"), kComma));
    EXPECT_EQ((Tokens{"a", "b"}), tokens(zkStringBase("a,b"), kComma));
    EXPECT_EQ((Tokens{"abc"}), tokens(zkStringBase("abc"), kComma));
    EXPECT_EQ((Tokens{"x"}), tokens(zkStringBase("x"), kComma));
    EXPECT_EQ((Tokens{"one", "two"}), tokens(zkStringBase("one two"), zkBStringTokenizer::m_spToken));
    EXPECT_EQ((Tokens{}), tokens(zkStringBase(), kComma));
}

TEST(Tokenizer, EmptyTokensBetweenAdjacentSeparators) {
    EXPECT_EQ((Tokens{"a", "", "b"}), tokens(zkStringBase("a,,b"), kComma));
    EXPECT_EQ((Tokens{"", "a"}), tokens(zkStringBase(",a"), kComma));
    EXPECT_EQ((Tokens{"a", ""}), tokens(zkStringBase("a,"), kComma));
    EXPECT_EQ((Tokens{"", ""}), tokens(zkStringBase(","), kComma));
    EXPECT_EQ((Tokens{"", "", "", ""}), tokens(zkStringBase(",,,"), kComma));
    EXPECT_EQ((Tokens{"x", "", "y"}), tokens(zkStringBase("x\r\ny"), zkBStringTokenizer::m_crlfToken));
    EXPECT_EQ((Tokens{"x", "y", ""}), tokens(zkStringBase("x\ny\r"), zkBStringTokenizer::m_crlfToken));
}

TEST(Tokenizer, StripOnlyWhenAsked) {
    const zkStringBase source(" a , b ");
    EXPECT_EQ((Tokens{"a", "b"}), tokens(source, kComma, true));
    EXPECT_EQ((Tokens{" a ", " b "}), tokens(source, kComma, false));
    EXPECT_EQ((Tokens{"", "x y", ""}), tokens(zkStringBase(" \t;\tx y\n;\r"), zkStringBase(";"), true));
}

TEST(Tokenizer, SeparatorSetsAndZeroBytes) {
    EXPECT_EQ((Tokens{"k", "v", "w"}), tokens(zkStringBase("k=v;w"), zkStringBase("=;")));
    EXPECT_EQ((Tokens{"a", "b"}), tokens(zkStringBase("a\0b", 3), zkStringBase("\0", 1)));
    EXPECT_EQ((Tokens{std::string("a\0b", 3)}), tokens(zkStringBase("a\0b", 3), kComma));
    EXPECT_EQ((Tokens{"a,b"}), tokens(zkStringBase("a,b"), zkStringBase()));
}

TEST(Tokenizer, FalseLeavesTheLastToken) {
    zkStringBase token("kept");
    zkBStringTokenizer none(zkStringBase::NullStr, kComma, true);
    EXPECT_FALSE(none.GetNext(token));
    EXPECT_EQ("kept", text(token));

    const zkStringBase source("first,second");
    zkBStringTokenizer tok(source, kComma, false);
    ASSERT_TRUE(tok.GetNext(token));
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_EQ("second", text(token));
}

TEST(Tokenizer, ReadsSourceAndSeparatorsAtEachCall) {
    zkStringBase source("a,b;c");
    zkStringBase seps(",");
    zkBStringTokenizer tok(source, seps, false);
    zkStringBase token;
    ASSERT_TRUE(tok.GetNext(token));
    seps = ";";
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("b", text(token));
    source.append(";d");
    ASSERT_TRUE(tok.GetNext(token));
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("d", text(token));
    EXPECT_FALSE(tok.GetNext(token));

    // A source cut below the position hands out one empty token, then stops.
    zkStringBase shrinking("abc,def");
    zkBStringTokenizer cut(shrinking, kComma, false);
    ASSERT_TRUE(cut.GetNext(token));
    shrinking.cut(5);
    EXPECT_TRUE(cut.GetNext(token));
    EXPECT_EQ("", text(token));
    EXPECT_FALSE(cut.GetNext(token));
}

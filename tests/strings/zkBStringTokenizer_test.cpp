// Splitting a string with zkBStringTokenizer.
#include "zkBStringTokenizer.h"
#include "zkStringBase.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

// Every token the tokenizer hands out, in order, until it reports false.
std::vector<std::string> tokens(const zkStringBase& source, const zkStringBase& seps, bool strip = false) {
    zkBStringTokenizer tok(source, seps, strip);
    std::vector<std::string> out;
    zkStringBase token;
    while (tok.GetNext(token)) {
        EXPECT_EQ('\0', token.data()[token.length()]);
        out.emplace_back(token.data(), token.length());
        if (out.size() > 64) break;
    }
    return out;
}

using Tokens = std::vector<std::string>;

}  // namespace

TEST(Tokenizer, SharedSeparatorSets) {
    EXPECT_EQ(" ", std::string(zkBStringTokenizer::m_spToken.data()));
    EXPECT_EQ("\r\n", std::string(zkBStringTokenizer::m_crlfToken.data()));
    EXPECT_EQ(",", std::string(zkBStringTokenizer::m_csvToken.data()));
}

TEST(Tokenizer, OneMoreTokenThanSeparators) {
    const zkStringBase& csv = zkBStringTokenizer::m_csvToken;
    EXPECT_EQ((Tokens{"a", "b", "d"}), tokens(zkStringBase("a,b,d"), csv));
    EXPECT_EQ((Tokens{"a", "b"}), tokens(zkStringBase("a,b"), csv));
    EXPECT_EQ((Tokens{"abc"}), tokens(zkStringBase("abc"), csv));
    EXPECT_EQ((Tokens{"x"}), tokens(zkStringBase("x"), csv));
    EXPECT_EQ((Tokens{"one", "two", "three"}), tokens(zkStringBase("one two three"), zkBStringTokenizer::m_spToken));
}

TEST(Tokenizer, EmptyTokensBetweenAdjacentSeparators) {
    const zkStringBase& csv = zkBStringTokenizer::m_csvToken;
    EXPECT_EQ((Tokens{"a", "", "b"}), tokens(zkStringBase("a,,b"), csv));
    EXPECT_EQ((Tokens{"", "a"}), tokens(zkStringBase(",a"), csv));
    EXPECT_EQ((Tokens{"a", ""}), tokens(zkStringBase("a,"), csv));
    EXPECT_EQ((Tokens{"", ""}), tokens(zkStringBase(","), csv));
    EXPECT_EQ((Tokens{"", "", "", ""}), tokens(zkStringBase(",,,"), csv));
    EXPECT_EQ((Tokens{"x", "", "y"}), tokens(zkStringBase("x\r\ny"), zkBStringTokenizer::m_crlfToken));
    EXPECT_EQ((Tokens{"x", "y", ""}), tokens(zkStringBase("x\ny\r"), zkBStringTokenizer::m_crlfToken));
}

TEST(Tokenizer, EmptySourceYieldsNothing) {
    const zkStringBase empty;
    zkBStringTokenizer tok(empty, zkBStringTokenizer::m_csvToken, true);
    zkStringBase token("kept");
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_EQ("kept", std::string(token.data()));
}

TEST(Tokenizer, StripOnlyWhenAsked) {
    const zkStringBase source(" a , b ");
    EXPECT_EQ((Tokens{"a", "b"}), tokens(source, zkBStringTokenizer::m_csvToken, true));
    EXPECT_EQ((Tokens{" a ", " b "}), tokens(source, zkBStringTokenizer::m_csvToken, false));
    EXPECT_EQ((Tokens{"", "x y", ""}), tokens(zkStringBase(" \t;\tx y\n;\r"), zkStringBase(";"), true));
}

TEST(Tokenizer, SeparatorSetsAndZeroBytes) {
    EXPECT_EQ((Tokens{"k", "v", "w"}), tokens(zkStringBase("k=v;w"), zkStringBase("=;")));
    EXPECT_EQ((Tokens{"a", "b"}), tokens(zkStringBase("a\0b", 3), zkStringBase("\0", 1)));
    EXPECT_EQ((Tokens{std::string("a\0b", 3)}), tokens(zkStringBase("a\0b", 3), zkBStringTokenizer::m_csvToken));
    EXPECT_EQ((Tokens{"a,b"}), tokens(zkStringBase("a,b"), zkStringBase()));
}

TEST(Tokenizer, TokenReplacedEachCallAndKeptAfterTheEnd) {
    const zkStringBase source("first,second");
    zkBStringTokenizer tok(source, zkBStringTokenizer::m_csvToken, false);
    zkStringBase token("junk");
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("first", std::string(token.data()));
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("second", std::string(token.data()));
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_FALSE(tok.GetNext(token));
    EXPECT_EQ("second", std::string(token.data()));
    EXPECT_EQ(6u, token.length());
}

TEST(Tokenizer, ReadsSourceAndSeparatorsAtEachCall) {
    zkStringBase source("a,b;c");
    zkStringBase seps(",");
    zkBStringTokenizer tok(source, seps, false);
    zkStringBase token;
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("a", std::string(token.data()));
    seps = ";";
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("b", std::string(token.data()));
    source.append(";d");
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("c", std::string(token.data()));
    ASSERT_TRUE(tok.GetNext(token));
    EXPECT_EQ("d", std::string(token.data()));
    EXPECT_FALSE(tok.GetNext(token));

    // A source cut below the position hands out one empty token, then stops.
    zkStringBase shrinking("abc,def");
    zkBStringTokenizer cut(shrinking, zkBStringTokenizer::m_csvToken, false);
    ASSERT_TRUE(cut.GetNext(token));
    shrinking.cut(5);
    EXPECT_TRUE(cut.GetNext(token));
    EXPECT_EQ("", std::string(token.data()));
    EXPECT_FALSE(cut.GetNext(token));
}

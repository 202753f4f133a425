// Splitting a string with zkBStringTokenizer.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "support/zkStringText.h"
#include "support/zkTableFile.h"
#include "zkBStringTokenizer.h"

TEST(Tokenizer, OneMoreTokenThanSeparators) {
    zkForEachRow("str_tokens.txt", [](const auto& row) {
        const zkStringBase source = zkStr(row[0]), seps = zkStr(row[1]);
        zkBStringTokenizer tok(source, seps, row[2] == "strip");
        std::vector<std::string> out;
        zkStringBase token("junk");
        while (out.size() < 64 && tok.GetNext(token)) out.push_back(zkText(token));
        EXPECT_EQ(std::vector<std::string>(row.begin() + 3, row.end()), out);
    });
}

// A token that is the source empties it first, which ends the walk; a token
// that is the separator set empties it, which leaves no separator.
TEST(Tokenizer, TokenMayBeTheSourceOrTheSeparators) {
    for (const char* sepText : {",", ",;"}) {
        SCOPED_TRACE(sepText);
        zkStringBase source("a,b"), seps(sepText);
        zkBStringTokenizer bySource(source, seps, false), bySeps(source, seps, false);
        EXPECT_TRUE(bySource.GetNext(source));
        EXPECT_EQ("", zkText(source));
        EXPECT_FALSE(bySource.GetNext(source));
        source = "a,b";
        EXPECT_TRUE(bySeps.GetNext(seps));
        EXPECT_EQ("a,b", zkText(seps));
        EXPECT_FALSE(bySeps.GetNext(seps));
    }
}

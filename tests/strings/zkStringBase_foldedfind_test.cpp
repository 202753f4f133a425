// Folded find over long strings, which skips ahead, against the same search
// over a short string, which tries every position.
#include <gtest/gtest.h>

#include <string>

#include "support/zkStringText.h"
#include "zkStringBase.h"

// The same tail behind a long filler that holds no match: the long search
// finds what the short one finds, shifted by the filler. Bytes from 0x80 up
// fold only as the locale says (not at all by default), and a match may end
// at the last byte.
TEST(StringSearch, FoldedFindSkipsAheadWithoutMissingAMatch) {
    const std::string filler(4096, '-');
    const struct {
        std::string tail;
        std::string pattern;
    } cases[] = {
        {"abc xyzXYZ", "xYz"},
        {"zz Hello\xC4\xE4 hello\xE4\xE4", "HELLO\xE4\xE4"},
        {"aaaaaaaaab", "AAB"},
        {"no match here", "MATCHES"},
        {"\xE9t\xC9T\xE9T", "\xC9t"},
        {"end", "END"},
        {"ba", "AB"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.tail);
        const zkStringBase shortText = zkStr(c.tail), longText = zkStr(filler + c.tail), pattern = zkStr(c.pattern);
        const unsigned expected = shortText.find(pattern, 0, false);
        const unsigned shifted = expected == zkStringBase::BadIndex ? expected : expected + 4096u;
        EXPECT_EQ(shifted, longText.find(pattern, 0, false));
        EXPECT_EQ(shifted, longText.find(pattern, 100, false));
    }
    EXPECT_EQ(4096u + 3u, zkStr(filler + "zz Hello").find(zkStr("HELLO"), 0, false));
    EXPECT_EQ(zkStringBase::BadIndex, zkStr(filler + "zz Hell").find(zkStr("HELLO"), 0, false));
}

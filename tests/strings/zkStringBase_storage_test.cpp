// Construction, the growth rule, assignment and editing of zkStringBase.
#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <new>
#include <string>

#include "support/zkStringText.h"
#include "zkStringBase.h"

constexpr unsigned kSlack = 128;
using Op = void (*)(zkStringBase&);
using S = zkStringBase;

// Counts the calls of resize(), to prove that all growth goes through it.
struct CountingString : zkStringBase {
    using zkStringBase::zkStringBase;
    void resize(unsigned n) override {
        ++calls;
        zkStringBase::resize(n);
    }
    unsigned calls = 0;
};

// A copy keeps the capacity, leaving room for the terminator when an adopted
// buffer recorded its length as its capacity; concatenate copies the first
// string and stops the second at a zero byte.
TEST(StringConstruction, CapacityIsTheTextAndTheSlack) {
    zkStringBase wide("abcd");
    wide.reserve(40);
    char* tight = new char[4];
    std::strcpy(tight, "abc");
    zkStringBase adopted(tight, 0, 99), zero(0u);
    EXPECT_EQ(tight, adopted.data());
    EXPECT_EQ(3u, adopted.capacity());
    zero.append("ab");
    // clang-format off
    const struct { zkStringBase s; std::string text; unsigned capacity; } cases[] = {
        {S(), "", kSlack}, {S("abc"), "abc", 3 + kSlack}, {S("abc", 0), "", kSlack}, {S(nullptr), "", kSlack},
        {S(nullptr, 5), "", kSlack}, {S("a\0b", 3), {"a\0b", 3}, 3 + kSlack}, {S(16u), "", 16}, {S(0u), "", 1},
        {zero, "ab", 3 + kSlack}, {S(adopted), "abc", 4}, {S(wide), "abcd", 40},
        {S::concatenate(wide, S("ef\0g", 4)), "abcdef", 40},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text);
        EXPECT_EQ(c.text, zkText(c.s));
        EXPECT_EQ(c.capacity, c.s.capacity());
    }
}

// Copies and assigned strings keep the compare type; an assigned text keeps
// the target's.
TEST(StringConstruction, CopiesKeepTheCompareType) {
    zkStringBase src("Abc"), dst;
    src.setCompareType(zkStringBase::CaseInsensitive);
    src = "abcd";
    dst = src;
    EXPECT_EQ(zkStringBase::CaseInsensitive, src.getCompareType());
    EXPECT_EQ(zkStringBase::CaseInsensitive, dst.getCompareType());
    EXPECT_EQ(zkStringBase::CaseInsensitive, S(src).getCompareType());
    EXPECT_EQ(zkStringBase::CaseInsensitive, S::concatenate(src, dst).getCompareType());
}

// Each edit starts from `start`, reserved to `room` bytes unless that is 0;
// a growth adds the slack to what is needed and goes through resize(), and
// nothing else reallocates.
TEST(StringGrowth, EditsGrowByTheRule) {
    const unsigned big = static_cast<unsigned>(std::to_string(1e300).size());
    const unsigned longMin = static_cast<unsigned>(std::to_string(LONG_MIN).size());
    // clang-format off
    const struct { const char* start; unsigned room; Op op; std::string text; unsigned capacity, resizes; } cases[] = {
        {"", 0, [](S& s) { for (int i = 0; i < 127; ++i) s.append('x'); }, std::string(127, 'x'), kSlack, 0},
        {"", 0, [](S& s) { for (int i = 0; i < 128; ++i) s.append('x'); }, std::string(128, 'x'), 129 + kSlack, 1},
        {"", 4, [](S& s) { s = "abc"; }, "abc", 4, 0},
        {"", 4, [](S& s) { s = "abcd"; }, "abcd", 4 + kSlack, 1},
        {"", 2, [](S& s) { s = 'x'; }, "x", 2, 0},
        {"", 1, [](S& s) { s = 'x'; }, "x", 1 + kSlack, 1},
        {"abc", 8, [](S& s) { for (char c : std::string("defg")) s.fappend(c); }, "abcdefg", 8, 0},
        {"abc", 8, [](S& s) { for (char c : std::string("defgh")) s.fappend(c); }, "abcdefgh", 9 + kSlack, 1},
        {"ac", 3, [](S& s) { s.insert("b", 1); }, "abc", 4 + kSlack, 1},
        {"v=", 3, [](S& s) { s += -1e300; }, "v=" + std::to_string(-1e300), 2 + big + 2 + kSlack, 1},
        {"", 2, [](S& s) { s.fromDouble(1e300, 6); }, std::to_string(1e300), big + kSlack, 1},
        {"", 1, [](S& s) { s.fromLong(LONG_MIN); }, std::to_string(LONG_MIN), longMin + kSlack, 1},
        // Sources inside the string's own buffer, which growth releases.
        {"abc", 4, [](S& s) { s.append(s); }, "abcabc", 7 + kSlack, 1},
        {"abab", 5, [](S& s) { s.insert(s.data(), 1, 2); }, "aabbab", 7 + kSlack, 1},
        {"abcd", 0, [](S& s) { s = s.data() + 2; }, "cd", 4 + kSlack, 0},
        // Below length + 1 a request is clamped, never losing text.
        {"abc", 8, [](S& s) { s.reserve(2); }, "abc", 4, 1},
        {"abc", 8, [](S& s) { s.resize(0); }, "abc", 4, 1},
        {"abc", 8, [](S& s) { s.resize(3); }, "abc", 4, 1},
        {"abc", 0, [](S& s) { s.cut(10); }, "", 3 + kSlack, 0},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text);
        CountingString s(c.start);
        if (c.room != 0) s.reserve(c.room);
        s.calls = 0;
        c.op(s);
        EXPECT_EQ(c.text, zkText(s));
        EXPECT_EQ(c.resizes, s.calls);
        EXPECT_EQ(c.capacity, s.capacity());
    }
}

// With no slack every buffer still has room for the terminator.
TEST(StringGrowth, ZeroSlackLeavesRoomForTheTerminator) {
    const unsigned saved = zkStringBase::_sGrowLength;
    zkStringBase::_sGrowLength = 0;
    zkStringBase empty, abc("abc"), appended("ab"), assigned;
    appended.append("cd");
    assigned = "abcdefgh";
    zkStringBase::_sGrowLength = saved;
    EXPECT_EQ(1u, empty.capacity());
    EXPECT_EQ(4u, abc.capacity());
    EXPECT_EQ(5u, appended.capacity());
    EXPECT_EQ(9u, assigned.capacity());
}

// Ranges are clamped to the text; a null or empty source adds nothing.
TEST(StringEditing, EditsClampTheirRanges) {
    // clang-format off
    const struct { const char* start; Op op; std::string text; } cases[] = {
        {"x", [](S& s) { s.append("", 0).append(nullptr, 5).prepend(nullptr).insert(nullptr, 0); }, "x"},
        {"x", [](S& s) { s.append("ab", 1).append("cd\0e", 0).append(S("\0z", 2)).append('\0'); }, {"xacd\0z\0", 7}},
        {"cd", [](S& s) { s.prepend("ab").prepend('>').prepend(S("\0", 1)); }, {"\0>abcd", 6}},
        {"abc", [](S& s) { s.insert("xy", 1).insert("xy", 0, 0).insert("<>", 99, 1); }, "xyaxybc<"},
        {"abc", [](S& s) { s.insert(S("1\0", 2), 2).insert(S("0"), 0); }, {"0ab1\0c", 6}},
        {"abcdef", [](S& s) { s.del(1, 2).del(4, 2).del(4, 12).del(3, 3).erase(1, S::BadIndex); }, "a"},
        {"abc", [](S& s) { s.cut(2).cut(0); }, "a"},
        {"abcb", [](S& s) { s.replace("b", "XY", 0, true).replace("b", nullptr, 3, true); }, "aXYc"},
        {"aXYcb", [](S& s) { s.replace("xy", "-", 0, true).replace("xy", "-", 0, false); }, "a-cb"},
        {"abcd", [](S& s) { s.replace("X", 1, 2).replace(S("<>"), 0, 0).replace("Z", 5, 9); }, "<>XdZ"},
        // A range ending before it starts, or starting past the end, adds nothing.
        {"", [](S& s) { s.appendSubString(S("hello"), 1, 3).appendSubString(S("hello"), 3, 99); }, "elllo"},
        {"", [](S& s) { s.appendSubString(S("hello"), 4, 4).appendSubString(S("hello"), 5, 9); }, "o"},
        {"", [](S& s) { s.appendSubString(S("hello"), 3, 1).appendSubString(S(), 0, 0); }, ""},
    };
    // clang-format on
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text);
        CountingString s(c.start);
        c.op(s);
        EXPECT_EQ(c.text, zkText(s));
        EXPECT_EQ(0u, s.calls);
    }
}

// Also when the source lies in the string's own buffer.
TEST(StringLimits, LengthPastThirtyTwoBitsThrowsWithTheTextKept) {
    // clang-format off
    const Op ops[] = {
        [](S& s) { s.append("y", 0xFFFFFFFFu); }, [](S& s) { s.append("y", 0xFFFFFFFDu); },
        [](S& s) { s.prepend("y", 0xFFFFFFFEu); }, [](S& s) { s.insert("y", 1, 0xFFFFFFFDu); },
        [](S& s) { s.append(s.data(), 0xFFFFFFFFu); }, [](S& s) { s.insert(s.data(), 1, 0xFFFFFFFEu); },
    };
    // clang-format on
    for (Op op : ops) {
        SCOPED_TRACE(&op - ops);
        zkStringBase s("xz");
        EXPECT_THROW(op(s), std::bad_alloc);
        EXPECT_EQ("xz", zkText(s));
        EXPECT_EQ(2u + kSlack, s.capacity());
    }
}

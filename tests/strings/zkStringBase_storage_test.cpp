// Construction, the growth rule, assignment and editing of zkStringBase.
#include "zkStringBase.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <cstring>
#include <new>
#include <string>

namespace {

constexpr unsigned kSlack = 128;

// The bytes of s, after checking that the terminator is in place.
std::string bytes(const zkStringBase& s) {
    EXPECT_EQ('\0', s.data()[s.length()]);
    return std::string(s.data(), s.length());
}

// Counts every reallocation, to prove that growth goes through resize().
class CountingString : public zkStringBase {
public:
    using zkStringBase::zkStringBase;
    using zkStringBase::operator=;
    void resize(unsigned newCapacity) override {
        ++calls;
        last = newCapacity;
        zkStringBase::resize(newCapacity);
    }
    unsigned calls = 0;
    unsigned last = 0;
};

// The resize() calls that op makes on an empty string of the given capacity.
template <class Op>
unsigned resizesBy(unsigned capacity, Op op) {
    CountingString s(capacity);
    op(s);
    return s.calls;
}

}  // namespace

TEST(StringConstruction, CapacitiesAndCompareType) {
    zkStringBase empty;
    EXPECT_EQ("", bytes(empty));
    EXPECT_EQ(kSlack, empty.capacity());
    EXPECT_EQ(zkStringBase::CaseSensitive, empty.getCompareType());
    EXPECT_TRUE(zkStringBase::NullStr.isNull());

    zkStringBase abc("abc");
    EXPECT_EQ(3u + kSlack, abc.capacity());
    zkStringBase notMeasured("abc", 0);
    EXPECT_EQ("", bytes(notMeasured));
    EXPECT_EQ(kSlack, notMeasured.capacity());
    zkStringBase withZero("a\0b", 3);
    EXPECT_EQ(std::string("a\0b", 3), bytes(withZero));
    EXPECT_EQ(3u + kSlack, withZero.capacity());

    const char* none = nullptr;
    EXPECT_EQ("", bytes(zkStringBase(none)));
    EXPECT_EQ("", bytes(zkStringBase(none, 5)));
    EXPECT_EQ(16u, zkStringBase(16u).capacity());

    zkStringBase zero(0u);
    EXPECT_GE(zero.capacity(), 1u);
    ASSERT_NE(nullptr, zero.data());
    EXPECT_STREQ("", zero.data());
    zero.append("ab");
    EXPECT_EQ("ab", bytes(zero));
}

TEST(StringConstruction, CopyAndAdoptedBuffers) {
    zkStringBase src("a\0bc", 4);
    src.setCompareType(zkStringBase::CaseInsensitive);
    src.reserve(40);
    zkStringBase copy(src);
    EXPECT_EQ(std::string("a\0bc", 4), bytes(copy));
    EXPECT_EQ(40u, copy.capacity());
    EXPECT_EQ(zkStringBase::CaseInsensitive, copy.getCompareType());

    char* buf = new char[10];
    std::strcpy(buf, "abc");
    zkStringBase adopted(buf, 10, 99);
    EXPECT_EQ(buf, adopted.data());
    EXPECT_EQ(3u, adopted.length());
    EXPECT_EQ(10u, adopted.capacity());

    char* tight = new char[4];
    std::strcpy(tight, "abc");
    zkStringBase exact(tight, 0, 0);
    EXPECT_EQ(3u, exact.capacity());
    zkStringBase exactCopy(exact);
    EXPECT_EQ("abc", bytes(exactCopy));
    EXPECT_GE(exactCopy.capacity(), 4u);
    exact.append('d');
    EXPECT_EQ("abcd", bytes(exact));
    EXPECT_EQ(3u + 2 + kSlack, exact.capacity());
}

TEST(StringGrowth, OneGrowthAt128thCharacter) {
    zkStringBase s;
    for (int i = 0; i < 127; ++i) s.append('x');
    EXPECT_EQ(kSlack, s.capacity());
    s.append('x');
    EXPECT_EQ(std::string(128, 'x'), bytes(s));
    EXPECT_EQ(129u + kSlack, s.capacity());

    // The slack is read at each growth.
    const unsigned saved = zkStringBase::_sGrowLength;
    zkStringBase::_sGrowLength = 3;
    s.reserve(130);
    s.append("ab");
    zkStringBase::_sGrowLength = saved;
    EXPECT_EQ(131u + 3, s.capacity());
}

TEST(StringGrowth, EveryGrowthGoesThroughVirtualResize) {
    CountingString chars;
    for (int i = 0; i < 128; ++i) chars.append('x');
    EXPECT_EQ(1u, chars.calls);
    EXPECT_EQ(257u, chars.last);

    CountingString assigned(4u);
    assigned = "abcd";
    EXPECT_EQ(1u, assigned.calls);
    EXPECT_EQ(4u + kSlack, assigned.last);

    EXPECT_EQ(1u, resizesBy(4, [](zkStringBase& s) { s.prepend("abcd"); }));
    EXPECT_EQ(1u, resizesBy(2, [](zkStringBase& s) { s.insert("abc", 0); }));
    EXPECT_EQ(1u, resizesBy(2, [](zkStringBase& s) { s = zkStringBase("abc"); }));
    EXPECT_EQ(1u, resizesBy(1, [](zkStringBase& s) { s = 'x'; }));
    EXPECT_EQ(1u, resizesBy(1, [](zkStringBase& s) { s.fappend('x'); }));
    EXPECT_EQ(1u, resizesBy(9, [](zkStringBase& s) { s.reserve(9); }));
    EXPECT_EQ(1u, resizesBy(2, [](zkStringBase& s) { s.appendSubString(zkStringBase("hello"), 0, 9); }));
    EXPECT_EQ(1u, resizesBy(2, [](zkStringBase& s) { s.append(1e300); }));
    EXPECT_EQ(1u, resizesBy(2, [](zkStringBase& s) { s.fromDouble(1e300, 2); }));
    EXPECT_EQ(1u, resizesBy(1, [](zkStringBase& s) { s.fromLong(5); }));
    EXPECT_EQ(2u, resizesBy(3, [](zkStringBase& s) { s = "ac"; s.reserve(3); s.insert("b", 1); }));
}

TEST(StringAssignment, CompareTypeAndGrowthAtCapacity) {
    zkStringBase s(4u);
    s.setCompareType(zkStringBase::CaseInsensitive);
    s = "abc";
    EXPECT_EQ(4u, s.capacity());
    s = "abcd";
    EXPECT_EQ("abcd", bytes(s));
    EXPECT_EQ(4u + kSlack, s.capacity());
    EXPECT_EQ(zkStringBase::CaseInsensitive, s.getCompareType());

    const char* none = nullptr;
    s = none;
    s = s.data();
    EXPECT_EQ("abcd", bytes(s));
    s = s.data() + 2;
    EXPECT_EQ("cd", bytes(s));

    zkStringBase dst(3u);
    dst = s;
    EXPECT_EQ(zkStringBase::CaseInsensitive, dst.getCompareType());
    dst = zkStringBase("a\0b", 3);
    EXPECT_EQ(std::string("a\0b", 3), bytes(dst));
    EXPECT_EQ(3u + kSlack, dst.capacity());
    EXPECT_EQ(zkStringBase::CaseSensitive, dst.getCompareType());

    dst = 'x';
    EXPECT_EQ("x", bytes(dst));
    // Without room for the character and the terminator it grows.
    for (unsigned capacity : {0u, 1u}) {
        zkStringBase tiny(capacity);
        tiny = 'y';
        EXPECT_EQ("y", bytes(tiny));
    }
}

TEST(StringEditing, AppendCountsNullsAndNumbers) {
    zkStringBase s("x");
    const char* none = nullptr;
    s.append("", 0).append(none, 5).append(none);
    EXPECT_EQ("x", bytes(s));
    s.append("abc", 2).append("cd\0ef", 0);
    EXPECT_EQ("xabcd", bytes(s));
    s.append("\0z", 2).append('\0');
    EXPECT_EQ(std::string("xabcd\0z\0", 8), bytes(s));

    s = "";
    s.append(zkStringBase("p\0q", 3)).append(-42L);
    s += zkStringBase("+");
    s += "r";
    s += 's';
    s += 7L;
    s += 1.5;
    EXPECT_EQ(std::string("p\0q-42+rs71.500000", 18), bytes(s));
}

TEST(StringEditing, AppendDoubleWritesTheWholeText) {
    for (double v : {1e25, 1e300, -1e300}) {
        char expected[512];
        std::snprintf(expected, sizeof expected, "v=%f", v);
        zkStringBase s("v=");
        s.append(v);
        EXPECT_EQ(expected, bytes(s));
        zkStringBase op("v=");
        op += v;
        EXPECT_EQ(expected, bytes(op));
    }
}

TEST(StringEditing, PrependAndInsert) {
    zkStringBase s("cd");
    const char* none = nullptr;
    s.prepend("ab").prepend('>').prepend(none).prepend("", 0);
    s.prepend(zkStringBase("\0", 1));
    EXPECT_EQ(std::string("\0>abcd", 6), bytes(s));

    zkStringBase t("abc");
    t.insert("xy", 1);
    EXPECT_EQ("axybc", bytes(t));
    t.insert("xy", 0, 0).insert("<>", 99, 1).insert(none, 2);
    EXPECT_EQ("xyaxybc<", bytes(t));
    t.insert(zkStringBase("1\0", 2), 3).insert(zkStringBase("0"), 0);
    EXPECT_EQ(std::string("0xya1\0xybc<", 11), bytes(t));
}

TEST(StringEditing, DelEraseAndCutClamp) {
    zkStringBase s("abcdef");
    s.del(1, 2);
    EXPECT_EQ("adef", bytes(s));
    s.del(4, 2).del(9, 12);
    EXPECT_EQ("adef", bytes(s));
    s.del(3, zkStringBase::BadIndex);
    EXPECT_EQ("ade", bytes(s));
    s.erase(1, 100);
    EXPECT_EQ("a", bytes(s));
    s.del(0, 0).del(0, 5);
    EXPECT_EQ("", bytes(s));

    zkStringBase c("abc");
    c.cut(2).cut(0);
    EXPECT_EQ("a", bytes(c));
    c.cut(10);
    EXPECT_EQ("", bytes(c));
    EXPECT_EQ(3u + kSlack, c.capacity());
}

TEST(StringEditing, ReplaceFirstOccurrenceAndRanges) {
    zkStringBase s("abcb");
    s.replace("b", "XY", 0, true);
    EXPECT_EQ("aXYcb", bytes(s));
    s.replace("q", "Z", 0, true).replace("a", "Z", 1, true).replace("xy", "-", 0, true);
    EXPECT_EQ("aXYcb", bytes(s));
    s.replace("xy", "-", 0, false).replace("b", nullptr, 0, true);
    EXPECT_EQ("a-c", bytes(s));

    zkStringBase r("abcd");
    r.replace("X", 1, 2);
    EXPECT_EQ("aXd", bytes(r));
    r.replace(zkStringBase("<>"), 0, 0);
    EXPECT_EQ("<>Xd", bytes(r));
    zkStringBase three("abc");
    three.replace("Z", 5, 9);
    EXPECT_EQ("abcZ", bytes(three));
}

TEST(StringEditing, AppendSubStringClampsRange) {
    const zkStringBase hello("hello");
    zkStringBase s;
    s.appendSubString(hello, 1, 3);
    EXPECT_EQ("ell", bytes(s));
    s.appendSubString(hello, 1, zkStringBase::BadIndex).appendSubString(hello, 3, 99);
    EXPECT_EQ("ellellolo", bytes(s));
    s.appendSubString(hello, 5, 9).appendSubString(hello, 3, 1).appendSubString(zkStringBase(), 0, 0);
    s.appendSubString(hello, 4, 4);
    EXPECT_EQ("ellelloloo", bytes(s));
}

TEST(StringEditing, ConcatenateKeepsFirstCapacityAndCompareType) {
    zkStringBase a("ab");
    a.setCompareType(zkStringBase::CaseInsensitive);
    zkStringBase joined = zkStringBase::concatenate(a, zkStringBase("cd\0e", 4));
    EXPECT_EQ("abcd", bytes(joined));
    EXPECT_EQ(a.capacity(), joined.capacity());
    EXPECT_EQ(zkStringBase::CaseInsensitive, joined.getCompareType());
    EXPECT_EQ("ab", bytes(a));
}

TEST(StringEditing, SelfSourcesGiveTheDoubledText) {
    zkStringBase s(4u);
    s = "abc";
    s.append(s);
    EXPECT_EQ("abcabc", bytes(s));
    s.reserve(7);
    s.append(s.data() + 1, 2);
    EXPECT_EQ("abcabcbc", bytes(s));
    s.reserve(9);
    s += s.data();
    EXPECT_EQ("abcabcbcabcabcbc", bytes(s));

    zkStringBase p("ab");
    p.prepend(p);
    EXPECT_EQ("abab", bytes(p));
    p.reserve(5);
    p.insert(p.data(), 1, 2);
    EXPECT_EQ("aabbab", bytes(p));
    p.appendSubString(p, 0, 1);
    EXPECT_EQ("aabbabaa", bytes(p));
}

TEST(StringStorage, ReserveResizeAndAccessors) {
    zkStringBase s("abc");
    s.reserve(1000);
    EXPECT_EQ(1000u, s.capacity());
    s.reserve(10);
    EXPECT_EQ(10u, s.capacity());
    // Below length + 1 the request is clamped, never losing text.
    s.reserve(2);
    EXPECT_EQ(4u, s.capacity());
    s.resize(0);
    EXPECT_EQ(4u, s.capacity());
    EXPECT_EQ("abc", bytes(s));

    s.reserve(8);
    for (char ch : {'d', 'e', 'f', 'g'}) s.fappend(ch);
    EXPECT_EQ(8u, s.capacity());
    s.fappend('h');
    EXPECT_EQ("abcdefgh", bytes(s));
    zkStringBase tiny(1u);
    tiny.fappend('x');
    tiny.fappend('y');
    EXPECT_EQ("xy", bytes(tiny));

    EXPECT_EQ('h', s.getLast());
    const unsigned capacity = s.capacity();
    s.makeNull();
    EXPECT_EQ("", bytes(s));
    EXPECT_EQ(capacity, s.capacity());
    EXPECT_EQ('\0', s.getLast());
}

TEST(StringLimits, LengthPastThirtyTwoBitsThrowsAndKeepsText) {
    zkStringBase a("x");
    EXPECT_THROW(a.append("y", 0xFFFFFFFFu), std::bad_alloc);
    EXPECT_THROW(a.append("y", 0xFFFFFFFEu), std::bad_alloc);
    EXPECT_THROW(a.prepend("y", 0xFFFFFFFFu), std::bad_alloc);
    EXPECT_THROW(a.prepend("y", 0xFFFFFFFEu), std::bad_alloc);
    EXPECT_EQ("x", bytes(a));

    zkStringBase b("xz");
    EXPECT_THROW(b.insert("y", 1, 0xFFFFFFFFu), std::bad_alloc);
    EXPECT_THROW(b.insert("y", 0, 0xFFFFFFFEu), std::bad_alloc);
    EXPECT_THROW(b.insert("y", 2, 0xFFFFFFFDu), std::bad_alloc);
    EXPECT_EQ("xz", bytes(b));
    EXPECT_EQ(2u + kSlack, b.capacity());

    // Also when the source lies in the string's own buffer.
    EXPECT_THROW(b.append(b.data(), 0xFFFFFFFFu), std::bad_alloc);
    EXPECT_THROW(b.insert(b.data(), 1, 0xFFFFFFFEu), std::bad_alloc);
    EXPECT_EQ("xz", bytes(b));
}

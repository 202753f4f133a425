// Construction, the growth rule, assignment and editing of zkStringBase.
#include "zkStringBase.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <cstring>
#include <new>
#include <string>

namespace {

// The bytes of s, after checking that the terminator is in place.
std::string bytes(const zkStringBase& s) {
    EXPECT_EQ('\0', s.data()[s.length()]);
    return std::string(s.data(), s.length());
}

std::string printed(const char* format, double value) {
    char buf[512];
    std::snprintf(buf, sizeof buf, format, value);
    return buf;
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

constexpr unsigned kSlack = 128;

}  // namespace

TEST(StringConstruction, CapacitiesAndCompareType) {
    zkStringBase empty;
    EXPECT_EQ(0u, empty.length());
    EXPECT_EQ(kSlack, empty.capacity());
    EXPECT_STREQ("", empty.data());
    EXPECT_EQ(zkStringBase::CaseSensitive, empty.getCompareType());
    EXPECT_TRUE(empty.isNull());

    zkStringBase abc("abc");
    EXPECT_EQ("abc", bytes(abc));
    EXPECT_EQ(3u + kSlack, abc.capacity());

    zkStringBase notMeasured("abc", 0);
    EXPECT_EQ("", bytes(notMeasured));
    EXPECT_EQ(kSlack, notMeasured.capacity());

    zkStringBase withZero("a\0b", 3);
    EXPECT_EQ(std::string("a\0b", 3), bytes(withZero));
    EXPECT_EQ(3u + kSlack, withZero.capacity());

    const char* none = nullptr;
    zkStringBase fromNull(none);
    EXPECT_EQ("", bytes(fromNull));
    zkStringBase fromNullCounted(none, 5);
    EXPECT_EQ("", bytes(fromNullCounted));

    zkStringBase sized(16u);
    EXPECT_EQ("", bytes(sized));
    EXPECT_EQ(16u, sized.capacity());

    EXPECT_TRUE(zkStringBase::NullStr.isNull());
    EXPECT_STREQ("", zkStringBase::NullStr.data());
}

TEST(StringConstruction, ZeroCapacityStillHoldsTheTerminator) {
    zkStringBase s(0u);
    EXPECT_GE(s.capacity(), 1u);
    ASSERT_NE(nullptr, s.data());
    EXPECT_STREQ("", s.data());
    s.append("ab");
    EXPECT_EQ("ab", bytes(s));
}

TEST(StringConstruction, CopyKeepsBytesCapacityAndCompareType) {
    zkStringBase src("a\0bc", 4);
    src.setCompareType(zkStringBase::CaseInsensitive);
    src.reserve(40);
    zkStringBase copy(src);
    EXPECT_EQ(std::string("a\0bc", 4), bytes(copy));
    EXPECT_EQ(40u, copy.capacity());
    EXPECT_EQ(zkStringBase::CaseInsensitive, copy.getCompareType());
    EXPECT_NE(src.data(), copy.data());
}

TEST(StringConstruction, AdoptsBufferWithoutCopying) {
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
    zkStringBase copy(exact);
    EXPECT_EQ("abc", bytes(copy));
    EXPECT_GE(copy.capacity(), 4u);
    exact.append('d');
    EXPECT_EQ("abcd", bytes(exact));
    EXPECT_EQ(3u + 2 + kSlack, exact.capacity());
}

TEST(StringGrowth, OneGrowthAt128thCharacter) {
    zkStringBase s;
    for (int i = 0; i < 127; ++i) s.append('x');
    EXPECT_EQ(kSlack, s.capacity());
    s.append('x');
    EXPECT_EQ(128u, s.length());
    EXPECT_EQ(129u + kSlack, s.capacity());
    EXPECT_EQ(std::string(128, 'x'), bytes(s));
}

TEST(StringGrowth, SlackIsReadAtEachGrowth) {
    zkStringBase s("abcd");
    const unsigned saved = zkStringBase::_sGrowLength;
    zkStringBase::_sGrowLength = 3;
    s.reserve(5);
    s.append("ef");
    EXPECT_EQ(6u + 1 + 3, s.capacity());
    zkStringBase::_sGrowLength = saved;
    EXPECT_EQ("abcdef", bytes(s));
}

TEST(StringGrowth, EveryGrowthGoesThroughVirtualResize) {
    CountingString chars;
    for (int i = 0; i < 128; ++i) chars.append('x');
    EXPECT_EQ(1u, chars.calls);
    EXPECT_EQ(257u, chars.last);

    CountingString pre(4u);
    pre.prepend("abcd");
    EXPECT_EQ(1u, pre.calls);
    EXPECT_EQ(5u + kSlack, pre.last);

    CountingString ins("ac");
    ins.reserve(3);
    ins.insert("b", 1);
    EXPECT_EQ(2u, ins.calls);
    EXPECT_EQ(4u + kSlack, ins.last);
    EXPECT_EQ("abc", bytes(ins));

    CountingString assigned(4u);
    assigned = "abcd";
    EXPECT_EQ(1u, assigned.calls);
    EXPECT_EQ(4u + kSlack, assigned.last);
    assigned = zkStringBase("0123456789abcdefghijklmnopqrstuvwxyz0123456789abcdefghijklmnopqrstuvwxyz"
                            "0123456789abcdefghijklmnopqrstuvwxyz0123456789abcdefghijklmnopqrstuvwxyz");
    EXPECT_EQ(2u, assigned.calls);
    EXPECT_EQ(144u + kSlack, assigned.last);

    CountingString one(1u);
    one = 'x';
    EXPECT_EQ(1u, one.calls);
    CountingString fapp(1u);
    fapp.fappend('x');
    EXPECT_EQ(1u, fapp.calls);

    CountingString sub(2u);
    sub.appendSubString(zkStringBase("hello"), 0, zkStringBase::BadIndex);
    EXPECT_EQ(1u, sub.calls);

    CountingString num(2u);
    num.append(1e300);
    EXPECT_EQ(1u, num.calls);
    CountingString dbl(2u);
    dbl.fromDouble(1e300, 2);
    EXPECT_EQ(1u, dbl.calls);
    CountingString lng(1u);
    lng.fromLong(5);
    EXPECT_EQ(1u, lng.calls);
    EXPECT_EQ("5", bytes(lng));
}

TEST(StringAssignment, CharPointerKeepsCompareTypeAndGrowsAtCapacity) {
    zkStringBase s(4u);
    s.setCompareType(zkStringBase::CaseInsensitive);
    s = "abc";
    EXPECT_EQ("abc", bytes(s));
    EXPECT_EQ(4u, s.capacity());
    s = "abcd";
    EXPECT_EQ("abcd", bytes(s));
    EXPECT_EQ(4u + kSlack, s.capacity());
    EXPECT_EQ(zkStringBase::CaseInsensitive, s.getCompareType());

    const char* none = nullptr;
    s = none;
    EXPECT_EQ("abcd", bytes(s));
    s = s.data();
    EXPECT_EQ("abcd", bytes(s));
    s = s.data() + 2;
    EXPECT_EQ("cd", bytes(s));
}

TEST(StringAssignment, StringTakesTextAndCompareType) {
    zkStringBase src("a\0b", 3);
    src.setCompareType(zkStringBase::CaseInsensitive);
    zkStringBase dst(3u);
    dst = src;
    EXPECT_EQ(std::string("a\0b", 3), bytes(dst));
    EXPECT_EQ(3u + kSlack, dst.capacity());
    EXPECT_EQ(zkStringBase::CaseInsensitive, dst.getCompareType());
    dst = dst;
    EXPECT_EQ(std::string("a\0b", 3), bytes(dst));
}

TEST(StringAssignment, SingleCharacterGrowsWhenThereIsNoRoom) {
    zkStringBase s("long text");
    s = 'x';
    EXPECT_EQ("x", bytes(s));
    zkStringBase tiny(1u);
    tiny = 'y';
    EXPECT_EQ("y", bytes(tiny));
    EXPECT_GE(tiny.capacity(), 2u);
    zkStringBase none(0u);
    none = 'z';
    EXPECT_EQ("z", bytes(none));
}

TEST(StringEditing, AppendCountsAndNulls) {
    zkStringBase s("x");
    const char* none = nullptr;
    s.append("", 0).append(none, 5).append(none);
    EXPECT_EQ("x", bytes(s));
    s.append("abc", 2);
    EXPECT_EQ("xab", bytes(s));
    s.append("cd\0ef", 0);
    EXPECT_EQ("xabcd", bytes(s));
    s.append("\0z", 2).append('\0');
    EXPECT_EQ(std::string("xabcd\0z\0", 8), bytes(s));
    s = "";
    s.append(zkStringBase("p\0q", 3)).append(-42L);
    s += zkStringBase("+");
    s += "r";
    s += 's';
    s += 7L;
    EXPECT_EQ(std::string("p\0q-42+rs7", 10), bytes(s));
}

TEST(StringEditing, AppendDoubleWritesTheWholeText) {
    zkStringBase s("v=");
    s.append(1.5);
    EXPECT_EQ("v=1.500000", bytes(s));
    for (double v : {1e25, 1e300, -1e300}) {
        zkStringBase big("v=");
        big.append(v);
        EXPECT_EQ("v=" + printed("%f", v), bytes(big));
        zkStringBase op;
        op += v;
        EXPECT_EQ(printed("%f", v), bytes(op));
    }
}

TEST(StringEditing, PrependAndInsert) {
    zkStringBase s("cd");
    const char* none = nullptr;
    s.prepend("ab").prepend('>').prepend(none).prepend("", 0);
    EXPECT_EQ(">abcd", bytes(s));
    s.prepend(zkStringBase("\0", 1));
    EXPECT_EQ(std::string("\0>abcd", 6), bytes(s));

    zkStringBase t("abc");
    t.insert("xy", 1);
    EXPECT_EQ("axybc", bytes(t));
    t.insert("xy", 0, 0);
    EXPECT_EQ("xyaxybc", bytes(t));
    t.insert("<>", 99, 1);
    EXPECT_EQ("xyaxybc<", bytes(t));
    t.insert(none, 2);
    EXPECT_EQ("xyaxybc<", bytes(t));
    t.insert(zkStringBase("1\0", 2), 3);
    EXPECT_EQ(std::string("xya1\0xybc<", 10), bytes(t));
    t.insert(zkStringBase("0"), 0);
    EXPECT_EQ('0', t[0]);
}

TEST(StringEditing, DelCutAndErase) {
    zkStringBase s("abcdef");
    s.del(1, 2);
    EXPECT_EQ("adef", bytes(s));
    s.del(4, 2).del(9, 12);
    EXPECT_EQ("adef", bytes(s));
    s.del(3, zkStringBase::BadIndex);
    EXPECT_EQ("ade", bytes(s));
    s.erase(1, 100);
    EXPECT_EQ("a", bytes(s));
    s.del(0, 0);
    EXPECT_EQ("", bytes(s));
    s.del(0, 5);
    EXPECT_EQ("", bytes(s));

    zkStringBase c("abc");
    c.cut(2);
    EXPECT_EQ("a", bytes(c));
    c.cut(0);
    EXPECT_EQ("a", bytes(c));
    c.cut(10);
    EXPECT_EQ("", bytes(c));
    EXPECT_EQ(3u + kSlack, c.capacity());
}

TEST(StringEditing, ReplaceFirstOccurrenceAndRanges) {
    zkStringBase s("abcb");
    s.replace("b", "XY", 0, true);
    EXPECT_EQ("aXYcb", bytes(s));
    s.replace("q", "Z", 0, true).replace("a", "Z", 1, true);
    EXPECT_EQ("aXYcb", bytes(s));
    s.replace("xy", "-", 0, true);
    EXPECT_EQ("aXYcb", bytes(s));
    s.replace("xy", "-", 0, false);
    EXPECT_EQ("a-cb", bytes(s));
    s.replace("b", nullptr, 0, true);
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
    EXPECT_EQ("ellellolo", bytes(s));
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
    zkStringBase roomy("abc");
    roomy.append(roomy);
    EXPECT_EQ("abcabc", bytes(roomy));

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
    s.reserve(17);
    s += s;
    EXPECT_EQ(32u, s.length());
    EXPECT_EQ(0, std::memcmp(s.data(), s.data() + 16, 16));

    zkStringBase p("ab");
    p.prepend(p);
    EXPECT_EQ("abab", bytes(p));
    p.reserve(5);
    p.insert(p.data(), 1, 2);
    EXPECT_EQ("aabbab", bytes(p));
    p.appendSubString(p, 0, 1);
    EXPECT_EQ("aabbabaa", bytes(p));
}

TEST(StringStorage, ReserveResizeAndSmallAccessors) {
    zkStringBase s("abc");
    s.reserve(1000);
    EXPECT_EQ(1000u, s.capacity());
    s.reserve(10);
    EXPECT_EQ(10u, s.capacity());
    EXPECT_EQ("abc", bytes(s));
    s.reserve(2);
    EXPECT_EQ(4u, s.capacity());
    EXPECT_EQ("abc", bytes(s));
    s.resize(0);
    EXPECT_EQ(4u, s.capacity());
    EXPECT_EQ("abc", bytes(s));

    s.reserve(8);
    for (char ch : {'d', 'e', 'f', 'g'}) s.fappend(ch);
    EXPECT_EQ("abcdefg", bytes(s));
    EXPECT_EQ(8u, s.capacity());
    s.fappend('h');
    EXPECT_EQ("abcdefgh", bytes(s));

    zkStringBase tiny(1u);
    tiny.fappend('x');
    tiny.fappend('y');
    EXPECT_EQ("xy", bytes(tiny));

    s[0] = 'A';
    s.at(1) = 'B';
    EXPECT_EQ('A', s.at(0));
    EXPECT_EQ('\0', s[s.length()]);
    EXPECT_EQ('h', s.getLast());
    const unsigned cap = s.capacity();
    s.makeNull();
    EXPECT_EQ("", bytes(s));
    EXPECT_EQ(cap, s.capacity());
    EXPECT_EQ('\0', s.getLast());
}

TEST(StringLimits, LengthPastThirtyTwoBitsThrowsAndKeepsText) {
    zkStringBase a("x");
    EXPECT_THROW(a.append("y", 0xFFFFFFFFu), std::bad_alloc);
    EXPECT_THROW(a.append("y", 0xFFFFFFFEu), std::bad_alloc);
    EXPECT_EQ("x", bytes(a));
    EXPECT_THROW(a.prepend("y", 0xFFFFFFFFu), std::bad_alloc);
    EXPECT_THROW(a.prepend("y", 0xFFFFFFFEu), std::bad_alloc);
    EXPECT_EQ("x", bytes(a));

    zkStringBase b("xz");
    EXPECT_THROW(b.insert("y", 1, 0xFFFFFFFFu), std::bad_alloc);
    EXPECT_THROW(b.insert("y", 0, 0xFFFFFFFEu), std::bad_alloc);
    EXPECT_THROW(b.insert("y", 2, 0xFFFFFFFDu), std::bad_alloc);
    EXPECT_EQ("xz", bytes(b));
    EXPECT_EQ(2u + kSlack, b.capacity());
}

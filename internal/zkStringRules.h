// Rules of zkStringBase that code outside the class needs as well: the
// length limit, the growth rule, and assignments of counted bytes.
#ifndef ZK_INTERNAL_STRING_RULES_H
#define ZK_INTERNAL_STRING_RULES_H

#include "zkStringBase.h"

// Lengths and capacities are 32-bit: a buffer holds at most this many bytes,
// the terminator included.
constexpr unsigned long long kZkMaxCapacity = 0xFFFFFFFFull;
// The longest text a string can hold.
constexpr unsigned long long kZkMaxStringLength = kZkMaxCapacity - 1;

// Room for the "%ld" text of a 64-bit long and its terminator.
constexpr int kZkLongTextSize = 32;

// The capacity a string takes when a text of n characters is assigned to it
// and does not fit: n plus the growth slack (at least room for the
// terminator), within the limit. Requires: n < kZkMaxCapacity.
inline unsigned zkAssignCapacity(unsigned long long n) {
    const unsigned long long slack = zkStringBase::_sGrowLength ? zkStringBase::_sGrowLength : 1;
    return static_cast<unsigned>(n + slack > kZkMaxCapacity ? kZkMaxCapacity : n + slack);
}

// Replaces s's text with the n bytes at p, growing a buffer that is too
// small to exactly n + 1 bytes: stored strings carry no slack.
inline void zkAssignExact(zkStringBase& s, const char* p, unsigned n) {
    s.makeNull();
    if (n >= s.capacity()) s.reserve(n + 1);
    s.assign(p, n);
}

// zkAssignExact with source's text and compare type, as an assignment would
// take.
inline void zkAssignExact(zkStringBase& s, const zkStringBase& source) {
    if (&s == &source) return;
    zkAssignExact(s, source.data(), source.length());
    s.setCompareType(source.getCompareType());
}

#endif

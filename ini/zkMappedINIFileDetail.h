// Helpers shared by the parts of zkMappedINIFile: stored strings sized to
// their text, and list and record allocation that ends the process when
// memory runs out.
#ifndef ZK_INI_MAPPED_INI_FILE_DETAIL_H
#define ZK_INI_MAPPED_INI_FILE_DETAIL_H

#include <new>
#include <utility>

#include "../internal/zkOutOfMemory.h"
#include "zkStringBase.h"

// Replaces s's text with the n bytes at p, growing its buffer to exactly
// n + 1 bytes when it is too small: a stored string carries no slack.
inline void zkSetSized(zkStringBase& s, const char* p, unsigned n) {
    s.makeNull();
    if (n >= s.capacity()) s.reserve(n + 1);
    // append measures the text with strlen when the count is 0.
    if (n) s.append(p, n);
}

// zkSetSized with source's text and compare type, as an assignment would take.
inline void zkAssignSized(zkStringBase& s, const zkStringBase& source) {
    if (&s == &source) return;
    zkSetSized(s, source.data(), source.length());
    s.setCompareType(source.getCompareType());
}

#endif

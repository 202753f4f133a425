// Helpers shared by the parts of zkMappedINIFile: stored strings sized to
// their text, and list and record allocation that ends the process when
// memory runs out.
#ifndef ZK_INI_MAPPED_INI_FILE_DETAIL_H
#define ZK_INI_MAPPED_INI_FILE_DETAIL_H

#include <new>
#include <utility>

#include "../internal/zkOutOfMemory.h"
#include "../internal/zkStringRules.h"
#include "zkStringBase.h"

// zkAssignExact with source's text and compare type, as an assignment would
// take.
inline void zkAssignSized(zkStringBase& s, const zkStringBase& source) {
    if (&s == &source) return;
    zkAssignExact(s, source.data(), source.length());
    s.setCompareType(source.getCompareType());
}

#endif

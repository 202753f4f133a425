// Test helpers: zkStringBase from and to std::string, zero bytes included.
#pragma once

#include <gtest/gtest.h>

#include "zkStringBase.h"

// A string of the bytes of text, with the given compare type.
inline zkStringBase zkStr(const std::string& text, zkStringBase::CompareType type = zkStringBase::CaseSensitive) {
    zkStringBase s(text.data(), static_cast<unsigned>(text.size()));
    s.setCompareType(type);
    return s;
}

// The bytes of s, after checking that the terminator is in place.
inline std::string zkText(const zkStringBase& s) {
    EXPECT_EQ('\0', s.data()[s.length()]);
    return std::string(s.data(), s.length());
}

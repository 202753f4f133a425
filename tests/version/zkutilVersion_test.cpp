// The library's version: the run-time query and the header's macros.
#include <gtest/gtest.h>

#include <string>

#include "zkutilVersion.h"

// The library reports the version its headers were generated with, and the
// string is the three numbers joined by full stops.
TEST(LibraryVersion, RunTimeMatchesHeader) {
    const std::string joined = std::to_string(ZKUTIL_VERSION_MAJOR) + "." + std::to_string(ZKUTIL_VERSION_MINOR) + "." +
                               std::to_string(ZKUTIL_VERSION_PATCH);
    EXPECT_EQ(joined, ZKUTIL_VERSION);
    EXPECT_STREQ(ZKUTIL_VERSION, zkutilVersion());
}

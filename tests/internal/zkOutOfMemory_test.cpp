#include <gtest/gtest.h>

#include "internal/zkOutOfMemory.h"

// A node that cannot be allocated ends the process with status 1, after
// exactly "out of memory" and a line end on standard error.
TEST(OutOfMemoryDeathTest, FailedNodeAllocationEndsTheProcessSayingSo) {
    const testing::Matcher<const std::string&> saysSo("out of memory\n");
    EXPECT_EXIT(zkNodeAllocator<long>().allocate(SIZE_MAX / 2), testing::ExitedWithCode(1), saysSo);
}

#include <gtest/gtest.h>

#include <list>

#include "internal/zkOutOfMemory.h"

TEST(OutOfMemoryDeathTest, ExitsWithStatusOneSayingSo) {
    EXPECT_EXIT(zkOutOfMemory(), ::testing::ExitedWithCode(1), "^out of memory\n$");
}

TEST(OutOfMemoryDeathTest, NodeAllocatorEndsTheProcessInsteadOfThrowing) {
    zkNodeAllocator<long> allocator;
    EXPECT_EXIT(allocator.allocate(static_cast<std::size_t>(-1) / 2), ::testing::ExitedWithCode(1), "out of memory");
    std::list<int, zkNodeAllocator<int>> list{1, 2, 3};
    EXPECT_EQ(3u, list.size());
}

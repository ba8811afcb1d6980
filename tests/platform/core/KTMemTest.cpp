#include "platform/core/KTMem.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <new>

// Makes an oversized allocation fail under a sanitizer as it does without.
extern "C" const char* __asan_default_options();
extern "C" const char* __asan_default_options()
{
    return "allocator_may_return_null=1";
}
extern "C" const char* __tsan_default_options();
extern "C" const char* __tsan_default_options()
{
    return "allocator_may_return_null=1";
}

namespace {

constexpr std::size_t kTooMuch = std::numeric_limits<std::size_t>::max() / 2;

bool isZero(const KTMem& block, std::size_t from)
{
    return std::all_of(block.data() + from, block.data() + block.size(), [](std::byte b) { return b == std::byte{}; });
}

TEST(KTMem, GrowingKeepsTheContentAndFillsWithZeros)
{
    KTMem block(10);
    EXPECT_TRUE(isZero(block, 0));
    std::memset(block.data(), 7, 10);
    // Bytes that were cut off must not reappear when the block grows within its capacity.
    ASSERT_TRUE(block.reallocate(6));
    ASSERT_TRUE(block.reallocate(9));
    EXPECT_EQ(block.size(), 9U);
    EXPECT_EQ(block.data()[5], std::byte{7});
    EXPECT_TRUE(isZero(block, 6));
    ASSERT_TRUE(block.reallocate(100'000));
    EXPECT_EQ(block.data()[5], std::byte{7});
    EXPECT_TRUE(isZero(block, 6));
    ASSERT_TRUE(block.allocate(9));
    EXPECT_TRUE(isZero(block, 0));
    ASSERT_TRUE(block.reallocate(0));
    EXPECT_EQ(block.data(), nullptr);
    ASSERT_TRUE(block.reallocate(4));
    EXPECT_TRUE(isZero(block, 0));
}

TEST(KTMem, WhenMemoryIsShortTheBlockIsUnchanged)
{
    KTMem block(3);
    std::memset(block.data(), 7, 3);
    EXPECT_FALSE(block.allocate(kTooMuch));
    EXPECT_FALSE(block.reallocate(kTooMuch));
    ASSERT_EQ(block.size(), 3U);
    EXPECT_EQ(block.data()[2], std::byte{7});
    EXPECT_THROW(KTMem{kTooMuch}, std::bad_alloc);
}

} // namespace

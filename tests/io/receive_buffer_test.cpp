// The session's receive buffer: bounded, kept while it is large enough,
// replaced when a larger block comes, given back on Release.
#include <gtest/gtest.h>

#include <cstring>

#include "io/receive_buffer.h"

namespace qn::test {
namespace {

TEST(ReceiveBuffer, BoundedKeptAcrossReadsAndReleased) {
    constexpr std::size_t kLimit = 5u << 20;
    ReceiveBuffer b(kLimit);
    EXPECT_EQ(b.Reserve(kLimit + 1), nullptr);
    EXPECT_EQ(b.capacity(), 0u);
    BYTE* first = b.Reserve(3u << 20);
    ASSERT_NE(first, nullptr);
    std::memset(first, 0x5a, 3u << 20);  // every byte writable
    EXPECT_GE(b.capacity(), 3u << 20);
    EXPECT_EQ(b.Reserve(1), first);
    EXPECT_EQ(b.Reserve(b.capacity()), first);
    BYTE* grown = b.Reserve(kLimit);
    ASSERT_NE(grown, nullptr);
    std::memset(grown, 0xa5, kLimit);
    EXPECT_GE(b.capacity(), kLimit);
    b.Release();
    EXPECT_EQ(b.capacity(), 0u);
    EXPECT_EQ(b.data(), nullptr);
    EXPECT_NE(b.Reserve(16), nullptr);
}

}  // namespace
}  // namespace qn::test

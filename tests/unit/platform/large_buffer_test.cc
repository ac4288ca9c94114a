#include "platform/large_buffer.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>

namespace {

constexpr std::size_t kMiB = 1024 * 1024;

class LargeBufferSizes : public ::testing::TestWithParam<std::size_t> {};

// The mapping is trimmed to an aligned range: a wrong trim would leave part of
// a buffer unmapped (a crash when written) or let two buffers overlap.
TEST_P(LargeBufferSizes, EveryByteIsWritableAndBuffersDoNotOverlap) {
  const std::size_t size = GetParam();
  memory::LargeBuffer first(size);
  memory::LargeBuffer second(size);
  ASSERT_NE(first.data(), nullptr);
  ASSERT_NE(second.data(), nullptr);
  std::memset(first.data(), 'a', size);
  std::memset(second.data(), 'b', size);
  EXPECT_EQ(std::count(first.data(), first.data() + size, 'a'), static_cast<long>(size));
}

INSTANTIATE_TEST_SUITE_P(Sizes, LargeBufferSizes,
                         ::testing::Values(1, 2 * kMiB - 1, 2 * kMiB, 16 * kMiB + 1));

}  // namespace

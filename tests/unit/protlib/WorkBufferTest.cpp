// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <limits>

#include "protlib/WorkBuffer.h"
#include "tests/unit/FailingNew.h"

namespace {

// Number of allocations that a buffer of that size needs; -1 when it is not valid.
template <std::size_t StackBytes>
long long AllocationsFor(long long sizeBytes) {
  const long long before = FailingNew::Count();
  WorkBuffer<StackBytes> buffer(sizeBytes);
  return buffer.IsValid() ? FailingNew::Count() - before : -1;
}

}  // namespace

TEST(WorkBufferTest, AllocatesOnlyAboveTheLimit) {
  EXPECT_EQ(AllocationsFor<64>(0), 0);
  EXPECT_EQ(AllocationsFor<64>(63), 0);
  EXPECT_EQ(AllocationsFor<64>(64), 0);
  EXPECT_EQ(AllocationsFor<64>(65), 1);
  EXPECT_EQ(AllocationsFor<256>(256), 0);
  EXPECT_EQ(AllocationsFor<256>(257), 1);
}

TEST(WorkBufferTest, IsZeroFilledAndWritable) {
  for (const int size : {1, 63, 64, 65, 1000}) {
    WorkBuffer<64> buffer(size);
    ASSERT_TRUE(buffer.IsValid());
    EXPECT_EQ(std::count(buffer.Data(), buffer.Data() + size, 0), size);
    std::fill_n(buffer.Data(), size, static_cast<unsigned char>(0xEE));
    EXPECT_EQ(buffer.Data()[size - 1], 0xEE);
  }
}

TEST(WorkBufferTest, NegativeSizeLeavesNoBuffer) {
  EXPECT_FALSE(WorkBuffer<64>(-1).IsValid());
  EXPECT_FALSE(WorkBuffer<64>(std::numeric_limits<long long>::min()).IsValid());
}

TEST(WorkBufferTest, ImpossibleSizeLeavesNoBuffer) {
  EXPECT_FALSE(WorkBuffer<64>(std::numeric_limits<long long>::max()).IsValid());
}

TEST(WorkBufferTest, FailedAllocationLeavesNoBuffer) {
  const FailingNew noMemory(1);
  EXPECT_FALSE(WorkBuffer<64>(65).IsValid());
  EXPECT_TRUE(noMemory.HasFailed());
}

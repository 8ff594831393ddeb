// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/records/geometry.h>

#include <climits>
#include <cstring>
#include <optional>
#include <utility>

#include "support/resource_limit.h"

namespace {

TEST(Rect, MeasuresTheDifferenceOfItsCorners) {
  EXPECT_EQ(COrbRect(1, 2, 11, 7).Width(), 10);
  EXPECT_EQ(COrbRect(1, 2, 11, 7).Height(), 5);
  EXPECT_EQ(COrbRect(10, 0, 0, 0).Width(), -10);
  EXPECT_EQ(COrbRect(INT_MIN, -1, INT_MAX, INT_MAX).Width(), -1);
  EXPECT_EQ(COrbRect(INT_MIN, -1, INT_MAX, INT_MAX).Height(), INT_MIN);
}

TEST(Buffer, OwnsWhatItAllocatesAndCopies) {
  COrbBuffer buffer, empty;
  std::memset(buffer.Allocate(100), 7, 100);
  const COrbBuffer copy(buffer);
  const void* const block = buffer.Allocate(16);
  EXPECT_EQ(&(buffer = std::as_const(buffer)), &buffer);
  EXPECT_EQ(buffer.GetBuffer(), block);
  EXPECT_EQ(buffer.GetSize(), 16U);
  buffer = copy;
  EXPECT_EQ(buffer.GetSize(), 100U);
  EXPECT_NE(buffer.GetBuffer(), copy.GetBuffer());
  EXPECT_EQ(std::memcmp(buffer.GetBuffer(), copy.GetBuffer(), 100), 0);
  empty.Allocate(0);
  buffer = empty;
  EXPECT_TRUE(buffer.data == nullptr && buffer.size == 0 && COrbBuffer(empty).data == nullptr);
  buffer.Free();
}

TEST(Buffer, IsEmptyWhereMemoryRunsOut) {
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
  GTEST_SKIP() << "sanitizers need the address space";
#endif
  constexpr unsigned int kLarge = 1U << 30;
  COrbBuffer large, target, fresh;
  ASSERT_NE(large.Allocate(kLarge), nullptr);
  target.Allocate(16);
  fresh.Allocate(16);
  std::optional<orb::test::ResourceLimit> tight(std::in_place, RLIMIT_AS, kLarge);
  const COrbBuffer copy(large);
  target = large;
  fresh.Allocate(kLarge);
  tight.reset();
  for (const COrbBuffer* buffer : {&copy, &std::as_const(target), &std::as_const(fresh)}) {
    EXPECT_TRUE(buffer->data == nullptr && buffer->size == 0);
  }
}

}  // namespace

// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/records/geometry.h>
#include <sys/resource.h>

#include <climits>
#include <cstring>

namespace {

TEST(Rect, MeasuresTheDifferenceOfItsCorners) {
  EXPECT_EQ(COrbRect(1, 2, 11, 7).Width(), 10);
  EXPECT_EQ(COrbRect(1, 2, 11, 7).Height(), 5);
  EXPECT_EQ(COrbRect(10, 0, 0, 0).Width(), -10);
  EXPECT_EQ(COrbRect(INT_MIN, -1, INT_MAX, INT_MAX).Width(), -1);
  EXPECT_EQ(COrbRect(INT_MIN, -1, INT_MAX, INT_MAX).Height(), INT_MIN);
}

TEST(Buffer, OwnsWhatItAllocatesAndCopies) {
  COrbBuffer buffer;
  std::memset(buffer.Allocate(100), 7, 100);
  const COrbBuffer copy(buffer);
  const void* const block = buffer.Allocate(16);
  EXPECT_EQ(buffer.GetSize(), 16U);
  const COrbBuffer& self = buffer;
  buffer = self;
  EXPECT_EQ(buffer.GetBuffer(), block);
  buffer = copy;
  EXPECT_EQ(buffer.GetSize(), 100U);
  EXPECT_NE(buffer.GetBuffer(), copy.GetBuffer());
  EXPECT_EQ(std::memcmp(buffer.GetBuffer(), copy.GetBuffer(), 100), 0);
  buffer.Free();
  buffer.Free();
  EXPECT_EQ(buffer.GetBuffer(), nullptr);
}

TEST(Buffer, OfNoBytesHasNoBlockInItsCopies) {
  COrbBuffer empty, target;
  empty.Allocate(0);
  target.Allocate(8);
  target = empty;
  EXPECT_EQ(target.data, nullptr);
  EXPECT_EQ(target.size, 0U);
  EXPECT_EQ(COrbBuffer(empty).data, nullptr);
}

TEST(Buffer, IsEmptyWhereMemoryRunsOut) {
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
  GTEST_SKIP() << "sanitizers need the address space";
#endif
  constexpr unsigned int kLarge = 1U << 30;
  COrbBuffer large, target;
  ASSERT_NE(large.Allocate(kLarge), nullptr);
  target.Allocate(16);
  rlimit old = {};
  getrlimit(RLIMIT_AS, &old);
  const rlimit tight = {kLarge, old.rlim_max};
  setrlimit(RLIMIT_AS, &tight);
  const COrbBuffer copy(large);
  target = large;
  COrbBuffer fresh;
  const void* const block = fresh.Allocate(kLarge);
  setrlimit(RLIMIT_AS, &old);
  EXPECT_EQ(block, nullptr);
  EXPECT_TRUE(copy.data == nullptr && copy.size == 0);
  EXPECT_TRUE(target.data == nullptr && target.size == 0);
  EXPECT_TRUE(fresh.data == nullptr && fresh.size == 0);
}

}  // namespace

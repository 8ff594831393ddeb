// SPDX-License-Identifier: MIT
#include "layout.h"

#include <gtest/gtest.h>

namespace orbimport {
namespace {

COrbTime Local(unsigned year, unsigned month, unsigned day) {
  COrbTime time;
  time.Initialize(year, month, day, 7, 8, 9, 0, 0, 0);
  return time;
}

TEST(Layout, ExpandsTheLocalTime) {
  const struct {
    const char* pattern;
    const char* path;
  } kCases[] = {
      {"%Y/%Y-%m-%d", "2024/2024-03-01"},
      {"%y%m%d", "240301"},
      {"%Y/%j", "2024/061"},  // A leap year.
      {"%H.%M.%S", "07.08.09"},
      {"100%%/a b", "100%/a b"},
      {"", ""},
  };
  for (const auto& c : kCases) {
    Layout layout;
    std::string why;
    ASSERT_TRUE(layout.Set(c.pattern, why)) << c.pattern;
    EXPECT_EQ(layout.Expand(Local(2024, 3, 1)), c.path);
  }
  EXPECT_EQ(Layout().Expand(Local(1999, 12, 31)), "1999/1999-12-31");
  Layout day;
  std::string why;
  ASSERT_TRUE(day.Set("%j", why));
  EXPECT_EQ(day.Expand(Local(2023, 12, 31)), "365");
}

TEST(Layout, NeverLeadsOutOfTheDestination) {
  for (const char* const bad :
       {"/abs", "..", "../%Y", "%Y/../..", "%Y/./%m", "a//b", "%Y/", "%", "%Q", "%Y%", "\xff"}) {
    Layout layout;
    std::string why;
    EXPECT_FALSE(layout.Set(bad, why)) << bad;
    EXPECT_NE(why, "");
    EXPECT_EQ(layout.Expand(Local(2024, 3, 1)), "2024/2024-03-01");  // As before.
  }
}

}  // namespace
}  // namespace orbimport

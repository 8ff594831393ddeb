// SPDX-License-Identifier: MIT
#include "layout.h"

#include <gtest/gtest.h>

namespace orbimport {
namespace {

std::string Expanded(const Layout& layout, unsigned year, unsigned month, unsigned day) {
  COrbTime time;
  time.Initialize(year, month, day, 7, 8, 9, 0, 0, 0);
  return layout.Expand(time);
}

TEST(Layout, ExpandsTheLocalTime) {
  Layout layout;
  EXPECT_EQ(Expanded(layout, 1999, 12, 31), "1999/1999-12-31");
  std::string why;
  for (const auto& [pattern, path] : {std::pair("%Y/%Y-%m-%d", "2024/2024-03-01"),
                                      {"%y%m%d", "240301"},
                                      {"%H.%M.%S", "07.08.09"},
                                      {"100%%/a b", "100%/a b"},
                                      {"", ""},
                                      {"%j", "061"}}) {  // A leap year.
    ASSERT_TRUE(layout.Set(pattern, why)) << pattern;
    EXPECT_EQ(Expanded(layout, 2024, 3, 1), path);
  }
  EXPECT_EQ(Expanded(layout, 2023, 12, 31), "365");
}

TEST(Layout, NeverLeadsOutOfTheDestination) {
  for (const char* const bad :
       {"/abs", "..", "../%Y", "%Y/../..", "%Y/./%m", "a//b", "%Y/", "%", "%Q", "%Y%", "\xff"}) {
    Layout layout;
    std::string why;
    EXPECT_FALSE(layout.Set(bad, why)) << bad;
    EXPECT_NE(why, "");
    EXPECT_EQ(Expanded(layout, 2024, 3, 1), "2024/2024-03-01");  // As before.
  }
}

}  // namespace
}  // namespace orbimport

// SPDX-License-Identifier: MIT
#include "progress.h"

#include <gtest/gtest.h>

namespace orbimport {
namespace {

TEST(ProgressLine, ShowsLessWhereThereIsLessRoom) {
  constexpr char kBar[] = "[###################-------------------]  50%  12/34 files  5.0 MB of ";
  const ProgressState half = {{12, 5'000'000}, {34, 10'000'000}, 2'500'000};
  const std::tuple<ProgressState, std::size_t, std::string> kCases[] = {
      {half, 100, kBar + std::string("10.0 MB  2.5 MB/s  0:02 left")},
      {half, 60, " 50%  12/34 files  5.0 MB of 10.0 MB  2.5 MB/s  0:02 left"},
      {half, 50, " 50%  12/34 files  5.0 MB of 10.0 MB  2.5 MB/s"},
      {half, 20, " 50%  12/34 files"},
      {half, 4, " 50%"},
      {half, 2, ""},
      {{{9, 9'999'999}, {10, 10'000'000}, 0}, 4, " 99%"},  // Complete only at the end.
      {{{0, 0}, {0, 0}, 0}, 4, "100%"},                    // Nothing to copy.
      {{{1, 0}, {2, 0}, 0}, 4, " 50%"},                    // Only empty files.
  };
  for (const auto& [state, width, line] : kCases) {
    EXPECT_EQ(ProgressLine(state, width, false), line);
  }
  EXPECT_NE(ProgressLine(half, 100, true).find("\x1b[32m###"), std::string::npos);
}

TEST(SmoothRate, BeginsWithTheFirstAndFollowsSlowly) {
  EXPECT_DOUBLE_EQ(SmoothRate(0, 500, 0.1), 5000);
  EXPECT_LT(SmoothRate(5000, 100, 0.1), 5000);
  EXPECT_GT(SmoothRate(5000, 100, 0.1), 4500);
  EXPECT_DOUBLE_EQ(SmoothRate(5000, 100, 0), 5000);
}

}  // namespace
}  // namespace orbimport

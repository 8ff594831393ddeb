// SPDX-License-Identifier: MIT
#include "progress.h"

#include <gtest/gtest.h>

namespace orbimport {
namespace {

const ProgressState kHalf = {{12, 5'000'000}, {34, 10'000'000}, 2'500'000};

TEST(ProgressLine, ShowsLessWhereThereIsLessRoom) {
  const struct {
    std::size_t width;
    const char* line;
  } kCases[] = {
      {100,
       "[###################-------------------]  50%  12/34 files  5.0 MB of 10.0 MB  2.5 MB/s"
       "  0:02 left"},
      {60, " 50%  12/34 files  5.0 MB of 10.0 MB  2.5 MB/s  0:02 left"},
      {50, " 50%  12/34 files  5.0 MB of 10.0 MB  2.5 MB/s"},
      {20, " 50%  12/34 files"},
      {4, " 50%"},
      {2, ""},
  };
  for (const auto& c : kCases) {
    const std::string line = ProgressLine(kHalf, c.width, false);
    EXPECT_LE(line.size(), c.width);
    EXPECT_EQ(line, c.line);
  }
}

TEST(ProgressLine, ColoursOnlyWhenAskedTo) {
  EXPECT_EQ(ProgressLine(kHalf, 100, false).find('\x1b'), std::string::npos);
  EXPECT_NE(ProgressLine(kHalf, 100, true).find("\x1b[32m###"), std::string::npos);
}

TEST(ProgressLine, IsCompleteOnlyAtTheEnd) {
  EXPECT_NE(ProgressLine({{9, 9'999'999}, {10, 10'000'000}, 0}, 40, false).find(" 99%"),
            std::string::npos);
  // Nothing to copy, and only empty files.
  EXPECT_NE(ProgressLine({{0, 0}, {0, 0}, 0}, 40, false).find("100%"), std::string::npos);
  EXPECT_NE(ProgressLine({{1, 0}, {2, 0}, 0}, 40, false).find(" 50%"), std::string::npos);
}

TEST(SmoothRate, BeginsWithTheFirstAndFollowsSlowly) {
  EXPECT_DOUBLE_EQ(SmoothRate(0, 500, 0.1), 5000);
  const double slower = SmoothRate(5000, 100, 0.1);
  EXPECT_LT(slower, 5000);
  EXPECT_GT(slower, 4500);
  EXPECT_DOUBLE_EQ(SmoothRate(5000, 100, 0), 5000);
}

}  // namespace
}  // namespace orbimport

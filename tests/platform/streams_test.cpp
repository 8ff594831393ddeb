// SPDX-License-Identifier: MIT
#include "platform/streams.h"

#include <gtest/gtest.h>

#include <string>

#include "support/temp_folder.h"

namespace {

using orb::platform::kItemExists;
using orb::platform::OutputStream;
using orb::test::ReadAll;
using orb::test::TempFolder;

TEST(OutputStream, TakesNoNameThatSomebodyElseTookMeanwhile) {
  const TempFolder folder;
  auto stream = OutputStream::Append(folder / "new");
  ASSERT_TRUE(stream);
  folder.Write("new", "theirs");
  EXPECT_EQ(stream.Value().Finish().Reason(), kItemExists);
  EXPECT_EQ(ReadAll(folder / "new"), "theirs");
}

}  // namespace

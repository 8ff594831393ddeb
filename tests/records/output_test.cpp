// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/records/metadata.h>
#include <orb/records/output.h>

#include <utility>

#include "support/texts.h"

namespace {

TEST(Task, CopiesItsTrimByTheRuleOfThatClass) {
  COrbTaskPropertyData task, assigned;
  task.taskTrim.trimRange[15] = 9;
  task.taskTrim.trimSaveValue = 5;
  assigned = task;
  EXPECT_EQ(assigned.taskTrim.trimRange[15], 9);
  for (const COrbTaskPropertyData& copy : {COrbTaskPropertyData(task), std::move(task)}) {
    EXPECT_EQ(copy.taskTrim.trimRange[15], 0);
    EXPECT_EQ(copy.taskTrim.trimSaveValue, 5U);
  }
}

TEST(Metadata, IsOrderedByItsKeysAndLookedUpWithoutATrace) {
  const auto key = [](int value) { return static_cast<eOrbDBMetaData>(value); };
  COrbDBMetaData data;
  EXPECT_TRUE(HasNoValue(data.GetStringData(key(2))));
  data.entries[key(3)] = S("three");
  data.entries[key(-1)] = S("minus one");
  EXPECT_EQ(data.entries.begin()->first, -1);
  EXPECT_TRUE(HasNoValue(data.GetStringData(key(2))));
  EXPECT_EQ(Text(data.GetStringData(key(3))), "three");
  EXPECT_EQ(data.entries.size(), 2U);
}

}  // namespace

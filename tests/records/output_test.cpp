// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/records/metadata.h>
#include <orb/records/output.h>

#include <utility>
#include <vector>

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

TEST(Rename, GoesBackToTheOriginalNames) {
  COrbRenameData rename;
  rename.renameValue2 = rename.renameValue6 = 77;
  for (int i = 0; i < 2; ++i) {
    rename.SetToOriginal();
    const std::vector<int> values = {rename.renameValue2,
                                     rename.renameValue3,
                                     rename.renameValue4,
                                     rename.renameValue5,
                                     rename.renameValue6};
    EXPECT_EQ(values, std::vector({77, 3, 3, 4, 77}));
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
  COrbIPTCData texts;
  texts.items[0x80000000U], texts.items[1];
  EXPECT_EQ(texts.items.begin()->first, 1U);
}

}  // namespace

// SPDX-License-Identifier: MIT
#include <orb/fileops/trash.h>

#include <vector>

#include "support/environment.h"
#include "support/files.h"

namespace orb::test {
namespace {

class MoveToTrash : public testing::Test {
 protected:
  bool IsInTrash(const std::string& name) const { return tree_.Has("data/Trash/files/" + name); }

  const Tree tree_{"a.jpg, b.jpg, locked.jpg!"};
  const ScopedVariable data_{"XDG_DATA_HOME", tree_ / "data"};
};

TEST_F(MoveToTrash, ListGoesOnAfterAFailureAndAlwaysSucceeds) {
  std::vector<COrbFilePath> paths;
  for (const char* path : {"a.jpg", "", "gone", "/\xff", "locked.jpg", "//", "b.jpg"})
    paths.push_back(PathOf(tree_.At(path)));
  EXPECT_EQ(OrbMoveToTrash(paths, false), kOrbNoErr);
  EXPECT_TRUE(IsInTrash("a.jpg") && IsInTrash("b.jpg") && tree_.Has("locked.jpg"));
}

TEST_F(MoveToTrash, CallsBackOnceBeforeAnythingIsTouched) {
  const COrbFilePath path = PathOf(tree_ / "a.jpg");
  Progress cancel{1};
  EXPECT_EQ(OrbMoveToTrashEx(path, Progress::Call, &cancel), kOrbErrCanceled);
  EXPECT_TRUE(tree_.Has("a.jpg"));
  EXPECT_FALSE(tree_.Has("data"));
  Progress goOn;
  EXPECT_EQ(OrbMoveToTrashEx(path, Progress::Call, &goOn), kOrbNoErr);
  EXPECT_TRUE(IsInTrash("a.jpg"));
  EXPECT_EQ(cancel.calls + goOn.calls, 2);
}

TEST_F(MoveToTrash, SaysDeniedForEveryFailure) {
  Progress progress;
  EXPECT_EQ(OrbMoveToTrashEx(PathOf("/\xff"), Progress::Call, &progress), kOrbErrAccessDenied);
  EXPECT_EQ(progress.calls, 0) << "no text that names an item";
  for (const char* path : {"gone", "", "/"})
    EXPECT_EQ(OrbMoveToTrashEx(PathOf(tree_.At(path)), nullptr, nullptr), kOrbErrAccessDenied);
}

}  // namespace
}  // namespace orb::test

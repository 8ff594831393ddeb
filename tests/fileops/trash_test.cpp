// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileops/trash.h>

#include <filesystem>
#include <string>
#include <vector>

#include "platform/items.h"
#include "support/environment.h"
#include "support/temp_folder.h"

namespace {

namespace fs = std::filesystem;

COrbFilePath PathOf(const std::string& path) {
  const COrbStringData text(OrbCharUtf8{path.c_str()});
  COrbFilePath made;
  made.Initialize(&text);
  return made;
}

class MoveToTrash : public testing::Test {
 protected:
  bool IsInTrash(const std::string& name) const {
    return fs::exists(folder_ / "data/Trash/files/" + name);
  }

  const orb::test::TempFolder folder_;
  const orb::test::ScopedVariable data_{"XDG_DATA_HOME", folder_ / "data"};
};

TEST_F(MoveToTrash, ListGoesOnAfterAFailureAndAlwaysSucceeds) {
  const std::string locked = folder_.Write("locked.jpg", "");
  ASSERT_TRUE(orb::platform::Items::Current().SetLocked(locked, true).Ok());
  const std::vector<COrbFilePath> paths = {PathOf(folder_.Write("a.jpg", "")),
                                           PathOf(""),
                                           PathOf(folder_ / "gone"),
                                           PathOf("/\xff"),
                                           PathOf(locked),
                                           PathOf("//"),
                                           PathOf(folder_.Write("b.jpg", ""))};
  EXPECT_EQ(OrbMoveToTrash(paths, false), kOrbNoErr);
  EXPECT_TRUE(IsInTrash("a.jpg") && IsInTrash("b.jpg"));
  EXPECT_TRUE(fs::exists(locked));
  EXPECT_EQ(OrbMoveToTrash({}, true), kOrbNoErr);
}

/// Counts its calls.
struct Progress {
  bool answer;
  int calls = 0;

  static bool Call(void* data) {
    ++static_cast<Progress*>(data)->calls;
    return static_cast<Progress*>(data)->answer;
  }
};

TEST_F(MoveToTrash, CallsBackOnceBeforeAnythingIsTouched) {
  const std::string path = folder_.Write("a.jpg", "");
  Progress cancel{false};
  EXPECT_EQ(OrbMoveToTrashEx(PathOf(path), Progress::Call, &cancel), kOrbErrCanceled);
  EXPECT_TRUE(fs::exists(path));
  EXPECT_FALSE(fs::exists(folder_ / "data"));
  Progress goOn{true};
  EXPECT_EQ(OrbMoveToTrashEx(PathOf(path), Progress::Call, &goOn), kOrbNoErr);
  EXPECT_TRUE(IsInTrash("a.jpg"));
  EXPECT_EQ(cancel.calls + goOn.calls, 2);
}

TEST_F(MoveToTrash, SaysDeniedForEveryFailure) {
  Progress progress{true};
  EXPECT_EQ(OrbMoveToTrashEx(PathOf("/\xff"), Progress::Call, &progress), kOrbErrAccessDenied);
  EXPECT_EQ(progress.calls, 0) << "no text that names an item";
  for (const std::string& path : {folder_ / "gone", std::string(), std::string("/")}) {
    EXPECT_EQ(OrbMoveToTrashEx(PathOf(path), nullptr, nullptr), kOrbErrAccessDenied);
  }
}

}  // namespace

// SPDX-License-Identifier: MIT
#include "platform/removal.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <stdio.h>

#include <atomic>
#include <filesystem>
#include <string>
#include <thread>

#include "platform/item_relations.h"
#include "platform/items.h"
#include "support/faults.h"
#include "support/refused_calls.h"
#include "support/temp_folder.h"
#include "support/trees.h"

namespace {

namespace fs = std::filesystem;
using orb::platform::Error;
using orb::platform::ExpectRemovable;
using orb::platform::IsItemOrAbove;
using orb::platform::Items;
using orb::platform::kBusy;
using orb::platform::kNoSuchItem;
using orb::platform::kNotPermitted;
using orb::platform::RemoveItem;
using orb::platform::ResolvedPath;
using orb::platform::UnlinkItem;
using orb::test::ReadAll;
using orb::test::RunInChild;
using orb::test::RunWithPrivateMounts;
using orb::test::TempFolder;

Error ErrorOf(const orb::platform::Status& status) {
  return status ? Error{orb::platform::ErrorDomain::kMach, 0} : status.Reason();
}

TEST(RemoveItem, RemovesTheEntryAndNothingBehindIt) {
  const TempFolder folder;
  folder.Write("kept", "x");
  folder.Write("file", "x");
  fs::create_directories(folder / "tree/sub/sub");
  fs::create_symlink("../kept", folder / "tree/sub/link");
  fs::create_symlink("kept", folder / "link");
  fs::create_symlink("nowhere", folder / "dangling");
  for (const char* name : {"file", "link", "dangling", "tree/"}) {
    SCOPED_TRACE(name);
    EXPECT_TRUE(RemoveItem(folder / name));
  }
  EXPECT_EQ(ReadAll(folder / "kept"), "x");
  EXPECT_EQ(std::distance(fs::directory_iterator(folder.Path()), {}), 1);
}

TEST(RemoveItem, RefusesLockedItemsAndPathsThatNameNoEntry) {
  const TempFolder folder;
  fs::create_directories(folder / "tree/sub");
  folder.Write("tree/sub/file", "x");
  fs::create_symlink("tree", folder / "link");
  EXPECT_EQ(ErrorOf(RemoveItem(folder / "missing")), kNoSuchItem);
  EXPECT_EQ(ErrorOf(RemoveItem("")), kNoSuchItem);
  EXPECT_EQ(ErrorOf(RemoveItem(folder / "link/")), kNoSuchItem);
  for (const std::string& path :
       {folder / "tree/.", folder / "tree/..", folder / "tree/../", std::string("/")})
    EXPECT_EQ(ErrorOf(RemoveItem(path)), kNotPermitted) << path;
  for (const char* locked : {"tree", "tree/sub", "tree/sub/file"}) {
    SCOPED_TRACE(locked);
    ASSERT_TRUE(Items::Current().SetLocked(folder / locked, true));
    EXPECT_EQ(ErrorOf(RemoveItem(folder / "tree")), kNotPermitted);
    EXPECT_EQ(ReadAll(folder / "tree/sub/file"), "x");
    ASSERT_TRUE(Items::Current().SetLocked(folder / locked, false));
  }
  ASSERT_TRUE(Items::Current().SetLocked(folder / "tree/sub/file", true));
  EXPECT_EQ(ErrorOf(UnlinkItem(folder / "tree/sub/file")), kNotPermitted);
}

// As kernels before 6.13 and sandboxes answer that do not know the call.
TEST(RemoveItem, FindsLocksWhereTheKernelCannotLookThemUpInAFolder) {
  constexpr long kGetAttributeAt = 464;
  for (const int error : {ENOSYS, EPERM}) {
    const TempFolder folder;
    fs::create_directories(folder / "tree");
    folder.Write("tree/file", "x");
    ORB_IN_CHILD(RunInChild(
        [&] {
          return orb::test::RefuseCalls({{kGetAttributeAt, error}});
        },
        [&] {
          ASSERT_TRUE(Items::Current().SetLocked(folder / "tree/file", true));
          EXPECT_EQ(ErrorOf(RemoveItem(folder / "tree")), kNotPermitted);
          ASSERT_TRUE(Items::Current().SetLocked(folder / "tree/file", false));
          EXPECT_TRUE(RemoveItem(folder / "tree"));
        }));
    EXPECT_FALSE(fs::exists(folder / "tree"));
  }
}

TEST(RemoveItem, DoesNotEnterAVolumeMountedInside) {
  const TempFolder folder;
  fs::create_directories(folder / "tree/mounted");
  fs::create_directories(folder / "other");
  folder.Write("other/photo", "x");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::BindMount(folder / "other", folder / "tree/mounted"));
    EXPECT_EQ(ErrorOf(RemoveItem(folder / "tree")), kBusy);
    EXPECT_EQ(ErrorOf(RemoveItem(folder / "tree/mounted")), kBusy);
    EXPECT_EQ(ReadAll(folder / "tree/mounted/photo"), "x");
  }));
}

TEST(RemoveItem, DoesNotAskAServerThatIsGoneAboutAVolumeMountedInside) {
  const TempFolder folder;
  fs::create_directories(folder / "tree/share");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    if (!orb::test::MountDeadShare(folder / "tree/share")) return;
    ::alarm(20);
    EXPECT_EQ(ErrorOf(ExpectRemovable(folder / "tree")), kNotPermitted);
    EXPECT_EQ(ErrorOf(RemoveItem(folder / "tree")), kBusy);
  }));
}

// Somebody exchanges a folder in the tree for a link to a folder outside, again and again.
TEST(RemoveItem, LeavesTheTreeThroughNoSwappedLink) {
  const TempFolder folder;
  fs::create_directories(folder / "outside");
  folder.Write("outside/photo", "x");
  fs::create_directory_symlink(folder / "outside", folder / "trap");
  std::atomic<bool> done = false;
  std::thread swapper([&] {
    while (!done)
      ::renameat2(AT_FDCWD,
                  (folder / "trap").c_str(),
                  AT_FDCWD,
                  (folder / "tree/sub").c_str(),
                  RENAME_EXCHANGE);
  });
  for (int round = 0; round < 30; ++round) {
    std::error_code ignored;
    fs::create_directories(folder / "tree/sub", ignored);
    for (int i = 0; i < 10; ++i) folder.Write("tree/sub/" + std::to_string(i), "");
    (void)RemoveItem(folder / "tree");
    if (ReadAll(folder / "outside/photo") != "x") break;
    for (int i = 0; i < 10; ++i) fs::remove(folder / ("outside/" + std::to_string(i)), ignored);
  }
  done = true;
  swapper.join();
  EXPECT_EQ(ReadAll(folder / "outside/photo"), "x");
}

TEST(IsItemOrAbove, KnowsItemsUnderEveryPathButNotTheirHardLinks) {
  const TempFolder folder;
  fs::create_directories(folder / "photos/raw");
  folder.Write("photos/raw/a", "x");
  fs::create_hard_link(folder / "photos/raw/a", folder / "photos/raw/b");
  fs::create_directory_symlink("photos", folder / "link");
  const struct {
    const char* candidate;
    bool expected;
  } kCases[] = {
      {"photos/raw/a", true},
      {"link/raw/a", true},
      {"link/../photos/raw/../raw/a", true},
      {"photos/raw/b", false},
      {"photos/raw", true},
      {"link/raw/", true},
      {"link/..", true},
      {"link", false},  // The link itself holds nothing.
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.candidate);
    const auto answer = IsItemOrAbove(folder / c.candidate, folder / "photos/raw/a");
    ASSERT_TRUE(answer);
    EXPECT_EQ(answer.Value(), c.expected);
  }
  EXPECT_FALSE(IsItemOrAbove(folder / "missing", folder / "photos"));
  EXPECT_EQ(ResolvedPath(folder / "link/raw/../../link").Value(),
            fs::canonical(folder.Path()).string() + "/link");
  EXPECT_EQ(ResolvedPath("/").Value(), "/");
  EXPECT_EQ(ResolvedPath("/tmp").Value(), "/tmp");
}

TEST(RemoveItem, GoesOnWhenSomebodyElseRemovesSomeOfIt) {
  const TempFolder folder;
  fs::create_directory(folder / "tree");
  for (int i = 0; i < 3'000; ++i) folder.Write("tree/" + std::to_string(i), "");
  std::thread other([&] {
    std::error_code ignored;
    for (int i = 3'000; --i >= 0;) fs::remove(folder / ("tree/" + std::to_string(i)), ignored);
  });
  EXPECT_TRUE(RemoveItem(folder / "tree"));
  other.join();
}

}  // namespace

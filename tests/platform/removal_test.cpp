// SPDX-License-Identifier: MIT
#include "platform/removal.h"

#include <atomic>
#include <thread>

#include "platform/item_relations.h"
#include "support/files.h"
#include "support/refused_calls.h"

namespace orb::platform {
namespace {

using namespace test;

TEST(RemoveItem, RemovesTheEntryAndNothingBehindIt) {
  const Tree tree("kept, file, tree/sub/sub/, tree/sub/link -> ../kept, link -> kept");
  tree.Make("dangling -> nowhere");
  for (const char* name : {"file", "link", "dangling", "tree/"})
    EXPECT_TRUE(RemoveItem(tree / name)) << name;
  EXPECT_EQ(tree.Read("kept"), "kept");
  EXPECT_EQ(NamesIn(tree.Path()), std::set<std::string>{"kept"});
}

TEST(RemoveItem, RefusesLockedItemsAndPathsThatNameNoEntry) {
  const Tree tree("tree/sub/file, link -> tree");
  const Unchanged unchanged(tree.Path());
  for (const char* path : {"missing", "", "link/"})
    EXPECT_EQ(ErrorOf(RemoveItem(tree.At(path))), kNoSuchItem) << path;
  for (const char* path : {"tree/.", "tree/..", "tree/../", "/"})
    EXPECT_EQ(ErrorOf(RemoveItem(tree.At(path))), kNotPermitted) << path;
  for (const char* locked : {"tree", "tree/sub", "tree/sub/file"}) {
    ASSERT_TRUE(SetLock(tree / locked, true));
    EXPECT_EQ(ErrorOf(RemoveItem(tree / "tree")), kNotPermitted) << locked;
    if (!fs::is_directory(tree / locked)) {
      EXPECT_EQ(ErrorOf(UnlinkItem(tree / locked)), kNotPermitted);
    }
    ASSERT_TRUE(SetLock(tree / locked, false));
  }
}

// As kernels before 6.13 and sandboxes answer that do not know the call.
TEST(RemoveItem, FindsLocksWhereTheKernelCannotLookThemUpInAFolder) {
  constexpr long kGetAttributeAt = 464;
  for (const int error : {ENOSYS, EPERM}) {
    const Tree tree("tree/file!");
    const auto body = [&] {
      EXPECT_EQ(ErrorOf(RemoveItem(tree / "tree")), kNotPermitted);
      ASSERT_TRUE(SetLock(tree / "tree/file", false));
      EXPECT_TRUE(RemoveItem(tree / "tree"));
    };
    ORB_IN_CHILD(RunInChild([&] { return RefuseCalls({{kGetAttributeAt, error}}); }, body));
    EXPECT_FALSE(tree.Has("tree"));
  }
}

TEST(RemoveItem, DoesNotEnterAVolumeMountedInside) {
  const Tree tree("tree/mounted/, other/photo");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(BindMount(tree / "other", tree / "tree/mounted"));
    EXPECT_EQ(ErrorOf(RemoveItem(tree / "tree")), kBusy);
    EXPECT_EQ(ErrorOf(RemoveItem(tree / "tree/mounted")), kBusy);
    EXPECT_TRUE(tree.Has("tree/mounted/photo"));
  }));
}

// Somebody exchanges a folder in the tree for a link to a folder outside, again and again.
TEST(RemoveItem, LeavesTheTreeThroughNoSwappedLink) {
  const Tree tree("outside/photo=x, trap -> outside");
  const std::string trap = tree / "trap";
  const std::string sub = tree / "tree/sub";
  std::atomic<bool> done = false;
  std::thread swapper([&] {
    while (!done) ::renameat2(AT_FDCWD, trap.c_str(), AT_FDCWD, sub.c_str(), RENAME_EXCHANGE);
  });
  for (int round = 0; round < 30 && tree.Read("outside/photo") == "x"; ++round) {
    std::error_code ignored;
    fs::create_directories(sub, ignored);
    for (int i = 0; i < 10; ++i) tree.Write("tree/sub/" + std::to_string(i), "");
    (void)RemoveItem(tree / "tree");
    for (int i = 0; i < 10; ++i) fs::remove(tree / ("outside/" + std::to_string(i)), ignored);
  }
  done = true;
  swapper.join();
  EXPECT_EQ(tree.Read("outside/photo"), "x");
}

TEST(IsItemOrAbove, KnowsItemsUnderEveryPathButNotTheirHardLinks) {
  const Tree tree("photos/raw/a, photos/raw/b => photos/raw/a, link -> photos");
  const std::pair<const char*, bool> kCases[] = {
      {"photos/raw/a", true},
      {"link/raw/a", true},
      {"link/../photos/raw/../raw/a", true},
      {"photos/raw/b", false},
      {"photos/raw", true},
      {"link/raw/", true},
      {"link/..", true},
      {"link", false},  // The link itself holds nothing.
  };
  for (const auto& [path, expected] : kCases)
    EXPECT_EQ(IsItemOrAbove(tree / path, tree / "photos/raw/a").Value(), expected) << path;
  EXPECT_FALSE(IsItemOrAbove(tree / "missing", tree / "photos"));
  EXPECT_EQ(ResolvedPath(tree / "link/raw/../../link").Value(),
            fs::canonical(tree.Path()).string() + "/link");
  EXPECT_EQ(ResolvedPath("/").Value(), "/");
  EXPECT_EQ(ResolvedPath("/tmp").Value(), "/tmp");
}

TEST(RemoveItem, GoesOnWhenSomebodyElseRemovesSomeOfIt) {
  const Tree tree("tree/");
  for (int i = 0; i < 3'000; ++i) tree.Write("tree/" + std::to_string(i), "");
  std::thread other([&] {
    std::error_code ignored;
    for (int i = 3'000; --i >= 0;) fs::remove(tree / ("tree/" + std::to_string(i)), ignored);
  });
  EXPECT_TRUE(RemoveItem(tree / "tree"));
  other.join();
}

}  // namespace
}  // namespace orb::platform

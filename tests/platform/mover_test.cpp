// SPDX-License-Identifier: MIT
#include "platform/mover.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <string>

#include "platform/items.h"
#include "support/faults.h"
#include "support/temp_folder.h"
#include "support/trees.h"

namespace {

namespace fs = std::filesystem;
using orb::platform::Error;
using orb::platform::Items;
using orb::platform::kInvalidName;
using orb::platform::kItemExists;
using orb::platform::kNoSuchItem;
using orb::platform::kNotPermitted;
using orb::platform::MoveItem;
using orb::test::ReadAll;
using orb::test::RunWithPrivateMounts;
using orb::test::TempFolder;

constexpr Error kDone{orb::platform::ErrorDomain::kMach, 0};

Error ErrorOf(const orb::platform::Status& status) { return status ? kDone : status.Reason(); }

std::set<std::string> NamesIn(const std::string& folder) {
  std::set<std::string> names;
  for (const auto& item : fs::directory_iterator(folder)) names.insert(item.path().filename());
  return names;
}

TEST(MoveItem, NeverReplacesAnything) {
  const TempFolder folder;
  for (const char* name : {"a", "b", "locked", "pinned/file"}) {
    fs::create_directories(fs::path(folder / name).parent_path());
    folder.Write(name, name);
  }
  fs::create_directories(folder / "tree/sub");
  fs::create_symlink("nowhere", folder / "dangling");
  fs::create_hard_link(folder / "a", folder / "A");
  ASSERT_TRUE(Items::Current().SetLocked(folder / "locked", true));
  ASSERT_TRUE(Items::Current().SetLocked(folder / "pinned", true));
  const struct {
    const char* from;
    const char* to;
    Error expected;
  } kRefused[] = {
      {"a", "b", kItemExists},
      {"a", "A", kItemExists},  // Two names of one file, and not two spellings of one name.
      {"a", "dangling", kItemExists},
      {"tree", "tree/..", kItemExists},
      {"tree", "tree/sub/tree", {orb::platform::ErrorDomain::kPosix, EINVAL}},
      {"a", "new/", kInvalidName},
      {"a", "missing/a", kNoSuchItem},
      {"missing", "new", kNoSuchItem},
      {"a/", "new", kNoSuchItem},
      {"tree/.", "new", kNotPermitted},
      {"locked", "new", kNotPermitted},
      {"pinned/file", "new", kNotPermitted},
      {"a", "pinned/new", kNotPermitted},
  };
  const auto before = orb::test::Describe(folder.Path());
  for (const auto& c : kRefused) {
    SCOPED_TRACE(std::string(c.from) + " to " + c.to);
    EXPECT_EQ(ErrorOf(MoveItem(folder / c.from, folder / c.to)), c.expected);
  }
  EXPECT_EQ(orb::test::Describe(folder.Path()), before);
  EXPECT_TRUE(MoveItem(folder / "a", folder / "tree/sub/a"));
  EXPECT_TRUE(MoveItem(folder / "tree", folder / "moved/"));
  EXPECT_TRUE(MoveItem(folder / "dangling", folder / "moved/dangling"));
  EXPECT_EQ(ReadAll(folder / "moved/sub/a"), "a");
  EXPECT_EQ(fs::read_symlink(folder / "moved/dangling"), "nowhere");
}

// An exFAT card knows neither case nor links nor renaming without replacing.
TEST(MoveItem, ChangesTheCaseOfANameOnACard) {
  const TempFolder folder;
  const std::string image = folder / "image";
  const std::string card = folder / "card";
  fs::create_directory(card);
  const std::string mount =
      "(truncate -s 8M " + image + " && mkfs.exfat " + image + " && loop=$(losetup -f --show " +
      image + ")" + " && mount.exfat-fuse $loop " + card + " && losetup -d $loop) >/dev/null 2>&1";
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    if (std::system(mount.c_str()) != 0) ::_exit(orb::test::kImpossibleStatus);
    EXPECT_EQ(ErrorOf(MoveItem(folder / "image", card + "/image")),
              (Error{orb::platform::ErrorDomain::kPosix, EXDEV}));
    folder.Write("card/img.jpg", "photo");
    folder.Write("card/other.jpg", "other");
    fs::create_directory(card + "/tree");
    EXPECT_EQ(ErrorOf(MoveItem(card + "/img.jpg", card + "/OTHER.jpg")), kItemExists);
    EXPECT_EQ(ErrorOf(MoveItem(card + "/img.jpg", card + "/IMG.jpg")), kDone);
    EXPECT_EQ(ErrorOf(MoveItem(card + "/tree", card + "/Tree")), kDone);
    EXPECT_EQ(ErrorOf(MoveItem(card + "/other.jpg", card + "/Tree/new.jpg")), kDone);
    EXPECT_EQ(NamesIn(card), (std::set<std::string>{"IMG.jpg", "Tree"}));
    EXPECT_EQ(ReadAll(card + "/IMG.jpg"), "photo");
    EXPECT_EQ(ReadAll(card + "/Tree/new.jpg"), "other");
    ::umount2(card.c_str(), MNT_DETACH);
  }));
}

}  // namespace

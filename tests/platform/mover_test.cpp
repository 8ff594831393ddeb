// SPDX-License-Identifier: MIT
#include "platform/mover.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <string>

#include "platform/item_relations.h"
#include "platform/items.h"
#include "support/faults.h"
#include "support/temp_folder.h"
#include "support/trees.h"

namespace {

namespace fs = std::filesystem;
using orb::platform::Error;
using orb::platform::ExpectMovable;
using orb::platform::ExpectMovableTo;
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
    EXPECT_EQ(ErrorOf(MoveItem(folder / "image", card + "/image")), orb::platform::kVolumeFull);
    EXPECT_TRUE(fs::exists(folder / "image"));
    EXPECT_EQ(NamesIn(card), std::set<std::string>());
    folder.Write("card/img.jpg", "photo");
    folder.Write("card/other.jpg", "other");
    fs::create_directory(card + "/tree");
    const auto isOne = orb::platform::IsItemOrAbove(card + "/IMG.JPG", card + "/img.jpg");
    EXPECT_TRUE(isOne && isOne.Value());  // What removes a destination asks this first.
    const auto isOther = orb::platform::IsItemOrAbove(card + "/OTHER.jpg", card + "/img.jpg");
    EXPECT_TRUE(isOther && !isOther.Value());
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

/// Two volumes, and a tree on the first one. For the body of RunWithPrivateMounts.
void MakeVolumes(const TempFolder& folder) {
  ASSERT_TRUE(orb::test::MountTmpfs(folder / "a", "size=64m"));
  ASSERT_TRUE(orb::test::MountTmpfs(folder / "b", "size=64m"));
  ASSERT_TRUE(orb::test::MountTmpfs(folder / "small", "size=1m"));
  fs::create_directories(folder / "a/tree/sub/empty");
  folder.Write("a/tree/100%.jpg", "photo");
  folder.Write("a/tree/sub/big", std::string(3 << 20, 'b'));
  fs::create_symlink("nowhere", folder / "a/tree/link");
  for (const char* name : {"b", "small"}) folder.Write(std::string(name) + "/taken", "old");
}

TEST(MoveItem, BringsFilesLinksAndTreesToAnotherVolume) {
  const TempFolder folder;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MakeVolumes(folder);
    const auto before = orb::test::Describe(folder / "a");
    const int descriptors = orb::test::OpenDescriptors();
    fs::remove(folder / "b/taken");
    for (const char* name : {"tree/100%.jpg", "tree/link"}) {
      const std::string there = folder / "b/" + fs::path(name).filename().string();
      EXPECT_EQ(ErrorOf(MoveItem(folder / "a/" + name, there)), kDone) << name;
      EXPECT_FALSE(fs::exists(fs::symlink_status(folder / "a/" + name)));
      EXPECT_EQ(ErrorOf(MoveItem(there, folder / "a/" + name)), kDone) << name;
    }
    const auto tree = orb::test::Describe(folder / "a/tree");
    EXPECT_EQ(ErrorOf(MoveItem(folder / "a/tree", folder / "b/tree/")), kDone);
    EXPECT_EQ(orb::test::Describe(folder / "b/tree"), tree);
    EXPECT_EQ(NamesIn(folder / "b"), std::set<std::string>{"tree"});
    EXPECT_EQ(NamesIn(folder / "a"), std::set<std::string>());
    EXPECT_EQ(before.size(), tree.size() + 1);
    ASSERT_TRUE(orb::test::MakeChain(folder / "a", 2100));  // Deeper than a path can tell.
    EXPECT_EQ(ErrorOf(MoveItem(folder / "a/d", folder / "b/d")), kDone);
    EXPECT_EQ(orb::test::ChainDepth(folder / "b"), 2101);
    EXPECT_EQ(orb::test::OpenDescriptors(), descriptors);
  }));
}

void MakeObstacle(const TempFolder& folder, const std::string& kind) {
  const std::string path = folder / "a/tree/obstacle";
  if (kind.empty()) return;
  if (kind == "pipe") {
    ASSERT_EQ(::mkfifo(path.c_str(), 0600), 0);
    return;
  }
  folder.Write("a/tree/obstacle", "x");
  if (kind == "locked") {
    ASSERT_TRUE(Items::Current().SetLocked(path, true));
    return;
  }
  ASSERT_EQ(::chmod(path.c_str(), 0600), 0);
  ASSERT_EQ(::chown((folder / "a/tree").c_str(), 65534, 65534), 0);
}

TEST(MoveItem, LeavesBothVolumesAsTheyWereWhenTheCopyFails) {
  const TempFolder folder;
  const struct {
    const char* obstacle;  // What is made in the tree: secret is not to be read.
    const char* from;
    const char* to;
    Error expected;
  } kCases[] = {
      {"", "a/tree", "small/tree", orb::platform::kVolumeFull},
      {"", "a/tree/sub/big", "small/big", orb::platform::kVolumeFull},
      {"", "a/tree", "small/taken", kItemExists},
      {"", "a/tree/100%.jpg", "b/taken", kItemExists},
      {"", "a/tree", "b/missing/tree", kNoSuchItem},
      {"locked", "a/tree", "b/tree", kNotPermitted},
      {"locked", "a/tree/obstacle", "b/file", kNotPermitted},
      {"pipe", "a/tree", "b/tree", kNotPermitted},
      {"pipe", "a/tree/obstacle", "b/file", kNotPermitted},
      {"secret", "a/tree", "b/tree", kNotPermitted},
      {"secret", "a/tree/obstacle", "b/file", kNotPermitted},
  };
  ASSERT_EQ(::chmod(folder.Path().c_str(), 0777), 0);
  for (const auto& c : kCases) {
    SCOPED_TRACE(std::string(c.obstacle) + " " + c.from + " to " + c.to);
    ORB_IN_CHILD(RunWithPrivateMounts([&] {
      MakeVolumes(folder);
      MakeObstacle(folder, c.obstacle);
      const auto before = orb::test::Describe(folder / "a");
      ASSERT_EQ(::seteuid(*c.obstacle == 's' ? 65534 : 0), 0);
      // What makes way for the item asks before. It does not look for pipes in a tree.
      const std::string obstacle = c.obstacle;
      const bool foreseen =
          !obstacle.empty() && (obstacle != "pipe" || std::string(c.from).ends_with("obstacle"));
      const auto movable = ExpectMovable(folder / c.from);
      const auto leaves = ExpectMovableTo(folder / c.from, folder / "b/new");
      EXPECT_EQ(movable && leaves, !foreseen);
      EXPECT_EQ(ErrorOf(MoveItem(folder / c.from, folder / c.to)), c.expected);
      ASSERT_EQ(::seteuid(0), 0);
      EXPECT_TRUE(orb::test::Describe(folder / "a") == before);
      EXPECT_EQ(NamesIn(folder / "b"), std::set<std::string>{"taken"});
      EXPECT_EQ(NamesIn(folder / "small"), std::set<std::string>{"taken"});
      EXPECT_EQ(ReadAll(folder / "b/taken"), "old");
    }));
  }
}

// Another user's file in a folder with the sticky bit may be read but not taken away.
TEST(MoveItem, KeepsTheCopyOfASourceThatCannotBeRemoved) {
  const TempFolder folder;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MakeVolumes(folder);
    folder.Write("a/photo", "photo");
    ASSERT_EQ(::chmod((folder / "a").c_str(), 01777), 0);
    ASSERT_EQ(::chmod(folder.Path().c_str(), 0777), 0);
    ASSERT_EQ(::chmod((folder / "b").c_str(), 0777), 0);
    ASSERT_EQ(::setresuid(65534, 65534, 65534), 0);
    EXPECT_EQ(ErrorOf(MoveItem(folder / "a/photo", folder / "b/photo")), kNotPermitted);
    EXPECT_EQ(ReadAll(folder / "a/photo"), "photo");
    EXPECT_EQ(ReadAll(folder / "b/photo"), "photo");
  }));
}

TEST(MoveItem, LosesNothingWhenItIsKilledOnTheWayToAnotherVolume) {
  const TempFolder folder;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MakeVolumes(folder);
    for (int i = 0; i < 200; ++i)
      folder.Write("a/tree/sub/" + std::to_string(i), std::string(50000, 'x'));
    const auto whole = orb::test::Describe(folder / "a/tree");
    bool arrived = false;
    for (int delay = 0; !arrived && delay < 400; ++delay) {
      SCOPED_TRACE(delay);
      const pid_t mover = ::fork();
      if (mover == 0) ::_exit(MoveItem(folder / "a/tree", folder / "b/tree") ? 0 : 1);
      ::usleep(static_cast<useconds_t>(delay) * 500);
      ::kill(mover, SIGKILL);
      ASSERT_EQ(::waitpid(mover, nullptr, 0), mover);
      arrived = fs::exists(folder / "b/tree");
      ASSERT_EQ(orb::test::Describe(folder / (arrived ? "b/tree" : "a/tree")), whole);
      for (const auto& part : fs::directory_iterator(folder / "b"))
        if (part.path().filename().string().starts_with(".orb-")) fs::remove_all(part);
    }
    EXPECT_TRUE(arrived);
  }));
}

// The lease tells when the copy comes to the second file: the first is written to, or the tree
// goes.
TEST(MoveItem, LosesNothingOfATreeThatChangesMeanwhile) {
  const TempFolder folder;
  static int first, second;
  static std::string tree, away;
  for (const char* elsewhere : {"", "a/away"}) {
    ORB_IN_CHILD(RunWithPrivateMounts([&] {
      MakeVolumes(folder);
      tree = folder / "a/tree";
      away = *elsewhere == '\0' ? "" : folder / elsewhere;
      first = ::open((tree + "/100%.jpg").c_str(), O_WRONLY | O_APPEND | O_CLOEXEC);
      second = ::open((tree + "/sub/big").c_str(), O_RDWR | O_CLOEXEC);
      ::signal(SIGIO, [](int) {
        const bool done =
            away.empty() ? ::write(first, "!", 1) == 1 : ::rename(tree.c_str(), away.c_str()) == 0;
        ::close(done ? second : first);
      });
      ASSERT_EQ(::fcntl(second, F_SETLEASE, F_WRLCK), 0);
      EXPECT_FALSE(MoveItem(tree, folder / "b/tree"));
      EXPECT_EQ(ReadAll((away.empty() ? tree : away) + "/100%.jpg"),
                away.empty() ? "photo!" : "photo");
      EXPECT_EQ(ReadAll(folder / "b/tree/100%.jpg"), away.empty() ? "" : "photo");
    }));
  }
}

}  // namespace

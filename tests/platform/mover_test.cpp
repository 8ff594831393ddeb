// SPDX-License-Identifier: MIT
#include "platform/mover.h"

#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include "platform/item_relations.h"
#include "support/files.h"

namespace orb::platform {
namespace {

using namespace test;
using Names = std::set<std::string>;

Error Move(const std::string& from, const std::string& to) { return ErrorOf(MoveItem(from, to)); }

TEST(MoveItem, NeverReplacesAnything) {
  const Tree tree("a, b, locked!, pinned/file, pinned/!, tree/sub/, dangling -> nowhere, A => a");
  const Row<Error> kRefused[] = {
      {"a", "b", kItemExists},
      {"a", "A", kItemExists},  // Two names of one file, and not two spellings of one name.
      {"a", "dangling", kItemExists},
      {"tree", "tree/..", kItemExists},
      {"tree", "tree/sub/tree", {ErrorDomain::kPosix, EINVAL}},
      {"a", "missing/a", kNoSuchItem},
      {"missing", "new", kNoSuchItem},
      {"a/", "new", kNoSuchItem},
      {"tree/.", "new", kNotPermitted},
      {"locked", "new", kNotPermitted},
      {"pinned/file", "new", kNotPermitted},
      {"a", "pinned/new", kNotPermitted},
  };
  ExpectRefusals(tree, kRefused, Move);
  EXPECT_EQ(Move(tree / "a", tree / "tree/sub/a"), kDone);
  EXPECT_EQ(Move(tree / "tree", tree / "moved/"), kDone);
  EXPECT_EQ(Move(tree / "dangling", tree / "moved/dangling"), kDone);
  EXPECT_EQ(tree.Read("moved/sub/a"), "a");
  EXPECT_EQ(fs::read_symlink(tree / "moved/dangling"), "nowhere");
}

// An exFAT card knows neither case nor links nor renaming without replacing.
TEST(MoveItem, ChangesTheCaseOfANameOnACard) {
  const Tree tree;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MountCard(tree, "card");
    const auto isOneOrAbove = [&](const char* item, const char* other) {
      return IsItemOrAbove(tree / item, tree / other).Value();
    };
    EXPECT_EQ(Move(tree / "image", tree / "card/image"), kVolumeFull);
    EXPECT_TRUE(tree.Has("image"));
    EXPECT_EQ(NamesIn(tree / "card"), Names());
    tree.Make("card/img.jpg=photo, card/other.jpg=other, card/tree/");
    // What removes a destination asks this first.
    EXPECT_TRUE(isOneOrAbove("card/IMG.JPG", "card/img.jpg"));
    EXPECT_FALSE(isOneOrAbove("card/OTHER.jpg", "card/img.jpg"));
    EXPECT_EQ(Move(tree / "card/img.jpg", tree / "card/OTHER.jpg"), kItemExists);
    EXPECT_EQ(Move(tree / "card/img.jpg", tree / "card/IMG.jpg"), kDone);
    EXPECT_EQ(Move(tree / "card/tree", tree / "card/Tree"), kDone);
    EXPECT_EQ(Move(tree / "card/other.jpg", tree / "card/Tree/new.jpg"), kDone);
    EXPECT_EQ(NamesIn(tree / "card"), (Names{"IMG.jpg", "Tree"}));
    EXPECT_EQ(tree.Read("card/IMG.jpg") + tree.Read("card/Tree/new.jpg"), "photoother");
    ::umount2((tree / "card").c_str(), MNT_DETACH);
  }));
}

/// Three volumes, and a tree on the first one. For the body of RunWithPrivateMounts.
void MakeVolumes(const Tree& tree) {
  ASSERT_TRUE(MountTmpfs(tree / "a", "size=64m"));
  ASSERT_TRUE(MountTmpfs(tree / "b", "size=64m"));
  ASSERT_TRUE(MountTmpfs(tree / "small", "size=1m"));
  tree.Make("a/tree/sub/empty/, a/tree/100%.jpg=photo, a/tree/link -> nowhere");
  tree.Make("b/taken=old, small/taken=old, a/tree/sub/big=" + std::string(3 << 20, 'b'));
}

TEST(MoveItem, BringsFilesLinksAndTreesToAnotherVolume) {
  const Tree tree;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MakeVolumes(tree);
    const auto before = Describe(tree / "a/tree");
    const int descriptors = OpenDescriptors();
    for (const std::string name : {"100%.jpg", "link"}) {
      EXPECT_EQ(Move(tree / "a/tree/" + name, tree / "b/" + name), kDone);
      EXPECT_FALSE(tree.Has("a/tree/" + name));
      EXPECT_EQ(Move(tree / "b/" + name, tree / "a/tree/" + name), kDone);
    }
    EXPECT_EQ(Move(tree / "a/tree", tree / "b/tree/"), kDone);
    EXPECT_EQ(Describe(tree / "b/tree"), before);
    EXPECT_EQ(NamesIn(tree / "b"), (Names{"taken", "tree"}));
    EXPECT_EQ(NamesIn(tree / "a"), Names());
    ASSERT_TRUE(MakeChain(tree / "a", 2100));  // Deeper than a path can tell.
    EXPECT_EQ(Move(tree / "a/d", tree / "b/d"), kDone);
    EXPECT_EQ(ChainDepth(tree / "b"), 2101);
    EXPECT_EQ(OpenDescriptors(), descriptors);
  }));
}

TEST(MoveItem, LeavesBothVolumesAsTheyWereWhenTheCopyFails) {
  const struct {
    std::string obstacle;  // What is made in the tree beforehand.
    uid_t user;
    std::string from, to;
    Error expected;
  } kCases[] = {
      {"", 0, "a/tree", "small/tree", kVolumeFull},
      {"", 0, "a/tree/sub/big", "small/big", kVolumeFull},
      {"", 0, "a/tree", "small/taken", kItemExists},
      {"", 0, "a/tree", "b/missing/tree", kNoSuchItem},
      {"a/tree/locked!", 0, "a/tree", "b/tree", kNotPermitted},
      {"a/tree/pipe|", 0, "a/tree", "b/tree", kNotPermitted},
      {"a/tree/secret 0600", kStranger, "a/tree", "b/tree", kNotPermitted},
      {"a/tree/secret 0600", kStranger, "a/tree/secret", "b/file", kNotPermitted},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.obstacle + c.from + " to " + c.to);
    const Tree tree;
    ORB_IN_CHILD(RunWithPrivateMounts([&] {
      MakeVolumes(tree);
      tree.Make(c.obstacle);
      ASSERT_EQ(::chown((tree / "a/tree").c_str(), c.user, c.user), 0);
      const Unchanged unchanged(tree / "a");
      ASSERT_EQ(::seteuid(c.user), 0);
      // What makes way for the item asks before.
      const bool foreseen = !c.obstacle.empty();
      const std::string from = tree / c.from;
      EXPECT_EQ(ExpectMovable(from) && ExpectMovableTo(from, tree / "b/new"), !foreseen);
      EXPECT_EQ(Move(tree / c.from, tree / c.to), c.expected);
      ASSERT_EQ(::seteuid(0), 0);
      for (const std::string volume : {"b", "small"}) {
        EXPECT_EQ(NamesIn(tree / volume), Names{"taken"});
        EXPECT_EQ(tree.Read(volume + "/taken"), "old");
      }
    }));
  }
}

// Another user's file in a folder with the sticky bit may be read but not taken away.
TEST(MoveItem, KeepsTheCopyOfASourceThatCannotBeRemoved) {
  const Tree tree;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MakeVolumes(tree);
    tree.Make("a/photo, a/ 01777, b/ 0777");
    ASSERT_EQ(::setresuid(kStranger, kStranger, kStranger), 0);
    EXPECT_EQ(Move(tree / "a/photo", tree / "b/photo"), kNotPermitted);
    EXPECT_EQ(tree.Read("a/photo"), "a/photo");
    EXPECT_EQ(tree.Read("b/photo"), "a/photo");
  }));
}

// What makes way for the item asks before, and the rename would refuse it afterwards.
TEST(ExpectMovable, KnowsWhatARenameAsksBesideTheFoldersPermission) {
  const Tree tree;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    for (const char* folder : {"sticky", "from/folder", "to", "bound"})
      fs::create_directories(tree / folder);
    tree.Write("sticky/photo", "photo");
    ASSERT_EQ(::mkfifo((tree / "from/pipe").c_str(), 0666), 0);
    ASSERT_EQ(::chmod((tree / "sticky").c_str(), 01777), 0);
    ASSERT_EQ(::mount((tree / "to").c_str(), (tree / "bound").c_str(), "", MS_BIND, nullptr), 0);
    for (const std::string folder : {"", "from", "to"})
      ASSERT_EQ(::chown((tree / folder).c_str(), kStranger, kStranger), 0);
    ASSERT_EQ(::setresuid(kStranger, kStranger, kStranger), 0);
    const struct {
      const char* from;
      const char* to;
      bool movable;
    } kCases[] = {
        {"sticky/photo", "to/photo", false},  // Neither it nor its folder is the stranger's.
        {"from/folder", "to/folder", false},  // Its ".." is not his to change.
        {"from/folder", "from/other", true},
        {"from/pipe", "bound/pipe", false},  // One volume, and yet no way for a rename.
        {"from/pipe", "to/pipe", true},
    };
    for (const auto& c : kCases) {
      SCOPED_TRACE(std::string(c.from) + " to " + c.to);
      const std::string from = tree / c.from, to = tree / c.to;
      EXPECT_EQ(ExpectMovable(from) && ExpectMovableTo(from, to), c.movable);
      EXPECT_EQ(MoveItem(from, to).Ok(), c.movable);
    }
  }));
}

TEST(MoveItem, LosesNothingWhenItIsKilledOnTheWayToAnotherVolume) {
  const Tree tree;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MakeVolumes(tree);
    for (int i = 0; i < 200; ++i)
      tree.Write("a/tree/sub/" + std::to_string(i), std::string(50000, 'x'));
    const auto whole = Describe(tree / "a/tree");
    bool arrived = false;
    for (int delay = 0; !arrived && delay < 400; ++delay) {
      const pid_t mover = ::fork();
      if (mover == 0) ::_exit(MoveItem(tree / "a/tree", tree / "b/tree") ? 0 : 1);
      ::usleep(static_cast<useconds_t>(delay) * 500);
      ::kill(mover, SIGKILL);
      ASSERT_EQ(::waitpid(mover, nullptr, 0), mover);
      arrived = tree.Has("b/tree");
      ASSERT_TRUE(Describe(tree / (arrived ? "b/tree" : "a/tree")) == whole) << delay;
      for (const std::string& part : NamesIn(tree / "b"))
        if (part.starts_with(".orb-")) fs::remove_all(tree / "b/" + part);
    }
    EXPECT_TRUE(arrived);
  }));
}

// The lease tells when the copy comes to the second file: the first is written to, or the tree
// goes.
TEST(MoveItem, LosesNothingOfATreeThatChangesMeanwhile) {
  const Tree tree;
  static int first, second;
  static std::string from, away;
  for (const char* elsewhere : {"", "a/away"}) {
    ORB_IN_CHILD(RunWithPrivateMounts([&] {
      MakeVolumes(tree);
      from = tree / "a/tree";
      away = *elsewhere == '\0' ? "" : tree / elsewhere;
      first = ::open((from + "/100%.jpg").c_str(), O_WRONLY | O_APPEND | O_CLOEXEC);
      second = ::open((from + "/sub/big").c_str(), O_RDWR | O_CLOEXEC);
      ::signal(SIGIO, [](int) {
        const bool done =
            away.empty() ? ::write(first, "!", 1) == 1 : ::rename(from.c_str(), away.c_str()) == 0;
        ::close(done ? second : first);
      });
      ASSERT_EQ(::fcntl(second, F_SETLEASE, F_WRLCK), 0);
      EXPECT_FALSE(MoveItem(from, tree / "b/tree"));
      EXPECT_EQ(ReadAll((away.empty() ? from : away) + "/100%.jpg"),
                away.empty() ? "photo!" : "photo");
      EXPECT_EQ(tree.Read("b/tree/100%.jpg"), away.empty() ? "" : "photo");
    }));
  }
}

}  // namespace
}  // namespace orb::platform

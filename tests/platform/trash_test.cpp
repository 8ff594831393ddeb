// SPDX-License-Identifier: MIT
#include "platform/trash.h"

#include <atomic>
#include <regex>
#include <sstream>
#include <thread>

#include "platform/trash_text.h"
#include "support/environment.h"
#include "support/files.h"

namespace orb::platform {
namespace {

using namespace test;

TEST(TrashText, TellsWhereAnItemWasAndSinceWhen) {
  EXPECT_EQ(InfoText("a#b", {2004, 8, 3, 9, 5, 7}),
            "[Trash Info]\nPath=a%23b\nDeletionDate=2004-08-03T09:05:07\n");
}

TEST(TrashText, NumbersNamesAndKeepsThemShort) {
  const std::string long245(245, 'x');
  const std::tuple<std::string, unsigned, std::string> kCases[] = {
      {"photo.jpg", 1, "photo.jpg"},
      {"photo.jpg", 12, "photo.12.jpg"},
      {".hidden", 2, ".hidden.2"},
      {long245, 1, long245},
      {long245 + ".jpeg", 2, std::string(238, 'x') + ".2.jpeg"},
      {std::string(243, 'x') + "\xe2\x82\xac", 1, std::string(243, 'x')},
      {"a." + std::string(250, 'y'), 1, "a." + std::string(243, 'y')},
  };
  for (const auto& [name, number, result] : kCases)
    EXPECT_EQ(NumberedName(name, number), result) << name;
}

bool RunShell(const std::string& command) { return std::system(command.c_str()) == 0; }

/// A home of its own, and a folder with items beside it.
class TrashTest : public testing::Test {
 protected:
  std::string Items() const { return tree_ / "items"; }
  std::string Home() const { return tree_ / "data/Trash"; }
  /// Makes a file and puts it into the trash.
  Status PutNew(const std::string& name, const std::string& content = "photo") const {
    tree_.Make(name + "=" + content);
    return Put(tree_ / name);
  }
  static Status Put(const std::string& path) { return Trash().Put(path); }
  /// What the record of an item says it was.
  static std::string PathIn(const std::string& trash, const std::string& name) {
    const std::string info = ReadAll(trash + "/info/" + name + ".trashinfo");
    static const std::regex kInfo(
        R"(\[Trash Info\]\nPath=(.*)\nDeletionDate=\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\n)");
    std::smatch match;
    return std::regex_match(info, match, kInfo) ? match[1].str() : "no record: " + info;
  }
  /// Nothing that was put there is left: no item, no record, and nothing half made.
  static bool IsEmpty(const std::string& trash) {
    const auto isEmpty = [](const std::string& f) { return !fs::exists(f) || fs::is_empty(f); };
    return isEmpty(trash + "/files") && isEmpty(trash + "/info");
  }

  const Tree tree_{"items/"};
  const ScopedVariable data_{"XDG_DATA_HOME", tree_ / "data"};
  const ScopedVariable home_{"HOME", tree_ / "home"};
};

TEST_F(TrashTest, KeepsContentAndPathWhateverTheName) {
  const std::pair<std::string, std::string> kCases[] = {
      {"photo.jpg", "photo.jpg"},
      {"100% pure.jpg", "100%25%20pure.jpg"},
      {"K\xc3\xb6ln.jpg", "K%C3%B6ln.jpg"},
      {"two\nlines", "two%0Alines"},
      {"-rf #?&;", "-rf%20%23%3F%26%3B"},
  };
  for (const auto& [name, recorded] : kCases) {
    SCOPED_TRACE(name);
    ASSERT_TRUE(PutNew("items/" + name, name));
    EXPECT_FALSE(tree_.Has("items/" + name));
    EXPECT_EQ(ReadAll(Home() + "/files/" + name), name);
    EXPECT_EQ(PathIn(Home(), name), Items() + "/" + recorded);
  }
  for (const char* part : {"", "/files", "/info"}) EXPECT_EQ(ModeOf(Home() + part), 0700u) << part;
  EXPECT_EQ(ModeOf(Home() + "/info/photo.jpg.trashinfo"), 0600u);
}

TEST_F(TrashTest, CountsUpAndNeverReplaces) {
  const std::string longName(255, 'x');
  for (const char* content : {"first", "second"}) {
    EXPECT_TRUE(PutNew("items/a.jpg", content));
    EXPECT_TRUE(PutNew("items/" + longName, content));
  }
  tree_.Make("data/Trash/files/a.3.jpg=without record");
  EXPECT_TRUE(PutNew("items/a.jpg", "fourth"));
  const std::pair<std::string, std::string> kExpected[] = {
      {"a.jpg", "first"},
      {"a.2.jpg", "second"},
      {"a.3.jpg", "without record"},
      {"a.4.jpg", "fourth"},
      {longName.substr(0, 243) + ".2", "second"},
  };
  for (const auto& [name, content] : kExpected)
    EXPECT_EQ(ReadAll(Home() + "/files/" + name), content);
  EXPECT_EQ(PathIn(Home(), "a.jpg"), Items() + "/a.jpg");
  EXPECT_FALSE(fs::exists(Home() + "/info/a.3.jpg.trashinfo"));
}

TEST_F(TrashTest, TakesALinkItselfAndFollowsThoseAbove) {
  tree_.Make("items/real/a.jpg, items/linked -> real, items/real/link.jpg -> a.jpg");
  EXPECT_TRUE(Put(Items() + "/linked/link.jpg"));
  EXPECT_TRUE(fs::is_symlink(Home() + "/files/link.jpg"));
  EXPECT_EQ(PathIn(Home(), "link.jpg"), Items() + "/real/link.jpg");
  EXPECT_TRUE(Put(Items() + "/linked/")) << "also with the separator of a folder";
  EXPECT_TRUE(fs::is_symlink(Home() + "/files/linked"));
  EXPECT_TRUE(tree_.Has("items/real/a.jpg"));
}

TEST_F(TrashTest, ListsTheSizesOfFolders) {
  tree_.Make(
      "data/Trash/directorysizes=5 6 gone\n3 4 kept%201\n, data/Trash/info/kept 1.trashinfo");
  tree_.Make("items/a trip/deep/, items/a trip/a.jpg=" + std::string(10'000, 'a'));
  ASSERT_TRUE(Put(Items() + "/a trip"));
  struct stat info, part;
  ::stat((Home() + "/info/a trip.trashinfo").c_str(), &info);
  std::int64_t blocks = 0;
  for (const char* name : {"", "/a.jpg", "/deep"}) {
    ASSERT_EQ(::stat((Home() + "/files/a trip" + name).c_str(), &part), 0);
    blocks += part.st_blocks;
  }
  const std::string size = std::to_string(blocks * 512);
  EXPECT_EQ(ReadAll(Home() + "/directorysizes"),
            "3 4 kept%201\n" + size + " " + std::to_string(info.st_mtime) + " a%20trip\n");
}

TEST_F(TrashTest, RefusesAndLeavesEverythingAsItWas) {
  tree_.Make("data/Trash/files/old.jpg, data/Trash/info/old.jpg.trashinfo");
  tree_.Make("items/locked.jpg!, items/vault/a.jpg, items/vault/!");
  const Unchanged unchanged(tree_.Path());
  std::istringstream paths(
      "/ // . .. @/items/. @/items/.. @/items/gone/a @/items/locked.jpg/a @/items/vault/a.jpg "
      "@/data/Trash @/data/Trash/files @/data/Trash/info @/data/Trash/files/old.jpg @/data");
  for (std::string path; std::getline(paths, path, ' ');) {
    if (path.front() == '@') path.replace(0, 1, tree_.Path());
    EXPECT_FALSE(Put(path)) << path;
  }
  EXPECT_EQ(ErrorOf(Put("")), kNoSuchItem);
  EXPECT_EQ(ErrorOf(Put(Items() + "/locked.jpg")), kNotPermitted);
  EXPECT_EQ(ErrorOf(Put(Items() + "/gone")), kNoSuchItem);
}

TEST_F(TrashTest, FindsTheHome) {
  for (const auto& data : {std::optional<std::string>(), std::optional<std::string>("relative")}) {
    const ScopedVariable scoped("XDG_DATA_HOME", data);
    EXPECT_TRUE(PutNew("items/a.jpg"));
    EXPECT_TRUE(tree_.Has("home/.local/share/Trash/files/a.jpg"));
    fs::remove_all(tree_ / "home");
  }
  tree_.Make("disk/Trash/, data -> disk");
  EXPECT_TRUE(PutNew("items/a.jpg")) << "a home behind a link";
  EXPECT_TRUE(tree_.Has("disk/Trash/files/a.jpg"));
}

TEST_F(TrashTest, DoesNotTrustATrashThatIsALinkOrSomebodyElses) {
  if (::geteuid() != 0) GTEST_SKIP() << "needs root to give folders away";
  tree_.Make("items/a.jpg, data/");
  for (const std::string make : {"ln -s ../../items Trash/files",
                                 "mkdir Trash/info && chown 1 Trash/info",
                                 "chown 1 Trash"}) {
    const std::string begin = "cd '" + (tree_ / "data") + "' && rm -rf Trash && mkdir Trash && ";
    ASSERT_TRUE(RunShell(begin + make));
    EXPECT_FALSE(Put(Items() + "/a.jpg")) << make;
    EXPECT_TRUE(tree_.Has("items/a.jpg"));
  }
}

// --- Other volumes

class TrashOnVolume : public TrashTest {
 protected:
  std::string Volume() const { return tree_ / "volume"; }
  std::string Own() const { return Volume() + "/.Trash-" + std::to_string(::geteuid()); }
  bool Mount() const { return MountTmpfs(Volume(), "size=4m,mode=0755"); }
};

TEST_F(TrashOnVolume, IsInTheTopFolder) {
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount());
    ASSERT_TRUE(PutNew("volume/100% in/a.jpg"));
    EXPECT_EQ(PathIn(Own(), "a.jpg"), "100%25%20in/a.jpg");
    EXPECT_TRUE(fs::exists(Own() + "/files/a.jpg"));
    EXPECT_FALSE(Put(Own()));
    EXPECT_FALSE(fs::exists(Home())) << "not made when it is not needed";

    tree_.Make("volume/link -> " + Items() + ", bound/");
    EXPECT_TRUE(PutNew("volume/link/b.jpg"));
    EXPECT_EQ(PathIn(Home(), "b.jpg"), Items() + "/b.jpg") << "the folder's volume decides";

    ASSERT_TRUE(BindMount(Volume() + "/100% in", tree_ / "bound"));
    ASSERT_TRUE(PutNew("bound/c.jpg"));
    EXPECT_EQ(PathIn(tree_ / "bound/.Trash-0", "c.jpg"), "c.jpg");
  }));
}

// The shared folder only when it is safe, else the user's own, and else the home, by copy.
TEST_F(TrashOnVolume, IsTheFirstThatCanBeTrusted) {
  const std::string home = Home();
  const std::tuple<std::string, std::string, std::string> kCases[] = {
      {"mkdir .Trash && chmod 1777 .Trash", "", Volume() + "/.Trash/0"},
      {"mkdir .Trash && chmod 0777 .Trash", "", Own()},
      {"mkdir sticky && chmod 1777 sticky && ln -s sticky .Trash", "", Own()},
      {"mkdir -p .Trash/0 && chmod 1777 .Trash && chown 1 .Trash/0", "", Own()},
      {"ln -s in .Trash-0", "", home},
      {"mkdir .Trash-0 && chown 1 .Trash-0", "", home},
      {"mkdir .Trash-0 && ln -s ../in .Trash-0/files", "", home},
      {"true", "nr_inodes=6", home},
  };
  for (const auto& [make, options, trash] : kCases) {
    SCOPED_TRACE(make);
    ORB_IN_CHILD(RunWithPrivateMounts([&, &make = make, &options = options, &trash = trash] {
      ASSERT_TRUE(MountTmpfs(Volume(), options));
      tree_.Make("volume/in/a.jpg=photo, volume/in/trip/b.jpg=of the trip");
      tree_.Make("data/Trash/files/a.jpg=without record");
      ASSERT_EQ(::chdir(Volume().c_str()), 0);
      ASSERT_TRUE(RunShell(make));
      EXPECT_FALSE(Put(Volume() + "/.Trash"));
      EXPECT_TRUE(Put(Volume() + "/in/a.jpg"));
      EXPECT_TRUE(Put(Volume() + "/in/trip"));
      EXPECT_TRUE(fs::is_empty(Volume() + "/in"));
      EXPECT_EQ(ReadAll(trash + "/files/trip/b.jpg"), "of the trip");
      EXPECT_EQ(ReadAll(trash + (trash == Home() ? "/files/a.2.jpg" : "/files/a.jpg")), "photo");
      EXPECT_EQ(ReadAll(Home() + "/files/a.jpg"), "without record");
    }));
  }
}

TEST_F(TrashOnVolume, KeepsWhatCannotBeCopiedOrRemoved) {
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount());
    tree_.Make("volume/.Trash-0 -> " + Items());  // So that only the copy is left.
    tree_.Make("volume/trip/locked.jpg!, volume/with a pipe/pipe|, volume/with a pipe/a.jpg");
    const std::string big = tree_.Write("volume/big.jpg", std::string(100'000, 'b'));
    const auto before = Describe(Volume());
    {
      const SpaceLeft little(50'000);
      EXPECT_EQ(ErrorOf(Put(big)), kVolumeFull);
    }
    EXPECT_EQ(ErrorOf(Put(Volume() + "/trip")), kNotPermitted) << "something inside stays";
    EXPECT_EQ(ErrorOf(Put(Volume() + "/with a pipe")), kNotPermitted);
    ASSERT_TRUE(MakeReadOnlyVolume(Volume()));
    EXPECT_FALSE(Put(big));
    EXPECT_EQ(Describe(Volume()), before);
    EXPECT_TRUE(IsEmpty(Home()));
  }));
}

TEST_F(TrashOnVolume, CopiesForAUserWhoMayNotWriteToTheTop) {
  tree_.Make("data/ 0777");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount());
    tree_.Make("volume/in/a.jpg, volume/sticky/trip/, volume/closed/a.jpg");
    tree_.Make("volume/in/from a disc/a.jpg");
    tree_.Make("volume/in/ 0777, volume/sticky/ 01777");
    ASSERT_EQ(::setresuid(kStranger, kStranger, kStranger), 0);
    EXPECT_TRUE(Put(Volume() + "/in/a.jpg"));
    EXPECT_FALSE(tree_.Has("volume/in/a.jpg"));
    EXPECT_TRUE(fs::exists(Home() + "/files/a.jpg"));
    fs::remove_all(Home());
    const Unchanged unchanged(Volume());
    EXPECT_FALSE(Put(Volume() + "/sticky/trip"));
    EXPECT_FALSE(Put(Volume() + "/closed/a.jpg"));
    EXPECT_FALSE(Put(Volume() + "/in/from a disc"));
    EXPECT_TRUE(IsEmpty(Home()));
  }));
}

TEST_F(TrashOnVolume, CopiesWhereTheVolumeDoesNotRename) {
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(tree_ / "layers", "size=4m"));
    tree_.Make("volume/, layers/upper/, layers/spare/, layers/lower/trip/a.jpg");
    if (!RunShell("cd '" + (tree_ / "layers") + "' && mount -t overlay overlay ../volume -o " +
                  "redirect_dir=off,lowerdir=lower,upperdir=upper,workdir=spare 2>/dev/null"))
      ::_exit(kImpossibleStatus);
    EXPECT_TRUE(Put(Volume() + "/trip"));
    EXPECT_FALSE(tree_.Has("volume/trip"));
    EXPECT_EQ(ReadAll(Home() + "/files/trip/a.jpg"), "layers/lower/trip/a.jpg");
    EXPECT_TRUE(IsEmpty(Own()));
  }));
}

TEST_F(TrashOnVolume, KeepsFoldersWhereVolumesAreMounted) {
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(Items() + "/a/mounted", "size=1m"));
    EXPECT_EQ(ErrorOf(Put(Items() + "/a/mounted")), kBusy);
    EXPECT_EQ(ErrorOf(Put(Items() + "/a")), kBusy);
    EXPECT_TRUE(tree_.Has("items/a/mounted"));
    EXPECT_TRUE(IsEmpty(Home()));
  }));
}

TEST_F(TrashOnVolume, IsListedAndRestoredByTrashCli) {
  if (!RunShell("command -v trash-list trash-restore >/dev/null"))
    GTEST_SKIP() << "needs trash-cli";
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount() && MountTmpfs(tree_ / "shared", "size=1m"));
    tree_.Make("shared/.Trash/ 01777");
    for (const std::string place : {"items/", "volume/", "shared/in/"}) {
      for (const std::string name : {"100%25 a.jpg", "Gr\xc3\xbc\xc3\x9f\x65.jpg"}) {
        SCOPED_TRACE(place + name);
        const std::string path = tree_ / (place + name);
        ASSERT_TRUE(PutNew(place + name, name));
        EXPECT_TRUE(RunShell("trash-list | grep -F ' " + path + "' >/dev/null"));
        ASSERT_EQ(::chdir(tree_.Path().c_str()), 0);
        EXPECT_TRUE(RunShell("echo 0 | trash-restore '" + path + "' >/dev/null"));
        EXPECT_EQ(ReadAll(path), name);
      }
    }
  }));
}

TEST_F(TrashOnVolume, KeepsTheCopyOfWhatSomebodyElseRemoves) {
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount());
    tree_.Make("volume/a.jpg=photo, volume/.Trash-0 -> " + Items());  // Only the copy is left.
    const std::string file = Volume() + "/a.jpg";
    std::atomic<bool> done = false;
    std::thread other([&] {
      while (!done && !fs::exists(Home() + "/files/a.jpg")) std::this_thread::yield();
      ::unlink(file.c_str());
    });
    (void)Put(file);
    done = true;
    other.join();
    EXPECT_EQ(ReadAll(Home() + "/files/a.jpg"), "photo");
    EXPECT_EQ(PathIn(Home(), "a.jpg"), file);
  }));
}

}  // namespace
}  // namespace orb::platform

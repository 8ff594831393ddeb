// SPDX-License-Identifier: MIT
#include "platform/trash.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <regex>
#include <sstream>
#include <string>

#include "platform/items.h"
#include "platform/trash_text.h"
#include "platform/volumes.h"
#include "support/environment.h"
#include "support/faults.h"
#include "support/temp_folder.h"
#include "support/trees.h"

namespace orb::platform {
namespace {

namespace fs = std::filesystem;

TEST(TrashText, EncodesByBytes) {
  EXPECT_EQ(PercentEncoded("/a b/100%/\xc3\xbc\n\x01~-_.txt"), "/a%20b/100%25/%C3%BC%0A%01~-_.txt");
  EXPECT_EQ(InfoText("a#b", {2004, 8, 3, 9, 5, 7}),
            "[Trash Info]\nPath=a%23b\nDeletionDate=2004-08-03T09:05:07\n");
}

TEST(TrashText, NumbersNamesAndKeepsThemShort) {
  const std::string long245(245, 'x');
  const struct {
    std::string name;
    unsigned number;
    std::string result;
  } kCases[] = {
      {"photo.jpg", 1, "photo.jpg"},
      {"photo.jpg", 12, "photo.12.jpg"},
      {"photo", 2, "photo.2"},
      {".hidden", 2, ".hidden.2"},
      {"a.tar.gz", 3, "a.tar.3.gz"},
      {long245, 1, long245},
      {long245 + "0123456789", 1, long245},
      {long245 + ".jpeg", 2, std::string(238, 'x') + ".2.jpeg"},
      {std::string(243, 'x') + "\xe2\x82\xac", 1, std::string(243, 'x')},
      {"a." + std::string(250, 'y'), 1, "a." + std::string(243, 'y')},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.name);
    EXPECT_EQ(NumberedName(c.name, c.number), c.result);
  }
}

TEST(TrashText, ListsFolderSizesOnce) {
  const auto isThere = [](const std::string& name) { return name != "gone"; };
  EXPECT_EQ(WithFolderSize("1 2 a%20b\n3 4 gone\n5 6 kept\n", {7, 8, "a b"}, isThere),
            "5 6 kept\n7 8 a%20b\n");
  EXPECT_EQ(WithFolderSize("", {7, 8, "%"}, isThere), "7 8 %25\n");
}

bool RunShell(const std::string& command) { return std::system(command.c_str()) == 0; }

/// A home of its own, and a folder with items beside it.
class TrashTest : public testing::Test {
 protected:
  TrashTest() {
    fs::create_directories(Items());
    fs::permissions(folder_.Path(), fs::perms(0777));
  }

  std::string Items() const { return folder_ / "items"; }
  std::string Home() const { return folder_ / "data/Trash"; }
  std::string Make(const std::string& path, const std::string& content = "photo") const {
    fs::create_directories(fs::path(folder_ / path).parent_path());
    return folder_.Write(path, content);
  }
  static Status Put(const std::string& path) { return Trash().Put(path); }
  /// What the record of an item says it was.
  static std::string PathIn(const std::string& trash, const std::string& name) {
    const std::string info = test::ReadAll(trash + "/info/" + name + ".trashinfo");
    static const std::regex kInfo(
        R"(\[Trash Info\]\nPath=(.*)\nDeletionDate=\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\n)");
    std::smatch match;
    return std::regex_match(info, match, kInfo) ? match[1].str() : "no record: " + info;
  }
  static bool IsEmpty(const std::string& trash) {
    return (!fs::exists(trash + "/files") || fs::is_empty(trash + "/files")) &&
           (!fs::exists(trash + "/info") || fs::is_empty(trash + "/info"));
  }

  const test::TempFolder folder_;
  const test::ScopedVariable data_{"XDG_DATA_HOME", folder_ / "data"};
  const test::ScopedVariable home_{"HOME", folder_ / "home"};
};

TEST_F(TrashTest, KeepsContentAndPathWhateverTheName) {
  const struct {
    const char* name;
    const char* recorded;
  } kCases[] = {
      {"photo.jpg", "photo.jpg"},
      {"100% pure.jpg", "100%25%20pure.jpg"},
      {"K\xc3\xb6ln.jpg", "K%C3%B6ln.jpg"},
      {"two\nlines", "two%0Alines"},
      {"-rf #?&;", "-rf%20%23%3F%26%3B"},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.name);
    const std::string path = Make(std::string("items/") + c.name, c.name);
    ASSERT_TRUE(Put(path).Ok());
    EXPECT_FALSE(fs::exists(path));
    EXPECT_EQ(test::ReadAll(Home() + "/files/" + c.name), c.name);
    EXPECT_EQ(PathIn(Home(), c.name), Items() + "/" + c.recorded);
  }
  for (const char* part : {"", "/files", "/info"}) {
    EXPECT_EQ(fs::status(Home() + part).permissions(), fs::perms(0700)) << part;
  }
  EXPECT_EQ(fs::status(Home() + "/info/photo.jpg.trashinfo").permissions(), fs::perms(0600));
}

TEST_F(TrashTest, CountsUpAndNeverReplaces) {
  Trash trash;
  const std::string longName(255, 'x');
  for (const char* content : {"first", "second"}) {
    EXPECT_TRUE(trash.Put(Make("items/a.jpg", content)).Ok());
    EXPECT_TRUE(trash.Put(Make("items/" + longName, content)).Ok());
  }
  Make("data/Trash/files/a.3.jpg", "without record");
  EXPECT_TRUE(Put(Make("items/a.jpg", "fourth")).Ok());
  const auto contentOf = [&](const std::string& name) {
    return test::ReadAll(Home() + "/files/" + name);
  };
  EXPECT_EQ(contentOf("a.jpg"), "first");
  EXPECT_EQ(contentOf("a.2.jpg"), "second");
  EXPECT_EQ(contentOf("a.3.jpg"), "without record");
  EXPECT_EQ(contentOf("a.4.jpg"), "fourth");
  EXPECT_EQ(contentOf(std::string(243, 'x') + ".2"), "second");
  EXPECT_FALSE(fs::exists(Home() + "/info/a.3.jpg.trashinfo"));
}

TEST_F(TrashTest, TakesALinkItselfAndFollowsThoseAbove) {
  const std::string file = Make("items/real/a.jpg");
  fs::create_symlink(Items() + "/real", Items() + "/linked");
  fs::create_symlink(file, Items() + "/real/link.jpg");
  EXPECT_TRUE(Put(Items() + "/linked/link.jpg").Ok());
  EXPECT_TRUE(fs::is_symlink(Home() + "/files/link.jpg"));
  EXPECT_EQ(PathIn(Home(), "link.jpg"), Items() + "/real/link.jpg");
  EXPECT_TRUE(Put(Items() + "/linked/").Ok()) << "also with the separator of a folder";
  EXPECT_TRUE(fs::is_symlink(Home() + "/files/linked"));
  EXPECT_TRUE(fs::exists(file));
}

TEST_F(TrashTest, ListsTheSizesOfFolders) {
  Make("items/trip/a.jpg", std::string(10'000, 'a'));
  Make("items/trip/deep/b.jpg", std::string(10'000, 'b'));
  Make("data/Trash/directorysizes", "5 6 gone\n");
  ASSERT_TRUE(Put(Items() + "/trip").Ok());
  struct stat info, parts[4];
  ::stat((Home() + "/info/trip.trashinfo").c_str(), &info);
  std::int64_t blocks = 0;
  for (const char* part : {"", "/a.jpg", "/deep", "/deep/b.jpg"}) {
    ASSERT_EQ(::stat((Home() + "/files/trip" + part).c_str(), parts), 0);
    blocks += parts[0].st_blocks;
  }
  EXPECT_EQ(test::ReadAll(Home() + "/directorysizes"),
            std::to_string(blocks * 512) + " " + std::to_string(info.st_mtime) + " trip\n");
}

TEST_F(TrashTest, RefusesAndLeavesEverythingAsItWas) {
  Make("data/Trash/files/old.jpg");
  Make("data/Trash/info/old.jpg.trashinfo");
  const std::string locked = Make("items/locked.jpg");
  Make("items/vault/a.jpg");
  ASSERT_TRUE(Items::Current().SetLocked(locked, true).Ok());
  ASSERT_TRUE(Items::Current().SetLocked(folder_ / "items/vault", true).Ok());
  const auto before = test::Describe(folder_.Path());
  std::istringstream paths(
      "/ // . .. @/items/. @/items/.. @/items/gone @/items/gone/a @/items/locked.jpg "
      "@/items/locked.jpg/a @/items/vault/a.jpg @/data/Trash @/data/Trash/files @/data/Trash/info "
      "@/data/Trash/files/old.jpg @/data");
  for (std::string path; std::getline(paths, path, ' ');) {
    if (path.front() == '@') path.replace(0, 1, folder_.Path());
    SCOPED_TRACE(path);
    EXPECT_FALSE(Put(path).Ok());
    EXPECT_EQ(test::Describe(folder_.Path()), before);
  }
  EXPECT_EQ(Put("").Reason(), kNoSuchItem);
  EXPECT_EQ(Put(locked).Reason(), kNotPermitted);
  EXPECT_EQ(Put(Items() + "/gone").Reason(), kNoSuchItem);
}

TEST_F(TrashTest, FindsTheHome) {
  const std::string inHome = folder_ / "home/.local/share/Trash";
  for (const auto& data : {std::optional<std::string>(), std::optional<std::string>("relative")}) {
    const test::ScopedVariable scoped("XDG_DATA_HOME", data);
    EXPECT_TRUE(Put(Make("items/a.jpg")).Ok());
    EXPECT_TRUE(fs::exists(inHome + "/files/a.jpg"));
    fs::remove_all(inHome);
  }
  fs::create_directories(folder_ / "disk/Trash");
  fs::create_directory_symlink(folder_ / "disk", folder_ / "data");
  EXPECT_TRUE(Put(Make("items/a.jpg")).Ok()) << "a home behind a link";
  EXPECT_TRUE(fs::exists(folder_ / "disk/Trash/files/a.jpg"));
  // Nobody's home does not exist.
  const test::ScopedVariable noHome("HOME", std::nullopt);
  const test::ScopedVariable noData("XDG_DATA_HOME", std::nullopt);
  const std::string path = Make("items/nobody/a.jpg");
  fs::permissions(Items() + "/nobody", fs::perms(0777));
  ORB_IN_CHILD(test::RunAsUser(65534, [&] {
    EXPECT_FALSE(Put(path).Ok());
    EXPECT_TRUE(fs::exists(path));
  }));
}

TEST_F(TrashTest, DoesNotTrustATrashThatIsALinkOrSomebodyElses) {
  if (::geteuid() != 0) GTEST_SKIP() << "needs root to give folders away";
  const std::string path = Make("items/a.jpg");
  for (const char* make : {"ln -s ../../items Trash/files",
                           "mkdir Trash/info && chown 1 Trash/info",
                           "chown 1 Trash"}) {
    SCOPED_TRACE(make);
    const std::string fresh = "rm -rf '" + Home() + "' && mkdir -p '" + Home() + "' && cd '";
    ASSERT_TRUE(RunShell(fresh + (folder_ / "data") + "' && " + make));
    EXPECT_FALSE(Put(path).Ok());
    EXPECT_TRUE(fs::exists(path));
  }
}

// --- Other volumes

class TrashOnVolume : public TrashTest {
 protected:
  std::string Volume() const { return folder_ / "volume"; }
  std::string Own() const { return Volume() + "/.Trash-" + std::to_string(::geteuid()); }
  bool Mount(const std::string& options = "size=4m") const {
    return test::MountTmpfs(Volume(), options);
  }
};

TEST_F(TrashOnVolume, IsInTheTopFolder) {
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount());
    ASSERT_TRUE(Put(Make("volume/100% in/a.jpg")).Ok());
    EXPECT_EQ(PathIn(Own(), "a.jpg"), "100%25%20in/a.jpg");
    EXPECT_TRUE(fs::exists(Own() + "/files/a.jpg"));
    EXPECT_FALSE(Put(Own()).Ok());
    EXPECT_FALSE(fs::exists(Home())) << "not made when it is not needed";

    fs::create_symlink(Items(), Volume() + "/link");
    EXPECT_TRUE(Put(Make("volume/link/b.jpg")).Ok());
    EXPECT_EQ(PathIn(Home(), "b.jpg"), Items() + "/b.jpg") << "the folder's volume decides";

    fs::create_directory(folder_ / "bound");
    ASSERT_TRUE(test::BindMount(Volume() + "/100% in", folder_ / "bound"));
    ASSERT_TRUE(Put(Make("bound/c.jpg")).Ok());
    EXPECT_EQ(PathIn(folder_ / "bound/.Trash-0", "c.jpg"), "c.jpg");
  }));
}

TEST_F(TrashOnVolume, UsesTheSharedFolderOnlyWhenItIsSafe) {
  const struct {
    const char* make;
    bool isUsed;
  } kCases[] = {
      {"mkdir .Trash && chmod 1777 .Trash", true},
      {"mkdir .Trash && chmod 0777 .Trash", false},
      {"mkdir sticky && chmod 1777 sticky && ln -s sticky .Trash", false},
      {"touch .Trash", false},
      {"mkdir -p .Trash/0 && chmod 1777 .Trash && chown 1 .Trash/0", false},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.make);
    ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
      ASSERT_TRUE(Mount() && RunShell("cd '" + Volume() + "' && " + c.make));
      EXPECT_TRUE(Put(Make("volume/a.jpg")).Ok());
      EXPECT_TRUE(fs::exists((c.isUsed ? Volume() + "/.Trash/0" : Own()) + "/files/a.jpg"));
      EXPECT_FALSE(Put(Volume() + "/.Trash").Ok());
    }));
  }
}

TEST_F(TrashOnVolume, FallsBackToTheHomeByCopy) {
  const struct {
    const char* make;
    const char* options;
  } kCases[] = {
      {"ln -s in .Trash-0", "size=4m"},
      {"mkdir .Trash-0 && chown 1 .Trash-0", "size=4m"},
      {"mkdir .Trash-0 && ln -s ../in .Trash-0/files", "size=4m"},
      {"true", "nr_inodes=6"},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.make);
    ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
      ASSERT_TRUE(Mount(c.options));
      const std::string file = Make("volume/in/a.jpg", "photo");
      Make("volume/in/trip/b.jpg", "of the trip");
      ASSERT_TRUE(RunShell("cd '" + Volume() + "' && " + c.make));
      Make("data/Trash/files/a.jpg", "without record");
      EXPECT_TRUE(Put(file).Ok());
      EXPECT_TRUE(Put(Volume() + "/in/trip").Ok());
      EXPECT_TRUE(fs::is_empty(Volume() + "/in"));
      EXPECT_EQ(test::ReadAll(Home() + "/files/a.jpg"), "without record");
      EXPECT_EQ(test::ReadAll(Home() + "/files/a.2.jpg"), "photo");
      EXPECT_EQ(PathIn(Home(), "a.2.jpg"), file);
      EXPECT_EQ(test::ReadAll(Home() + "/files/trip/b.jpg"), "of the trip");
    }));
  }
}

class LittleSpace final : public Volumes {
 public:
  std::optional<std::uint64_t> AvailableCapacity(const std::string&) const override {
    return 50'000;
  }
};

TEST_F(TrashOnVolume, KeepsWhatCannotBeCopiedOrRemoved) {
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount());
    fs::create_directory_symlink(Items(), Own());  // So that only the copy is left.
    const std::string big = Make("volume/big.jpg", std::string(100'000, 'b'));
    const std::string trip = Volume() + "/trip";
    const std::string locked = Make("volume/trip/locked.jpg");
    const std::string pipe = Volume() + "/with a pipe/pipe";
    Make("volume/with a pipe/a.jpg");
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    ASSERT_TRUE(Items::Current().SetLocked(locked, true).Ok());
    const auto before = test::Describe(Volume());
    {
      const LittleSpace little;
      const ScopedVolumes scoped(little);
      EXPECT_EQ(Put(big).Reason(), kVolumeFull);
    }
    EXPECT_EQ(Put(trip).Reason(), kNotPermitted) << "something inside could not be removed";
    EXPECT_EQ(Put(Volume() + "/with a pipe").Reason(), kNotPermitted);
    ASSERT_TRUE(test::MakeReadOnlyVolume(Volume()));
    EXPECT_FALSE(Put(big).Ok());
    EXPECT_EQ(test::Describe(Volume()), before);
    EXPECT_TRUE(IsEmpty(Home()));
  }));
}

TEST_F(TrashOnVolume, CopiesForAUserWhoMayNotWriteToTheTop) {
  fs::create_directory(folder_ / "data");
  fs::permissions(folder_ / "data", fs::perms(0777));
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount("size=4m,mode=0755"));
    const std::string file = Make("volume/in/a.jpg");
    fs::permissions(Volume() + "/in", fs::perms(0777));
    const std::string sticky = Make("volume/sticky/a.jpg");
    fs::permissions(Volume() + "/sticky", fs::perms(01777));
    const std::string closed = Make("volume/closed/a.jpg");
    ASSERT_EQ(::setresuid(65534, 65534, 65534), 0);
    EXPECT_TRUE(Put(file).Ok());
    EXPECT_FALSE(fs::exists(file));
    EXPECT_TRUE(fs::exists(Home() + "/files/a.jpg"));
    fs::remove_all(Home());
    EXPECT_FALSE(Put(sticky).Ok());
    EXPECT_FALSE(Put(closed).Ok());
    EXPECT_TRUE(fs::exists(sticky) && fs::exists(closed));
    EXPECT_TRUE(IsEmpty(Home()));
  }));
}

TEST_F(TrashOnVolume, CopiesWhereTheVolumeDoesNotRename) {
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(test::MountTmpfs(folder_ / "layers", "size=4m"));
    for (const char* layer : {"upper", "work"})
      fs::create_directories(folder_ / ("layers/" + std::string(layer)));
    Make("layers/lower/trip/a.jpg", "below");
    Make("layers/lower/tour/a.jpg", "below");
    fs::create_directory(Volume());
    const std::string options = "lowerdir=" + (folder_ / "layers/lower") +
                                ",redirect_dir=off,upperdir=" + (folder_ / "layers/upper") +
                                ",workdir=" + (folder_ / "layers/work");
    if (::mount("overlay", Volume().c_str(), "overlay", 0, options.c_str()) != 0) {
      ::_exit(test::kImpossibleStatus);
    }
    EXPECT_TRUE(Put(Volume() + "/trip").Ok());
    EXPECT_FALSE(fs::exists(Volume() + "/trip"));
    EXPECT_EQ(test::ReadAll(Home() + "/files/trip/a.jpg"), "below");
    EXPECT_TRUE(IsEmpty(Own()));

    const test::ScopedVariable data("XDG_DATA_HOME", Volume() + "/data");
    EXPECT_TRUE(Put(Volume() + "/tour").Ok()) << "nor the volume of the home";
    EXPECT_EQ(test::ReadAll(Volume() + "/data/Trash/files/tour/a.jpg"), "below");
  }));
}

TEST_F(TrashOnVolume, KeepsFoldersWhereVolumesAreMounted) {
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    fs::create_directories(Items() + "/a/mounted");
    ASSERT_TRUE(test::MountTmpfs(Items() + "/a/mounted", "size=1m"));
    EXPECT_EQ(Put(Items() + "/a/mounted").Reason(), kBusy);
    EXPECT_EQ(Put(Items() + "/a").Reason(), kBusy);
    EXPECT_TRUE(fs::exists(Items() + "/a/mounted"));
    EXPECT_TRUE(IsEmpty(Home()));
  }));
}

// --- Another client

TEST_F(TrashOnVolume, IsListedAndRestoredByTrashCli) {
  if (!RunShell("command -v trash-list trash-restore >/dev/null"))
    GTEST_SKIP() << "needs trash-cli";
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(Mount());
    ASSERT_TRUE(test::MountTmpfs(folder_ / "shared", "size=1m"));
    fs::create_directory(folder_ / "shared/.Trash");
    fs::permissions(folder_ / "shared/.Trash", fs::perms(01777));
    int number = 0;
    for (const char* place : {"items/", "volume/", "shared/in/"}) {
      for (const char* name : {"100%25.jpg", "a b.jpg", "Gr\xc3\xbc\xc3\x9f\x65.jpg", "trip/"}) {
        const std::string content = std::to_string(++number);
        const std::string item = std::string(place) + name;
        const std::string path = folder_ / item;
        SCOPED_TRACE(item);
        const std::string file = Make(path.ends_with('/') ? item + "a.jpg" : item, content);
        const std::string shown = path.ends_with('/') ? path.substr(0, path.size() - 1) : path;
        ASSERT_TRUE(Put(path).Ok());
        EXPECT_TRUE(RunShell("trash-list | grep -F ' " + shown + "' >/dev/null"));
        EXPECT_TRUE(RunShell("cd '" + folder_.Path() + "' && echo 0 | trash-restore '" + shown +
                             "' >/dev/null"));
        EXPECT_EQ(test::ReadAll(file), content);
      }
      EXPECT_TRUE(Put(Make(std::string(place) + "twice.jpg", "1")).Ok());
      EXPECT_TRUE(Put(Make(std::string(place) + "twice.jpg", "2")).Ok());
    }
    EXPECT_TRUE(RunShell("test $(trash-list | grep -c /twice.jpg) = 6"));
  }));
}

}  // namespace
}  // namespace orb::platform

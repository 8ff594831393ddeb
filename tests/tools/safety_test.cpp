// SPDX-License-Identifier: MIT
#include <algorithm>
#include <fstream>

#include "import_fixture.h"
#include "support/environment.h"
#include "support/faults.h"
#include "text.h"

namespace orbimport {
namespace {

using orb::test::RunWithPrivateMounts;

void FlipByte(const std::string& path, std::streamoff at) {
  std::fstream file(path, std::ios::in | std::ios::out | std::ios::binary);
  file.seekg(at);
  const char byte = static_cast<char>(~file.get());
  file.seekp(at);
  file.put(byte);
}

/// For the body of RunWithPrivateMounts.
void NeedShell(const std::string& folder, const std::string& command) {
  if (std::system(("cd " + folder + " && " + command).c_str()) != 0) {
    ::_exit(orb::test::kImpossibleStatus);
  }
}

TEST_F(Import, ReadsWhatReachedTheDeviceAndNotWhatMemoryKeeps) {
  const std::string photo = Bytes(3'000'001, 1);
  const std::string source = folder_.Write("a.jpg", photo);
  const std::string image = folder_ / "image", copy = folder_ / "volume/a.jpg";
  const auto goOn = [] { return true; };
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    NeedShell(folder_.Path(),
              "truncate -s 24M image && mkdir volume && mkfs.ext4 -q -m 0 image && "
              "mount -o loop image volume");
    fs::copy_file(source, copy);
    EXPECT_EQ(CompareOnDevice(source, copy, goOn), kOrbNoErr);
    EXPECT_EQ(CompareOnDevice(source, copy, [] { return false; }), kOrbErrCanceled);
    std::ofstream(copy, std::ios::app | std::ios::binary) << "x";
    EXPECT_EQ(CompareOnDevice(source, copy, goOn), OrbResult{kImportErrCopyDiffers});
    fs::copy_file(source, copy, fs::copy_options::overwrite_existing);
    // The flush is over when it is asked to go on; now the medium loses a bit.
    const auto spoil = [&] {
      const std::string bytes = ReadAll(image), part = photo.substr(2'000'000, 64);
      for (std::size_t at = 0; (at = bytes.find(part, at)) != std::string::npos; ++at) {
        FlipByte(image, static_cast<std::streamoff>(at));  // Old blocks may hold it as well.
      }
      return true;
    };
    EXPECT_EQ(ReadAll(copy), photo);  // Memory keeps it.
    EXPECT_EQ(CompareOnDevice(source, copy, spoil), OrbResult{kImportErrCopyDiffers});
    ::umount2((folder_ / "volume").c_str(), MNT_DETACH);
  }));
}

TEST_F(Meanwhile, ACopyThatDiffersGoesAndItsShotStays) {
  PutOnCard({{"I.CR2", "raw"}, {"I.JPG", "jpeg"}, {"K.JPG", "kept"}});
  options_.verify = options_.move = true;
  compare_ = [](const std::string& source, const std::string& copy, const auto& goOn) {
    if (copy.ends_with("I.JPG")) FlipByte(copy, 2);
    return CompareOnDevice(source, copy, goOn);
  };
  const orb::test::ScopedVariable home("XDG_DATA_HOME", folder_ / "data");
  EXPECT_FALSE(RunWith([] {}));
  EXPECT_TRUE(Says(said_, "kImportErrCopyDiffers " + Card("I.JPG"))) << said_;
  EXPECT_EQ(Tree(), (Files{{"D/I.CR2", "raw"}, {"D/K.JPG", "kept"}}));
  EXPECT_EQ(Tree("card"), (Files{{"I.CR2", "raw"}, {"I.JPG", "jpeg"}}));
}

TEST_F(Import, TakesFromTheCardOnlyWhatIsSafeAndGivesItBack) {
  const std::string raw = Bytes(100'000, 1);
  PutOnCard({{"1/I.CR2", raw}, {"1/I.JPG", "jpeg"}, {"1/i.xmp", "x"}});
  PutOnCard({{"2/I.JPG", "other jpeg"}, {"2/\u00e9 100%\n.jpg", ""}});
  // Both are there already by size and time, one by its bytes as well.
  Put({{"photos/" + kDay + "here.jpg", "same size"}, {"photos/" + kDay + "equal.jpg", "equal"}});
  PutOnCard({{"here.jpg", "SAME SIZE"}, {"equal.jpg", "equal"}});
  const Ended ended = Run("--move --json");
  EXPECT_EQ(ended.exitCode, 1);
  EXPECT_TRUE(Says(ended.err, "kImportErrPresentDiffers " + Card("here.jpg"))) << ended.err;
  EXPECT_TRUE(Says(ended.err, "Put into the trash: 6 files")) << ended.err;
  EXPECT_TRUE(Says(ended.out, R"({"status":"trashed","source":")" + Card("equal.jpg")));
  EXPECT_EQ(Tree("card"), (Files{{"here.jpg", "SAME SIZE"}}));
  EXPECT_EQ(ReadAll(Photos(kDay) + "I_1.JPG"), "other jpeg");
  if (std::system("command -v trash-restore >/dev/null") != 0) GTEST_SKIP() << "no trash-cli";
  const orb::test::ScopedVariable home("XDG_DATA_HOME", folder_ / "data");
  const std::string restore = "cd " + folder_.Path() + "/card && for name in 1/I.CR2 2/I.JPG; do " +
                              "echo 0 | trash-restore $PWD/$name >/dev/null; done";
  EXPECT_EQ(std::system(restore.c_str()), 0);
  EXPECT_TRUE(Tree("card") ==
              (Files{{"here.jpg", "SAME SIZE"}, {"1/I.CR2", raw}, {"2/I.JPG", "other jpeg"}}));
}

TEST_F(Import, NeverTakesTheOnlyCopy) {
  // What is to be imported lies where it would go.
  PutOnCard({{"in/" + kDay + "a.jpg", "a"}, {"in/linked.jpg", "b"}});
  fs::create_hard_link(Card("in/linked.jpg"), Card("in/" + kDay + "linked.jpg"));
  const Files before = Tree("card");
  const Ended ended = Wait(Start("--move --verbose card/in/2024 card/in"));
  EXPECT_EQ(ended.exitCode, 0) << ended.err;
  EXPECT_TRUE(Says(ended.out, "left in SOURCE: 2 files")) << ended.out;
  EXPECT_EQ(Tree("card"), before);
  EXPECT_FALSE(fs::exists(folder_ / "data"));
}

TEST_F(Import, KeepsTheShotOfAFileThatTheTrashDoesNotTake) {
  PutOnCard({{"I.CR2", "raw"}, {"I.JPG", "jpeg"}, {"J.JPG", "free"}});
  COrbFileHandle locked(OrbPath(Card("I.JPG")));
  if (locked.SetAttribute(kOrbFileAttrLocked) >= kOrbErrFirst) GTEST_SKIP() << "no locks here";
  const Ended ended = Run("--move");
  locked.SetAttribute(0);
  EXPECT_EQ(ended.exitCode, 1);
  EXPECT_TRUE(Says(ended.err, "kImportErrNotTrashed " + Card("I.JPG"))) << ended.err;
  EXPECT_EQ(Tree("card"), (Files{{"I.CR2", "raw"}, {"I.JPG", "jpeg"}}));
  EXPECT_EQ(Tree().size(), 3u);
}

TEST_F(Import, APhotoIsAlwaysInOnePlaceWhenAMoveIsKilled) {
  Files card;
  for (unsigned i = 0; i < 12; ++i) {
    const std::string name = "IMG_" + std::to_string(i);
    card[name + ".CR2"] = Bytes(200'000 + 1000 * i, i);
    card[name + ".xmp"] = Bytes(300, 200 + i);
  }
  int kills = 0;
  for (unsigned round = 0; round < 3; ++round) {
    PutOnCard(card);
    Ended ended;
    for (unsigned i = 0; i < 30 && ended.exitCode != 0; ++i) {
      ended = RunAndKill("--move", (round * 30 + i) * 7919 % 60000);
      kills += ended.exitCode == -1 ? 1 : 0;
      const Files left = Tree("card"), photos = Tree(), trash = Tree("data/Trash/files");
      for (const auto& [name, bytes] : card) {
        if (left.contains(name) && left.at(name) == bytes) continue;
        EXPECT_TRUE(photos.contains(kDay + name) && photos.at(kDay + name) == bytes) << name;
        // Under its own name or, after a kill in between, another one.
        const auto isIt = [&whole = bytes](const auto& file) { return file.second == whole; };
        EXPECT_TRUE(std::ranges::any_of(trash, isIt)) << name;
      }
    }
    EXPECT_EQ(Run("--move").exitCode, 0);
    EXPECT_EQ(Tree("card"), Files());
    EXPECT_EQ(Tree().size(), card.size());
    fs::remove_all(Photos());
    fs::remove_all(folder_ / "data");
  }
  EXPECT_GT(kills, 0);
}

TEST_F(Import, TellsAFullVolumeBeforeItWritesAnything) {
  const struct {
    const char* what;
    std::size_t files, size;
    bool fits;
  } kCases[] = {
      {"all of it", 1, 1'048'576 - 4 * 4096, true},
      {"one file too large", 1, 1'100'000, false},
      {"many small files, each in a block of its own", 300, 100, false},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.what);
    fs::remove_all(Card(""));
    PutOnCard({{"A.jpg", "small"}});
    for (std::size_t i = 0; i < c.files; ++i) {
      PutOnCard({{"IMG_" + std::to_string(i) + ".JPG", Bytes(c.size, 1)}});
    }
    ORB_IN_CHILD(RunWithPrivateMounts([&] {
      NeedShell(folder_.Path(), "mkdir -p photos && mount -t tmpfs -o size=1m none photos");
      for (const char* const option : {"--dry-run", "--verify"}) {
        const Ended ended = Run(option);
        EXPECT_EQ(ended.exitCode, c.fits ? 0 : 1) << ended.err;
        EXPECT_EQ(Says(ended.err, "kOrbErrDiskFull " + folder_ / "photos"), !c.fits) << ended.err;
        EXPECT_TRUE(c.fits || fs::is_empty(Photos()));
      }
      if (c.fits) return;
      EXPECT_EQ(Run("--fill").exitCode, 1);
      EXPECT_EQ(ReadAll(Photos(kDay) + "A.jpg"), "small");
    }));
  }
}

TEST_F(Import, CountsTheRoomOfWhatAKilledImportLeft) {
  const std::string photo = Bytes(800'000, 1);
  PutOnCard({{"a.jpg", photo}});
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    NeedShell(folder_.Path(), "mkdir photos && mount -t tmpfs -o size=1m none photos");
    Put({{"photos/" + kDay + "a.jpg", photo.substr(0, 600'000)}}, kMayFirst + 5);
    folder_.Write(std::string("photos/") + kJournal, PromiseOf(kDay + "a.jpg", photo.size()));
    const Ended ended = Run();
    EXPECT_EQ(ended.exitCode, 0) << ended.err;
    EXPECT_TRUE(Tree() == (Files{{kDay + "a.jpg", photo}}));
  }));
}

}  // namespace
}  // namespace orbimport

// SPDX-License-Identifier: MIT
#include <pty.h>

#include "import_fixture.h"

namespace orbimport {
namespace {

TEST_F(Import, BringsEverythingOnceWithItsTime) {
  const std::tuple<const char*, const char*, std::string> kFiles[] = {
      {"100/IMG_1.CR2", "IMG_1.CR2", Bytes(200'000, 1)},
      {"100/IMG_1.JPG", "IMG_1.JPG", Bytes(65'536, 2)},
      {"101/IMG_1.JPG", "IMG_1_1.JPG", Bytes(65'536, 3)},  // Another of the same size and time.
      {"101/Caf\u00e9.jpg", "Caf\u00e9.jpg", "composed"},
      {"101/Cafe\u0301.jpg", "Cafe\u0301.jpg", "decomposed"},
      {"101/two\nlines %s.mov", "two\nlines %s.mov", ""},
      {"100/IMG_1.xmp", "IMG_1.xmp", "later"},
  };
  Files expected;
  for (const auto& [from, to, bytes] : kFiles) {
    PutOnCard({{from, bytes}});
    expected[kDay + to] = bytes;
  }
  SetTime(Card("100/IMG_1.xmp"), kMayFirst + 200'000);
  const Ended first = Run();
  EXPECT_EQ(first.exitCode, 0) << first.err;
  EXPECT_TRUE(Tree() == expected);
  EXPECT_EQ(TimeOf(Photos(kDay + "IMG_1.CR2")), kMayFirst);
  EXPECT_EQ(TimeOf(Photos(kDay + "IMG_1.xmp")), kMayFirst + 200'000);
  EXPECT_TRUE(Says(first.err, "\"2024/2024-05-01/two\\nlines %s.mov\""));

  const Ended second = Run("--verbose");
  EXPECT_EQ(second.exitCode, 0) << second.err;
  EXPECT_FALSE(Says(second.out, "copied ")) << second.out;
  EXPECT_TRUE(Tree() == expected);
}

TEST_F(Import, NeverOverwritesNorEntersItsOwnDestination) {
  PutOnCard({{"a.jpg", "card a"}, {"b.jpg", "card b"}, {"c.jpg", "card c"}});
  const std::string day = "in/" + kDay;
  PutOnCard({{day + "a.jpg", "mine  "}});  // Of the same size.
  SetTime(Card(day + "a.jpg"), kMayFirst + 5);
  fs::create_directories(Card(day + "b.jpg"));
  fs::create_symlink("nowhere", Card(day + "c.jpg"));
  for (int i = 0; i < 2; ++i) EXPECT_EQ(Wait(Start("card card/in")).exitCode, 0);
  EXPECT_TRUE(fs::is_directory(Card(day + "b.jpg")) && fs::is_symlink(Card(day + "c.jpg")));
  EXPECT_EQ(Tree("card/in"),
            (Files{{kDay + "a.jpg", "mine  "},
                   {kDay + "a_1.jpg", "card a"},
                   {kDay + "b_1.jpg", "card b"},
                   {kDay + "c.jpg", ""},
                   {kDay + "c_1.jpg", "card c"}}));
}

TEST_F(Import, SaysWhatItLeavesOutAndWhy) {
  PutOnCard({{"good.jpg", "good"}, {"bad\xff.jpg", ""}, {"bad folder\xe9/inside.jpg", ""}});
  PutOnCard({{"._good.jpg", "resource"}, {"good.doc", "text"}});
  fs::create_symlink("good.jpg", Card("link.jpg"));
  fs::create_directory_symlink("/", Card("root"));
  ASSERT_EQ(::mkfifo(Card("pipe.jpg").c_str(), 0600), 0);
  const Ended ended = Run("--json");
  EXPECT_EQ(ended.exitCode, 1);
  EXPECT_EQ(Tree(), (Files{{kDay + "good.jpg", "good"}}));
  EXPECT_TRUE(Says(ended.err, "kOrbErrInvalidName \"" + Card("bad\\xFF.jpg\""))) << ended.err;
  std::map<std::string, int> statuses;
  std::istringstream lines(ended.out);
  for (std::string line; std::getline(lines, line);) ++statuses[line.substr(11, 6)];
  EXPECT_EQ(statuses, (std::map<std::string, int>{{"copied", 1}, {"failed", 2}, {"skippe", 5}}));
  EXPECT_TRUE(Says(ended.out, R"("bytes":4,"modified":"2024-05-01T10:00:00Z"})"));
  EXPECT_TRUE(Says(ended.out, "_bytes\":\"" + Card("bad%20folder%E9/inside.jpg\""))) << ended.out;
}

TEST_F(Import, OnlyTellsInADryRun) {
  PutOnCard({{"a.jpg", "a"}});
  const Ended ended = Run("--dry-run --layout=%Y/%m");
  EXPECT_EQ(ended.exitCode, 0);
  EXPECT_TRUE(Says(ended.out, "planned  a.jpg -> 2024/05/a.jpg")) << ended.out;
  EXPECT_FALSE(fs::exists(Photos()));
}

TEST_F(Import, RefusesWrongUsage) {
  PutOnCard({{"a.jpg", "a"}});
  for (const char* const args : {"",
                                 "card",
                                 "card x y",
                                 "--nonsense card x",
                                 "--json=yes card x",
                                 "--layout=../%Y card x",
                                 "card card/.",
                                 "card card/a.jpg",
                                 "card/a.jpg photos",
                                 "card/missing photos",
                                 "card ''"}) {
    const Ended ended = Wait(Start(args));
    EXPECT_EQ(ended.exitCode, 2) << args;
    EXPECT_TRUE(Says(ended.err, "orb-import: "));
  }
  EXPECT_EQ(Wait(Start("--help")).exitCode, 0);
  EXPECT_EQ(Wait(Start("--version")).exitCode, 0);
}

TEST_F(Import, LeavesNothingOfAPhotoForWhichThereIsNoRoom) {
  PutOnCard({{"big.jpg", Bytes(2'000'000, 1)}, {"small.jpg", "small"}});
  const std::string limited = "trap '' XFSZ; ulimit -f 1000; " + Command("card photos");
  EXPECT_EQ(WEXITSTATUS(std::system((limited + " >out 2>err").c_str())), 1);
  const std::string err = ReadAll(folder_ / "err");
  EXPECT_TRUE(Says(err, "kOrbErrDiskFull " + Card("big.jpg"))) << err;
  EXPECT_TRUE(Says(err, "1/2 2024/2024-05-01/big.jpg failed")) << err;
  EXPECT_EQ(Tree(), (Files{{kDay + "small.jpg", "small"}}));
}

TEST_F(Import, DrawsABarOnATerminalAndStopsAtOnceOnCtrlC) {
  PutOnCard({{"a.jpg", "a"}, {"b.mov", "b"}, {"b.xmp", "b"}});
  // It takes long to copy and no room on the card. There need not be any for the copy.
  fs::resize_file(Card("b.mov"), 8ull << 30);
  SetTime(Card("b.mov"), kMayFirst);
  const std::string command = "export TERM=xterm NO_COLOR=1; " + Command("--fill card photos");
  int terminal = -1;
  winsize size = {24, 60, 0, 0};
  const pid_t child = ::forkpty(&terminal, nullptr, nullptr, &size);
  if (child == 0) {
    ::execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
    ::_exit(127);
  }
  std::string shown;
  char piece[4096];
  bool stopped = false;
  for (ssize_t count; (count = ::read(terminal, piece, sizeof piece)) > 0;) {
    shown.append(piece, static_cast<std::size_t>(count));
    if (stopped || !Says(shown, "/s")) continue;
    EXPECT_EQ(Run().exitCode, 1);  // Nobody else may work there.
    stopped = ::write(terminal, "\x03", 1) == 1;
  }
  ::close(terminal);
  EXPECT_EQ(Wait(child).exitCode, 130);
  EXPECT_TRUE(Says(shown, "Stopped before the end")) << shown;
  EXPECT_FALSE(Says(shown, "\x1b[3"));  // No colour.
  std::istringstream lines(shown.substr(0, shown.find("Type")));
  int draws = 0;
  for (std::string line; std::getline(lines, line, '\r');) {
    draws += Says(line, "files") ? 1 : 0;
    EXPECT_TRUE(!Says(line, "%") || line.find("\x1b[K") <= 59) << line;
  }
  EXPECT_GE(draws, 2) << shown;
  EXPECT_EQ(Tree(), (Files{{kDay + "a.jpg", "a"}}));
}

TEST_F(Import, LeavesNothingShortWhenItIsKilledAtAnyMoment) {
  Files expected;
  for (unsigned i = 0; i < 16; ++i) {
    const std::string name = "IMG_" + std::to_string(i);
    const Files shot = {{name + ".CR2", Bytes(900'000 + 1000 * i, i)},
                        {name + ".JPG", Bytes(300'000, 100 + i)},
                        {name + ".xmp", Bytes(300, 200 + i)}};
    PutOnCard(shot);
    for (const auto& [file, bytes] : shot) expected[kDay + file] = bytes;
  }
  int kills = 0;
  for (unsigned i = 0; i < 40; ++i) {
    Ended ended = RunAndKill("", i * 7919 % 30000);
    if (ended.exitCode != 0) {
      kills += fs::exists(Photos(kJournal)) ? 1 : 0;
      // Whatever stands under a photo's name with its size and time has to be that photo.
      for (const auto& [path, found] : Tree()) {
        const bool looksWhole = expected.contains(path) && found.size() == expected[path].size() &&
                                TimeOf(Photos(path)) == kMayFirst;
        EXPECT_TRUE(!looksWhole || found == expected[path]) << path;
      }
      if (kills % 6 != 0) continue;
      ended = Run();
    }
    // Whoever comes through in the end has nothing twice, nothing left over and no journal.
    EXPECT_EQ(ended.exitCode, 0) << ended.err;
    EXPECT_TRUE(Tree() == expected) << ended.out;
    fs::remove_all(Photos());
  }
  EXPECT_GT(kills, 0);
}

TEST_F(Import, TakesOnlyItsOwnUnfinishedFilesAway) {
  const std::string photo = Bytes(100'000, 1), part = photo.substr(0, 70'000);
  for (const char* const name : {"short", "foreign", "unlisted", "whole"}) {
    PutOnCard({{name + std::string(".jpg"), photo}});
  }
  Files expected = {{kDay + "short.jpg", part},
                    {kDay + "foreign.jpg", "not the photo's bytes"},
                    {kDay + "unlisted.jpg", part},
                    {kDay + "whole.jpg", photo},
                    {kDay + "gone.jpg", "of another card"}};
  std::string journal;
  for (const auto& [path, bytes] : expected) {
    Put({{"photos/" + path, bytes}}, kMayFirst + 5);
    if (path != kDay + "unlisted.jpg") journal += PromiseOf(path, 100'000);
  }
  Put({{std::string("photos/") + kJournal, journal}});
  const Ended ended = Run();
  EXPECT_EQ(ended.exitCode, 0) << ended.err;
  EXPECT_TRUE(Says(ended.err, "gone.jpg")) << ended.err;
  Files tree = Tree();
  EXPECT_EQ(tree.erase(kJournal), 1u);  // For the card that gone.jpg came from.
  expected[kDay + "short.jpg"] = photo;
  expected[kDay + "foreign_1.jpg"] = expected[kDay + "unlisted_1.jpg"] = photo;
  EXPECT_TRUE(tree == expected);
  EXPECT_EQ(TimeOf(Photos(kDay + "whole.jpg")), kMayFirst);
}

TEST_F(Meanwhile, AShotMovesOnTogetherWhenOneOfItsNamesIsTaken) {
  PutOnCard({{"I.CR2", "raw"}, {"I.JPG", "jpeg"}});
  EXPECT_TRUE(RunWith([&] { Put({{"photos/D/I.JPG", "taken"}}); }));
  EXPECT_EQ(Tree(), (Files{{"D/I.JPG", "taken"}, {"D/I_1.CR2", "raw"}, {"D/I_1.JPG", "jpeg"}}));
}

TEST_F(Meanwhile, ASourceThatVanishesOrChangesIsAFailure) {
  PutOnCard({{"a.jpg", "a"}, {"b.jpg", "b"}, {"c.jpg", "c"}});
  EXPECT_FALSE(RunWith([&] {
    fs::remove(Card("a.jpg"));
    PutOnCard({{"b.jpg", "grown"}});
  }));
  EXPECT_EQ(Tree(), (Files{{"D/c.jpg", "c"}}));
}

TEST_F(Import, TheSampleCardComesThroughWhole) {
  if (std::system("command -v convert exiftool setfattr >/dev/null") != 0) {
    GTEST_SKIP() << "the sample card needs imagemagick, exiftool and attr";
  }
  ASSERT_EQ(std::system((ORB_SAMPLE_PHOTOS " " + folder_ / "card").c_str()), 0);
  const Ended ended = Run("--verify");
  EXPECT_EQ(ended.exitCode, 1);  // The one name that is not UTF-8.
  EXPECT_EQ(Tree().size(), 24u) << ended.err;
  EXPECT_FALSE(Says(Run("--verbose").out, "copied "));
}

}  // namespace
}  // namespace orbimport

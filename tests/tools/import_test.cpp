// SPDX-License-Identifier: MIT
#include <pty.h>
#include <sys/resource.h>

#include <chrono>
#include <csignal>
#include <thread>

#include "import_fixture.h"

namespace orbimport {
namespace {

TEST_F(Import, BringsEverythingOnceWithItsTime) {
  Put("DCIM/100/IMG_1.CR2", Bytes(200'000, 1));
  Put("DCIM/100/IMG_1.JPG", Bytes(65'536, 2));
  Put("DCIM/100/IMG_1.xmp", "later", kMayFirst + 200'000);
  Put("DCIM/101/IMG_1.JPG", Bytes(65'536, 3));  // Another photo of the same size and time.
  Put("DCIM/101/Caf\u00e9.jpg", "composed");
  Put("DCIM/101/Cafe\u0301.jpg", "decomposed");
  Put("DCIM/101/two\nlines %s.mov", "");
  const Files expected = {
      {"2024/2024-05-01/IMG_1.CR2", Bytes(200'000, 1)},
      {"2024/2024-05-01/IMG_1.JPG", Bytes(65'536, 2)},
      {"2024/2024-05-01/IMG_1.xmp", "later"},
      {"2024/2024-05-01/IMG_1_1.JPG", Bytes(65'536, 3)},
      {"2024/2024-05-01/Caf\u00e9.jpg", "composed"},
      {"2024/2024-05-01/Cafe\u0301.jpg", "decomposed"},
      {"2024/2024-05-01/two\nlines %s.mov", ""},
  };
  const Ended first = Run();
  EXPECT_EQ(first.exitCode, 0) << first.err;
  EXPECT_EQ(Tree(), expected);
  EXPECT_EQ(TimeOf(Photos("2024/2024-05-01/IMG_1.CR2")), kMayFirst);
  EXPECT_EQ(TimeOf(Photos("2024/2024-05-01/IMG_1.xmp")), kMayFirst + 200'000);
  EXPECT_NE(first.err.find("\"2024/2024-05-01/two\\nlines %s.mov\""), std::string::npos);

  const Ended second = Run({"--verbose"});
  EXPECT_EQ(second.exitCode, 0) << second.err;
  EXPECT_EQ(second.out.find("copied "), std::string::npos) << second.out;
  EXPECT_EQ(Tree(), expected);
}

TEST_F(Import, NeverOverwritesNorEntersItsOwnDestination) {
  Put("a.jpg", "card a");
  Put("b.jpg", "card b");
  Put("c.jpg", "card c");
  const std::string day = Card("photos/2024/2024-05-01/");
  fs::create_directories(day + "b.jpg");
  folder_.Write("card/photos/2024/2024-05-01/a.jpg", "mine  ");  // Of the same size.
  fs::create_symlink("nowhere", day + "c.jpg");
  const auto import = [&] { return Wait(Start({folder_ / "card", Card("photos")})); };
  EXPECT_EQ(import().exitCode, 0);
  EXPECT_EQ(import().exitCode, 0);
  EXPECT_EQ(ReadAll(day + "a.jpg"), "mine  ");
  EXPECT_EQ(ReadAll(day + "a_1.jpg"), "card a");
  EXPECT_TRUE(fs::is_directory(day + "b.jpg"));
  EXPECT_EQ(ReadAll(day + "b_1.jpg"), "card b");
  EXPECT_TRUE(fs::is_symlink(day + "c.jpg"));
  EXPECT_EQ(ReadAll(day + "c_1.jpg"), "card c");
  EXPECT_EQ(std::distance(fs::directory_iterator(day), {}), 6);
}

TEST_F(Import, SaysWhatItLeavesOutAndWhy) {
  Put("good.jpg", "good");
  Put("bad\xff.jpg", "bad");
  Put("bad folder\xe9/inside.jpg", "bad");
  Put("._good.jpg", "resource");
  Put("good.doc", "text");
  fs::create_symlink("good.jpg", Card("link.jpg"));
  fs::create_directory_symlink("/", Card("root"));
  ASSERT_EQ(::mkfifo(Card("pipe.jpg").c_str(), 0600), 0);
  const Ended ended = Run({"--json"});
  EXPECT_EQ(ended.exitCode, 1);
  EXPECT_EQ(Tree(), (Files{{"2024/2024-05-01/good.jpg", "good"}}));
  EXPECT_NE(ended.err.find("kOrbErrInvalidName \"" + Card("bad\\xFF.jpg\"")), std::string::npos)
      << ended.err;
  std::map<std::string, int> statuses;
  std::istringstream lines(ended.out);
  for (std::string line; std::getline(lines, line);) ++statuses[line.substr(0, line.find(','))];
  EXPECT_EQ(statuses,
            (std::map<std::string, int>{{R"({"status":"copied")", 1},
                                        {R"({"status":"failed")", 2},
                                        {R"({"status":"skipped")", 5}}));
  EXPECT_NE(ended.out.find(R"("bytes":4,"modified":"2024-05-01T10:00:00Z"})"), std::string::npos);
  const std::string bytes = "_bytes\":\"" + folder_.Path() + "/card/bad%20folder%E9/inside.jpg\"";
  EXPECT_NE(ended.out.find(bytes), std::string::npos) << ended.out;
  const std::string check = "python3 -c 'import json,sys\nfor l in sys.stdin: json.loads(l)' < ";
  if (std::system("python3 -c '' 2>/dev/null") == 0) {
    EXPECT_EQ(std::system((check + folder_ / "out").c_str()), 0) << ended.out;
  }
}

TEST_F(Import, OnlyTellsInADryRun) {
  Put("a.jpg", "a");
  const Ended ended = Run({"--dry-run", "--layout=%Y/%m"});
  EXPECT_EQ(ended.exitCode, 0);
  EXPECT_NE(ended.out.find("planned  a.jpg -> 2024/05/a.jpg"), std::string::npos) << ended.out;
  EXPECT_FALSE(fs::exists(Photos()));
}

TEST_F(Import, RefusesWrongUsage) {
  Put("a.jpg", "a");
  const std::string card = folder_ / "card";
  const std::vector<std::vector<std::string>> kWrong = {
      {},
      {card},
      {card, "x", "y"},
      {"--nonsense", card, "x"},
      {"--json=yes", card, "x"},
      {"--layout=../%Y", card, "x"},
      {card, card + "/."},
      {card, Card("a.jpg")},
      {Card("a.jpg"), Photos()},
      {Card("missing"), Photos()},
      {card, ""},
  };
  for (const auto& args : kWrong) {
    const Ended ended = Wait(Start(args));
    EXPECT_EQ(ended.exitCode, 2) << testing::PrintToString(args);
    EXPECT_NE(ended.err.find("orb-import: "), std::string::npos);
  }
  EXPECT_EQ(Wait(Start({"--help"})).exitCode, 0);
  EXPECT_EQ(Wait(Start({"--version"})).exitCode, 0);
}

TEST_F(Import, LeavesNothingOfAPhotoForWhichThereIsNoRoom) {
  Put("big.jpg", Bytes(2'000'000, 1));
  Put("small.jpg", "small");
  const Ended ended = Wait(Start({folder_ / "card", folder_ / "photos"}, [] {
    std::signal(SIGXFSZ, SIG_IGN);
    const rlimit limit = {1'000'000, 1'000'000};
    ::setrlimit(RLIMIT_FSIZE, &limit);
  }));
  EXPECT_EQ(ended.exitCode, 1);
  EXPECT_NE(ended.err.find("kOrbErrDiskFull " + Card("big.jpg")), std::string::npos) << ended.err;
  EXPECT_NE(ended.err.find("1/2 2024/2024-05-01/big.jpg failed"), std::string::npos) << ended.err;
  EXPECT_EQ(Tree(), (Files{{"2024/2024-05-01/small.jpg", "small"}}));
}

/// A file that takes long to copy and no room on the card. There need not be any for the copy.
void PutHole(const std::string& path) {
  fs::resize_file(path, 8ull << 30);
  SetTime(path, kMayFirst);
}

template <typename Condition>
void Await(const Condition& condition) {
  for (int i = 0; i < 2000 && !condition(); ++i) {
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
}

TEST_F(Import, StopsAtOnceOnCtrlC) {
  Put("a.jpg", "a");
  PutHole(Put("b.mov", "b"));
  Put("b.xmp", "b");
  const std::string day = Photos("2024/2024-05-01/");
  const pid_t child = Start({"--fill", folder_ / "card", folder_ / "photos"});
  Await([&] { return fs::exists(day + "b.mov") && fs::file_size(day + "b.mov") > 0; });
  const Ended second = Run();  // Meanwhile nobody else may work there.
  ::kill(child, SIGINT);
  EXPECT_EQ(second.exitCode, 1);
  const Ended ended = Wait(child);
  EXPECT_EQ(ended.exitCode, 130);
  EXPECT_NE(ended.out.find("Stopped before the end"), std::string::npos) << ended.out;
  EXPECT_EQ(Tree(), (Files{{"2024/2024-05-01/a.jpg", "a"}}));
}

TEST_F(Import, DrawsABarOnATerminal) {
  PutHole(Put("b.mov", "b"));
  int terminal = -1;
  winsize size = {24, 60, 0, 0};
  const pid_t child = ::forkpty(&terminal, nullptr, nullptr, &size);
  if (child == 0) {
    ::setenv("TERM", "xterm", 1);
    ::setenv("NO_COLOR", "1", 1);
    const std::string card = folder_ / "card";
    ::execl(ORB_IMPORT, ORB_IMPORT, "--fill", card.c_str(), Photos().c_str(), nullptr);
    ::_exit(127);
  }
  const auto start = std::chrono::steady_clock::now();
  std::string shown;
  char piece[4096];
  bool stopped = false;
  for (ssize_t count; (count = ::read(terminal, piece, sizeof piece)) > 0;) {
    shown.append(piece, static_cast<std::size_t>(count));
    if (stopped || shown.find("/s") == std::string::npos) continue;
    stopped = ::write(terminal, "\x03", 1) == 1;
  }
  ::close(terminal);
  const std::chrono::duration<double> seconds = std::chrono::steady_clock::now() - start;
  EXPECT_EQ(Wait(child).exitCode, 130);
  EXPECT_EQ(shown.find("\x1b[3"), std::string::npos);  // No colour.
  std::istringstream lines(shown.substr(0, shown.find("Type")));
  int draws = 0;
  for (std::string line; std::getline(lines, line, '\r');) {
    if (line.find("files") != std::string::npos) ++draws;
    if (line.find('%') == std::string::npos) continue;
    EXPECT_LE(line.find("\x1b[K"), 59u) << line;
  }
  EXPECT_GE(draws, 2) << shown;
  EXPECT_LE(draws, 2 + 10 * seconds.count());
  EXPECT_EQ(Tree(), Files());
}

/// Whatever stands under a photo's name with the photo's size and time has to be that photo.
void ExpectNoFalseWhole(const Files& card, const std::string& day) {
  for (const auto& [name, bytes] : card) {
    const std::string path = day + name;
    if (!fs::exists(path) || fs::file_size(path) != bytes.size()) continue;
    EXPECT_TRUE(TimeOf(path) != kMayFirst || ReadAll(path) == bytes) << path;
  }
}

TEST_F(Import, LeavesNothingShortWhenItIsKilledAtAnyMoment) {
  Files card;
  for (unsigned i = 0; i < 16; ++i) {
    const std::string name = "IMG_" + std::to_string(i);
    card[name + ".CR2"] = Bytes(900'000 + 1000 * i, i);
    card[name + ".JPG"] = Bytes(300'000, 100 + i);
    card[name + ".xmp"] = Bytes(300, 200 + i);
  }
  for (const auto& [name, bytes] : card) Put(name, bytes);
  Files expected;
  for (const auto& [name, bytes] : card) expected["2024/2024-05-01/" + name] = bytes;
  const std::string journal = Photos(".orb-import.journal");
  // Whoever comes through in the end has nothing twice, nothing left over and no journal.
  const auto expectAll = [&](const Ended& ended) {
    EXPECT_EQ(ended.exitCode, 0) << ended.err;
    EXPECT_TRUE(Tree() == expected) << ended.out;
    fs::remove_all(Photos());
  };
  int kills = 0;
  for (unsigned i = 0; i < 40; ++i) {
    const pid_t child = Start({folder_ / "card", folder_ / "photos"});
    WaitUntilUnderWay(child, journal);
    std::this_thread::sleep_for(std::chrono::microseconds(i * 7919 % 30000));
    ::kill(child, SIGKILL);
    const Ended ended = Wait(child);
    if (ended.exitCode == 0) {
      expectAll(ended);
      continue;
    }
    kills += fs::exists(journal) ? 1 : 0;
    ExpectNoFalseWhole(card, Photos("2024/2024-05-01/"));
    if (kills % 6 == 0) expectAll(Run());
  }
  EXPECT_GT(kills, 0);
}

TEST_F(Import, TakesOnlyItsOwnUnfinishedFilesAway) {
  const std::string photo = Bytes(100'000, 1);
  for (const char* const name : {"short.jpg", "foreign.jpg", "unlisted.jpg", "whole.jpg"}) {
    Put(name, photo);
  }
  const std::string day = "photos/2024/2024-05-01/";
  fs::create_directories(folder_ / day);
  folder_.Write(day + "short.jpg", photo.substr(0, 70'000));
  folder_.Write(day + "foreign.jpg", "not the photo's bytes");
  folder_.Write(day + "unlisted.jpg", photo.substr(0, 70'000));
  folder_.Write(day + "whole.jpg", photo);
  folder_.Write(day + "gone.jpg", "of another card");
  std::string journal;
  for (const char* const name : {"short", "foreign", "whole", "gone"}) {
    journal += FormatPromise({std::string("2024/2024-05-01/") + name + ".jpg",
                              100'000,
                              std::uint64_t{2082844800} + kMayFirst});
  }
  folder_.Write("photos/.orb-import.journal", journal);
  const Ended ended = Run();
  EXPECT_EQ(ended.exitCode, 0) << ended.err;
  EXPECT_NE(ended.err.find("gone.jpg"), std::string::npos) << ended.err;
  Files tree = Tree();
  EXPECT_EQ(tree.erase(".orb-import.journal"), 1u);  // For the card that gone.jpg came from.
  EXPECT_TRUE(tree == (Files{{"2024/2024-05-01/short.jpg", photo},
                             {"2024/2024-05-01/foreign.jpg", "not the photo's bytes"},
                             {"2024/2024-05-01/foreign_1.jpg", photo},
                             {"2024/2024-05-01/unlisted.jpg", photo.substr(0, 70'000)},
                             {"2024/2024-05-01/unlisted_1.jpg", photo},
                             {"2024/2024-05-01/whole.jpg", photo},
                             {"2024/2024-05-01/gone.jpg", "of another card"}}));
  EXPECT_EQ(TimeOf(folder_ / (day + "whole.jpg")), kMayFirst);
}

TEST_F(Meanwhile, AShotMovesOnTogetherWhenOneOfItsNamesIsTaken) {
  Put("I.CR2", "raw");
  Put("I.JPG", "jpeg");
  EXPECT_TRUE(RunWith([&] {
    fs::create_directory(Photos("D"));
    folder_.Write("photos/D/I.JPG", "taken");
  }));
  EXPECT_EQ(Tree(), (Files{{"D/I.JPG", "taken"}, {"D/I_1.CR2", "raw"}, {"D/I_1.JPG", "jpeg"}}));
}

TEST_F(Meanwhile, ASourceThatVanishesOrChangesIsAFailure) {
  Put("a.jpg", "a");
  Put("b.jpg", "b");
  Put("c.jpg", "c");
  EXPECT_FALSE(RunWith([&] {
    fs::remove(Card("a.jpg"));
    Put("b.jpg", "grown");
  }));
  EXPECT_EQ(Tree(), (Files{{"D/c.jpg", "c"}}));
}

TEST_F(Import, TheSampleCardComesThroughWhole) {
  if (std::system("command -v convert exiftool setfattr >/dev/null") != 0) {
    GTEST_SKIP() << "the sample card needs imagemagick, exiftool and attr";
  }
  ASSERT_EQ(std::system((ORB_SAMPLE_PHOTOS " " + folder_ / "card").c_str()), 0);
  const Ended first = Run({"--json"});
  EXPECT_EQ(first.exitCode, 1);  // The one name that is not UTF-8.
  EXPECT_EQ(Tree().size(), 24u) << first.err;
  std::istringstream lines(first.out);
  int copied = 0;
  const auto value = [](const std::string& line, const std::string& key) {
    const std::size_t at = line.find("\"" + key + "\":\"") + key.size() + 4;
    return line.substr(at, line.find("\",\"", at) - at);
  };
  for (std::string line; std::getline(lines, line);) {
    if (!line.starts_with(R"({"status":"copied")") || line.find('\\') != std::string::npos)
      continue;
    ++copied;
    const std::string source = value(line, "source"), destination = value(line, "destination");
    EXPECT_TRUE(ReadAll(source) == ReadAll(destination)) << line;
    EXPECT_EQ(TimeOf(source), TimeOf(destination)) << line;
  }
  EXPECT_EQ(copied, 22);  // Two names hold a character that JSON escapes.
  EXPECT_EQ(Run({"--verbose"}).out.find("copied "), std::string::npos);
}

}  // namespace
}  // namespace orbimport

// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/create.h>
#include <orb/fileops/path_relations.h>

#include <atomic>
#include <cstddef>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "fileops/numbered_name.h"
#include "platform/taken_runs.h"
#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"

namespace {

namespace fs = std::filesystem;
using orb::NumberedName;
using orb::TakenNumbers;
using orb::test::ReadAll;
using orb::test::RunWithPrivateMounts;
using orb::test::TempFolder;

/// The name that was made, or the code in its place.
std::string Unique(const std::string& folder, const std::string& name) {
  COrbFilePath result;
  const OrbResult code = OrbCreateUniqueFile(PathOf(folder), S(name), &result);
  EXPECT_EQ(result.IsEmpty(), code != kOrbNoErr);
  if (code != kOrbNoErr) return std::to_string(code);
  const std::string path = Text(result.GetFullPath());
  EXPECT_TRUE(fs::exists(path)) << path;
  return path.substr(folder.size() + 1);
}

TEST(CreateUniqueFile, NumbersTheNameBeforeItsExtension) {
  const TempFolder folder;
  const struct {
    const char* name;
    std::vector<std::string> made;
  } kCases[] = {
      {"photo.jpg", {"photo.jpg", "photo_1.jpg", "photo_2.jpg"}},
      {"a.b.jpg", {"a.b.jpg", "a.b_1.jpg"}},
      {"notes", {"notes", "notes_1"}},
      {".profile", {".profile", "_1.profile"}},
      {"dot.", {"dot.", "dot_1"}},
      {"100%d.tif", {"100%d.tif", "100%d_1.tif"}},
  };
  for (const auto& c : kCases) {
    for (const std::string& made : c.made) EXPECT_EQ(Unique(folder.Path(), c.name), made);
  }
}

TEST(CreateUniqueFile, TakesTheLowestFreeNumberOfMany) {
  const TempFolder folder;
  for (int i = 0; i < 300; ++i) Unique(folder.Path(), "p.jpg");
  EXPECT_TRUE(fs::exists(folder / "p_299.jpg"));
  fs::remove(folder / "p_7.jpg");
  fs::remove(folder / "p_120.jpg");
  fs::create_symlink("nowhere", folder / "p_300.jpg");  // Taken, although it leads nowhere.
  for (const char* made : {"p_7.jpg", "p_120.jpg", "p_301.jpg"})
    EXPECT_EQ(Unique(folder.Path(), "p.jpg"), made);
}

/// The name that trying one after the other gives.
std::string FirstFree(const std::string& folder, const std::string& stem, const std::string& end) {
  std::string name = stem + end;
  for (int i = 1; fs::exists(fs::symlink_status(fs::path(folder) / name)); ++i)
    name = stem + "_" + std::to_string(i) + end;
  return name;
}

/// What other programs do to a numbered name, and to the folder.
void Disturb(const fs::path& folder, int number, int kind) {
  const fs::path name = folder / ("p_" + std::to_string(number) + ".jpg");
  std::error_code ignored;
  if (kind == 0) fs::remove(name, ignored);
  if (kind == 1) fs::rename(name, folder / "elsewhere", ignored);
  if (kind == 2) fs::rename(name, folder / "p_5.jpg", ignored);
  if (kind == 3) std::ofstream(name).put('x');
  if (kind == 4) fs::remove(folder / "p.jpg", ignored);
  if (kind == 5 && number > 35) fs::remove_all(folder, ignored);
  fs::create_directory(folder, ignored);
}

/// What is known of a series is kept only of one that has this number.
void MakeLong(const fs::path& folder, const std::string& stem) {
  std::ofstream file(folder / (stem + "_100.jpg"));
}

void CompareWithFirstFree(const std::string& folder) {
  std::mt19937 random(7);
  fs::create_directory(folder);
  for (int i = 0; i < 500; ++i) {
    const std::string stem = random() % 3 == 0 ? "q" : "p";
    MakeLong(folder, stem);
    const std::string expected = FirstFree(folder, stem, ".jpg");
    ASSERT_EQ(Unique(folder, stem + ".jpg"), expected) << i;
    if (random() % 4 == 0)
      Disturb(folder, static_cast<int>(random() % 40), static_cast<int>(random() % 6));
  }
}

TEST(CreateUniqueFile, GivesTheFirstFreeNameWhateverOthersDo) {
  const TempFolder folder;
  CompareWithFirstFree(folder / "usual");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    const std::string unwatched = folder / "unwatched";
    fs::create_directory(unwatched);
    ASSERT_EQ(::mount("orb-test", unwatched.c_str(), "ramfs", 0, nullptr), 0);
    CompareWithFirstFree(unwatched + "/folder");
  }));
}

TEST(CreateUniqueFile, SeesInAChildAndBesideItWhatTheOtherRemoves) {
  const TempFolder folder;
  const auto child = [&] {
    fs::remove(folder / "p_3.jpg");
    EXPECT_EQ(Unique(folder.Path(), "p.jpg"), "p_3.jpg");
    fs::remove(folder / "p_4.jpg");
    EXPECT_EQ(Unique(folder.Path(), "p.jpg"), "p_4.jpg");
    fs::remove(folder / "p_5.jpg");
    Unique(folder.Path(), "other.jpg");  // Looks at what has happened.
  };
  MakeLong(folder.Path(), "p");
  for (int i = 0; i < 20; ++i) Unique(folder.Path(), "p.jpg");
  ORB_IN_CHILD(orb::test::RunInChild([] { return true; }, child));
  EXPECT_EQ(Unique(folder.Path(), "p.jpg"), "p_5.jpg");
}

// Somebody removes a name while it is found out which are taken.
TEST(CreateUniqueFile, RemembersNothingThatLeftBeforeItWatched) {
  const TempFolder parent;
  std::mt19937 random(7);
  for (int round = 0; round < 200; ++round) {
    const std::string folder = parent / std::to_string(round);
    fs::create_directory(folder);
    for (const char* name : {"p.jpg", "p_1.jpg", "p_2.jpg", "p_3.jpg", "p_100.jpg"})
      std::ofstream(fs::path(folder) / name).put('x');
    std::atomic<bool> begun = false;
    std::thread other([&] {
      while (!begun) continue;
      for (volatile auto wait = random() % 20'000; wait > 0;) wait = wait - 1;
      fs::remove(folder + "/p_2.jpg");
    });
    begun = true;
    const std::string made = Unique(folder, "p.jpg");
    other.join();
    ASSERT_EQ(Unique(folder, "p.jpg"), made == "p_2.jpg" ? "p_4.jpg" : "p_2.jpg") << round;
  }
}

std::ptrdiff_t OpenDescriptors() {
  return std::distance(fs::directory_iterator("/proc/self/fd"), fs::directory_iterator());
}

void MakeTenSeries(const std::string& folder, const std::string& stem, int size) {
  for (int i = 0; i < 10; ++i) {
    for (int j = 0; j < size; ++j) Unique(folder, stem + std::to_string(i));
  }
}

TEST(CreateUniqueFile, HoldsADescriptorForLongSeriesOnly) {
  const TempFolder parent;
  const std::string folder = parent / "folder";
  const auto count = [&] {
    fs::create_directory(folder);
    Unique(folder, "first");
    const auto before = OpenDescriptors();
    MakeTenSeries(folder, "short", 50);
    EXPECT_EQ(OpenDescriptors(), before);
    MakeTenSeries(folder, "long", 110);
    EXPECT_EQ(OpenDescriptors(), before + 1);
    fs::remove_all(folder);
    Unique(parent.Path(), "last");
    EXPECT_EQ(OpenDescriptors(), before);
  };
  ORB_IN_CHILD(orb::test::RunInChild([] { return true; }, count));
}

void MakeAtExit() {
  const TempFolder folder;
  MakeLong(folder.Path(), "p");
  for (int i = 0; i < 9; ++i) Unique(folder.Path(), "p.jpg");
  if (!fs::exists(folder / "p_8.jpg")) ::_exit(1);
}

TEST(CreateUniqueFile, WorksUntilTheProgramHasEnded) {
  const auto useAndExit = [] {
    std::atexit(MakeAtExit);
    MakeAtExit();
    std::exit(0);
  };
  EXPECT_EXIT(useAndExit(), testing::ExitedWithCode(0), "");
}

TEST(TakenRuns, AreEndedByWhatMayBeAnotherSpelling) {
  const struct {
    const char* name;
    const char* stem;
    bool may;
  } kCases[] = {
      {"photo_7.jpg", "photo", true},
      {"PHOTO_7.JPG", "photo", true},
      {"pho", "photo", true},
      {"photo_7.jpg", "", true},
      {"\u212Bnn", "photo", true},  // What such a letter folds to only the volume knows.
      {"phot\u200bo_7", "photo", true},
      {"k_7", "\u212A", true},
      {".orb-0123456789abcdef", "photo", false},
      {"phone_7.jpg", "photo", false},
  };
  for (const auto& c : kCases)
    EXPECT_EQ(orb::platform::MayBeginWith(c.name, c.stem), c.may) << c.name;
}

TEST(CreateUniqueFile, EndsWhereNoNumberCanHelp) {
  const TempFolder folder;
  const std::string longest = std::string(251, 'n') + ".jpg";
  EXPECT_EQ(Unique(folder.Path(), longest), longest);
  EXPECT_EQ(Unique(folder.Path(), longest), std::to_string(kOrbErrInvalidName));
  EXPECT_EQ(Unique(folder.Path(), "n" + longest), std::to_string(kOrbErrInvalidName));
  EXPECT_EQ(Unique(folder / "missing", "a"), std::to_string(kOrbErrAccessDenied));
  EXPECT_EQ(Unique("", "a"), std::to_string(kOrbErrEmptyPath));
  ASSERT_EQ(COrbFileHandle(PathOf(folder.Path())).SetAttribute(kOrbFileAttrLocked), 0u);
  EXPECT_EQ(Unique(folder.Path(), longest), std::to_string(kOrbErrInvalidName));
  folder.Write("a", "");
  EXPECT_EQ(Unique(folder.Path(), "a"), std::to_string(kOrbErrAccessDenied));
}

TEST(CreateUniqueFile, GivesNoTwoCallersTheSameFile) {
  constexpr int kThreads = 4;
  constexpr int kFiles = 50;
  const TempFolder folder;
  std::vector<std::set<std::string>> made(kThreads);
  std::vector<std::thread> threads;
  for (auto& mine : made) {
    threads.emplace_back([&] {
      for (int i = 0; i < kFiles; ++i) mine.insert(Unique(folder.Path(), "p.jpg"));
    });
  }
  for (auto& thread : threads) thread.join();
  std::set<std::string> all;
  for (const auto& mine : made) all.insert(mine.begin(), mine.end());
  EXPECT_EQ(all.size(), std::size_t{kThreads * kFiles});
  EXPECT_TRUE(all.contains("p_199.jpg"));
}

TEST(NumberedName, ReadsOnlyTheNamesThatItGives) {
  const NumberedName names(S("p.jpg"));
  EXPECT_EQ(names.NumberOf("p_12.jpg"), 12u);
  for (const char* name : {"p.jpg",
                           "p_.jpg",
                           "p_0.jpg",
                           "p_01.jpg",
                           "p_+1.jpg",
                           "p_1.JPG",
                           "p_99999999999.jpg",
                           "p_1x.jpg",
                           "q_1.jpg"})
    EXPECT_FALSE(names.NumberOf(name)) << name;
  const TakenNumbers taken({1, 2, 4, 9999});
  EXPECT_EQ(taken.NextFree(1), 3u);
  EXPECT_EQ(taken.NextFree(4), 5u);
  EXPECT_EQ(taken.NextFree(70), 70u);
}

TEST(CreateFile, ReplacesAFileOrALinkByAnEmptyFile) {
  const TempFolder folder;
  folder.Write("old", "content");
  folder.Write("outside", "content");
  fs::create_symlink("outside", folder / "link");
  COrbFilePath result;
  for (const char* name : {"new", "old", "link"}) {
    EXPECT_EQ(OrbCreateFile(PathOf(folder.Path()), S(name), &result), kOrbNoErr) << name;
    EXPECT_EQ(Text(result.GetFullPath()), folder / name);
    EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(folder / name)));
    EXPECT_EQ(ReadAll(folder / name), "");
  }
  EXPECT_EQ(ReadAll(folder / "outside"), "content");
}

TEST(CreateFile, SaysWhyItCannot) {
  const TempFolder folder;
  fs::create_directory(folder / "folder");
  folder.Write("locked", "x");
  ASSERT_EQ(COrbFileHandle(PathOf(folder / "locked")).SetAttribute(kOrbFileAttrLocked), 0u);
  const struct {
    std::string folder;
    std::string name;
    OrbResult expected;
  } kCases[] = {
      {"", "new", kOrbErrEmptyPath},
      {folder.Path(), "folder", kOrbErrFileExists},
      {folder.Path(), "locked", kOrbErrFileExists},
      {folder.Path(), std::string(256, 'n'), kOrbErrInvalidName},
      {folder.Path(), "\xff", kOrbErrInvalidName},
      {folder / "missing", "new", kOrbErrAccessDenied},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.name);
    COrbFilePath result = PathOf("before");
    EXPECT_EQ(OrbCreateFile(PathOf(c.folder), S(c.name), &result), c.expected);
    EXPECT_EQ(Text(result.GetFullPath()), "before");
  }
  EXPECT_EQ(ReadAll(folder / "locked"), "x");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MountTmpfs(folder / "full", "size=1m,nr_inodes=1"));
    COrbFilePath result;
    EXPECT_EQ(OrbCreateFile(PathOf(folder / "full"), S("new"), &result), kOrbErrDiskFull);
    EXPECT_EQ(OrbCreateFolder(PathOf(folder / "full"), S("new"), nullptr), kOrbErrDiskFull);
  }));
}

TEST(CreateFolder, MakesMissingFoldersAbove) {
  const TempFolder folder;
  folder.Write("file", "");
  COrbFilePath result;
  const COrbFilePath above = PathOf(folder / "x/y");
  EXPECT_EQ(OrbCreateFolder(above, S("z"), &result), kOrbNoErr);
  EXPECT_EQ(Text(result.GetFullPath()), folder / "x/y/z");
  EXPECT_TRUE(fs::is_directory(folder / "x/y/z"));
  EXPECT_EQ(OrbCreateFolder(above, S("z"), nullptr), kOrbErrFileExists);
  EXPECT_EQ(OrbCreateFolder(PathOf(folder.Path()), S("file"), nullptr), kOrbErrFileExists);
  EXPECT_EQ(OrbCreateFolder(above, S(std::string(256, 'n')), nullptr), kOrbErrInvalidName);
  EXPECT_EQ(OrbCreateFolder(PathOf(""), S("z"), nullptr), kOrbErrEmptyPath);
  ASSERT_EQ(COrbFileHandle(above).SetAttribute(kOrbFileAttrLocked), 0u);
  EXPECT_EQ(OrbCreateFolder(above, S("new"), nullptr), kOrbErrAccessDenied);
}

TEST(PathRelations, WorkOnTheTextAlone) {
  const struct {
    const char* path;
    OrbResult result;
    const char* parent;
    const char* name;
  } kCases[] = {
      {"/a/b/c", 0, "/a/b", "c"},
      {"/a/b/", 0, "/a/b", ""},
      {"a/b.jpg", 0, "a", "b.jpg"},
      {"/a", kOrbErrNotFound, "before", "a"},
      {"b.jpg", kOrbErrNotFound, "before", "b.jpg"},
      {"", kOrbErrNotFound, "before", ""},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    COrbStringData parent = S("before");
    EXPECT_EQ(OrbGetParentFolder(S(c.path), &parent), c.result);
    EXPECT_EQ(Text(parent), c.parent);
    EXPECT_EQ(OrbGetParentFolder(S(c.path), nullptr), c.result);
    COrbStringData name = S(c.path);
    EXPECT_EQ(OrbGetFileNameFromPath(name, &name), kOrbNoErr);  // The output may be the input.
    EXPECT_EQ(Text(name), c.name);
  }
  EXPECT_TRUE(OrbIsSubFolder(S("/a/b"), S("/A/B/c")));
  EXPECT_FALSE(OrbIsSubFolder(S("/a/b"), S("/a/bc")));
  EXPECT_TRUE(OrbIsSubFolder(PathOf("/a/b/"), PathOf("/a/b")));
}

}  // namespace

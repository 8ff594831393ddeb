// SPDX-License-Identifier: MIT
#include <orb/fileops/create.h>
#include <orb/fileops/path_relations.h>

#include <random>
#include <thread>
#include <vector>

#include "fileops/numbered_name.h"
#include "platform/taken_runs.h"
#include "support/files.h"

namespace orb::test {
namespace {

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
  const Tree folder;
  const std::pair<const char*, std::vector<std::string>> kCases[] = {
      {"photo.jpg", {"photo.jpg", "photo_1.jpg", "photo_2.jpg"}},
      {"a.b.jpg", {"a.b.jpg", "a.b_1.jpg"}},
      {"notes", {"notes", "notes_1"}},
      {".profile", {".profile", "_1.profile"}},
      {"dot.", {"dot.", "dot_1"}},
      {"100%d.tif", {"100%d.tif", "100%d_1.tif"}},
  };
  for (const auto& [name, all] : kCases)
    for (const std::string& made : all) EXPECT_EQ(Unique(folder.Path(), name), made);
}

TEST(CreateUniqueFile, TakesTheLowestFreeNumberOfMany) {
  const Tree tree;
  for (int i = 0; i < 300; ++i) Unique(tree.Path(), "p.jpg");
  EXPECT_TRUE(tree.Has("p_299.jpg"));
  for (const char* name : {"p_7.jpg", "p_120.jpg"}) fs::remove(tree / name);
  tree.Make("p_300.jpg -> nowhere");  // Taken, although it leads nowhere.
  for (const char* made : {"p_7.jpg", "p_120.jpg", "p_301.jpg"})
    EXPECT_EQ(Unique(tree.Path(), "p.jpg"), made);
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

void CompareWithFirstFree(const std::string& folder) {
  std::mt19937 random(7);
  fs::create_directory(folder);
  for (int i = 0; i < 500; ++i) {
    const std::string stem = random() % 3 == 0 ? "q" : "p";
    const std::string expected = FirstFree(folder, stem, ".jpg");
    ASSERT_EQ(Unique(folder, stem + ".jpg"), expected) << i;
    if (random() % 4 == 0)
      Disturb(folder, static_cast<int>(random() % 40), static_cast<int>(random() % 6));
  }
}

TEST(CreateUniqueFile, GivesTheFirstFreeNameWhateverOthersDo) {
  const Tree folder;
  CompareWithFirstFree(folder / "usual");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    const std::string unwatched = folder / "unwatched";
    fs::create_directory(unwatched);
    ASSERT_EQ(::mount("orb-test", unwatched.c_str(), "ramfs", 0, nullptr), 0);
    CompareWithFirstFree(unwatched + "/folder");
  }));
}

TEST(CreateUniqueFile, SeesInAChildAndBesideItWhatTheOtherRemoves) {
  const Tree folder;
  const auto child = [&] {
    fs::remove(folder / "p_3.jpg");
    EXPECT_EQ(Unique(folder.Path(), "p.jpg"), "p_3.jpg");
    fs::remove(folder / "p_4.jpg");
    EXPECT_EQ(Unique(folder.Path(), "p.jpg"), "p_4.jpg");
    fs::remove(folder / "p_5.jpg");
    Unique(folder.Path(), "other.jpg");  // Looks at what has happened.
  };
  for (int i = 0; i < 20; ++i) Unique(folder.Path(), "p.jpg");
  ORB_IN_CHILD(RunInChild([] { return true; }, child));
  EXPECT_EQ(Unique(folder.Path(), "p.jpg"), "p_5.jpg");
}

TEST(CreateUniqueFile, HoldsAtMostOneDescriptor) {
  const auto before = OpenDescriptors();
  for (int i = 0; i < 12; ++i) {
    const Tree folder;
    for (int j = 0; j < 7; ++j) Unique(folder.Path(), "p.jpg");
  }
  EXPECT_LE(OpenDescriptors(), before + 1);
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
  for (const auto& c : kCases) EXPECT_EQ(platform::MayBeginWith(c.name, c.stem), c.may) << c.name;
}

TEST(CreateUniqueFile, EndsWhereNoNumberCanHelp) {
  const std::string longest = std::string(251, 'n') + ".jpg";
  const Tree tree(longest + ", locked/a, locked/" + longest + ", locked/!");
  const Row<OrbResult> kCases[] = {
      {"", longest, kOrbErrEmptyPath},
      {tree.Path(), longest, kOrbErrInvalidName},
      {tree.Path(), "n" + longest, kOrbErrInvalidName},
      {"missing", "a", kOrbErrAccessDenied},
      {"locked", longest, kOrbErrInvalidName},
      {"locked", "a", kOrbErrAccessDenied},
  };
  const Unchanged unchanged(tree.Path());
  for (const auto& [folder, name, expected] : kCases)
    EXPECT_EQ(Unique(tree.At(folder), name), std::to_string(expected)) << folder << name;
}

TEST(CreateUniqueFile, GivesNoTwoCallersTheSameFile) {
  const Tree tree;
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([&] {
      for (int k = 0; k < 50; ++k) Unique(tree.Path(), "p.jpg");
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(NamesIn(tree.Path()).size(), 200u);
  EXPECT_TRUE(tree.Has("p_199.jpg"));
}

TEST(NumberedName, ReadsOnlyTheNamesThatItGives) {
  const NumberedName names(S("p.jpg"));
  EXPECT_EQ(names.NumberOf("p_12.jpg"), 12u);
  std::istringstream others(
      "p.jpg p_.jpg p_0.jpg p_01.jpg p_+1.jpg p_1.JPG p_99999999999.jpg p_1x.jpg q_1.jpg");
  for (std::string name; others >> name;) EXPECT_FALSE(names.NumberOf(name)) << name;
  const TakenNumbers taken({1, 2, 4, 9999});
  EXPECT_EQ(taken.NextFree(1), 3u);
  EXPECT_EQ(taken.NextFree(4), 5u);
  EXPECT_EQ(taken.NextFree(70), 70u);
}

TEST(CreateFile, ReplacesAFileOrALinkByAnEmptyFile) {
  const Tree tree("old, outside, link -> outside");
  COrbFilePath result;
  for (const char* name : {"new", "old", "link"}) {
    EXPECT_EQ(OrbCreateFile(PathOf(tree.Path()), S(name), &result), kOrbNoErr) << name;
    EXPECT_EQ(Text(result.GetFullPath()), tree / name);
    EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(tree / name)));
    EXPECT_EQ(tree.Read(name), "");
  }
  EXPECT_EQ(tree.Read("outside"), "outside");
}

TEST(CreateFile, AndCreateFolderSayWhyTheyCannot) {
  const Tree tree("folder/, file, lock!, locked/!");
  const std::tuple<std::string, std::string, OrbResult, OrbResult> kCases[] = {
      {"", "new", kOrbErrEmptyPath, kOrbErrEmptyPath},
      {tree.Path(), "folder", kOrbErrFileExists, kOrbErrFileExists},
      {tree.Path(), "lock", kOrbErrFileExists, kOrbErrFileExists},
      {tree.Path(), std::string(256, 'n'), kOrbErrInvalidName, kOrbErrInvalidName},
      {tree.Path(), "\xff", kOrbErrInvalidName, kOrbErrInvalidName},
      {"locked", "new", kOrbErrAccessDenied, kOrbErrAccessDenied},
      {"missing", "new", kOrbErrAccessDenied, kOrbNoErr},
  };
  for (const auto& [folder, name, file, made] : kCases) {
    SCOPED_TRACE(folder + "/" + name);
    COrbFilePath result = PathOf("before");
    EXPECT_EQ(OrbCreateFile(PathOf(tree.At(folder)), S(name), &result), file);
    EXPECT_EQ(Text(result.GetFullPath()), "before");
    EXPECT_EQ(OrbCreateFolder(PathOf(tree.At(folder)), S(name), nullptr), made);
  }
  EXPECT_EQ(tree.Read("lock"), "lock");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(tree / "full", "size=1m,nr_inodes=1"));
    COrbFilePath result;
    EXPECT_EQ(OrbCreateFile(PathOf(tree / "full"), S("new"), &result), kOrbErrDiskFull);
    EXPECT_EQ(OrbCreateFolder(PathOf(tree / "full"), S("new"), nullptr), kOrbErrDiskFull);
  }));
}

TEST(CreateFolder, MakesMissingFoldersAbove) {
  const Tree tree;
  COrbFilePath result;
  EXPECT_EQ(OrbCreateFolder(PathOf(tree / "x/y"), S("z"), &result), kOrbNoErr);
  EXPECT_EQ(Text(result.GetFullPath()), tree / "x/y/z");
  EXPECT_TRUE(fs::is_directory(tree / "x/y/z"));
}

TEST(PathRelations, WorkOnTheTextAlone) {
  const std::tuple<const char*, OrbResult, const char*, const char*> kCases[] = {
      {"/a/b/c", 0, "/a/b", "c"},
      {"/a/b/", 0, "/a/b", ""},
      {"a/b.jpg", 0, "a", "b.jpg"},
      {"/a", kOrbErrNotFound, "before", "a"},
      {"b.jpg", kOrbErrNotFound, "before", "b.jpg"},
      {"", kOrbErrNotFound, "before", ""},
  };
  for (const auto& [path, result, expectedParent, expectedName] : kCases) {
    SCOPED_TRACE(path);
    COrbStringData parent = S("before");
    EXPECT_EQ(OrbGetParentFolder(S(path), &parent), result);
    EXPECT_EQ(Text(parent), expectedParent);
    EXPECT_EQ(OrbGetParentFolder(S(path), nullptr), result);
    COrbStringData name = S(path);
    EXPECT_EQ(OrbGetFileNameFromPath(name, &name), kOrbNoErr);  // The output may be the input.
    EXPECT_EQ(Text(name), expectedName);
  }
  EXPECT_TRUE(OrbIsSubFolder(S("/a/b"), S("/A/B/c")));
  EXPECT_FALSE(OrbIsSubFolder(S("/a/b"), S("/a/bc")));
  EXPECT_TRUE(OrbIsSubFolder(PathOf("/a/b/"), PathOf("/a/b")));
}

}  // namespace
}  // namespace orb::test

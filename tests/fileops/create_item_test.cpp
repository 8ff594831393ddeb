// SPDX-License-Identifier: MIT
#include <orb/fileops/create.h>
#include <orb/fileops/path_relations.h>

#include <thread>
#include <vector>

#include "fileops/numbered_name.h"
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
  const TempFolder folder;
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

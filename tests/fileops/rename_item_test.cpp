// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileops/access.h>
#include <orb/fileops/rename.h>

#include <filesystem>
#include <string>

#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"
#include "support/trees.h"

namespace {

namespace fs = std::filesystem;
using orb::test::ReadAll;
using orb::test::TempFolder;

bool IsLocked(const std::string& path) {
  return (COrbFileHandle(PathOf(path)).GetAttribute() & kOrbFileAttrLocked) != 0;
}

TEST(RenameFile, KeepsTheLockWhateverHappens) {
  const TempFolder folder;
  for (const char* name : {"locked", "open", "other"}) folder.Write(name, name);
  ASSERT_TRUE(Lock(folder / "locked"));
  const struct {
    const char* from;
    const char* to;
    OrbResult expected;
  } kCases[] = {
      {"locked", "other", kOrbErrFileExists},
      {"locked", "", kOrbErrFileExists},  // That is the folder itself.
      {"locked", "missing/new", kOrbErrNotFound},
      {"locked", "50%d \xc3\xbc", kOrbNoErr},
      {"open", "new", kOrbNoErr},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.to);
    COrbFilePath result = PathOf("before");
    const bool locked = IsLocked(folder / c.from);
    EXPECT_EQ(OrbRenameFile(PathOf(folder / c.from), S(c.to), &result), c.expected);
    const bool renamed = c.expected == kOrbNoErr;
    EXPECT_EQ(Text(result.GetFullPath()), renamed ? folder / c.to : "before");
    const std::string now = folder / (renamed ? c.to : c.from);
    EXPECT_EQ(ReadAll(now), c.from);
    EXPECT_EQ(IsLocked(now), locked);
  }
  EXPECT_EQ(ReadAll(folder / "other"), "other");
}

TEST(RenameFile, SaysWhyItCannotAndChangesNothing) {
  const TempFolder folder;
  folder.Write("file", "x");
  fs::create_directories(folder / "pinned");
  folder.Write("pinned/file", "x");
  ASSERT_TRUE(Lock(folder / "pinned"));
  const struct {
    std::string path;
    std::string name;
    OrbResult expected;
  } kCases[] = {
      {"", "new", kOrbErrNoSuchFile},
      {folder / "missing", "new", kOrbErrAccessDenied},
      {folder / "pinned/file", "new", kOrbErrAccessDenied},
      {folder / "file", "pinned/new", kOrbErrAccessDenied},
      {folder / "file", "..", kOrbErrFileExists},
      {folder / "file", "\xff", kOrbErrInvalidName},
      {folder / "file", std::string(256, 'n'), kOrbErrInvalidName},
  };
  const auto before = orb::test::Describe(folder.Path());
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path + " to " + c.name);
    EXPECT_EQ(OrbRenameFile(PathOf(c.path), S(c.name), nullptr), c.expected);
  }
  EXPECT_EQ(orb::test::Describe(folder.Path()), before);
  ORB_IN_CHILD(orb::test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MakeReadOnlyVolume(folder.Path()));
    const COrbFileHandle file(PathOf(folder / "file"));
    EXPECT_EQ(OrbRenameFile(file, S("new"), nullptr), kOrbErrAccessDenied);
    EXPECT_TRUE(OrbIsReadable(file) && !OrbIsDeletable(file));
  }));
}

TEST(RenameFile, WorksOnFoldersLinksAndItsOwnResult) {
  const TempFolder folder;
  fs::create_directories(folder / "tree/sub");
  fs::create_symlink("tree", folder / "link");
  COrbFilePath path = PathOf(folder / "tree/sub//");
  EXPECT_EQ(OrbRenameFile(path, S("/../Sub"), &path), kOrbNoErr);  // A "/" is nothing special.
  EXPECT_EQ(Text(path.GetFullPath()), folder / "tree/../Sub");
  EXPECT_EQ(OrbRenameFile(PathOf(folder / "link"), S("renamed"), nullptr), kOrbNoErr);
  EXPECT_EQ(fs::read_symlink(folder / "renamed"), "tree");
  EXPECT_TRUE(fs::is_directory(folder / "Sub"));
}

TEST(Access, OfAFileNeedsTheFolderAndThePackagesAboveIt) {
  const TempFolder folder;
  fs::create_directories(folder / "pinned/x.app/y.bundle");
  fs::create_directories(folder / "free/x.app");
  for (const char* name : {"free/file", "free/x.app/file", "pinned/x.app/y.bundle/file"})
    folder.Write(name, "");
  folder.Write("free/read-only", "");
  fs::permissions(folder / "free/read-only", fs::perms(0444));
  ASSERT_TRUE(Lock(folder / "pinned"));
  const struct {
    std::string path;
    bool writable;
    bool exists;
  } kCases[] = {
      {folder / "free", true, true},
      {folder / "free/file", true, true},
      {folder / "free/x.app/file", true, true},
      {folder / "free/read-only", false, true},
      {folder / "pinned", false, true},
      {folder / "pinned/x.app", false, true},
      {folder / "pinned/x.app/y.bundle/file", false, true},
      {folder / "missing", false, false},
      {"", false, false},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    const COrbFileHandle handle(PathOf(c.path));
    EXPECT_EQ(OrbIsWritable(handle), c.writable);
    EXPECT_EQ(OrbIsReadable(handle), c.exists);
    EXPECT_EQ(OrbIsDeletable(handle), c.exists);
  }
}

}  // namespace

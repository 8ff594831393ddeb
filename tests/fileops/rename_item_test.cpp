// SPDX-License-Identifier: MIT
#include <orb/fileops/access.h>
#include <orb/fileops/rename.h>

#include "support/files.h"

namespace orb::test {
namespace {

TEST(RenameFile, KeepsTheLockWhateverHappens) {
  const Tree tree("locked!, open, other");
  const Row<OrbResult> kCases[] = {
      {"locked", "other", kOrbErrFileExists},
      {"locked", "missing/new", kOrbErrNotFound},
      {"locked", "50%d \xc3\xbc", kOrbNoErr},
      {"open", "new", kOrbNoErr},
  };
  for (const auto& [from, to, expected] : kCases) {
    SCOPED_TRACE(to);
    COrbFilePath result = PathOf("before");
    EXPECT_EQ(OrbRenameFile(PathOf(tree / from), S(to), &result), expected);
    const bool renamed = expected == kOrbNoErr;
    EXPECT_EQ(Text(result.GetFullPath()), renamed ? tree / to : "before");
    EXPECT_EQ(tree.Read(renamed ? to : from), from);
    const COrbFileHandle item(PathOf(tree / (renamed ? to : from)));
    EXPECT_EQ((item.GetAttribute() & kOrbFileAttrLocked) != 0, from == "locked");
  }
  EXPECT_EQ(tree.Read("other"), "other");
}

TEST(RenameFile, SaysWhyItCannotAndChangesNothing) {
  const Tree tree("file, pinned/file, pinned/!");
  const Row<OrbResult> kCases[] = {
      {"", "new", kOrbErrNoSuchFile},
      {"missing", "new", kOrbErrAccessDenied},
      {"pinned/file", "new", kOrbErrAccessDenied},
      {"file", "pinned/new", kOrbErrAccessDenied},
      {"file", "..", kOrbErrFileExists},
      {"file", std::string(256, 'n'), kOrbErrInvalidName},
  };
  ExpectRefusals(tree, kCases, [&](const std::string& path, const std::string& name) {
    return OrbRenameFile(PathOf(path), S(name.substr(tree.Path().size() + 1)), nullptr);
  });
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MakeReadOnlyVolume(tree.Path()));
    const COrbFileHandle file(PathOf(tree / "file"));
    EXPECT_EQ(OrbRenameFile(file, S("new"), nullptr), kOrbErrAccessDenied);
    EXPECT_TRUE(OrbIsReadable(file) && !OrbIsDeletable(file));
  }));
}

TEST(RenameFile, WorksOnFoldersLinksAndItsOwnResult) {
  const Tree tree("tree/sub/, link -> tree");
  COrbFilePath path = PathOf(tree / "tree/sub//");
  EXPECT_EQ(OrbRenameFile(path, S("/../Sub"), &path), kOrbNoErr);  // A "/" is nothing special.
  EXPECT_EQ(Text(path.GetFullPath()), tree / "tree/../Sub");
  EXPECT_EQ(OrbRenameFile(PathOf(tree / "link"), S("renamed"), nullptr), kOrbNoErr);
  EXPECT_EQ(fs::read_symlink(tree / "renamed"), "tree");
  EXPECT_TRUE(fs::is_directory(tree / "Sub"));
}

TEST(Access, OfAFileNeedsTheFolderAndThePackagesAboveIt) {
  const Tree tree("free/file, free/x.app/file, free/read-only 0444");
  tree.Make("pinned/x.app/y.bundle/file, pinned/!");
  const std::tuple<const char*, bool, bool> kCases[] = {
      {"free/file", true, true},
      {"free/x.app/file", true, true},
      {"free/read-only", false, true},
      {"pinned", false, true},
      {"pinned/x.app/y.bundle/file", false, true},
      {"missing", false, false},
      {"", false, false},
  };
  for (const auto& [path, writable, exists] : kCases) {
    SCOPED_TRACE(path);
    const COrbFileHandle handle(PathOf(tree.At(path)));
    EXPECT_EQ(OrbIsWritable(handle), writable);
    EXPECT_EQ(OrbIsReadable(handle), exists);
    EXPECT_EQ(OrbIsDeletable(handle), exists);
  }
}

}  // namespace
}  // namespace orb::test

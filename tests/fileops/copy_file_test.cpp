// SPDX-License-Identifier: MIT
#include <orb/fileops/copy.h>

#include "support/files.h"

namespace orb::test {
namespace {

OrbResult Append(const std::string& from,
                 const std::string& folder,
                 const std::string& name,
                 Progress* progress = nullptr) {
  const auto call = progress != nullptr ? Progress::Call : nullptr;
  return OrbCopyFileEx(PathOf(from), PathOf(folder), S(name), call, progress);
}

TEST(CopyFileEx, AppendsInPieces) {
  for (const std::size_t size : {0u, 5u, 65536u, 65537u, 200000u}) {
    SCOPED_TRACE(size);
    const std::string bytes(size, 's');
    const Tree tree("old, source=" + bytes);
    Progress progress;
    EXPECT_EQ(Append(tree / "source", tree.Path(), "old", &progress), kOrbNoErr);
    EXPECT_EQ(progress.calls, static_cast<int>((size + 65535) / 65536));
    EXPECT_TRUE(tree.Read("old") == "old" + bytes);
    EXPECT_EQ(Append(tree / "source", tree / "/", "new"), kOrbNoErr);
    EXPECT_TRUE(tree.Has("new") && tree.Read("new") == bytes);
  }
}

TEST(CopyFileEx, LeavesTheDestinationAsItWasWhenItDoesNotSucceed) {
  const Tree tree(
      "old, locked/file!, locked/!, hard => old, link -> old, dangling -> nowhere, pipe|");
  tree.Write("source", std::string(200000, 's'));
  const Row<OrbResult> kCases[] = {
      {"old", "old", kOrbErrSamePath},
      {"old", "hard", kOrbErrSamePath},
      {"source", "link", kOrbErrAccessDenied},
      {"source", "dangling", kOrbErrAccessDenied},
      {"source", "pipe", kOrbErrAccessDenied},
      {"pipe", "new", kOrbErrAccessDenied},
      {"source", "locked/file", kOrbErrAccessDenied},
      {"source", "locked/new", kOrbErrAccessDenied},
      {"source", "locked", kOrbErrUnknown},
      {"source", "missing/new", kOrbErrNotFound},
      {"source", "\xff", kOrbErrInvalidName},
      {"source", std::string(256, 'n'), kOrbErrNameTooLong},
      {"locked", "new", kOrbErrUnknown},  // A folder cannot be read.
      {"missing", "old", kOrbNoErr},
      {"dangling", "new", kOrbNoErr},
      {"", "new", kOrbNoErr},
  };
  ExpectRefusals(tree, kCases, [&](const std::string& from, const std::string& to) {
    Progress progress;
    const OrbResult result =
        Append(from, tree.Path(), to.substr(tree.Path().size() + 1), &progress);
    EXPECT_EQ(progress.calls, 0);
    return result;
  });
  const Unchanged unchanged(tree.Path());
  Progress progress{1};
  EXPECT_EQ(Append(tree / "source", tree.Path(), "new", &progress), kOrbErrCanceled);
  EXPECT_EQ(progress.calls, 1);
  EXPECT_EQ(Append(tree / "source", "", "new"), kOrbErrEmptyPath);
}

TEST(CopyFileEx, LeavesNoDestinationWhenCanceledButWhatSomebodyElsePutThere) {
  const Tree tree("old, hard => old");
  const COrbFilePath source = PathOf(tree.Write("source", std::string(200000, 's')));
  Progress progress{3};
  EXPECT_EQ(Append(tree / "source", tree.Path(), "old", &progress), kOrbErrCanceled);
  EXPECT_FALSE(tree.Has("old"));
  EXPECT_EQ(tree.Read("hard"), "old");
  static const std::string photo = tree / "photo";
  for (const char* reserved : {"", "photo="}) {
    tree.Make(reserved);
    const auto replaceAndCancel = [](void*) {
      fs::remove(photo);
      std::ofstream(photo) << "theirs";
      return false;
    };
    EXPECT_EQ(OrbCopyFileEx(source, PathOf(tree.Path()), S("photo"), replaceAndCancel, nullptr),
              kOrbErrCanceled);
    EXPECT_EQ(tree.Read("photo"), "theirs");
  }
}

TEST(CopyFileEx, TakesBackWhatAFullVolumeOrAStrangersFileLeft) {
  const Tree tree;
  const std::string source = tree.Write("source", std::string(3 * 1024 * 1024, 's'));
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(tree / "to", "size=1m"));
    tree.Make("to/old");
    for (const char* name : {"old", "new"})
      EXPECT_EQ(Append(source, tree / "to", name), kOrbErrDiskFull);
    EXPECT_EQ(tree.Read("to/old"), "to/old");
    EXPECT_FALSE(tree.Has("to/new"));
  }));
  ASSERT_TRUE(SetMode(source, 0600));
  ORB_IN_CHILD(RunAsUser(kStranger, [&] {
    EXPECT_EQ(Append(source, tree.Path(), "new"), kOrbErrAccessDenied);
    EXPECT_FALSE(tree.Has("new"));
  }));
}

TEST(MakeFilePath, JoinsUnderTheLimits) {
  const std::string n255(255, 'n');
  const std::string f1021(1021, 'f');
  std::string wide = "/";  // Too long as bytes only.
  for (int i = 0; i < 350; ++i) wide += "\xe3\x81\x82";
  const std::tuple<std::string, std::string, OrbResult, OrbResult> kCases[] = {
      {"/a", "b", 0, 0},
      {"/a", n255 + "n", kOrbErrNameTooLong, kOrbErrNameTooLong},
      {f1021, "b", 0, 0},
      {f1021 + "f", "b", kOrbErrNameTooLong, kOrbErrPathTooLong},
      {wide, "b", 0, kOrbErrPathTooLong},
      {"/a", "\xff", kOrbErrInvalidName, kOrbErrInvalidName},
  };
  for (const auto& [folder, name, asText, asPath] : kCases) {
    SCOPED_TRACE(folder + " and " + name);
    COrbStringData text;
    COrbFilePath path;
    EXPECT_EQ(OrbMakeFilePath(S(folder), S(name), &text), asText);
    EXPECT_EQ(Text(text), asText == 0 ? folder + "/" + name : "");
    EXPECT_EQ(OrbMakeFilePath(PathOf(folder), S(name), &path), asPath);
    EXPECT_EQ(Text(path.GetFullPath()), asPath == 0 ? folder + "/" + name : "");
  }
  for (const char* folder : {"", "/", "/a/"}) {
    COrbStringData text;
    EXPECT_EQ(OrbMakeFilePath(S(folder), S("b"), &text), kOrbNoErr);
    EXPECT_EQ(Text(text), std::string(folder) + "b");
  }
  EXPECT_EQ(OrbMakeFilePath(S("/a"), S("b"), nullptr), kOrbErrNotFound);
}

}  // namespace
}  // namespace orb::test

// SPDX-License-Identifier: MIT
#include <orb/fileops/whole_file.h>

#include "support/files.h"

namespace orb::test {
namespace {

OrbResult Write(const std::string& path, const std::string& data) {
  return OrbWriteFile(PathOf(path), data.data(), static_cast<unsigned int>(data.size()));
}

TEST(ReadFile, FillsTheBufferAsFarAsTheFileGoes) {
  const Tree folder("file=0123456789, link -> file");
  std::string buffer(100, '-');
  EXPECT_EQ(OrbReadFile(PathOf(folder / "link"), buffer.data(), 100), kOrbNoErr);
  EXPECT_EQ(buffer, "0123456789" + std::string(90, '-'));
  // The count of a file that is said to be huge must not cost memory or time.
  EXPECT_EQ(OrbReadFile(PathOf(folder / "file"), buffer.data(), 0xffffffff), kOrbNoErr);
  EXPECT_EQ(OrbReadFile(PathOf(folder / "file"), buffer.data() + 50, 4), kOrbNoErr);
  EXPECT_EQ(buffer.substr(48, 8), "--0123--");
  EXPECT_EQ(OrbReadFile(PathOf(folder / "file"), nullptr, 0), kOrbNoErr);
}

TEST(WriteFile, WritesOverTheStartOnly) {
  const Tree folder("file=0123456789, link -> file");
  const std::string file = folder / "file";
  EXPECT_EQ(Write(file, "abcd"), kOrbNoErr);
  EXPECT_EQ(ReadAll(file), "abcd456789");
  EXPECT_EQ(OrbWriteFile(PathOf(file), nullptr, 0), kOrbNoErr);
  EXPECT_EQ(Write(folder / "link", "0123456789 and more"), kOrbNoErr);
  EXPECT_EQ(ReadAll(file), "0123456789 and more");
  EXPECT_TRUE(fs::is_symlink(folder / "link"));
}

TEST(WholeFile, SaysWhatCannotBeOpened) {
  const Tree tree("locked=photo!, pipe| 0666, folder/");
  const std::tuple<const char*, OrbResult, OrbResult> kCases[] = {
      {"", kOrbErrNotFound, kOrbErrNotFound},
      {"\xff", kOrbErrNotFound, kOrbErrNotFound},
      {"folder", kOrbErrUnknown, kOrbErrUnknown},
      {"pipe", kOrbErrAccessDenied, kOrbErrAccessDenied},
      {"locked", kOrbNoErr, kOrbErrAccessDenied},
  };
  const Unchanged unchanged(tree.Path());
  for (const auto& [path, reading, writing] : kCases) {
    char letter = '-';
    EXPECT_EQ(OrbReadFile(PathOf(tree.At(path)), &letter, 1), reading) << path;
    EXPECT_EQ(letter, reading == kOrbNoErr ? 'p' : '-') << path;
    EXPECT_EQ(Write(tree.At(path), "x"), writing) << path;
  }
}

TEST(WriteFile, ThatCannotGrowLeavesTheFileAsItWas) {
  const TempFolder folder;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(folder / "small", "size=64k"));
    const std::string photo(10'000, 'p');
    const std::string file = folder.Write("small/photo", photo);
    EXPECT_EQ(Write(file, std::string(100'000, 'x')), kOrbErrUnknown);
    EXPECT_EQ(ReadAll(file), photo);
    EXPECT_EQ(Write(file, "x"), kOrbNoErr);
  }));
}

}  // namespace
}  // namespace orb::test

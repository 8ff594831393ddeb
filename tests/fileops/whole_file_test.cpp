// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileops/whole_file.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"

namespace {

namespace fs = std::filesystem;
using orb::test::ReadAll;
using orb::test::TempFolder;

OrbResult Write(const std::string& path, const std::string& data) {
  return OrbWriteFile(PathOf(path), data.data(), static_cast<unsigned int>(data.size()));
}

TEST(ReadFile, FillsTheBufferAsFarAsTheFileGoes) {
  const TempFolder folder;
  folder.Write("file", "0123456789");
  fs::create_symlink("file", folder / "link");
  for (const char* name : {"file", "link"}) {
    std::string buffer(100, '-');
    EXPECT_EQ(OrbReadFile(PathOf(folder / name), buffer.data(), 100), kOrbNoErr);
    EXPECT_EQ(buffer, "0123456789" + std::string(90, '-'));
    // The count of a file that is said to be huge must not cost memory or time.
    EXPECT_EQ(OrbReadFile(PathOf(folder / name), buffer.data(), 0xffffffff), kOrbNoErr);
    EXPECT_EQ(OrbReadFile(PathOf(folder / name), buffer.data() + 50, 4), kOrbNoErr);
    EXPECT_EQ(buffer.substr(48, 8), "--0123--");
  }
  EXPECT_EQ(OrbReadFile(PathOf(folder / "file"), nullptr, 0), kOrbNoErr);
}

TEST(WriteFile, WritesOverTheStartOnly) {
  const TempFolder folder;
  const std::string file = folder.Write("file", "0123456789");
  fs::create_symlink("file", folder / "link");
  EXPECT_EQ(Write(file, "abcd"), kOrbNoErr);
  EXPECT_EQ(ReadAll(file), "abcd456789");
  EXPECT_EQ(OrbWriteFile(PathOf(file), nullptr, 0), kOrbNoErr);
  EXPECT_EQ(ReadAll(file), "abcd456789");
  EXPECT_EQ(Write(folder / "link", "0123456789 and more"), kOrbNoErr);
  EXPECT_EQ(ReadAll(file), "0123456789 and more");
  EXPECT_TRUE(fs::is_symlink(folder / "link"));
}

TEST(WholeFile, SaysWhatCannotBeOpened) {
  const TempFolder folder;
  folder.Write("locked", "photo");
  ASSERT_TRUE(Lock(folder / "locked"));
  fs::create_symlink("locked", folder / "link");
  ASSERT_EQ(::mkfifo((folder / "pipe").c_str(), 0666), 0);
  const struct {
    std::string path;
    OrbResult reading;
    OrbResult writing;
  } kCases[] = {
      {"", kOrbErrNotFound, kOrbErrNotFound},
      {folder / "missing", kOrbErrNotFound, kOrbErrNotFound},
      {folder / "\xff", kOrbErrNotFound, kOrbErrNotFound},
      {folder.Path(), kOrbErrUnknown, kOrbErrUnknown},
      {folder / "pipe", kOrbErrAccessDenied, kOrbErrAccessDenied},
      {folder / "locked", kOrbNoErr, kOrbErrAccessDenied},
      {folder / "link", kOrbNoErr, kOrbErrAccessDenied},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    char letter = '-';
    EXPECT_EQ(OrbReadFile(PathOf(c.path), &letter, 1), c.reading);
    EXPECT_EQ(letter, c.reading == kOrbNoErr ? 'p' : '-');
    EXPECT_EQ(Write(c.path, "x"), c.writing);
  }
  EXPECT_EQ(ReadAll(folder / "locked"), "photo");
  EXPECT_FALSE(fs::exists(folder / "missing"));
}

TEST(WriteFile, ThatCannotGrowLeavesTheFileAsItWas) {
  const TempFolder folder;
  ORB_IN_CHILD(orb::test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MountTmpfs(folder / "small", "size=64k"));
    const std::string photo(10'000, 'p');
    const std::string file = folder.Write("small/photo", photo);
    EXPECT_EQ(Write(file, std::string(100'000, 'x')), kOrbErrUnknown);
    EXPECT_EQ(ReadAll(file), photo);
    EXPECT_EQ(Write(file, "x"), kOrbNoErr);
  }));
}

}  // namespace

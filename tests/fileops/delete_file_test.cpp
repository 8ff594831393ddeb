// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileops/remove.h>

#include <chrono>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"

namespace {

namespace fs = std::filesystem;
using orb::test::RunAsUser;
using orb::test::RunWithPrivateMounts;
using orb::test::TempFolder;
using Clock = std::chrono::steady_clock;

TEST(DeleteFile, RemovesWhatIsWritableAndNotLocked) {
  const TempFolder folder;
  folder.Write("locked", "");
  ASSERT_TRUE(Lock(folder / "locked"));
  folder.Write("read-only", "");
  fs::permissions(folder / "read-only", fs::perms(0444));
  folder.Write("file", "");
  fs::create_directories(folder / "tree/sub");
  const struct {
    std::string path;
    OrbResult expected;
  } kCases[] = {
      {"", kOrbErrNoSuchFile},
      {folder / "missing", kOrbErrAccessDenied},
      {folder / "\xff", kOrbErrAccessDenied},
      {folder / "locked", kOrbErrAccessDenied},
      {folder / "read-only", kOrbErrAccessDenied},
      {folder / "file", kOrbNoErr},
      {folder / "tree", kOrbNoErr},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(OrbDeleteFile(PathOf(c.path)), c.expected);
  }
  EXPECT_EQ(std::distance(fs::directory_iterator(folder.Path()), {}), 2);
}

TEST(DeleteFile, SaysWhenTheFolderForbidsIt) {
  const TempFolder folder;
  folder.Write("file", "");
  fs::permissions(folder / "file", fs::perms(0666));
  fs::permissions(folder.Path(), fs::perms(0755));
  ORB_IN_CHILD(RunAsUser(
      65534, [&] { EXPECT_EQ(OrbDeleteFile(PathOf(folder / "file")), kOrbErrAccessDenied); }));
  EXPECT_TRUE(fs::exists(folder / "file"));
}

TEST(DeleteFile, WaitsForABusyFileButNotForever) {
  const TempFolder folder;
  const std::string busy = folder.Write("busy", "");
  folder.Write("other", "");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::BindMount(folder / "other", busy));
    const auto start = Clock::now();
    EXPECT_EQ(OrbDeleteFile(PathOf(busy)), kOrbErrUnknown);
    EXPECT_GE(Clock::now() - start, std::chrono::seconds(4));
    std::thread freer([&] {
      std::this_thread::sleep_for(std::chrono::milliseconds(60));
      ::umount2(busy.c_str(), MNT_DETACH);
    });
    EXPECT_EQ(OrbDeleteFile(PathOf(busy)), kOrbNoErr);
    freer.join();
  }));
  EXPECT_FALSE(fs::exists(busy));
}

TEST(DeleteFile, EndsAListAtTheFirstFailure) {
  const TempFolder folder;
  const auto paths = [&](const char* first, const char* second, const char* third) {
    return std::vector{PathOf(folder / first), PathOf(folder / second), PathOf(folder / third)};
  };
  for (const char* name : {"a", "locked", "b"}) folder.Write(name, "");
  for (const char* name : {"x/sub", "busy/sub", "y/sub"}) fs::create_directories(folder / name);
  ASSERT_TRUE(Lock(folder / "locked"));
  EXPECT_EQ(OrbDeleteFile({}, true), kOrbNoErr);
  EXPECT_EQ(OrbDeleteFolder({}, false), kOrbNoErr);
  EXPECT_EQ(OrbDeleteFile(paths("a", "locked", "b"), true), kOrbErrAccessDenied);
  EXPECT_EQ(OrbDeleteFile({PathOf(folder / "b")}, false), kOrbNoErr);
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::BindMount(folder / "busy/sub", folder / "busy"));
    EXPECT_EQ(OrbDeleteFolder(paths("x", "busy", "y"), true), kOrbErrAccessDenied);
  }));
  EXPECT_FALSE(fs::exists(folder / "a") || fs::exists(folder / "b") || fs::exists(folder / "x"));
  EXPECT_TRUE(fs::exists(folder / "locked") && fs::exists(folder / "y/sub"));
}

TEST(DeleteFolder, AsksNothingAndSaysWhatThePlatformSaid) {
  const TempFolder folder;
  fs::create_directories(folder / "tree/sub");
  folder.Write("read-only", "");
  fs::permissions(folder / "read-only", fs::perms(0444));
  folder.Write("locked", "");
  ASSERT_TRUE(Lock(folder / "locked"));
  const struct {
    std::string path;
    OrbResult expected;
  } kCases[] = {
      {"", kOrbErrNotFound},
      {folder / "missing", kOrbErrNotFound},
      {folder / "\xff", kOrbErrNotFound},
      {folder / "locked", kOrbErrAccessDenied},
      {folder / "tree/.", kOrbErrAccessDenied},
      {folder / std::string(256, 'n'), kOrbErrUnknown},
      {folder / "tree", kOrbNoErr},
      {folder / "read-only", kOrbNoErr},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(OrbDeleteFolder(PathOf(c.path)), c.expected);
  }
}

}  // namespace

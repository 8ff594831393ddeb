// SPDX-License-Identifier: MIT
#include <orb/fileops/remove.h>

#include <chrono>
#include <thread>
#include <vector>

#include "support/files.h"

namespace orb::test {
namespace {

using Clock = std::chrono::steady_clock;

TEST(DeleteFile, RemovesWhatIsWritableAndNotLocked) {
  const Tree tree("locked!, read-only 0444, file, tree/sub/");
  const std::pair<const char*, OrbResult> kCases[] = {
      {"", kOrbErrNoSuchFile},
      {"missing", kOrbErrAccessDenied},
      {"locked", kOrbErrAccessDenied},
      {"read-only", kOrbErrAccessDenied},
      {"file", kOrbNoErr},
      {"tree", kOrbNoErr},
  };
  for (const auto& [path, expected] : kCases)
    EXPECT_EQ(OrbDeleteFile(PathOf(tree.At(path))), expected) << path;
  EXPECT_EQ(NamesIn(tree.Path()).size(), 2u);
}

TEST(DeleteFile, SaysWhenTheFolderForbidsIt) {
  const Tree tree("in/file 0666, in/ 0755");
  ORB_IN_CHILD(RunAsUser(kStranger, [&] {
    EXPECT_EQ(OrbDeleteFile(PathOf(tree / "in/file")), kOrbErrAccessDenied);
    EXPECT_TRUE(tree.Has("in/file"));
  }));
}

TEST(DeleteFile, WaitsForABusyFileButNotForever) {
  const Tree tree("busy, other");
  const COrbFilePath busy = PathOf(tree / "busy");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(BindMount(tree / "other", tree / "busy"));
    const auto start = Clock::now();
    EXPECT_EQ(OrbDeleteFile(busy), kOrbErrUnknown);
    EXPECT_GE(Clock::now() - start, std::chrono::seconds(4));
    std::thread freer([&] {
      std::this_thread::sleep_for(std::chrono::milliseconds(60));
      ::umount2((tree / "busy").c_str(), MNT_DETACH);
    });
    EXPECT_EQ(OrbDeleteFile(busy), kOrbNoErr);
    freer.join();
  }));
  EXPECT_FALSE(tree.Has("busy"));
}

TEST(DeleteFile, EndsAListAtTheFirstFailure) {
  const Tree tree("a, locked!, b, x/sub/, busy/sub/, y/sub/");
  const auto paths = [&](const char* first, const char* second, const char* third) {
    return std::vector{PathOf(tree / first), PathOf(tree / second), PathOf(tree / third)};
  };
  EXPECT_EQ(OrbDeleteFile(paths("a", "locked", "b"), true), kOrbErrAccessDenied);
  EXPECT_EQ(OrbDeleteFile({PathOf(tree / "b")}, false), kOrbNoErr);
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(BindMount(tree / "busy/sub", tree / "busy"));
    EXPECT_EQ(OrbDeleteFolder(paths("x", "busy", "y"), true), kOrbErrAccessDenied);
  }));
  EXPECT_EQ(NamesIn(tree.Path()), (std::set<std::string>{"busy", "locked", "y"}));
}

TEST(DeleteFolder, AsksNothingAndSaysWhatThePlatformSaid) {
  const Tree tree("tree/sub/, read-only 0444, locked!");
  const std::pair<std::string, OrbResult> kCases[] = {
      {"", kOrbErrNotFound},
      {"locked", kOrbErrAccessDenied},
      {"tree/.", kOrbErrAccessDenied},
      {std::string(256, 'n'), kOrbErrUnknown},
      {"tree", kOrbNoErr},
      {"read-only", kOrbNoErr},
  };
  for (const auto& [path, expected] : kCases)
    EXPECT_EQ(OrbDeleteFolder(PathOf(tree.At(path))), expected) << path;
}

}  // namespace
}  // namespace orb::test

// SPDX-License-Identifier: MIT
#include <orb/fileops/temp_files.h>

#include <thread>

#include "support/files.h"

namespace orb::test {
namespace {

/// The path that was made, or the code in its place.
std::string Create(const COrbFilePath* folder, const std::string& suffix) {
  COrbFilePath result = PathOf("before");
  const OrbResult code = OrbCreateTempFile(folder, &result, S(suffix));
  const std::string path = Text(result.GetFullPath());
  if (code == kOrbNoErr) return path;
  EXPECT_EQ(path, "before");
  return std::to_string(code);
}

std::string CreateIn(const std::string& folder, const std::string& suffix = "") {
  const COrbFilePath path = PathOf(folder);
  return Create(&path, suffix);
}

std::string Project() {
  COrbFilePath folder = PathOf("before");
  const OrbResult code = OrbGetProjectTempFolder(&folder);
  return code == kOrbNoErr ? Text(folder.GetFullPath()) : std::to_string(code);
}

// Runs in a new process, not in a copy of this one.
TEST(CreateTempFileDeathTest, CountsFromZeroInEveryProcess) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  const auto numbers = [] {
    const TempFolder folder;
    return CreateIn(folder.Path()) == folder / "OrbTmp0000" &&
           CreateIn(folder.Path(), "%d_x.tif") == folder / "OrbTmp0001%d_x.tif";
  };
  EXPECT_EXIT(std::_Exit(numbers() ? 0 : 1), testing::ExitedWithCode(0), "");
}

TEST(CreateTempFile, TriesEveryNumberOnceAndEmptiesNobodysFile) {
  const Tree tree;
  for (int i = 0; i < 10'000; ++i) {
    const std::string name = "OrbTmp" + std::to_string(10'000 + i).substr(1);
    // A link is a name that is taken, although it leads nowhere.
    if (i != 4321) tree.Make(name + (i % 2 == 0 ? "=photo" : " -> nowhere"));
  }
  EXPECT_EQ(CreateIn(tree.Path()), tree / "OrbTmp4321");
  EXPECT_EQ(CreateIn(tree.Path()), std::to_string(kOrbErrDiskFull));
  EXPECT_EQ(tree.Read("OrbTmp0000"), "photo");
  EXPECT_FALSE(tree.Has("nowhere"));
}

TEST(CreateTempFile, SaysWhyItCannot) {
  const Tree tree("locked/!");
  const Row<OrbResult> kCases[] = {
      {"", "", kOrbErrEmptyPath},
      {"missing", "", kOrbErrAccessDenied},
      {"locked", "", kOrbErrAccessDenied},
      {tree.Path(), "/../../outside", kOrbErrAccessDenied},
      {tree.Path(), std::string(250, 'n'), kOrbErrInvalidName},
  };
  for (const auto& [folder, suffix, expected] : kCases)
    EXPECT_EQ(CreateIn(tree.At(folder), suffix), std::to_string(expected)) << folder << suffix;
}

// Threads of several processes, all with the same numbers, in one folder.
TEST(CreateTempFile, GivesNoTwoCallersTheSameFile) {
  constexpr int kFiles = 100;
  const TempFolder folder;
  const auto make = [&] {
    for (int i = 0; i < kFiles; ++i) std::ofstream(CreateIn(folder.Path()), std::ios::app) << "x";
  };
  const pid_t child = ::fork();
  std::thread other(make);
  make();
  other.join();
  if (child == 0) ::_exit(HasFailure() ? 1 : 0);
  int status = -1;
  EXPECT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(NamesIn(folder.Path()).size(), 4u * kFiles);
  for (const std::string& name : NamesIn(folder.Path()))
    EXPECT_EQ(ReadAll(folder / name), "x") << name;
}

/// $TMPDIR in a child process, where the project name may be changed as well.
template <typename Body>
void WithTempDirectory(const std::string& directory, Body body) {
  EXPECT_EQ(RunInChild([&] { return ::setenv("TMPDIR", directory.c_str(), 1) == 0; }, body),
            ChildOutcome::kPassed);
}

TEST(ProjectTempFolder, IsMadeLevelByLevelWithItsOwnMode) {
  const TempFolder folder;
  WithTempDirectory(folder.Path() + "/", [&] {
    ::umask(077);
    EXPECT_EQ(Project(), folder / "Calyx/RTL");
    EXPECT_EQ(OrbSetProjectName(S("P \xc3\xbc%d")), kOrbNoErr);
    EXPECT_EQ(Project(), folder / "Calyx/P \xc3\xbc%d/RTL");
    const std::string file = Create(nullptr, ".jpg");
    EXPECT_EQ(fs::path(file).parent_path(), Project());
    for (const char* level : {"Calyx", "Calyx/RTL", "Calyx/P \xc3\xbc%d/RTL"})
      EXPECT_EQ(ModeOf(folder / level), 0755u) << level;
    fs::create_directories(Project() + "/x/y");
    OrbClearProjectTempFolder();
    EXPECT_FALSE(fs::exists(folder / "Calyx/P \xc3\xbc%d/RTL"));
    EXPECT_TRUE(fs::exists(folder / "Calyx/RTL"));
  });
}

TEST(ProjectTempFolder, RefusesNamesThatLeadElsewhere) {
  const Tree tree("temp/Calyx/RTL/, temp/RTL/photos/, RTL/photos/");
  const Unchanged unchanged(tree.Path());
  WithTempDirectory(tree / "temp", [&] {
    const std::string overlong(256, 'n');
    for (const char* name : {"..", "a/../..", "\xff", overlong.c_str()}) {
      SCOPED_TRACE(name);
      EXPECT_EQ(OrbSetProjectName(S(name)), kOrbNoErr);
      EXPECT_EQ(Project(), std::to_string(kOrbErrInvalidName));
      EXPECT_EQ(Create(nullptr, ""), std::to_string(kOrbErrAccessDenied));
      OrbClearProjectTempFolder();
    }
  });
}

TEST(ProjectTempFolder, TrustsNoLevelThatOthersControl) {
  const char* const kCases[] = {
      "mv Calyx/P/RTL ../own && ln -s ../../../own Calyx/P/RTL",
      "chmod 0777 Calyx",
      "chown 65534:65534 Calyx/P/RTL",
  };
  if (::geteuid() != 0) GTEST_SKIP() << "only root can give a folder away";
  for (const char* const spoil : kCases) {
    SCOPED_TRACE(spoil);
    const Tree tree("temp/Calyx/P/RTL/photos/");
    ASSERT_EQ(std::system(("cd '" + (tree / "temp") + "' && " + spoil).c_str()), 0);
    const Unchanged unchanged(tree.Path());
    WithTempDirectory(tree / "temp", [&] {
      OrbSetProjectName(S("P"));
      EXPECT_EQ(Project(), tree / "temp/Calyx/P/RTL");
      EXPECT_EQ(Create(nullptr, ""), std::to_string(kOrbErrAccessDenied));
      OrbClearProjectTempFolder();
    });
    EXPECT_EQ(NamesIn(tree / "temp/Calyx/P/RTL"), std::set<std::string>{"photos"});
  }
}

}  // namespace
}  // namespace orb::test

// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileops/temp_files.h>
#include <sys/stat.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>

#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"

namespace {

namespace fs = std::filesystem;
using orb::test::ChildOutcome;
using orb::test::ReadAll;
using orb::test::RunInChild;
using orb::test::TempFolder;

mode_t ModeOf(const std::string& path) {
  struct stat status {};
  ::lstat(path.c_str(), &status);
  return status.st_mode & 07777;
}

/// The path that was made, or the code in its place.
std::string Create(const COrbFilePath* folder, const std::string& suffix) {
  COrbFilePath result = PathOf("before");
  const OrbResult code = OrbCreateTempFile(folder, &result, S(suffix));
  const std::string path = Text(result.GetFullPath());
  if (code == kOrbNoErr) return path;
  EXPECT_EQ(path, "before");
  return std::to_string(code);
}

std::string CreateIn(const std::string& folder, const std::string& suffix) {
  const COrbFilePath path = PathOf(folder);
  return Create(&path, suffix);
}

std::string Project() {
  COrbFilePath folder = PathOf("before");
  const OrbResult code = OrbGetProjectTempFolder(&folder);
  return code == kOrbNoErr ? Text(folder.GetFullPath()) : std::to_string(code);
}

bool NumbersFromTheStart() {
  const TempFolder folder;
  for (const char* name : {"OrbTmp0000", "OrbTmp0001", "OrbTmp0002%d_x.tif"}) {
    const std::string suffix = std::string(name).substr(10);
    if (CreateIn(folder.Path(), suffix) != folder / name) return false;
  }
  return true;
}

// Runs in a new process, not in a copy of this one.
TEST(CreateTempFileDeathTest, CountsFromZeroInEveryProcess) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(std::_Exit(NumbersFromTheStart() ? 0 : 1), testing::ExitedWithCode(0), "");
}

TEST(CreateTempFile, TriesEveryNumberOnceAndEmptiesNobodysFile) {
  const TempFolder folder;
  for (int i = 0; i < 10'000; ++i) {
    const std::string name = "OrbTmp" + std::to_string(10'000 + i).substr(1);
    if (i == 4321) continue;
    // A link is a name that is taken, although it leads nowhere.
    i % 2 == 0 ? (void)folder.Write(name, "photo") : fs::create_symlink("nowhere", folder / name);
  }
  EXPECT_EQ(CreateIn(folder.Path(), ""), folder / "OrbTmp4321");
  EXPECT_EQ(CreateIn(folder.Path(), ""), std::to_string(kOrbErrDiskFull));
  EXPECT_EQ(ReadAll(folder / "OrbTmp0000"), "photo");
  EXPECT_FALSE(fs::exists(folder / "nowhere"));
}

TEST(CreateTempFile, SaysWhyItCannot) {
  const TempFolder folder;
  fs::create_directory(folder / "locked");
  ASSERT_TRUE(Lock(folder / "locked"));
  const struct {
    std::string folder;
    std::string suffix;
    OrbResult expected;
  } kCases[] = {
      {"", "", kOrbErrEmptyPath},
      {folder / "missing", "", kOrbErrAccessDenied},
      {folder / "locked", "", kOrbErrAccessDenied},
      {folder.Path(), "/../../outside", kOrbErrAccessDenied},
      {folder.Path(), "\xff", kOrbErrInvalidName},
      {folder.Path(), std::string(250, 'n'), kOrbErrInvalidName},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.folder + " " + c.suffix);
    EXPECT_EQ(CreateIn(c.folder, c.suffix), std::to_string(c.expected));
  }
}

// Threads of several processes, all with the same numbers, in one folder.
TEST(CreateTempFile, GivesNoTwoCallersTheSameFile) {
  constexpr int kFiles = 100;
  const TempFolder folder;
  const auto make = [&](const std::string& mine) {
    for (int i = 0; i < kFiles; ++i) {
      const std::string path = CreateIn(folder.Path(), "");
      EXPECT_EQ(ReadAll(path), "");
      std::ofstream(path, std::ios::app) << mine;
    }
  };
  const pid_t child = ::fork();
  const std::string mine = child == 0 ? "a" : "b";
  std::thread other(make, mine + "1");
  make(mine + "2");
  other.join();
  if (child == 0) ::_exit(HasFailure() ? 1 : 0);
  int status = -1;
  EXPECT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  int count = 0;
  for (const auto& file : fs::directory_iterator(folder.Path())) {
    EXPECT_EQ(ReadAll(file.path()).size(), 2u) << file.path();
    ++count;
  }
  EXPECT_EQ(count, 4 * kFiles);
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
  const TempFolder folder;
  fs::create_directories(folder / "temp/Calyx/RTL");
  fs::create_directories(folder / "temp/RTL/photos");
  fs::create_directories(folder / "RTL/photos");
  WithTempDirectory(folder / "temp", [&] {
    const std::string overlong(256, 'n');
    for (const char* name : {"..", "a/../..", "\xff", overlong.c_str()}) {
      SCOPED_TRACE(name);
      EXPECT_EQ(OrbSetProjectName(S(name)), kOrbNoErr);
      EXPECT_EQ(Project(), std::to_string(kOrbErrInvalidName));
      EXPECT_EQ(Create(nullptr, ""), std::to_string(kOrbErrAccessDenied));
      OrbClearProjectTempFolder();
    }
  });
  EXPECT_TRUE(fs::exists(folder / "RTL/photos") && fs::exists(folder / "temp/RTL/photos"));
  EXPECT_TRUE(fs::is_empty(folder / "temp/Calyx/RTL"));
}

TEST(ProjectTempFolder, TrustsNoLevelThatOthersControl) {
  const struct {
    const char* level;
    void (*spoil)(const std::string& level, const std::string& elsewhere);
  } kCases[] = {
      {"Calyx", [](auto& level, auto& elsewhere) { fs::rename(level, elsewhere + "/own"); }},
      {"Calyx/P/RTL", [](auto& level, auto& elsewhere) { fs::rename(level, elsewhere + "/own"); }},
      {"Calyx", [](auto& level, auto&) { fs::permissions(level, fs::perms(0777)); }},
      {"Calyx/P/RTL", [](auto& level, auto&) { fs::permissions(level, fs::perms(0775)); }},
      {"Calyx/P/RTL", [](auto& level, auto&) { (void)!::chown(level.c_str(), 65534, 65534); }},
  };
  if (::geteuid() != 0) GTEST_SKIP() << "only root can give a folder away";
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.level);
    const TempFolder folder;
    fs::create_directories(folder / "elsewhere");
    fs::create_directories(folder / "temp/Calyx/P/RTL/photos");
    c.spoil(folder / "temp/" + c.level, folder / "elsewhere");
    const bool moved = fs::exists(folder / "elsewhere/own");
    if (moved) fs::create_directory_symlink(folder / "elsewhere/own", folder / "temp/" + c.level);
    WithTempDirectory(folder / "temp", [&] {
      OrbSetProjectName(S("P"));
      EXPECT_EQ(Project(), folder / "temp/Calyx/P/RTL");
      EXPECT_EQ(Create(nullptr, ""), std::to_string(kOrbErrAccessDenied));
      OrbClearProjectTempFolder();
    });
    EXPECT_TRUE(fs::exists(folder / "temp/Calyx/P/RTL/photos"));
    EXPECT_EQ(std::distance(fs::directory_iterator(folder / "temp/Calyx/P/RTL"), {}), 1);
  }
}

}  // namespace

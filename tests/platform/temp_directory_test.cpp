// SPDX-License-Identifier: MIT
#include "platform/temp_directory.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <string>

#include "support/faults.h"
#include "support/temp_folder.h"

namespace {

namespace fs = std::filesystem;
using orb::platform::TemporaryDirectory;
using orb::test::ChildOutcome;
using orb::test::RunInChild;
using orb::test::TempFolder;

/// The directory with this $TMPDIR, or "refused".
std::string Find(const char* chosen, const std::string& shared) {
  chosen == nullptr ? ::unsetenv("TMPDIR") : ::setenv("TMPDIR", chosen, 1);
  const auto found = TemporaryDirectory(shared);
  return found ? found.Value() : "refused";
}

TEST(TemporaryDirectory, IsTheChosenOneOrTheUsersOwn) {
  const TempFolder folder;
  const std::string own = folder / "shared/orb-" + std::to_string(::geteuid());
  fs::create_directory(folder / "shared");
  folder.Write("file", "");
  fs::create_directory(folder / "\xff");
  const auto child = [&] {
    ::umask(0);
    EXPECT_EQ(Find(folder.Path().c_str(), folder / "shared"), folder.Path());
    EXPECT_FALSE(fs::exists(own));
    for (const std::string& useless :
         {std::string(), std::string("."), folder / "file", folder / "missing", folder / "\xff"})
      EXPECT_EQ(Find(useless.c_str(), folder / "shared"), own) << useless;
    EXPECT_EQ(Find(nullptr, folder / "shared"), own);
    EXPECT_EQ(fs::status(own).permissions(), fs::perms(0700));
    EXPECT_EQ(Find(nullptr, folder / "missing"), "refused");
  };
  EXPECT_EQ(RunInChild([] { return true; }, child), ChildOutcome::kPassed);
}

TEST(TemporaryDirectory, IsNotTakenFromOthers) {
  const TempFolder folder;
  const std::string own = folder / "orb-" + std::to_string(::geteuid());
  const auto find = [&] {
    return RunInChild([] { return true; },
                      [&] { EXPECT_EQ(Find(nullptr, folder.Path()), "refused"); });
  };
  fs::create_directory(folder / "elsewhere");
  fs::create_directory_symlink("elsewhere", own);
  EXPECT_EQ(find(), ChildOutcome::kPassed);
  fs::remove(own);
  fs::create_directory(own);
  if (::chown(own.c_str(), 65534, 65534) != 0) GTEST_SKIP() << "only root can give a folder away";
  EXPECT_EQ(find(), ChildOutcome::kPassed);
}

}  // namespace

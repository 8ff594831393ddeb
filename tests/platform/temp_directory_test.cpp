// SPDX-License-Identifier: MIT
#include "platform/temp_directory.h"

#include "support/environment.h"
#include "support/files.h"

namespace orb::platform {
namespace {

using namespace test;

const std::string kOwn = "orb-" + std::to_string(::geteuid());

/// The directory with this $TMPDIR, or "refused".
std::string Find(const std::optional<std::string>& chosen, const std::string& shared) {
  const ScopedVariable scoped("TMPDIR", chosen);
  const auto found = TemporaryDirectory(shared);
  return found ? found.Value() : "refused";
}

TEST(TemporaryDirectory, IsTheChosenOneOrTheUsersOwn) {
  const Tree tree("shared/, file, \xff/");
  const std::string own = tree / "shared/" + kOwn;
  const mode_t mask = ::umask(0);
  EXPECT_EQ(Find(tree.Path(), tree / "shared"), tree.Path());
  EXPECT_FALSE(fs::exists(own));
  for (const std::string& useless :
       {std::string(), std::string("."), tree / "file", tree / "missing", tree / "\xff"})
    EXPECT_EQ(Find(useless, tree / "shared"), own) << useless;
  EXPECT_EQ(Find({}, tree / "shared"), own);
  EXPECT_EQ(ModeOf(own), 0700u);
  EXPECT_EQ(Find({}, tree / "missing"), "refused");
  ::umask(mask);
}

TEST(TemporaryDirectory, IsNotTakenFromOthers) {
  const Tree linked("elsewhere/, " + kOwn + " -> elsewhere");
  EXPECT_EQ(Find({}, linked.Path()), "refused");
  const Tree given(kOwn + "/ 0700");
  if (::chown((given / kOwn).c_str(), kStranger, kStranger) != 0)
    GTEST_SKIP() << "only root can give a folder away";
  EXPECT_EQ(Find({}, given.Path()), "refused");
}

}  // namespace
}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/result.h>

#include <string>
#include <vector>

namespace orb {

/// Where a project keeps its scratch files.
struct ProjectFolder {
  /// The system's temporary directory.
  std::string base;
  /// The folders below it, one in the other.
  std::vector<std::string> levels;

  std::string Path() const;
};

/// kOrbErrInvalidName for a name that leads elsewhere or can be no folder's; kOrbErrAccessDenied
/// without a temporary directory. `folder` is then untouched.
OrbResult LocateProjectFolder(const std::string& projectName, ProjectFolder* folder);

}  // namespace orb

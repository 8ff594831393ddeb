// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

#include "platform/error.h"

namespace orb::platform {

/// What is known of an item with all it holds.
struct TreeSurvey {
  /// The space it takes up on its volume.
  std::uint64_t bytes = 0;
  /// False when something inside is locked, on a volume of its own or in a folder that the caller
  /// may not write to: not all of it could be removed.
  bool canBeRemoved = true;
  /// False when the caller may not read some file, or something is no file, link or folder.
  bool canBeCopied = true;
  /// Of all names, sizes and times of change: another sum tells that something was written, added
  /// or taken away in between.
  std::uint64_t state = 0;
};

enum class SurveyFor { kSize, kCopy, kRemoval };

/// Looks at the item at `name` in an open folder and, without following links, at all below it.
/// kSize asks for no permissions, kCopy whether it can be copied, kRemoval for both. A folder that
/// cannot be read is a failure.
Result<TreeSurvey> SurveyTree(int folder, const std::string& name, SurveyFor purpose);

}  // namespace orb::platform

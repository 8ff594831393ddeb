// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/error.h"

namespace orb::platform {

/// Removes a file, a link or a folder with all it holds. Links are never followed, also when a
/// folder is swapped for one meanwhile, and volumes mounted inside the folder are not entered: what
/// is on them stays. kNotPermitted for a locked item, for a locked folder inside or above, and for
/// a path that ends in "." or ".."; kBusy for a mount point and the like. The first failure ends
/// it; what was removed before is gone.
Status RemoveItem(const std::string& path);

/// kNotPermitted for a folder with something inside that RemoveItem() would stop at with a part of
/// the folder gone: a locked item, a volume of its own, a folder that the caller may not write to
/// or cannot look into. Only that is looked for.
Status ExpectRemovable(const std::string& path);

/// Removes one entry that is not a folder, under the same rules.
Status UnlinkItem(const std::string& path);

}  // namespace orb::platform

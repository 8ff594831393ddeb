// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/error.h"

namespace orb::platform {

/// Moves an item to a path of the same volume where nothing is, in one step: at every moment it is
/// at one of the two. Links are moved and not followed. A change of an item's own name in nothing
/// but letters' case works also where the volume takes both for one, in two steps there.
///
/// kItemExists when anything is at the destination, also a link that leads nowhere. kNotPermitted
/// for a locked item, in and into a locked folder, and for a source that ends in "." or "..".
/// POSIX's EXDEV where the destination is on another volume. Whenever it fails the item is where it
/// was.
Status MoveItem(const std::string& source, const std::string& destination);

}  // namespace orb::platform

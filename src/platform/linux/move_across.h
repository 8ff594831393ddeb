// SPDX-License-Identifier: MIT
#pragma once

#include "platform/linux/place.h"

namespace orb::platform {

/// A copy on another volume that is complete, on the device and in its place, so that the source
/// may go. What could not be removed afterwards is not copied, as far as that can be known, and
/// what changed meanwhile is no copy. On failure nothing is left of it, unless the source itself is
/// not there any more.
Status CopyAcross(const Place& from, const Place& to);

/// MoveItem() to another volume: CopyAcross(), and then the removal of the source.
Status MoveAcross(const Place& from, const Place& to);

}  // namespace orb::platform

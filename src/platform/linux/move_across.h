// SPDX-License-Identifier: MIT
#pragma once

#include "platform/linux/place.h"

namespace orb::platform {

/// MoveItem() to another volume: a copy that is complete, on the device and in its place, and then
/// the removal of the source.
Status MoveAcross(const Place& from, const Place& to);

}  // namespace orb::platform

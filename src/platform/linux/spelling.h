// SPDX-License-Identifier: MIT
#pragma once

#include "platform/linux/place.h"

namespace orb::platform {

/// Whether two places where something is found are one item of a case-blind volume under two
/// spellings. Some drivers show it as two items then: only the folder's list of names tells.
Result<bool> IsOneItemInTwoSpellings(const Place& a, const Place& b);

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/linux/place.h"

namespace orb::platform {

/// Finds an item that may be taken out of its folder. kNotPermitted where the folder is locked, and
/// for a path that ends in "." or "..".
Result<Place> LocateRemovable(const std::string& path);

/// RefuseLocked() of the entry itself.
Status RefuseLockedEntry(int folder, const char* name);

/// RemoveItem() of an entry of an open folder.
Status RemoveItemAt(int folder, const std::string& name);

}  // namespace orb::platform

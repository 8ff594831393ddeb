// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/error.h"

namespace orb::platform {

/// The item's path with every link and every ".." on the way resolved; a link at its end is the
/// item itself and stays.
Result<std::string> ResolvedPath(const std::string& path);

/// Whether the item at `candidate` is the one at `path` or a folder above it, as the file system
/// knows them, whatever the texts are. A second hard link is another item.
Result<bool> IsItemOrAbove(const std::string& candidate, const std::string& path);

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include <sys/stat.h>

#include <cstddef>
#include <span>

#include "platform/error.h"

namespace orb::platform {

/// Brings a file's bytes into a new, empty file: `size` of them as `source` was when it was opened,
/// or all there are when it showed none, as files of /proc do. Fewer bytes than were seen are an
/// error. Holes stay holes where the file system tells of them.
Status CopyFileData(int from, int to, const struct stat& source);

/// Reads until the block is full or the file ends. Gives how many bytes there were.
Result<std::size_t> ReadBlock(int from, std::span<std::byte> block);
/// Writes the whole block.
Status WriteBlock(int to, std::span<const std::byte> block);

}  // namespace orb::platform

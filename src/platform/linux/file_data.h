// SPDX-License-Identifier: MIT
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <span>

#include "platform/error.h"
#include "platform/linux/item_metadata.h"

namespace orb::platform {

/// Cloning what is no larger than this takes longer than reading and writing it, on most file
/// systems.
inline constexpr off_t kCloneAbove = off_t{64} << 10;

/// Brings a file's bytes into a new, empty file: as many as `source` said when it was opened, or
/// all there are when it showed none, as files of /proc do. Fewer bytes than were seen are an
/// error. Holes stay holes where the file system tells of them. What is larger than `cloneAbove`
/// shares its bytes with the source where the file system can do that.
Status CopyFileData(int from, int to, const StatusRecord& source, off_t cloneAbove = kCloneAbove);

/// Reads until the block is full or the file ends. Gives how many bytes there were.
Result<std::size_t> ReadBlock(int from, std::span<std::byte> block);
/// Writes the whole block.
Status WriteBlock(int to, std::span<const std::byte> block);

}  // namespace orb::platform

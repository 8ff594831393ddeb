// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/mount_table.h"

/// \file
/// Mounts by the numbers that the kernel never gives out again, without the table of all mounts.
/// Older kernels know neither question; then, and whenever the kernel does not tell at once, the
/// answer is nothing and the table has to be read.

namespace orb::platform {

/// The mount that the item itself is on, if the kernel has the whole way to it in memory. The file
/// system is not asked, so that a server that is gone does not hang the answer.
std::optional<std::uint64_t> MountNumberInMemory(const std::string& path);

/// What is mounted.
struct MountedVolume {
  DeviceNumber device;
  /// The file system's, as statfs() tells it.
  std::uint64_t magic = 0;
};

/// The volume of the mount with such a number. The texts take the kernel longer than all the rest.
std::optional<MountedVolume> ReadVolume(std::uint64_t number);

/// The mount with such a number, which is its id as well.
std::optional<Mount> ReadMount(std::uint64_t number);

}  // namespace orb::platform

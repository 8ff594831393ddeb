// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <cstdint>
#include <functional>
#include <set>
#include <string>

/// \file
/// What the library has no operation for: the device behind a folder.
namespace orbimport {

/// A volume's room, as this user has it. All zero when nobody knows.
struct Room {
  std::uint64_t volume = 0;  // Equal for two folders on one volume.
  std::uint64_t available = 0;
  std::uint64_t block = 0;  // What a file takes is a multiple of this.
  bool isExact = false;     // Whether files take what they hold: never compressed, never packed.
};

Room RoomAt(const std::string& folder);

/// On return all that was written to the volumes of these folders is on their devices, the names
/// included.
bool FlushVolumes(const std::set<std::string>& folders);

/// Whether a copy holds what its source does: kOrbNoErr, kImportErrCopyDiffers,
/// kImportErrCopyUnreadable, kOrbErrDiskFull when the device had no room after all, kOrbErrCanceled
/// when `goOn` said no, otherwise why the source cannot be read. The copy is flushed first, then
/// `goOn` is asked, and then, as after each piece, the copy is read past the memory that keeps what
/// was written, from the device itself; a volume that has none, such as one in memory, is read as
/// it is.
OrbResult CompareOnDevice(const std::string& source,
                          const std::string& copy,
                          const std::function<bool()>& goOn);

}  // namespace orbimport

// SPDX-License-Identifier: MIT
#pragma once

#include <sys/stat.h>

#include <string>

#include "platform/linux/posix.h"

namespace orb::platform {

/// An item by the folder that holds it and its name there. What is done through the folder's
/// descriptor cannot be led astray by somebody who swaps a folder on the path for a link.
struct Place {
  /// Opened with O_PATH; links on the way to it were followed, as every lookup does.
  UniqueFd folder;
  /// One component; "." for the root.
  std::string name;
  /// The path ended in "/": only a folder can be meant.
  bool folderMeant = false;

  /// "." and "..": they name a folder, but not by its entry.
  bool NamesNoEntry() const { return name == "." || name == ".."; }
};

/// Finds the folder; whether the item exists is not asked. kNoSuchItem for the empty path.
Result<Place> Locate(const std::string& path);

/// An entry of a folder that is open. The folder is held a second time.
Result<Place> EntryOf(int folder, std::string name);

/// The record of the item itself. kNoSuchItem where a folder was meant and something else is.
Result<struct stat> ReadStatus(const Place& place);

/// Opens what ought to be a file, but may have become a pipe or a device, without waiting for its
/// other end. A file that is leased to a file server is waited for, as every program does. Nothing,
/// and errno, when it fails.
UniqueFd OpenFile(int folder, const char* name, int flags);

/// Whether something is mounted on an entry. That itself is not asked: its server may be gone.
/// Kernels before 5.6 do not tell.
bool IsMountPoint(int folder, const char* name);

/// Which file or folder it is, for as long as somebody holds it open.
struct Identity {
  dev_t device = 0;
  ino_t inode = 0;

  bool operator==(const Identity&) const = default;
};

inline Identity IdentityOf(const struct stat& status) { return {status.st_dev, status.st_ino}; }
Result<Identity> IdentityOf(int item);

/// Opens the folder above one that is open, for reading, if it is still the expected one.
Result<UniqueFd> OpenAbove(int folder, const Identity& expected);

/// Whether an open folder is the one that is asked for or lies below it.
Result<bool> IsInOrBelow(int folder, const Identity& sought);

}  // namespace orb::platform

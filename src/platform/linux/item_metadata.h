// SPDX-License-Identifier: MIT
#pragma once

#include <sys/stat.h>
#include <sys/statfs.h>
#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <optional>

#include "platform/error.h"
#include "platform/items.h"

/// \file
/// What this library keeps beside an item's content, its lock and its creation time, and what the
/// file system records of it. Descriptors opened with O_PATH need /proc to be mounted.

namespace orb::platform {

/// Of the lock attribute only the presence counts.
inline constexpr char kLockAttribute[] = "user.orb.locked";
inline constexpr char kCreatedAttribute[] = "user.orb.created";

/// The item that the system calls are asked about: behind a descriptor, opened with O_PATH or for
/// real and without following links, or the directory entry at a path. Does not own what it names.
class ItemRef {
 public:
  ItemRef(int descriptor) : descriptor_(descriptor) {}
  explicit ItemRef(const char* path) : path_(path) {}

  /// These answer as the system calls do: -1 and errno.
  int Status(struct statx* status) const;
  /// A path must not be that of a link: the kernel would follow it.
  int Volume(struct statfs* volume) const;
  ssize_t ListAttributes(char* names, std::size_t size) const;
  ssize_t GetAttribute(const char* name, char* value, std::size_t size) const;

 private:
  int descriptor_ = -1;
  const char* path_ = nullptr;
};

using StatusRecord = struct statx;

Result<StatusRecord> ReadStatus(const ItemRef& item);
ItemKind KindOf(const StatusRecord& status);
/// The number of the mount or, where the kernel tells none, of the device.
std::uint64_t MountOf(const StatusRecord& status);
/// In a folder with the sticky bit the owner of the item or of the folder may take it away.
bool StickyBitForbids(const StatusRecord& folder, const StatusRecord& item);
Timestamp ModificationTime(const StatusRecord& status);
Timestamp LastAccessTime(const StatusRecord& status);

/// Which of the two attributes an item has.
struct OwnAttributes {
  bool lock = false;
  bool created = false;
  /// Whether the volume has attributes at all.
  bool supported = true;
};

Result<OwnAttributes> FindOwnAttributes(const ItemRef& item);

/// The immutable or the append-only flag.
bool HasLockFlag(const StatusRecord& status);
/// The read-only attribute of FAT and exFAT shows as a file without any write bit.
bool MayShowReadOnlyAttribute(const StatusRecord& status);
/// Whether the volume is one of those where it does. `own` tells whether it has other attributes.
bool HasReadOnlyAttribute(const struct statfs& volume,
                          const StatusRecord& status,
                          const OwnAttributes& own);

/// Whether the item is locked in any form: the attribute, the flags, the read-only attribute.
Result<bool> IsLocked(const ItemRef& item);
/// kNotPermitted for a locked item: before whatever a lock forbids.
Status RefuseLocked(const ItemRef& item);
/// kNotPermitted when the volume cannot carry the lock or the caller may not change it. The owner
/// needs no write permission. Unlocking clears every form or fails.
Status SetLocked(int item, bool locked);

/// The creation time that was stored, else the birth time that the file system keeps, else the
/// older of the times of modification and change.
Timestamp CreationTime(const ItemRef& item, const StatusRecord& status, const OwnAttributes& own);
Result<Timestamp> CreationTime(const ItemRef& item);
/// kNotPermitted when the volume cannot carry it. The owner needs no write permission.
Status StoreCreationTime(int item, Timestamp time);

}  // namespace orb::platform

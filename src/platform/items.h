// SPDX-License-Identifier: MIT
#pragma once

#include <compare>
#include <cstdint>
#include <span>
#include <string>

#include "platform/error.h"

/// \file
/// Questions about, and small changes to, the item at a path. The item is the directory entry
/// itself: a link is never followed, except by Exists(). Nothing here opens a file, so that a FIFO
/// or a dead medium does not hang a question. Paths are valid UTF-8: the caller refuses others.

namespace orb::platform {

/// A point in time in seconds since 1970-01-01 00:00:00 GMT, and nanoseconds after that.
struct Timestamp {
  std::int64_t seconds = 0;
  std::uint32_t nanoseconds = 0;

  // NOLINTNEXTLINE(modernize-use-nullptr): clang-tidy takes the comparison for one with a pointer.
  auto operator<=>(const Timestamp&) const = default;
};

enum class ItemKind { kFile, kFolder, kLink, kOther };

/// What is recorded with the item itself.
struct ItemRecord {
  ItemKind kind = ItemKind::kOther;
  /// Whichever form the lock has.
  bool locked = false;
  /// The permission bits, 0 to 07777.
  std::uint16_t mode = 0;
  std::uint32_t owner = 0;
  std::uint32_t group = 0;
  /// In bytes, of regular files and of links; 0 for all else.
  std::uint64_t size = 0;
  Timestamp modified;
  Timestamp created;
};

/// The record, and what the caller and the volume have to do with the item.
struct ItemInfo : ItemRecord {
  /// What the kernel answers for the effective user.
  bool readable = false;
  /// MayWrite() of the caller: the real user, and the groups that the process had when it asked
  /// first, its effective group among them.
  bool mayWrite = false;
  /// A folder that is shown as a file.
  bool isPackage = false;
  /// Of the item's mount.
  Result<bool> volumeReadOnly = false;
};

/// Write permission of a user by the mode bits: the first of owner, group and others that fits
/// decides. The superuser is judged like everyone.
bool MayWrite(const ItemRecord& item, std::uint32_t user, std::span<const std::uint32_t> groups);

/// What CreateFolders() makes of a folder that is there already.
enum class IfExists { kFail, kAccept };

/// A path as the system takes it, zero-terminated. It lives as long as what it was made from.
class PathText {
 public:
  PathText(const char* path) : path_(path) {}
  PathText(const std::string& path) : path_(path.c_str()) {}

  const char* Get() const { return path_; }

 private:
  const char* path_;
};

/// The service. Everything may be called from any thread.
class Items {
 public:
  /// The system's, unless a test has put another in place.
  static const Items& Current();

  virtual ~Items() = default;

  /// Whether something exists there, following links: a link that leads nowhere does not.
  virtual bool Exists(PathText path) const = 0;
  virtual Result<ItemInfo> Read(PathText path) const = 0;
  virtual Result<ItemRecord> ReadRecord(PathText path) const = 0;
  virtual Result<Timestamp> AccessTime(PathText path) const = 0;

  /// Locking what is locked and unlocking what is not succeeds. Unlocking clears every form of the
  /// lock or fails. The owner needs no write permission.
  virtual Status SetLocked(PathText path, bool locked) const = 0;
  /// Refused for a locked item, and for a time that the volume cannot hold; the item then keeps its
  /// time.
  virtual Status SetModified(PathText path, Timestamp time) const = 0;
  virtual Status SetCreated(PathText path, Timestamp time) const = 0;

  /// A new empty file takes the place of what is there in one step: a link is replaced and not
  /// written through. A locked item and a folder are refused.
  virtual Status ReplaceByEmptyFile(PathText path) const = 0;
  /// kItemExists when anything is there, also a link that leads nowhere.
  virtual Status CreateEmptyFile(PathText path) const = 0;
  /// Makes missing folders on the way too. All with the usual mode, 0777 less the process's mask.
  virtual Status CreateFolders(PathText path, IfExists ifExists) const = 0;
};

/// Puts other items in place of the current ones while it lives. For tests; not while another
/// thread asks.
class ScopedItems {
 public:
  explicit ScopedItems(const Items& replacement);
  ~ScopedItems();
  ScopedItems(const ScopedItems&) = delete;
  ScopedItems& operator=(const ScopedItems&) = delete;

 private:
  const Items* previous_;
};

}  // namespace orb::platform

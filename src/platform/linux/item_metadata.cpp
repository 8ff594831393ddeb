// SPDX-License-Identifier: MIT
#include "platform/linux/item_metadata.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <linux/magic.h>
#include <sys/ioctl.h>
#include <sys/sysmacros.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <string>
#include <string_view>

#include "platform/linux/posix.h"

namespace orb::platform {

namespace {

constexpr unsigned kWriteBits = S_IWUSR | S_IWGRP | S_IWOTH;
constexpr unsigned kPermissionBits = 07777;
constexpr std::size_t kLongestTime = 64;
constexpr unsigned kStatusFields = STATX_BASIC_STATS | STATX_BTIME;
constexpr __u64 kLockFlags = STATX_ATTR_IMMUTABLE | STATX_ATTR_APPEND;

/// A path to what a descriptor stands for, for calls that do not take an O_PATH descriptor. The
/// kernel does not follow a link that the descriptor itself stands for. It takes no memory, which
/// might not be there while a permission is granted for the moment.
class PathOf {
 public:
  explicit PathOf(int descriptor) {
    char* const digits = std::ranges::copy(kFolder, text_.data()).out;
    *std::to_chars(digits, text_.data() + text_.size() - 1, descriptor).ptr = '\0';
  }
  const char* Text() const { return text_.data(); }

 private:
  static constexpr std::string_view kFolder = "/proc/self/fd/";
  std::array<char, 32> text_;
};

Timestamp FromKernel(const struct statx_timestamp& time) { return {time.tv_sec, time.tv_nsec}; }

OwnAttributes ScanNames(std::string_view names) {
  OwnAttributes own;
  while (!names.empty()) {
    const std::string_view name = names.substr(0, names.find('\0'));
    own.lock |= name == kLockAttribute;
    own.created |= name == kCreatedAttribute;
    names.remove_prefix(std::min(names.size(), name.size() + 1));
  }
  return own;
}

/// For an item with many attributes: the kernel refuses to list more than 64 KiB of names.
OwnAttributes AskForEach(const ItemRef& item) {
  const auto has = [&](const char* name) { return item.GetAttribute(name, nullptr, 0) >= 0; };
  return {.lock = has(kLockAttribute), .created = has(kCreatedAttribute)};
}

/// A volume without attributes, or one that will not list them, has none of ours to show.
Result<OwnAttributes> WithoutNames() {
  if (errno == ENOTSUP) return OwnAttributes{.supported = false};
  if (errno == EACCES || errno == EPERM || errno == ENODATA) return OwnAttributes{};
  return LastError();
}

Status Ask(int result) { return result == 0 ? Status() : Status(LastError()); }

int ChangeMode(int item, mode_t mode) {
  const int result = ::fchmod(item, mode);
  return result != 0 && errno == EBADF ? ::chmod(PathOf(item).Text(), mode) : result;
}

int SetAttribute(int item, const char* name, std::string_view value) {
  const int result = ::fsetxattr(item, name, value.data(), value.size(), 0);
  if (result == 0 || errno != EBADF) return result;
  return ::setxattr(PathOf(item).Text(), name, value.data(), value.size(), 0);
}

int RemoveAttribute(int item, const char* name) {
  const int result = ::fremovexattr(item, name);
  return result != 0 && errno == EBADF ? ::removexattr(PathOf(item).Text(), name) : result;
}

/// Only the owner's missing permission can be granted.
bool LacksOwnersPermission(const StatusRecord& status) {
  return status.stx_uid == ::geteuid() && (status.stx_mode & S_IWUSR) == 0 &&
         KindOf(status) != ItemKind::kLink;
}

/// Makes a change to attributes, which the kernel ties to write permission. The owner of an item
/// without it may change the permission, so it is granted for the moment and put back, whatever
/// the change comes to.
template <typename Change>
Status WithWritePermission(int item, Change change) {
  if (change() == 0) return {};
  if (errno != EACCES) return LastError();
  const Result<StatusRecord> status = ReadStatus(item);
  if (!status || !LacksOwnersPermission(status.Value())) return kNotPermitted;
  const mode_t mode = status.Value().stx_mode & kPermissionBits;
  if (ChangeMode(item, mode | S_IWUSR) != 0) return LastError();
  const Status changed = Ask(change());
  const Status putBack = Ask(ChangeMode(item, mode));
  return changed.Ok() ? putBack : changed;
}

Status SetLockAttribute(int item) {
  return WithWritePermission(item, [&] { return SetAttribute(item, kLockAttribute, "1"); });
}

Status RemoveLockAttribute(int item) {
  const Result<OwnAttributes> own = FindOwnAttributes(item);
  if (!own) return own.Reason();
  if (!own.Value().lock) return {};
  return WithWritePermission(item, [&] { return RemoveAttribute(item, kLockAttribute); });
}

Result<bool> ShowsReadOnlyAttribute(const ItemRef& item,
                                    const StatusRecord& status,
                                    const OwnAttributes& own) {
  if (!MayShowReadOnlyAttribute(status)) return false;
  struct statfs volume;
  if (item.Volume(&volume) != 0) return LastError();
  return HasReadOnlyAttribute(volume, status, own);
}

/// The drivers take the read-only attribute as a change of the write bits, and some accept it
/// without doing it.
Status SetReadOnlyAttribute(int item, bool locked) {
  const Result<StatusRecord> before = ReadStatus(item);
  if (!before) return before.Reason();
  const mode_t mode = before.Value().stx_mode & kPermissionBits;
  if (ChangeMode(item, locked ? mode & ~kWriteBits : mode | kWriteBits) != 0) return LastError();
  const Result<StatusRecord> after = ReadStatus(item);
  if (!after) return after.Reason();
  return MayShowReadOnlyAttribute(after.Value()) == locked ? Status() : Status(kNotPermitted);
}

/// The flags go through an ioctl, which needs the item open for reading.
Status ClearLockFlags(int item, const StatusRecord& status) {
  if (!S_ISREG(status.stx_mode) && !S_ISDIR(status.stx_mode)) return kNotPermitted;
  const int access = O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;
  const UniqueFd open(Retry([&] { return ::open(PathOf(item).Text(), access); }));
  if (!open) return LastError();
  int flags = 0;
  if (::ioctl(open.Get(), FS_IOC_GETFLAGS, &flags) != 0) return kNotPermitted;
  flags &= ~(FS_IMMUTABLE_FL | FS_APPEND_FL);
  return ::ioctl(open.Get(), FS_IOC_SETFLAGS, &flags) == 0 ? Status() : Status(kNotPermitted);
}

Status Lock(int item) {
  const Status byAttribute = SetLockAttribute(item);
  if (byAttribute.Ok()) return byAttribute;
  const Result<StatusRecord> status = ReadStatus(item);
  struct statfs volume;
  if (!status || !S_ISREG(status.Value().stx_mode) || ::fstatfs(item, &volume) != 0) {
    return byAttribute;
  }
  const bool takesReadOnly =
      HasReadOnlyAttribute(volume, status.Value(), OwnAttributes{.supported = false});
  return takesReadOnly ? SetReadOnlyAttribute(item, true) : byAttribute;
}

/// The flags first: under them nothing else can be cleared.
Status Unlock(int item) {
  const Result<StatusRecord> status = ReadStatus(item);
  if (!status) return status.Reason();
  if (HasLockFlag(status.Value())) {
    const Status cleared = ClearLockFlags(item, status.Value());
    if (!cleared) return cleared;
  }
  const Status removed = RemoveLockAttribute(item);
  if (!removed) return removed;
  const Result<bool> stillLocked = IsLocked(item);
  if (!stillLocked) return stillLocked.Reason();
  return stillLocked.Value() ? SetReadOnlyAttribute(item, false) : Status();
}

template <typename Number>
bool TakeNumber(std::string_view& text, Number& number) {
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc()) return false;
  text.remove_prefix(static_cast<std::size_t>(end - text.data()));
  return true;
}

/// Seconds and nanoseconds as decimal numbers, "1588334400 250000000". Anything else, whoever wrote
/// it, is no time.
std::optional<Timestamp> ParseTime(std::string_view text) {
  Timestamp time;
  if (!TakeNumber(text, time.seconds) || !text.starts_with(' ')) return std::nullopt;
  text.remove_prefix(1);
  if (!TakeNumber(text, time.nanoseconds) || !text.empty()) return std::nullopt;
  if (time.nanoseconds > 999'999'999) return std::nullopt;
  return time;
}

std::optional<Timestamp> StoredCreationTime(const ItemRef& item) {
  std::array<char, kLongestTime> value;
  const ssize_t size = item.GetAttribute(kCreatedAttribute, value.data(), value.size());
  if (size < 0) return std::nullopt;
  return ParseTime({value.data(), static_cast<std::size_t>(size)});
}

Timestamp RecordedCreationTime(const StatusRecord& status) {
  if ((status.stx_mask & STATX_BTIME) != 0) return FromKernel(status.stx_btime);
  return std::min(FromKernel(status.stx_mtime), FromKernel(status.stx_ctime));
}

}  // namespace

int ItemRef::Status(struct statx* status) const {
  return Retry([&] {
    if (path_ != nullptr) {
      return ::statx(AT_FDCWD, path_, AT_SYMLINK_NOFOLLOW, kStatusFields, status);
    }
    return ::statx(descriptor_, "", AT_EMPTY_PATH, kStatusFields, status);
  });
}

int ItemRef::Volume(struct statfs* volume) const {
  return Retry(
      [&] { return path_ != nullptr ? ::statfs(path_, volume) : ::fstatfs(descriptor_, volume); });
}

ssize_t ItemRef::ListAttributes(char* names, std::size_t size) const {
  return Retry([&] {
    if (path_ != nullptr) return ::llistxattr(path_, names, size);
    const ssize_t result = ::flistxattr(descriptor_, names, size);
    if (result >= 0 || errno != EBADF) return result;
    return ::listxattr(PathOf(descriptor_).Text(), names, size);
  });
}

ssize_t ItemRef::GetAttribute(const char* name, char* value, std::size_t size) const {
  return Retry([&] {
    if (path_ != nullptr) return ::lgetxattr(path_, name, value, size);
    const ssize_t result = ::fgetxattr(descriptor_, name, value, size);
    if (result >= 0 || errno != EBADF) return result;
    return ::getxattr(PathOf(descriptor_).Text(), name, value, size);
  });
}

Result<StatusRecord> ReadStatus(const ItemRef& item) {
  StatusRecord status;
  if (item.Status(&status) != 0) return LastError();
  return status;
}

ItemKind KindOf(const StatusRecord& status) {
  if (S_ISREG(status.stx_mode)) return ItemKind::kFile;
  if (S_ISDIR(status.stx_mode)) return ItemKind::kFolder;
  return S_ISLNK(status.stx_mode) ? ItemKind::kLink : ItemKind::kOther;
}

std::uint64_t MountOf(const StatusRecord& status) {
  if ((status.stx_mask & STATX_MNT_ID) != 0) return status.stx_mnt_id;
  return makedev(status.stx_dev_major, status.stx_dev_minor);
}

bool StickyBitForbids(const StatusRecord& folder, const StatusRecord& item) {
  const uid_t user = ::geteuid();
  const bool isSticky = (folder.stx_mode & S_ISVTX) != 0;
  return isSticky && user != 0 && user != item.stx_uid && user != folder.stx_uid;
}

Timestamp ModificationTime(const StatusRecord& status) { return FromKernel(status.stx_mtime); }

Timestamp LastAccessTime(const StatusRecord& status) { return FromKernel(status.stx_atime); }

Result<OwnAttributes> FindOwnAttributes(const ItemRef& item) {
  std::array<char, 256> names;
  const ssize_t size = item.ListAttributes(names.data(), names.size());
  if (size >= 0) return ScanNames({names.data(), static_cast<std::size_t>(size)});
  return errno == ERANGE ? AskForEach(item) : WithoutNames();
}

bool HasLockFlag(const StatusRecord& status) { return (status.stx_attributes & kLockFlags) != 0; }

bool MayShowReadOnlyAttribute(const StatusRecord& status) {
  return S_ISREG(status.stx_mode) && (status.stx_mode & kWriteBits) == 0;
}

bool HasReadOnlyAttribute(const struct statfs& volume,
                          const StatusRecord& status,
                          const OwnAttributes& own) {
  switch (volume.f_type) {
    case MSDOS_SUPER_MAGIC:
    case EXFAT_SUPER_MAGIC:
      return true;
    case FUSE_SUPER_MAGIC:
      // A disk served by a process has the number of its device, a remote folder has none. Those
      // that know permissions of their own know attributes as well.
      return status.stx_dev_major != 0 && !own.supported;
    default:
      return false;
  }
}

Result<bool> IsLocked(const ItemRef& item) {
  const Result<StatusRecord> status = ReadStatus(item);
  if (!status) return status.Reason();
  if (HasLockFlag(status.Value())) return true;
  const Result<OwnAttributes> own = FindOwnAttributes(item);
  if (!own) return own.Reason();
  if (own.Value().lock) return true;
  return ShowsReadOnlyAttribute(item, status.Value(), own.Value());
}

Status RefuseLocked(const ItemRef& item) {
  const Result<bool> locked = IsLocked(item);
  if (!locked) return locked.Reason();
  return locked.Value() ? Status(kNotPermitted) : Status();
}

Status SetLocked(int item, bool locked) {
  const Result<bool> before = IsLocked(item);
  if (!before) return before.Reason();
  if (before.Value() == locked) return {};
  return locked ? Lock(item) : Unlock(item);
}

Timestamp CreationTime(const ItemRef& item, const StatusRecord& status, const OwnAttributes& own) {
  const auto stored = own.created ? StoredCreationTime(item) : std::nullopt;
  return stored.value_or(RecordedCreationTime(status));
}

Result<Timestamp> CreationTime(const ItemRef& item) {
  const Result<StatusRecord> status = ReadStatus(item);
  if (!status) return status.Reason();
  return CreationTime(item, status.Value(), {.created = true});
}

Status StoreCreationTime(int item, Timestamp time) {
  const std::string text = std::to_string(time.seconds) + ' ' + std::to_string(time.nanoseconds);
  return WithWritePermission(item, [&] { return SetAttribute(item, kCreatedAttribute, text); });
}

}  // namespace orb::platform

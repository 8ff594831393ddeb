// SPDX-License-Identifier: MIT
#include "platform/linux/item_attributes.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/xattr.h>

#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/item_metadata.h"
#include "platform/linux/posix.h"

namespace orb::platform {
namespace {

/// The kernel's own limit of a list and of a value.
constexpr std::size_t kMaxAttribute = 65'536;
/// While somebody changes it under us.
constexpr int kSizeTries = 4;
constexpr mode_t kModeBits = 07777;
constexpr char kAccessList[] = "system.posix_acl_access";
constexpr char kDefaultAccessList[] = "system.posix_acl_default";

bool IsUserAttribute(std::string_view name) {
  if (name == kLockAttribute || name == kCreatedAttribute) return false;  // Carried by meaning.
  return name.starts_with("user.");
}

bool IsAccessList(std::string_view name) {
  return name == kAccessList || name == kDefaultAccessList;
}

/// What the destination cannot carry, and what a source does not let us see.
bool IsRefusal(int number) {
  switch (number) {
    case EOPNOTSUPP:
    case EPERM:
    case EACCES:
    case ENOSPC:
    case EDQUOT:
    case E2BIG:
    case ERANGE:
    case ENODATA:
    case EINVAL:  // An access control list that names users the volume does not know.
      return true;
    default:
      return false;
  }
}

Status UnlessRefused() { return IsRefusal(errno) ? Status() : Status(LastError()); }

/// Calls `read(buffer, size)` with a buffer of the size that it tells. Nothing for a refusal and
/// for more than an attribute can hold.
template <typename Read>
Result<std::optional<std::string>> ReadSized(Read read) {
  // Named: g++ 12 warns of a temporary without a value.
  std::optional<std::string> nothing;
  std::string value;
  for (int i = 0; i < kSizeTries; ++i) {
    const ssize_t size = read(nullptr, 0);
    if (size < 0) break;
    if (static_cast<std::size_t>(size) > kMaxAttribute) return nothing;
    value.resize(static_cast<std::size_t>(size));
    const ssize_t count = size == 0 ? 0 : read(value.data(), value.size());
    if (count >= 0) return std::optional(value.substr(0, static_cast<std::size_t>(count)));
    if (errno != ERANGE) break;
  }
  if (IsRefusal(errno)) return nothing;
  return LastError();
}

using Names = std::vector<std::string>;

Names SplitNames(std::string_view list) {
  Names names;
  for (std::size_t at = 0; at < list.size(); at += names.back().size() + 1)
    names.emplace_back(list.substr(at, list.find('\0', at) - at));
  return names;
}

/// The kernel lists no more than 64 KiB of names. Of an item with more, those that are known are
/// asked for one by one; nobody can tell the others.
Names AskForEach(int from) {
  Names names;
  for (const char* name : {kLockAttribute, kCreatedAttribute, kAccessList, kDefaultAccessList})
    if (::fgetxattr(from, name, nullptr, 0) >= 0) names.emplace_back(name);
  return names;
}

Result<Names> ListAttributes(int from) {
  std::array<char, 1024> few;  // Enough for almost every item, and one call instead of two.
  const ssize_t size = ::flistxattr(from, few.data(), few.size());
  if (size >= 0) return SplitNames({few.data(), static_cast<std::size_t>(size)});
  if (errno != ERANGE) return IsRefusal(errno) ? Result(Names()) : LastError();
  const auto list =
      ReadSized([&](char* buffer, std::size_t room) { return ::flistxattr(from, buffer, room); });
  if (!list) return list.Reason();
  return list.Value() ? SplitNames(*list.Value()) : AskForEach(from);
}

Status CarryOne(int from, int to, const char* name) {
  const auto value = ReadSized(
      [&](char* buffer, std::size_t size) { return ::fgetxattr(from, name, buffer, size); });
  if (!value) return value.Reason();
  if (!value.Value()) return {};
  const std::string& bytes = *value.Value();
  if (::fsetxattr(to, name, bytes.data(), bytes.size(), 0) != 0) return UnlessRefused();
  return {};
}

Status CarryThose(int from, int to, const Names& names, bool (*chosen)(std::string_view)) {
  for (const std::string& name : names) {
    if (!chosen(name)) continue;
    if (Status carried = CarryOne(from, to, name.c_str()); !carried) return carried;
  }
  return {};
}

/// Set-id bits lend the owner's rights: they go along only where the owner is the same.
mode_t ModeFor(const StatusRecord& source, const struct stat& copy) {
  mode_t mode = source.stx_mode & kModeBits;
  if (source.stx_uid != copy.st_uid) mode &= ~mode_t{S_ISUID};
  if (source.stx_gid != copy.st_gid) mode &= ~mode_t{S_ISGID};
  return mode;
}

/// Refused on FAT, network and user-space volumes, which is no failed copy. Where the mode is right
/// already, as that of most new files is, it is not set again: that would be one more change of the
/// file for the file system to log.
void CarryMode(int to, const StatusRecord& source) {
  struct stat copy;
  if (::fstat(to, &copy) != 0) return;
  const mode_t mode = ModeFor(source, copy);
  if ((copy.st_mode & kModeBits) != mode) (void)::fchmod(to, mode);
}

timespec KernelTime(const Timestamp& time) {
  return {static_cast<time_t>(time.seconds), static_cast<long>(time.nanoseconds)};
}

/// Refused as the mode is.
void CarryTimes(int to, const StatusRecord& source) {
  const timespec times[2] = {KernelTime(LastAccessTime(source)),
                             KernelTime(ModificationTime(source))};
  (void)::futimens(to, times);
}

OwnAttributes OwnOf(const Names& names) {
  const auto has = [&](const char* name) { return std::ranges::find(names, name) != names.end(); };
  return {.lock = has(kLockAttribute), .created = has(kCreatedAttribute)};
}

bool IsLockedBy(int from, const StatusRecord& status, const OwnAttributes& own) {
  if (own.lock || HasLockFlag(status)) return true;
  if (!MayShowReadOnlyAttribute(status)) return false;
  const auto locked = IsLocked(from);
  return locked && locked.Value();
}

}  // namespace

Status CarryAttributes(int from, int to, const StatusRecord& source) {
  const auto names = ListAttributes(from);
  if (!names) return names.Reason();
  const OwnAttributes own = OwnOf(names.Value());
  // An owner without write permission cannot set attributes any more: lists and mode come later.
  (void)StoreCreationTime(to, CreationTime(from, source, own));
  for (const auto chosen : {IsUserAttribute, IsAccessList}) {
    if (Status carried = CarryThose(from, to, names.Value(), chosen); !carried) return carried;
  }
  CarryMode(to, source);
  CarryTimes(to, source);
  if (IsLockedBy(from, source, own)) (void)SetLocked(to, true);
  return {};
}

}  // namespace orb::platform

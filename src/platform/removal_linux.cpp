// SPDX-License-Identifier: MIT
#include "platform/removal.h"

#include <fcntl.h>
#include <limits.h>
#include <stdio.h>
#include <sys/syscall.h>
#include <sys/xattr.h>

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/linux/folder_stream.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/removal_at.h"
#include "platform/linux/tree_survey.h"

namespace orb::platform {
namespace {

/// How many levels of a tree are held open at once.
constexpr std::size_t kOpenLevels = 32;
/// How often a folder that is found not empty after everything in it was removed is gone through
/// again, before it counts as one that somebody else is filling.
constexpr int kMaxPasses = 32;

#ifdef SYS_getxattrat
constexpr long kGetAttributeAt = SYS_getxattrat;
#else
constexpr long kGetAttributeAt = 464;  // One number on all machines but one.
#endif

/// What getxattrat() takes beside the names.
struct AttributeRoom {
  alignas(8) std::uint64_t value = 0;
  std::uint32_t size = 0;
  std::uint32_t flags = 0;
};

/// Of kernels before 6.13.
long FindLockByPath(int folder, const char* name) {
  char path[sizeof "/proc/self/fd/" + 12 + NAME_MAX + 1];
  const int length = std::snprintf(path, sizeof path, "/proc/self/fd/%d/%s", folder, name);
  if (length < 0 || static_cast<std::size_t>(length) >= sizeof path) return 0;
  return ::lgetxattr(path, kLockAttribute, nullptr, 0);
}

/// Takes a quarter of the time that the way through /proc takes.
long FindLock(int folder, const char* name) {
  AttributeRoom none;
  const long found = ::syscall(
      kGetAttributeAt, folder, name, AT_SYMLINK_NOFOLLOW, kLockAttribute, &none, sizeof none);
  // Where it is not known, some sandboxes call it forbidden.
  const bool unknown = found < 0 && (errno == ENOSYS || errno == EPERM);
  return unknown ? FindLockByPath(folder, name) : found;
}

/// The kernel itself refuses to remove or rename what has the immutable or the append-only flag.
/// Where the attribute is not simply missing, all is looked at.
bool HasNoLockAttribute(int folder, const char* name) {
  return FindLock(folder, name) < 0 && errno == ENODATA;
}

int Unlink(int folder, const char* name, int flags) {
  return Retry([&] { return ::unlinkat(folder, name, flags); });
}

enum class Outcome { kGone, kNotEmpty };

Result<Outcome> RemoveFolderEntry(int folder, const char* name) {
  if (Unlink(folder, name, AT_REMOVEDIR) == 0) return Outcome::kGone;
  if (errno == ENOTEMPTY || errno == EEXIST) return Outcome::kNotEmpty;
  return LastRemovalError();
}

/// Removes an entry that is no folder with content, whatever it may be by now.
Result<Outcome> RemoveEntry(int folder, const char* name, unsigned char type) {
  if (type == DT_DIR && IsMountPoint(folder, name)) return kBusy;
  if (Status open = RefuseLockedEntry(folder, name); !open) return open.Reason();
  if (type == DT_DIR) return RemoveFolderEntry(folder, name);
  if (Unlink(folder, name, 0) == 0) return Outcome::kGone;
  if (errno == EISDIR) return RemoveFolderEntry(folder, name);
  return LastRemovalError();
}

/// A folder that is being emptied.
struct Level {
  std::string name;
  Identity identity;
  /// Nothing while it is one of those far above that are closed.
  std::optional<FolderStream> entries;
  int passes = 0;
};

/// Empties and removes a folder that was found not empty, in a loop of its own stack so that no
/// depth is too deep. Levels far above the current one are closed meanwhile and found again through
/// "..".
class TreeRemover {
 public:
  explicit TreeRemover(int above) : above_(above) {}

  Status Remove(const std::string& name) {
    if (Status entered = Enter(above_, name.c_str()); !entered) return entered;
    while (!levels_.empty()) {
      if (Status done = Proceed(); !done) return done;
    }
    return {};
  }

 private:
  Status Proceed() {
    FolderStream& entries = *levels_.back().entries;
    const auto entry = entries.Next();
    if (!entry) return entry.Reason();
    const char* name = entry.Value().name;
    if (name == nullptr) return Leave();
    const auto outcome = RemoveEntry(entries.Descriptor(), name, entry.Value().type);
    if (!outcome) return UnlessGone(outcome.Reason());
    if (outcome.Value() == Outcome::kGone) return {};
    return UnlessGone(Enter(entries.Descriptor(), name));
  }

  /// What somebody else removed meanwhile is no failure. What has become something else makes its
  /// folder be gone through again.
  static Status UnlessGone(const Status& done) {
    return !done && done.Reason() == kNoSuchItem ? Status() : done;
  }

  Status Enter(int above, const char* name) {
    constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
    auto entries =
        FolderStream::Open(UniqueFd(Retry([&] { return ::openat(above, name, kFlags); })));
    if (!entries) return entries.Reason();
    const auto identity = IdentityOf(entries.Value().Descriptor());
    if (!identity) return identity.Reason();
    levels_.push_back({name, identity.Value(), std::move(entries).Value(), 0});
    if (levels_.size() > kOpenLevels) levels_[levels_.size() - 1 - kOpenLevels].entries.reset();
    return {};
  }

  Status Leave() {
    if (levels_.size() > 1) {
      if (Status open = ReopenAbove(); !open) return open;
    }
    Level& level = levels_.back();
    const auto outcome = RemoveFolderEntry(FolderAbove(), level.name.c_str());
    if (outcome && outcome.Value() == Outcome::kNotEmpty) return PassAgain(&level);
    const bool isInside = levels_.size() > 1;
    levels_.pop_back();
    if (outcome) return {};
    return isInside ? UnlessGone(outcome.Reason()) : outcome.Reason();
  }

  /// What a level removed already is not listed again, so it begins at the start.
  Status ReopenAbove() {
    Level& level = levels_[levels_.size() - 2];
    if (level.entries) return {};
    auto folder = OpenAbove(levels_.back().entries->Descriptor(), level.identity);
    if (!folder) return folder.Reason();
    auto entries = FolderStream::Open(std::move(folder).Value());
    if (!entries) return entries.Reason();
    level.entries = std::move(entries).Value();
    return {};
  }

  int FolderAbove() const {
    return levels_.size() > 1 ? levels_[levels_.size() - 2].entries->Descriptor() : above_;
  }

  /// Removing while listing hides entries on some file systems.
  Status PassAgain(Level* level) {
    if (++level->passes == kMaxPasses) return ErrorFromErrno(ENOTEMPTY);
    level->entries->Restart();
    return {};
  }

  int above_;
  std::vector<Level> levels_;
};

}  // namespace

Status RefuseLockedEntry(int folder, const char* name) {
  if (HasNoLockAttribute(folder, name)) return {};
  const UniqueFd item(
      Retry([&] { return ::openat(folder, name, O_PATH | O_NOFOLLOW | O_CLOEXEC); }));
  return item ? RefuseLocked(item.Get()) : Status(LastError());
}

Result<Place> LocateRemovable(const std::string& path) {
  auto place = Locate(path);
  if (!place) return place;
  if (place.Value().NamesNoEntry()) return kNotPermitted;
  const auto status = ReadStatus(place.Value());
  if (!status) return status.Reason();
  if (Status open = RefuseLocked(place.Value().folder.Get()); !open) return open.Reason();
  return place;
}

Status RemoveItemAt(int folder, const std::string& name) {
  const auto outcome = RemoveEntry(folder, name.c_str(), DT_UNKNOWN);
  if (!outcome) return outcome.Reason();
  return outcome.Value() == Outcome::kGone ? Status() : TreeRemover(folder).Remove(name);
}

Status RemoveItem(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  const auto place = LocateRemovable(path);
  if (!place) return place.Reason();
  return RemoveItemAt(place.Value().folder.Get(), place.Value().name);
}

Status ExpectRemovable(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  const auto place = Locate(path);
  if (!place) return place.Reason();
  const auto status = ReadStatus(place.Value());
  if (!status) return status.Reason();
  if (!S_ISDIR(status.Value().st_mode)) return {};
  const auto survey =
      SurveyTree(place.Value().folder.Get(), place.Value().name, SurveyFor::kRemoval);
  // What cannot be looked into cannot be emptied. What has just gone is no obstacle.
  if (!survey) return survey.Reason() == kNoSuchItem ? Status() : kNotPermitted;
  return survey.Value().canBeRemoved ? Status() : kNotPermitted;
}

Status UnlinkItem(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  const auto place = LocateRemovable(path);
  if (!place) return place.Reason();
  const int folder = place.Value().folder.Get();
  const char* name = place.Value().name.c_str();
  if (Status open = RefuseLockedEntry(folder, name); !open) return open;
  if (Unlink(folder, name, 0) != 0) return LastRemovalError();
  return {};
}

}  // namespace orb::platform

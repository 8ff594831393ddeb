// SPDX-License-Identifier: MIT
#include "platform/copier.h"

#include <fcntl.h>
#include <limits.h>
#include <linux/magic.h>
#include <sys/statfs.h>
#include <sys/sysmacros.h>

#include <optional>
#include <utility>
#include <vector>

#include "platform/linux/copy_at.h"
#include "platform/linux/file_data.h"
#include "platform/linux/folder_stream.h"
#include "platform/linux/item_attributes.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/new_file.h"
#include "platform/linux/tree_survey.h"

namespace orb::platform {
namespace {

constexpr mode_t kPrivateFile = 0600;
constexpr mode_t kPrivateFolder = 0700;
/// How many levels of a tree are held open at once, two descriptors each.
constexpr std::size_t kOpenLevels = 16;

/// What XFS has and linux/magic.h does not.
constexpr unsigned long kXfsMagic = 0x58465342;
/// btrfs keeps what is no larger in its trees.
constexpr off_t kBtrfsInline = 2048;

/// What can be saved on a volume that files are copied to.
struct Savings {
  NewFile::Closing closing = NewFile::Closing::kMayFail;
  off_t cloneAbove = kCloneAbove;
};

Savings SavingsOn(int folder) {
  struct statfs volume;
  if (::fstatfs(folder, &volume) != 0) return {};
  switch (static_cast<unsigned long>(volume.f_type)) {
    case BTRFS_SUPER_MAGIC:
      return {NewFile::Closing::kCannotFail, kBtrfsInline};
    case EXT4_SUPER_MAGIC:
    case TMPFS_MAGIC:
    case kXfsMagic:
      return {NewFile::Closing::kCannotFail};
    default:
      return {};
  }
}

/// A copy under way: an entry of one folder to an entry of another.
struct Step {
  int from;
  const char* name;
  int to;
  const char* newName;
  Savings savings;
};

Identity RecordedIdentity(const StatusRecord& status) {
  return {::makedev(status.stx_dev_major, status.stx_dev_minor), status.stx_ino};
}

UniqueFd OpenFolder(int above, const char* name) {
  constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
  return UniqueFd(Retry([&] { return ::openat(above, name, kFlags); }));
}

/// Reading for a copy is no use of the file: it would change its access time. Only the owner may
/// ask for that.
UniqueFd OpenSource(const Step& step) {
  constexpr int kFlags = O_RDONLY | O_NOFOLLOW;
  UniqueFd file = OpenFile(step.from, step.name, kFlags | O_NOATIME);
  const bool isRefused = !file && (errno == EPERM || errno == EINVAL);
  return isRefused ? OpenFile(step.from, step.name, kFlags) : std::move(file);
}

/// A file without a name begins with the permissions that it will have, as far as its owner can
/// write to it.
Result<NewFile> CreateCopy(int folder, const StatusRecord& source) {
  constexpr mode_t kPermissions = 0777;
  return NewFile::Create(folder, (source.stx_mode & kPermissions) | kPrivateFile, kPrivateFile);
}

Status CopyOpenFile(int from, const StatusRecord& source, const Step& step) {
  auto copy = CreateCopy(step.to, source);
  if (!copy) return copy.Reason();
  const int to = copy.Value().Descriptor();
  Status done = CopyFileData(from, to, source, step.savings.cloneAbove);
  if (done) done = CarryAttributes(from, to, source);
  return done ? copy.Value().Publish(step.newName, step.savings.closing) : done;
}

Status CopyFile(const Step& step) {
  const UniqueFd from = OpenSource(step);
  if (!from) return LastError();
  const auto source = ReadStatus(from.Get());
  if (!source) return source.Reason();
  if (!S_ISREG(source.Value().stx_mode)) return kNotPermitted;
  return CopyOpenFile(from.Get(), source.Value(), step);
}

Status CopyLink(const Step& step) {
  char target[PATH_MAX];
  struct stat status;
  const ssize_t length = ::readlinkat(step.from, step.name, target, sizeof target - 1);
  if (length < 0 || ::fstatat(step.from, step.name, &status, AT_SYMLINK_NOFOLLOW) != 0)
    return LastError();
  target[length] = '\0';
  if (::symlinkat(target, step.to, step.newName) != 0) return LastError();
  const timespec times[2] = {status.st_atim, status.st_mtim};
  (void)::utimensat(step.to, step.newName, times, AT_SYMLINK_NOFOLLOW);
  return {};
}

Status CopyLeaf(mode_t type, const Step& step) {
  switch (type & S_IFMT) {
    case S_IFREG:
      return CopyFile(step);
    case S_IFLNK:
      return CopyLink(step);
    default:
      return kNotPermitted;  // Opening a device may do something to it: it is not even tried.
  }
}

/// One folder of the source and its copy.
struct Level {
  UniqueFd from;
  UniqueFd to;
  Identity fromIdentity;
  Identity toIdentity;
  StatusRecord status;
  Savings savings;
  /// The folders in it that are still to be copied.
  std::vector<std::string> pending;
};

/// Copies a folder level by level, files first and folders as they come, in a loop of its own stack
/// so that no depth is too deep. Levels far above the current one are closed meanwhile and found
/// again through "..".
class TreeCopier {
 public:
  Status Copy(const Step& root) {
    if (Status entered = Enter(root); !entered) return entered;
    while (!levels_.empty()) {
      if (Status done = Proceed(); !done) return done;
    }
    return {};
  }

 private:
  Status Proceed() {
    Level& level = levels_.back();
    if (level.pending.empty()) return Leave();
    const std::string name = std::move(level.pending.back());
    level.pending.pop_back();
    return Enter({level.from.Get(), name.c_str(), level.to.Get(), name.c_str(), {}});
  }

  Status Enter(const Step& step) {
    Level level;
    level.from = OpenFolder(step.from, step.name);
    if (!level.from) return LastError();
    const auto status = ReadStatus(level.from.Get());
    if (!status) return status.Reason();
    level.status = status.Value();
    level.fromIdentity = RecordedIdentity(level.status);
    if (root_ && level.fromIdentity == *root_) return ErrorFromErrno(EINVAL);  // Into itself.
    if (::mkdirat(step.to, step.newName, kPrivateFolder) != 0) return LastError();
    level.to = OpenFolder(step.to, step.newName);
    if (!level.to) return LastError();
    const auto identity = IdentityOf(level.to.Get());
    if (!identity) return identity.Reason();
    level.toIdentity = identity.Value();
    level.savings = SavingsOn(level.to.Get());
    if (!root_) root_ = level.toIdentity;
    levels_.push_back(std::move(level));
    CloseFarLevel();
    return CopyEntries();
  }

  void CloseFarLevel() {
    if (levels_.size() <= kOpenLevels) return;
    Level& far = levels_[levels_.size() - 1 - kOpenLevels];
    far.from.Reset();
    far.to.Reset();
  }

  /// Copies what is no folder and notes the folders.
  Status CopyEntries() {
    Level& level = levels_.back();
    auto entries = FolderStream::Open(OpenFolder(level.from.Get(), "."));
    if (!entries) return entries.Reason();
    for (;;) {
      const auto entry = entries.Value().Next();
      if (!entry) return entry.Reason();
      if (entry.Value().name == nullptr) return {};
      if (Status copied = CopyEntry(entry.Value()); !copied) return copied;
    }
  }

  Status CopyEntry(const FolderStream::Entry& entry) {
    Level& level = levels_.back();
    auto type = static_cast<mode_t>(DTTOIF(entry.type));
    if (entry.type == DT_UNKNOWN) {
      struct stat status;
      if (::fstatat(level.from.Get(), entry.name, &status, AT_SYMLINK_NOFOLLOW) != 0)
        return LastError();
      type = status.st_mode;
    }
    if (S_ISDIR(type)) {
      level.pending.emplace_back(entry.name);
      return {};
    }
    const int from = level.from.Get();
    return CopyLeaf(type, {from, entry.name, level.to.Get(), entry.name, level.savings});
  }

  /// The folder's own attributes come after its content, which would change its times.
  Status Leave() {
    Level level = std::move(levels_.back());
    levels_.pop_back();
    if (!levels_.empty()) {
      if (Status open = Reopen(level); !open) return open;
    }
    return CarryAttributes(level.from.Get(), level.to.Get(), level.status);
  }

  Status Reopen(const Level& below) {
    Level& level = levels_.back();
    if (level.from) return {};
    auto from = OpenAbove(below.from.Get(), level.fromIdentity);
    if (!from) return from.Reason();
    auto to = OpenAbove(below.to.Get(), level.toIdentity);
    if (!to) return to.Reason();
    level.from = std::move(from).Value();
    level.to = std::move(to).Value();
    return {};
  }

  std::vector<Level> levels_;
  std::optional<Identity> root_;  // Of the copy.
};

Status CopyFolder(const struct stat& source, const Step& step) {
  const auto inside = IsInOrBelow(step.to, IdentityOf(source));
  if (!inside) return inside.Reason();
  if (inside.Value()) return ErrorFromErrno(EINVAL);
  return TreeCopier().Copy(step);
}

/// Nothing is added to a locked folder. A name that is taken is found again when the copy is
/// published; asking before saves copying for nothing.
Status ExpectFree(const Place& destination) {
  const auto locked = IsLocked(destination.folder.Get());
  if (!locked) return locked.Reason();
  if (locked.Value()) return kNotPermitted;
  struct stat ignored;
  const int folder = destination.folder.Get();
  if (::fstatat(folder, destination.name.c_str(), &ignored, AT_SYMLINK_NOFOLLOW) == 0)
    return kItemExists;
  return errno == ENOENT ? Status() : Status(LastError());
}

}  // namespace

Status CopyItemAt(const Place& from, const Place& to) {
  const auto status = ReadStatus(from);
  if (!status) return status.Reason();
  if (Status free = ExpectFree(to); !free) return free;
  const Step step{from.folder.Get(),
                  from.name.c_str(),
                  to.folder.Get(),
                  to.name.c_str(),
                  SavingsOn(to.folder.Get())};
  const bool isFolder = S_ISDIR(status.Value().st_mode);
  return isFolder ? CopyFolder(status.Value(), step) : CopyLeaf(status.Value().st_mode, step);
}

Status CopyItem(const std::string& source, const std::string& destination) {
  const ErrnoKeeper errnoKeeper;
  const auto from = Locate(source);
  if (!from) return from.Reason();
  const auto to = Locate(destination);
  return to ? CopyItemAt(from.Value(), to.Value()) : Status(to.Reason());
}

Status ExpectCopyable(const std::string& source) {
  const ErrnoKeeper errnoKeeper;
  const auto place = Locate(source);
  if (!place) return place.Reason();
  const auto survey = SurveyTree(place.Value().folder.Get(), place.Value().name, SurveyFor::kCopy);
  if (!survey) return survey.Reason();
  return survey.Value().canBeCopied ? Status() : kNotPermitted;
}

}  // namespace orb::platform

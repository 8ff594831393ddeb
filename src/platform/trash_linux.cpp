// SPDX-License-Identifier: MIT
#include "platform/trash.h"

#include <fcntl.h>
#include <pwd.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <string_view>
#include <utility>

#include "platform/item_relations.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/place.h"
#include "platform/linux/posix.h"
#include "platform/linux/removal_at.h"
#include "platform/linux/trash_folder.h"
#include "platform/linux/tree_survey.h"
#include "platform/mount_table.h"
#include "platform/volumes.h"

namespace orb::platform {

namespace {

constexpr char kMountTable[] = "/proc/self/mountinfo";

// --- Where the home trash is

/// The environment's word counts only where nobody else could have put it there.
std::string AbsoluteFolder(const char* variable) {
  const char* value = ::secure_getenv(variable);
  return value != nullptr && value[0] == '/' ? value : "";
}

std::string HomeFolder() {
  if (std::string home = AbsoluteFolder("HOME"); !home.empty()) return home;
  std::array<char, 16384> buffer;
  struct passwd entry;
  struct passwd* found = nullptr;
  if (::getpwuid_r(::geteuid(), &entry, buffer.data(), buffer.size(), &found) != 0) return {};
  return found != nullptr && found->pw_dir[0] == '/' ? found->pw_dir : "";
}

/// Empty when nobody knows.
std::string HomeTrashPath() {
  if (const std::string data = AbsoluteFolder("XDG_DATA_HOME"); !data.empty()) {
    return data + "/Trash";
  }
  const std::string home = HomeFolder();
  return home.empty() ? home : home + "/.local/share/Trash";
}

// --- Items and the folders that hold them

std::string_view ParentOf(std::string_view path) { return path.substr(0, path.rfind('/')); }

/// The text before the last component: items with the same one are in the same folder.
std::string_view FolderText(std::string_view path) {
  path = path.substr(0, path.find_last_not_of('/') + 1);
  return path.substr(0, path.rfind('/') + 1);
}

std::string NameBelow(std::string_view path, std::string_view folderText) {
  path.remove_prefix(folderText.size());
  return std::string(path.substr(0, path.find('/')));
}

/// What is known of an item on a server does for this: it is not asked again.
Result<StatusRecord> ReadStatus(int folder, const char* name, int flags) {
  constexpr unsigned kFields = STATX_TYPE | STATX_MODE | STATX_UID | STATX_INO | STATX_MNT_ID;
  flags |= AT_STATX_DONT_SYNC;
  StatusRecord status;
  const auto ask = [&] { return ::statx(folder, name, flags, kFields, &status); };
  if (Retry(ask) != 0) return LastError();
  return status;
}

Identity IdentityOf(const StatusRecord& status) {
  return {makedev(status.stx_dev_major, status.stx_dev_minor), status.stx_ino};
}

std::optional<std::uint64_t> MountAt(const std::string& path) {
  const Result<StatusRecord> status = ReadStatus(AT_FDCWD, path.c_str(), 0);
  return status ? std::optional(MountOf(status.Value())) : std::nullopt;
}

/// The mount on which a path will be once it is made.
std::optional<std::uint64_t> MountToBe(std::string path) {
  while (!path.empty()) {
    if (const auto mount = MountAt(path)) return mount;
    path = ParentOf(path);
  }
  return MountAt("/");
}

/// An open folder, with what is the same for all items in it.
struct Parent {
  std::string text;
  UniqueFd folder;
  std::string path;  // Resolved; empty for the root.
  StatusRecord status;
};

struct Item {
  const Parent& parent;
  std::string name;
  std::string path;  // Resolved up to the item itself.
  StatusRecord status;

  bool IsFolder() const { return S_ISDIR(status.stx_mode); }
};

Result<Parent> OpenParent(const std::string& path) {
  Result<Place> place = Locate(path);
  if (!place) return place.Reason();
  if (place.Value().NamesNoEntry()) return kNotPermitted;
  const Result<std::string> resolved = ResolvedPath(path);
  if (!resolved) return resolved.Reason();
  const UniqueFd& folder = place.Value().folder;
  const Result<StatusRecord> status = ReadStatus(folder.Get(), "", AT_EMPTY_PATH);
  if (!status) return status.Reason();
  if (const Status refused = RefuseLocked(folder.Get()); !refused) return refused.Reason();
  return Parent{std::string(FolderText(path)),
                std::move(place.Value().folder),
                std::string(ParentOf(resolved.Value())),
                status.Value()};
}

Result<Item> FindItem(const Parent& parent, const std::string& path) {
  const std::string name = NameBelow(path, parent.text);
  if (name == "." || name == "..") return kNotPermitted;
  const auto status = ReadStatus(parent.folder.Get(), name.c_str(), AT_SYMLINK_NOFOLLOW);
  if (!status) return status.Reason();
  if (MountOf(status.Value()) != MountOf(parent.status)) return kBusy;
  Item item{parent, name, parent.path + '/' + name, status.Value()};
  const Status refused = RefuseLocked(ItemRef(item.path.c_str()));
  if (!refused) return refused.Reason();
  return item;
}

/// Asked before anything is copied, so that no copy is made in vain.
Status ExpectRoom(const Item& item, const TrashFolder& trash) {
  const auto survey = SurveyTree(item.parent.folder.Get(), item.name, SurveyFor::kSize);
  if (!survey) return survey.Reason();
  const auto capacity = Volumes::Current().AvailableCapacity(trash.PathOf("."));
  return capacity && survey.Value().bytes > *capacity ? Status(kVolumeFull) : Status();
}

/// The copy of a file goes again only while the file is seen to be there: else it may be the last.
/// Of a folder a part may be gone, and its copy stays.
Status RemoveCopied(const Item& item, const TrashFolder& trash, const std::string& name) {
  const int folder = item.parent.folder.Get();
  const Status removed = RemoveItemAt(folder, item.name);
  if (removed || item.IsFolder()) return removed;
  struct stat status;
  if (::fstatat(folder, item.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0) {
    trash.Drop(name);
    return removed;
  }
  return LastError() == kNoSuchItem ? Status() : removed;
}

bool IsOtherVolume(const Error& failed) { return failed == ErrorFromErrno(EXDEV); }

}  // namespace

/// What the items of one batch have in common: the folder that held the last one, and the trash
/// folders, by mount.
class Trash::Batch {
 public:
  Status Put(const std::string& path) {
    const Result<const Parent*> parent = ParentFor(path);
    if (!parent) return parent.Reason();
    const Result<Item> item = FindItem(*parent.Value(), path);
    if (!item) return item.Reason();
    if (item.Value().IsFolder() && HoldsMount(item.Value().path)) return kBusy;
    return IsOnHomeMount(*parent.Value()) ? PutOnHomeMount(item.Value())
                                          : PutOnOtherMount(item.Value());
  }

 private:
  Result<const Parent*> ParentFor(const std::string& path) {
    if (parent_ && !path.empty() && parent_->text == FolderText(path)) return &*parent_;
    parent_.reset();
    Result<Parent> opened = OpenParent(path);
    if (!opened) return opened.Reason();
    return &parent_.emplace(std::move(opened).Value());
  }

  Status PutOnHomeMount(const Item& item) {
    Result<TrashFolder>& home = Home();
    if (!home) return home.Reason();
    const Status moved = MoveInto(home.Value(), item);
    return !moved && IsOtherVolume(moved.Reason()) ? CopyIntoHome(item) : moved;
  }

  Status PutOnOtherMount(const Item& item) {
    Result<TrashFolder>& trash = OnMountOf(item.parent);
    if (!trash) return CopyIntoHome(item);
    const Status moved = MoveInto(trash.Value(), item);
    if (moved) return moved;
    const bool mayCopy = IsOtherVolume(moved.Reason()) || moved.Reason() == kVolumeFull;
    return mayCopy ? CopyIntoHome(item) : moved;
  }

  static Status MoveInto(TrashFolder& trash, const Item& item) {
    if (Concerns(trash, item)) return kNotPermitted;
    const auto rename = [&](const std::string& name) {
      return trash.RenameIn(item.parent.folder.Get(), item.name, name);
    };
    const Result<std::string> taken = trash.TakeIn(item.name, item.path, rename);
    if (!taken) return taken.Reason();
    if (item.IsFolder()) trash.NoteFolder(taken.Value());
    return {};
  }

  Status CopyIntoHome(const Item& item) {
    Result<TrashFolder>& home = Home();
    if (!home) return home.Reason();
    TrashFolder& trash = home.Value();
    const bool isForbidden = StickyBitForbids(item.parent.status, item.status);
    if (isForbidden || Concerns(trash, item)) return kNotPermitted;
    if (const Status room = ExpectRoom(item, trash); !room) return room;
    const auto copy = [&](const std::string& name) {
      return trash.CopyIn(item.parent.folder.Get(), item.name, name);
    };
    const Result<std::string> taken = trash.TakeIn(item.name, item.path, copy);
    if (!taken) return taken.Reason();
    if (item.IsFolder()) trash.NoteFolder(taken.Value());
    return RemoveCopied(item, trash, taken.Value());
  }

  /// The trash does not go into itself, nor does a folder that holds it.
  static bool Concerns(const TrashFolder& trash, const Item& item) {
    return trash.IsPart(IdentityOf(item.parent.status)) || trash.IsTrashOfVolume(item.path) ||
           (item.IsFolder() && trash.IsPartOrAbove(IdentityOf(item.status)));
  }

  Result<TrashFolder>& Home() {
    if (!home_) {
      home_.emplace(homePath_.empty() ? Result<TrashFolder>(kNoSuchItem)
                                      : TrashFolder::OpenHome(homePath_));
    }
    return *home_;
  }

  bool IsOnHomeMount(const Parent& parent) const { return homeMount_ == MountOf(parent.status); }

  Result<TrashFolder>& OnMountOf(const Parent& parent) {
    const std::uint64_t mount = MountOf(parent.status);
    const auto known = onMounts_.find(mount);
    if (known != onMounts_.end()) return known->second;
    return onMounts_.emplace(mount, OpenOnMountOf(parent)).first->second;
  }

  Result<TrashFolder> OpenOnMountOf(const Parent& parent) {
    const std::uint64_t id = MountOf(parent.status);
    const Mount* mount = Mounts().FindById(id);
    if (mount == nullptr) mount = Mounts().FindByPath(parent.path + '/');
    // Another mount may hide the top folder.
    if (mount == nullptr || MountAt(mount->folder) != id) return kNoSuchItem;
    return TrashFolder::OpenAt(mount->folder);
  }

  /// Whoever empties the trash would empty that volume.
  bool HoldsMount(const std::string& path) {
    const std::string below = path + '/';
    return std::ranges::any_of(Mounts().Mounts(),
                               [&](const Mount& mount) { return mount.folder.starts_with(below); });
  }

  const MountTable& Mounts() {
    if (!mounts_) {
      Result<MountTable> table = MountTable::Read(kMountTable);
      mounts_.emplace(table ? std::move(table).Value() : MountTable());
    }
    return *mounts_;
  }

  const std::string homePath_ = HomeTrashPath();
  const std::optional<std::uint64_t> homeMount_ =
      homePath_.empty() ? std::nullopt : MountToBe(homePath_);
  std::optional<Parent> parent_;
  std::optional<MountTable> mounts_;
  std::optional<Result<TrashFolder>> home_;
  std::map<std::uint64_t, Result<TrashFolder>> onMounts_;
};

Trash::Trash() {
  const ErrnoKeeper errnoKeeper;
  batch_ = std::make_unique<Batch>();
}

Trash::~Trash() {
  const ErrnoKeeper errnoKeeper;
  batch_.reset();
}

Status Trash::Put(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  return batch_->Put(path);
}

}  // namespace orb::platform

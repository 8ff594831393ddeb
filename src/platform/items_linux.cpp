// SPDX-License-Identifier: MIT
#include "platform/items.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <string_view>
#include <vector>

#include "platform/linux/item_metadata.h"
#include "platform/linux/new_file.h"
#include "platform/linux/place.h"

namespace orb::platform {

namespace {

constexpr std::string_view kPackageExtensions[] = {".app", ".bundle", ".plugin", ".photoslibrary"};
constexpr char kPackageMark[] = "/Contents/Info.plist";
constexpr mode_t kNewFile = 0666;
constexpr mode_t kNewFolder = 0777;
/// FAT keeps times in steps of two seconds.
constexpr std::int64_t kCoarsestStep = 2;

// --- Questions

std::string_view WithoutTrailingSeparators(std::string_view path) {
  const std::size_t last = path.find_last_not_of('/');
  return path.substr(
      0, last == std::string_view::npos ? std::min<std::size_t>(path.size(), 1) : last + 1);
}

std::string_view LastComponent(std::string_view path) {
  path = WithoutTrailingSeparators(path);
  return path.substr(path.rfind('/') + 1);
}

char AsciiLower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

bool HasExtension(std::string_view name, std::string_view extension) {
  if (name.size() <= extension.size()) return false;
  return std::ranges::equal(name.substr(name.size() - extension.size()), extension, {}, AsciiLower);
}

bool Permits(const char* path, int access, int flags) {
  return Retry([&] { return ::faccessat(AT_FDCWD, path, access, AT_EACCESS | flags); }) == 0;
}

bool IsPackage(const char* path) {
  const std::string_view name = LastComponent(path);
  for (const std::string_view extension : kPackageExtensions) {
    if (HasExtension(name, extension)) return true;
  }
  return Permits((std::string(path) + kPackageMark).c_str(), F_OK, 0);
}

std::vector<std::uint32_t> ReadGroups() {
  std::vector<gid_t> groups;
  int count = ::getgroups(0, nullptr);
  while (count > 0) {
    groups.resize(static_cast<std::size_t>(count));
    if ((count = ::getgroups(count, groups.data())) >= 0) break;
    count = ::getgroups(0, nullptr);  // The list has grown.
  }
  groups.resize(static_cast<std::size_t>(std::max(count, 0)));
  groups.push_back(::getegid());
  return {groups.begin(), groups.end()};
}

bool CallerMayWrite(const ItemRecord& item) {
  static const std::vector<std::uint32_t> groups = ReadGroups();
  return MayWrite(item, ::getuid(), groups);
}

/// What the system tells of an item.
struct Reading {
  StatusRecord status;
  OwnAttributes own;
};

/// In place: the record is large, and copies of it show in the time of a pass.
Status ReadItem(const ItemRef& item, Reading& reading) {
  if (Retry([&] { return item.Status(&reading.status); }) != 0) return LastError();
  const Result<OwnAttributes> own = FindOwnAttributes(item);
  if (!own) return own.Reason();
  reading.own = own.Value();
  return {};
}

void FillRecord(ItemRecord& record, const ItemRef& item, const Reading& reading) {
  const auto& [status, own] = reading;
  record.kind = KindOf(status);
  record.locked = own.lock || HasLockFlag(status);
  record.mode = status.stx_mode & 07777;
  record.owner = status.stx_uid;
  record.group = status.stx_gid;
  const bool hasSize = record.kind == ItemKind::kFile || record.kind == ItemKind::kLink;
  record.size = hasSize ? status.stx_size : 0;
  record.modified = ModificationTime(status);
  record.created = CreationTime(item, status, own);
}

/// One question that settles two: who may read and write the item can read it, and neither its
/// mount nor its file system is read-only. Special files may be written on a read-only volume. The
/// kernel itself has to say so: where it does not know the call, the C library judges by the mode
/// alone.
bool IsReadableOnWritableVolume(const char* path, const ItemInfo& info) {
  if (!info.mayWrite || info.locked || info.kind == ItemKind::kOther) return false;
  constexpr int kFlags = AT_EACCESS | AT_SYMLINK_NOFOLLOW;
  return ::syscall(SYS_faccessat2, AT_FDCWD, path, R_OK | W_OK, kFlags) == 0;
}

UniqueFd OpenItem(const char* path) {
  return UniqueFd(Retry([&] { return ::open(path, O_PATH | O_NOFOLLOW | O_CLOEXEC); }));
}

int ReadVolume(const char* path, ItemKind kind, struct statfs* volume) {
  if (kind != ItemKind::kLink) return ItemRef(path).Volume(volume);
  const UniqueFd link = OpenItem(path);
  return link ? ItemRef(link.Get()).Volume(volume) : -1;
}

void AskTheVolume(ItemInfo& info, const char* path, const Reading& reading) {
  const auto& [status, own] = reading;
  struct statfs volume;
  if (ReadVolume(path, info.kind, &volume) != 0) {
    info.volumeReadOnly = LastError();
    return;
  }
  info.volumeReadOnly = (volume.f_flags & ST_RDONLY) != 0;
  info.locked |= MayShowReadOnlyAttribute(status) && HasReadOnlyAttribute(volume, status, own);
}

// --- Changes

/// Opens an item for a change of what a lock protects.
Result<UniqueFd> OpenUnlocked(const char* path) {
  UniqueFd item = OpenItem(path);
  if (!item) return LastError();
  if (const Status refused = RefuseLocked(item.Get()); !refused) return refused.Reason();
  return item;
}

/// Both times at once: disks behind FUSE accept a change of one alone without doing it.
Status WriteTimes(int item, Timestamp accessed, Timestamp modified) {
  const struct timespec times[] = {{accessed.seconds, accessed.nanoseconds},
                                   {modified.seconds, modified.nanoseconds}};
  const int result = Retry([&] { return ::utimensat(item, "", times, AT_EMPTY_PATH); });
  return result == 0 ? Status() : Status(LastError());
}

bool IsNear(Timestamp a, Timestamp b) {
  return a.seconds - b.seconds < kCoarsestStep && b.seconds - a.seconds < kCoarsestStep;
}

/// Finds the folder that a new entry goes into.
Result<Place> LocateNew(const std::string& path) {
  Result<Place> place = Locate(path);
  if (!place) return place;
  if (const Status refused = RefuseLocked(place.Value().folder.Get()); !refused)
    return refused.Reason();
  if (place.Value().folderMeant) return kInvalidName;
  return place;
}

Status CreateFile(const UniqueFd& folder, const std::string& name) {
  const int flags = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC;
  const UniqueFd file(Retry([&] { return ::openat(folder.Get(), name.c_str(), flags, kNewFile); }));
  return file ? Status() : Status(LastError());
}

Status RefuseToReplace(const Place& place) {
  const int flags = O_PATH | O_NOFOLLOW | O_CLOEXEC;
  const UniqueFd old(
      Retry([&] { return ::openat(place.folder.Get(), place.name.c_str(), flags); }));
  if (!old) return LastError();
  const Result<StatusRecord> status = ReadStatus(old.Get());
  if (!status) return status.Reason();
  if (KindOf(status.Value()) == ItemKind::kFolder) return kItemExists;
  return RefuseLocked(old.Get());
}

Status ReplaceByNewFile(const Place& place) {
  auto file = NewFile::CreateHidden(place.folder.Get(), kNewFile);
  return file ? file.Value().Replace(place.name.c_str()) : Status(file.Reason());
}

Status CreateFolder(const std::string& path) {
  const Result<Place> place = LocateNew(path);
  if (!place) return place.Reason();
  const Place& at = place.Value();
  const int made = Retry([&] { return ::mkdirat(at.folder.Get(), at.name.c_str(), kNewFolder); });
  return made == 0 ? Status() : Status(LastError());
}

/// Where the text of the folder above ends; 0 when there is none above.
std::size_t ParentEnd(std::string_view path) {
  const std::size_t slash = path.rfind('/');
  if (slash == std::string_view::npos) return 0;
  const std::size_t last = path.find_last_not_of('/', slash);
  return last == std::string_view::npos ? 0 : last + 1;
}

std::size_t NextEnd(std::string_view path, std::size_t end) {
  const std::size_t begin = path.find_first_not_of('/', end);
  return std::min(path.find('/', begin), path.size());
}

bool IsFolder(const char* path) {
  struct stat status;
  return ::stat(path, &status) == 0 && S_ISDIR(status.st_mode);
}

/// Creates the folders on the way to `path` that are missing, and then the last one.
Status CreateWithParents(const std::string& path) {
  std::size_t end = path.size();
  Status made = CreateFolder(path);
  while (!made && made.Reason() == kNoSuchItem && ParentEnd({path.data(), end}) > 0) {
    end = ParentEnd({path.data(), end});
    made = CreateFolder(path.substr(0, end));
  }
  while (end < path.size() && (made || made.Reason() == kItemExists)) {
    end = NextEnd(path, end);
    made = CreateFolder(path.substr(0, end));
  }
  return made;
}

class SystemItems final : public Items {
 public:
  bool Exists(PathText path) const override {
    const ErrnoKeeper errnoKeeper;
    return Permits(path.Get(), F_OK, 0);
  }

  Result<ItemRecord> ReadRecord(PathText path) const override {
    const ErrnoKeeper errnoKeeper;
    const ItemRef item(path.Get());
    Reading reading;
    if (const Status read = ReadItem(item, reading); !read) return read.Reason();
    ItemInfo info;
    FillRecord(info, item, reading);
    if (MayShowReadOnlyAttribute(reading.status)) {
      AskTheVolume(info, path.Get(), reading);
    }
    return ItemRecord(info);
  }

  Result<ItemInfo> Read(PathText path) const override {
    const ErrnoKeeper errnoKeeper;
    const ItemRef item(path.Get());
    Reading reading;
    if (const Status read = ReadItem(item, reading); !read) return read.Reason();
    ItemInfo info;
    FillRecord(info, item, reading);
    info.mayWrite = CallerMayWrite(info);
    info.readable = IsReadableOnWritableVolume(path.Get(), info);
    if (!info.readable) {
      info.readable = Permits(path.Get(), R_OK, AT_SYMLINK_NOFOLLOW);
      AskTheVolume(info, path.Get(), reading);
    }
    info.isPackage = info.kind == ItemKind::kFolder && IsPackage(path.Get());
    return info;
  }

  Result<Timestamp> AccessTime(PathText path) const override {
    const ErrnoKeeper errnoKeeper;
    const Result<StatusRecord> status = ReadStatus(ItemRef(path.Get()));
    if (!status) return status.Reason();
    return LastAccessTime(status.Value());
  }

  Status SetLocked(PathText path, bool locked) const override {
    const ErrnoKeeper errnoKeeper;
    const UniqueFd item = OpenItem(path.Get());
    if (!item) return LastError();
    return platform::SetLocked(item.Get(), locked);
  }

  Status SetModified(PathText path, Timestamp time) const override {
    const ErrnoKeeper errnoKeeper;
    const Result<UniqueFd> item = OpenUnlocked(path.Get());
    if (!item) return item.Reason();
    const int fd = item.Value().Get();
    const Result<StatusRecord> before = ReadStatus(fd);
    if (!before) return before.Reason();
    const Timestamp accessed = LastAccessTime(before.Value());
    if (const Status written = WriteTimes(fd, accessed, time); !written) return written;
    const Result<StatusRecord> after = ReadStatus(fd);
    if (after && IsNear(ModificationTime(after.Value()), time)) return {};
    // The kernel takes what the volume cannot hold for the nearest that it can.
    (void)WriteTimes(fd, accessed, ModificationTime(before.Value()));
    return kNotPermitted;
  }

  Status SetCreated(PathText path, Timestamp time) const override {
    const ErrnoKeeper errnoKeeper;
    const Result<UniqueFd> item = OpenUnlocked(path.Get());
    if (!item) return item.Reason();
    return StoreCreationTime(item.Value().Get(), time);
  }

  Status ReplaceByEmptyFile(PathText path) const override {
    const ErrnoKeeper errnoKeeper;
    const Result<Place> place = LocateNew(path.Get());
    if (!place) return place.Reason();
    const Status created = CreateFile(place.Value().folder, place.Value().name);
    if (created || created.Reason() != kItemExists) return created;
    const Status refused = RefuseToReplace(place.Value());
    return refused ? ReplaceByNewFile(place.Value()) : refused;
  }

  Status CreateEmptyFile(PathText path) const override {
    const ErrnoKeeper errnoKeeper;
    const Result<Place> place = LocateNew(path.Get());
    if (!place) return place.Reason();
    return CreateFile(place.Value().folder, place.Value().name);
  }

  Status CreateFolders(PathText path, IfExists ifExists) const override {
    const ErrnoKeeper errnoKeeper;
    const Status made = CreateWithParents(std::string(WithoutTrailingSeparators(path.Get())));
    if (made || made.Reason() != kItemExists || ifExists == IfExists::kFail) return made;
    return IsFolder(path.Get()) ? Status() : made;
  }
};

const SystemItems systemItems;
constinit std::atomic<const Items*> currentItems = nullptr;

}  // namespace

bool MayWrite(const ItemRecord& item, std::uint32_t user, std::span<const std::uint32_t> groups) {
  if (item.owner == user) return (item.mode & S_IWUSR) != 0;
  if (std::ranges::find(groups, item.group) != groups.end()) return (item.mode & S_IWGRP) != 0;
  return (item.mode & S_IWOTH) != 0;
}

const Items& Items::Current() {
  const Items* replacement = currentItems.load(std::memory_order_acquire);
  return replacement != nullptr ? *replacement : systemItems;
}

ScopedItems::ScopedItems(const Items& replacement)
    : previous_(currentItems.exchange(&replacement)) {}

ScopedItems::~ScopedItems() { currentItems.store(previous_); }

}  // namespace orb::platform

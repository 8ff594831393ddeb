// SPDX-License-Identifier: MIT
#include <orb/fileinfo/file_handle.h>
#include <orb/path/path_text.h>

#include <string_view>

#include "fileinfo/item_path.h"
#include "fileinfo/item_times.h"
#include "fileops/error_mapping.h"
#include "path/file_types.h"
#include "platform/items.h"
#include "strings/string_access.h"
#include "strings/text_compare.h"

namespace {

using orb::StringAccess;
using orb::platform::Error;
using orb::platform::ItemInfo;
using orb::platform::ItemKind;
using orb::platform::ItemRecord;
using orb::platform::Items;
using orb::platform::PathText;
using orb::platform::Result;
using orb::platform::Status;
using orb::platform::Timestamp;

constexpr unsigned kAnyReadBit = 0440;
constexpr unsigned kOwnersWriteBit = 0200;

unsigned int FlagIf(bool condition, unsigned int flag) { return condition ? flag : 0; }

/// The code of a failure, which some calls report without an error object.
OrbResult FailureCode(const Error& error) {
  const OrbResult code = orb::OrbMapError(error);
  return code == kOrbNoErr ? kOrbErrNoSuchFile : code;
}

/// The last component as it is stored; the root is its own.
std::string_view NameOf(std::string_view path) {
  const std::size_t last = path.find_last_not_of('/');
  if (last == std::string_view::npos) return path.substr(0, 1);
  path = path.substr(0, last + 1);
  return path.substr(path.rfind('/') + 1);
}

/// A link that leads nowhere is an entry that can be read, and yet does not exist.
bool Exists(const char* path, const Result<ItemInfo>& info) {
  if (info && info.Value().kind != ItemKind::kLink) return true;
  return Items::Current().Exists(path);
}

/// What the caller may do, and the lock. Where the volume gives no answer nothing is writable.
unsigned int CallersAttributes(const ItemInfo& info) {
  const bool volumeWritable = info.volumeReadOnly && !info.volumeReadOnly.Value();
  return FlagIf(info.locked, kOrbFileAttrLocked) | FlagIf(info.readable, kOrbFileAttrReadable) |
         FlagIf(volumeWritable, kOrbFileAttrVolumeWritable) |
         FlagIf(volumeWritable && info.mayWrite, kOrbFileAttrWritable);
}

/// A volume that did not answer ends the pass only when it says why.
OrbResult VolumeFailure(const ItemInfo& info) {
  return info.volumeReadOnly ? kOrbNoErr : orb::OrbMapError(info.volumeReadOnly.Reason());
}

unsigned int RecordedAttributes(const ItemRecord& item) {
  const bool writable = (item.mode & kOwnersWriteBit) != 0;
  return FlagIf(item.locked, kOrbFileAttrLocked) |
         FlagIf((item.mode & kAnyReadBit) != 0, kOrbFileAttrReadable) |
         FlagIf(writable, kOrbFileAttrWritable) |
         FlagIf(writable && !item.locked, kOrbFileAttrVolumeWritable) |
         FlagIf(item.kind == ItemKind::kFolder, kOrbFileAttrFolder);
}

OrbResult SetTime(const COrbFileHandle& handle,
                  const COrbTime& time,
                  Status (Items::*set)(PathText, Timestamp) const) {
  if (handle.IsEmpty()) return kOrbErrNoSuchFile;
  const COrbStringData fullPath = handle.GetFullPath();
  const char* path = orb::ItemPathInPlace(fullPath);
  if (path == nullptr) return kOrbErrNoSuchFile;
  const Status status = (Items::Current().*set)(path, orb::TimestampOf(time.GetUTCTime()));
  return status ? kOrbNoErr : FailureCode(status.Reason());
}

bool IsFolder(const COrbStringData& path) {
  COrbFileHandle handle;
  handle.Initialize(&path);
  return (handle.GetAttribute() & kOrbFileAttrFolder) != 0;
}

std::string_view WithoutOneSeparator(std::string_view path) {
  if (path.ends_with('/')) path.remove_suffix(1);
  return path;
}

}  // namespace

/// What one pass found at a path, which is the handle's own or another.
struct COrbFileHandle::Pass {
  std::string_view path;
  bool isOwn;
  Result<ItemInfo> answer;
};

COrbFileHandle::COrbFileHandle(const COrbFilePath& other) : COrbFilePath(other) {}

COrbFileHandle::COrbFileHandle(const FSRef* reference) { Initialize(reference); }

COrbFileHandle::COrbFileHandle(const CFStringRef* fullPath) { Initialize(fullPath); }

COrbFileHandle::COrbFileHandle(const COrbFileHandle& other) : COrbFilePath(other) {
  CopyCollected(other);
}

COrbFileHandle::~COrbFileHandle() = default;

COrbFilePath& COrbFileHandle::operator=(const COrbFilePath& other) {
  if (this != &other) COrbFilePath::operator=(other);  // Frees, which forgets.
  return *this;
}

COrbFileHandle& COrbFileHandle::operator=(const COrbFileHandle& other) {
  if (this == &other) return *this;
  COrbFilePath::operator=(other);
  CopyCollected(other);
  return *this;
}

void COrbFileHandle::Free() {
  COrbFilePath::Free();
  collected = false;
  actualName.Clear();
}

bool COrbFileHandle::IsEmpty() const { return COrbFilePath::IsEmpty(); }

OrbResult COrbFileHandle::Update() {
  return CollectFileInformatioin() == kOrbNoErr ? kOrbNoErr : kOrbErrNoSuchFile;
}

OrbResult COrbFileHandle::CollectFileInformatioin() const {
  if (IsEmpty()) return kOrbErrNoSuchFile;
  const char* itemPath = orb::ItemPathInPlace(path);
  if (itemPath == nullptr) return kOrbErrNoSuchFile;
  const Pass pass{itemPath, true, Items::Current().Read(itemPath)};
  return Exists(itemPath, pass.answer) ? Keep(pass) : kOrbErrNoSuchFile;
}

OrbResult COrbFileHandle::SetCatalogInfo(CFStringRef fullPath) const {
  COrbStringData text;
  text.InitWithCFString(fullPath);
  const char* itemPath = orb::ItemPathInPlace(text);
  if (itemPath == nullptr) return Keep({{}, false, orb::platform::kNoSuchItem});
  return Keep({itemPath, false, Items::Current().Read(itemPath)});
}

/// A pass that fails half-way keeps what it has found up to there. Whether anything counts as
/// collected then stays as it was.
OrbResult COrbFileHandle::Keep(const Pass& pass) const {
  attributes = 0;
  if (!pass.answer) return FailureCode(pass.answer.Reason());
  const ItemInfo& info = pass.answer.Value();
  attributes = CallersAttributes(info);
  if (const OrbResult failure = VolumeFailure(info); failure != kOrbNoErr) return failure;
  const bool isFolder = info.kind == ItemKind::kFolder && !info.isPackage;
  attributes |= FlagIf(isFolder, kOrbFileAttrFolder);
  fileSize = info.size;
  modificationTime = orb::UtcOf(info.modified);
  creationTime = orb::UtcOf(info.created);
  const std::string_view name = NameOf(pass.path);
  actualName.Clear();  // Of the own path it is made when it is asked for.
  if (!pass.isOwn) actualName = StringAccess::FromUtf8(name);
  const bool hasType = !isFolder && info.kind != ItemKind::kLink;
  fileType = hasType ? orb::FileTypeOfName(name) : eOrbFileType_Unknown;
  collected = true;
  return kOrbNoErr;
}

OrbResult COrbFileHandle::EnsureCollected() const {
  return collected ? kOrbNoErr : CollectFileInformatioin();
}

void COrbFileHandle::CopyCollected(const COrbFileHandle& other) {
  collected = other.collected;
  if (!collected) return;
  actualName = other.actualName;
  attributes = other.attributes;
  fileType = other.fileType;
  fileSize = other.fileSize;
  creationTime = other.creationTime;
  modificationTime = other.modificationTime;
}

bool COrbFileHandle::IsExist() const { return orb::ItemExists(path); }

unsigned int COrbFileHandle::GetAttribute() const {
  return EnsureCollected() == kOrbNoErr ? attributes : 0;
}

eOrbFileType COrbFileHandle::GetFileType() const {
  return EnsureCollected() == kOrbNoErr ? fileType : eOrbFileType_Unknown;
}

std::uint64_t COrbFileHandle::GetFileSize() const {
  return EnsureCollected() == kOrbNoErr ? fileSize : 0;
}

OrbResult COrbFileHandle::GetDisplayName(COrbStringData& name) const { return GetActualName(name); }

OrbResult COrbFileHandle::GetActualName(COrbStringData& name) const {
  if (EnsureCollected() != kOrbNoErr) return kOrbErrNotFound;
  if (actualName.IsEmpty())
    actualName = StringAccess::FromUtf8(NameOf(StringAccess::Read(path).Readable()));
  name = actualName;
  return kOrbNoErr;
}

OrbResult COrbFileHandle::SetAttribute(unsigned int flags) {
  if (IsEmpty()) return kOrbErrNoSuchFile;
  const char* itemPath = orb::ItemPathInPlace(path);
  if (itemPath == nullptr) return kOrbErrNoSuchFile;
  const unsigned int locked = flags & kOrbFileAttrLocked;
  const Status status = Items::Current().SetLocked(itemPath, locked != 0);
  if (!status) return FailureCode(status.Reason());
  attributes = (attributes & ~kOrbFileAttrLocked) | locked;
  return kOrbNoErr;
}

bool COrbFileHandle::IsEqual(const COrbFileHandle& other) const {
  const std::string_view a = StringAccess::Read(path).Readable();
  const std::string_view b = StringAccess::Read(other.path).Readable();
  if (a.empty() || b.empty()) return false;
  return orb::CompareFolded({WithoutOneSeparator(a)}, {WithoutOneSeparator(b)}) == 0;
}

OrbResult COrbFileHandle::GetCreateTime(COrbTime* time) const {
  if (EnsureCollected() != kOrbNoErr) return kOrbErrNoSuchFile;
  if (time == nullptr) return kOrbErrNotFound;
  *time = creationTime;
  return kOrbNoErr;
}

OrbResult COrbFileHandle::GetUpdateTime(COrbTime* time) const {
  if (EnsureCollected() != kOrbNoErr) return kOrbErrNoSuchFile;
  if (time == nullptr) return kOrbErrNotFound;
  *time = modificationTime;
  return kOrbNoErr;
}

UTCDateTime COrbFileHandle::GetUpdateTime() const {
  return EnsureCollected() == kOrbNoErr ? modificationTime : UTCDateTime{};
}

OrbResult COrbFileHandle::GetAccessTime(COrbTime* time) const {
  if (IsEmpty()) return kOrbErrNoSuchFile;
  const char* itemPath = orb::ItemPathInPlace(path);
  if (itemPath == nullptr) return kOrbErrNoSuchFile;
  const Result<Timestamp> accessed = Items::Current().AccessTime(itemPath);
  if (!accessed) return FailureCode(accessed.Reason());
  if (time == nullptr) return kOrbErrNotFound;
  *time = static_cast<unsigned long long>(orb::TicksOf(accessed.Value()));
  return kOrbNoErr;
}

OrbResult COrbFileHandle::SetCreateTime(const COrbTime& time) {
  return SetTime(*this, time, &Items::SetCreated);
}

OrbResult COrbFileHandle::SetUpdateTime(const COrbTime& time) {
  return SetTime(*this, time, &Items::SetModified);
}

OrbResult COrbFileHandle::SetAccessTime(const COrbTime&) { return kOrbErrNotSupported; }

unsigned int COrbFileHandle::GetAttribute(const COrbStringData& fullPath) {
  const char* path = orb::ItemPathInPlace(fullPath);
  if (path == nullptr) return FailureCode(orb::platform::kNoSuchItem);
  const Result<ItemRecord> item = Items::Current().ReadRecord(path);
  return item ? RecordedAttributes(item.Value()) : FailureCode(item.Reason());
}

eOrbFileType COrbFileHandle::GetFileType(const COrbStringData& name) {
  return orb::FileTypeOfName(StringAccess::Read(name).Readable());
}

eOrbFileType OrbPathFindExtensionType(const COrbStringData& path, bool refuseFolders) {
  const COrbStringData extension = OrbPathFindExtension(path, true);
  if (extension.IsEmpty()) return eOrbFileType_Unknown;
  if (refuseFolders && IsFolder(path)) return eOrbFileType_Unknown;
  return OrbPathConvertExtensionToType(extension);
}

eOrbFileType OrbPathFindExtensionType(const COrbFilePath& path, bool refuseFolders) {
  if (path.IsEmpty()) return eOrbFileType_Unknown;
  return OrbPathFindExtensionType(path.GetFullPath(), refuseFolders);
}

bool OrbPathIsEqualActually(const COrbFileHandle& a, const COrbFileHandle& b) {
  return a.IsEqual(b);
}

bool OrbPathIsEqualVirtually(const COrbFileHandle& a, const COrbFileHandle& b) {
  return OrbPathIsEqualActually(a, b);
}

bool OrbPathIsEqualOrRootActually(const COrbFileHandle& a, const COrbFileHandle& b) {
  return OrbPathIsEqualOrRootActually(a.GetFullPath(), b.GetFullPath(), true);
}

bool OrbPathIsEqualOrRootVirtually(const COrbFileHandle& a, const COrbFileHandle& b) {
  return OrbPathIsEqualOrRootActually(a, b);
}

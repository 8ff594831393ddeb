// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/path/file_type.h>
#include <orb/platform/core_foundation.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>
#include <orb/time/time.h>

#include <cstdint>

/// The item is locked against change, as a camera's protect mark does.
constexpr unsigned int kOrbFileAttrLocked = 0x00000002;
/// The item's volume is not read-only.
constexpr unsigned int kOrbFileAttrVolumeWritable = 0x00000004;
/// The calling user may read the item.
constexpr unsigned int kOrbFileAttrReadable = 0x00000008;
/// The mode bits let the calling user write, and the volume is writable.
constexpr unsigned int kOrbFileAttrWritable = 0x00000010;
/// A folder that is not a package.
constexpr unsigned int kOrbFileAttrFolder = 0x10000000;

/// A path that also answers questions about the item there: attributes, type, size, names and
/// times. The first question reads everything in one pass and keeps it until the path changes or
/// Update() is called; changes on disk in between are not seen. The item at a path is the directory
/// entry itself: a symbolic link is an item of its own, of size and times of its own and without
/// type.
///
/// Not for concurrent use, not even of its const operations: they fill the cache.
class ORB_EXPORT COrbFileHandle : public COrbFilePath {
 public:
  COrbFileHandle() = default;
  COrbFileHandle(const COrbFilePath& other);
  /// Empty when the reference cannot be read.
  COrbFileHandle(const FSRef* reference);
  COrbFileHandle(const CFStringRef* fullPath);
  /// Copies what was collected too.
  COrbFileHandle(const COrbFileHandle& other);
  ~COrbFileHandle() override;

  /// Takes the path and forgets what was collected.
  COrbFilePath& operator=(const COrbFilePath& other) override;
  /// Copies what was collected too. Assigning a handle to itself changes nothing.
  COrbFileHandle& operator=(const COrbFileHandle& other);
  /// Makes the path empty and forgets what was collected.
  void Free() override;
  bool IsEmpty() const override;

  /// Collects afresh. kOrbErrNoSuchFile when that fails for any reason; what was collected stays,
  /// except for what a pass that failed half-way has written.
  OrbResult Update();
  /// One collection pass. kOrbErrNoSuchFile for an empty path or where nothing exists, otherwise
  /// the code of what failed.
  OrbResult CollectFileInformatioin() const;
  /// One collection pass on the item at another path, into this handle's cache.
  OrbResult SetCatalogInfo(CFStringRef fullPath) const;

  /// Whether something exists at the path now, following links. Never kept.
  bool IsExist() const;
  /// The kOrbFileAttr flags; 0 when they cannot be collected.
  unsigned int GetAttribute() const;
  /// The type by name; eOrbFileType_Unknown for folders, links and names without a known extension,
  /// and when nothing can be collected.
  eOrbFileType GetFileType() const;
  /// In bytes; 0 for folders and when nothing can be collected.
  std::uint64_t GetFileSize() const;
  /// The names as shown and as stored. kOrbErrNotFound when nothing can be collected; the output is
  /// then untouched.
  OrbResult GetDisplayName(COrbStringData& name) const;
  OrbResult GetActualName(COrbStringData& name) const;

  /// Locks the item when `flags` has kOrbFileAttrLocked and unlocks it otherwise; other bits are
  /// ignored. kOrbErrNoSuchFile for an empty path, kOrbErrNotFound where nothing exists,
  /// kOrbErrAccessDenied where the volume cannot carry the lock or the caller is not the owner,
  /// otherwise the code of what failed; the lock then stays as it was.
  OrbResult SetAttribute(unsigned int flags);

  /// Whether both paths are the same text without regard to case and to a trailing "/".
  bool IsEqual(const COrbFileHandle& other) const;

  /// One of the eOrbDriveType values, found out once for each volume and then kept as long as the
  /// process runs. eOrbDriveType_Fixed also where nothing exists, which is not kept. Whether an
  /// item on a network volume exists is not asked, so that a server that is gone does not hang the
  /// answer. Collects nothing, and may be called on different handles from several threads at once.
  unsigned int GetDriveType() const;

  /// Times with a resolution of 1/65536 s. kOrbErrNoSuchFile when they cannot be collected,
  /// kOrbErrNotFound for a null `time`; the output is untouched on failure.
  OrbResult GetCreateTime(COrbTime* time) const;
  OrbResult GetUpdateTime(COrbTime* time) const;
  /// All zero when it cannot be collected.
  UTCDateTime GetUpdateTime() const;
  /// The time of the last access, with a resolution of 100 ns, read now and never kept.
  /// kOrbErrNoSuchFile for an empty path, kOrbErrNotFound where nothing exists and for a null
  /// `time`, otherwise the code of what failed.
  OrbResult GetAccessTime(COrbTime* time) const;

  /// Set the item's times to whole seconds; what was collected stays as it was until Update().
  /// kOrbErrNoSuchFile for an empty path, kOrbErrNotFound where nothing exists, kOrbErrAccessDenied
  /// for a locked item and where the volume or the caller's rights do not allow it, otherwise the
  /// code of what failed; the item's time then stays.
  OrbResult SetCreateTime(const COrbTime& time);
  OrbResult SetUpdateTime(const COrbTime& time);
  /// Always kOrbErrNotSupported, and nothing changes.
  OrbResult SetAccessTime(const COrbTime& time);

  /// The attributes by the item's own record alone (mode bits, not the caller's rights), computed
  /// now. When they cannot be read, the result code of that failure in their place.
  static unsigned int GetAttribute(const COrbStringData& fullPath);
  /// The type of a name by its extension. The file system is not asked.
  static eOrbFileType GetFileType(const COrbStringData& name);

 private:
  struct Pass;

  ORB_LOCAL OrbResult EnsureCollected() const;
  ORB_LOCAL OrbResult Keep(const Pass& pass) const;
  ORB_LOCAL void CopyCollected(const COrbFileHandle& other);

  mutable COrbStringData actualName;
  mutable bool collected = false;
  mutable unsigned int attributes = 0;
  mutable eOrbFileType fileType = eOrbFileType_Unknown;
  mutable std::uint64_t fileSize = 0;
  mutable UTCDateTime creationTime{};
  mutable UTCDateTime modificationTime{};
};

/// The type of a path's extension; with `refuseFolders`, eOrbFileType_Unknown for an existing
/// folder. A path where nothing exists is classified by its name.
ORB_EXPORT eOrbFileType OrbPathFindExtensionType(const COrbStringData& path, bool refuseFolders);
ORB_EXPORT eOrbFileType OrbPathFindExtensionType(const COrbFilePath& path, bool refuseFolders);

/// COrbFileHandle::IsEqual() of the first with the second.
ORB_EXPORT bool OrbPathIsEqualActually(const COrbFileHandle& a, const COrbFileHandle& b);
ORB_EXPORT bool OrbPathIsEqualVirtually(const COrbFileHandle& a, const COrbFileHandle& b);
/// Whether a is the same path as b or one of its ancestors, as text.
ORB_EXPORT bool OrbPathIsEqualOrRootActually(const COrbFileHandle& a, const COrbFileHandle& b);
ORB_EXPORT bool OrbPathIsEqualOrRootVirtually(const COrbFileHandle& a, const COrbFileHandle& b);

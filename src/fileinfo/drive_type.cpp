// SPDX-License-Identifier: MIT
#include <orb/fileinfo/drive_type.h>
#include <orb/fileinfo/file_handle.h>

#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <tuple>

#include "platform/drives.h"
#include "strings/string_access.h"

namespace {

using orb::platform::Drives;
using orb::platform::DriveTraits;
using orb::platform::VolumeId;

struct ByNumbers {
  bool operator()(const VolumeId& a, const VolumeId& b) const {
    return std::tie(a.mount, a.device) < std::tie(b.mount, b.device);
  }
};

/// The types that were found out. Entries are never changed or removed. Guarded by its lock.
class DriveTypeCache {
 public:
  static DriveTypeCache& Instance() {
    static DriveTypeCache cache;
    return cache;
  }

  std::optional<eOrbDriveType> Find(const VolumeId& volume) {
    const std::lock_guard lock(mutex_);
    const auto found = types_.find(volume);
    return found != types_.end() ? std::optional(found->second) : std::nullopt;
  }

  void Add(const VolumeId& volume, eOrbDriveType type) {
    const std::lock_guard lock(mutex_);
    types_.emplace(volume, type);
  }

 private:
  std::mutex mutex_;
  std::map<VolumeId, eOrbDriveType, ByNumbers> types_;
};

eOrbDriveType TypeOf(const DriveTraits& drive) {
  if (drive.optical) return eOrbDriveType_Optical;
  if (drive.remote) return eOrbDriveType_Remote;
  if (!drive.ejectable) return eOrbDriveType_Fixed;
  return drive.writable ? eOrbDriveType_Removable : eOrbDriveType_RemovableReadOnly;
}

eOrbDriveType FindType(const std::string& path) {
  const auto volume = Drives::Current().VolumeOf(path);
  if (!volume) return eOrbDriveType_Fixed;
  if (const auto kept = DriveTypeCache::Instance().Find(volume.Value())) return *kept;
  // Outside the lock: two threads may find out the same.
  const auto traits = Drives::Current().Read(path, volume.Value());
  if (!traits) return eOrbDriveType_Fixed;
  const eOrbDriveType type = TypeOf(traits.Value());
  DriveTypeCache::Instance().Add(volume.Value(), type);
  return type;
}

}  // namespace

unsigned int COrbFileHandle::GetDriveType() const {
  const COrbStringData fullPath = GetFullPath();
  const std::string_view text = orb::StringAccess::Read(fullPath).Readable();
  if (text.empty()) return eOrbDriveType_Fixed;
  return static_cast<unsigned int>(FindType(std::string(text)));
}

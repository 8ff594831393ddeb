// SPDX-License-Identifier: MIT
#include "platform/drives.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <climits>
#include <cstddef>
#include <filesystem>
#include <mutex>
#include <optional>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/linux/posix.h"
#include "platform/linux/system_file.h"
#include "platform/mount_table.h"

namespace orb::platform {

namespace {

using Clock = std::chrono::steady_clock;

/// Newer than the C library's own header.
constexpr unsigned kUniqueMountId = 0x4000;
constexpr std::chrono::seconds kTableAge{1};
/// Mappings stand on mappings; a chain longer than this is a loop.
constexpr int kMostSlaves = 8;

constexpr std::string_view kRemoteTypes[] = {"9p",
                                             "afs",
                                             "auristorfs",
                                             "beegfs",
                                             "ceph",
                                             "cifs",
                                             "coda",
                                             "davfs",
                                             "fuse.afp",
                                             "fuse.beegfs",
                                             "fuse.ceph",
                                             "fuse.curlftpfs",
                                             "fuse.davfs",
                                             "fuse.davfs2",
                                             "fuse.gcsfuse",
                                             "fuse.glusterfs",
                                             "fuse.goofys",
                                             "fuse.gvfsd-fuse",
                                             "fuse.juicefs",
                                             "fuse.kio-fuse",
                                             "fuse.rclone",
                                             "fuse.s3fs",
                                             "fuse.smbnetfs",
                                             "fuse.sshfs",
                                             "gfs2",
                                             "glusterfs",
                                             "gpfs",
                                             "gvfs",
                                             "lustre",
                                             "ncpfs",
                                             "nfs",
                                             "nfs4",
                                             "ocfs2",
                                             "orangefs",
                                             "smb3",
                                             "smbfs"};

bool IsRemote(const Mount& mount) { return std::ranges::binary_search(kRemoteTypes, mount.type); }

// --- The disk below a volume, as sysfs tells of it

/// The attribute of a disk. A partition has none of its own and lies in its disk's folder.
std::string DiskAttribute(const std::string& device, const std::string& name) {
  for (const char* up : {"/", "/../"}) {
    Result<std::string> text = ReadSystemFile(device + up + name);
    if (text) return text.Value().substr(0, text.Value().find('\n'));
  }
  return {};
}

bool Exists(const std::string& path) { return ::access(path.c_str(), F_OK) == 0; }

/// Where the device hangs, which the link to its folder says:
/// "../../devices/pci0000:00/0000:00:14.0/usb1/1-2/.../block/sdb/sdb1".
std::string DevicePath(const std::string& device) {
  std::array<char, PATH_MAX> target;
  const ssize_t size = ::readlink(device.c_str(), target.data(), target.size());
  return size < 0 ? device : std::string(target.data(), static_cast<std::size_t>(size));
}

/// Whether a component of the path is the word and a number, as in usb1 and fw0.
bool HasNumbered(std::string_view path, std::string_view word) {
  const auto isDigit = [](char c) { return c >= '0' && c <= '9'; };
  for (std::size_t at = path.find(word); at != path.npos; at = path.find(word, at + 1)) {
    const std::size_t number = at + word.size();
    const std::size_t end = std::min(path.find('/', number), path.size());
    const std::string_view digits = path.substr(number, end - number);
    if (at > 0 && path[at - 1] == '/' && !digits.empty() && std::ranges::all_of(digits, isDigit))
      return true;
  }
  return false;
}

bool HangsOutside(std::string_view devicePath) {
  return HasNumbered(devicePath, "usb") || HasNumbered(devicePath, "fw");
}

/// The disks that a device-mapper or md device stands on.
std::vector<std::string> Slaves(const std::string& device) {
  std::vector<std::string> slaves;
  std::error_code ignored;
  for (const auto& entry : std::filesystem::directory_iterator(device + "/slaves", ignored)) {
    slaves.push_back(entry.path());
  }
  return slaves;
}

bool IsEjectable(const std::string& device, int depth = 0) {
  if (HangsOutside(DevicePath(device))) return true;
  if (DiskAttribute(device, "removable") == "1") return true;
  // Of an MMC host's slot "SD" can be taken out, "MMC" is soldered.
  if (DiskAttribute(device, "device/type").starts_with("SD")) return true;
  if (depth == kMostSlaves) return false;
  return std::ranges::any_of(Slaves(device),
                             [&](const auto& slave) { return IsEjectable(slave, depth + 1); });
}

bool IsOptical(const std::string& device) {
  constexpr std::string_view kScsiOptical = "5";
  return DiskAttribute(device, "device/type") == kScsiOptical;
}

/// sysfs has "!" for the "/" of such names as cciss/c0d0.
std::string SysfsName(std::string_view source) {
  std::string name(source.substr(source.rfind("/dev/", 0) == 0 ? 5 : source.size()));
  std::ranges::replace(name, '/', '!');
  return name;
}

/// A mapping's source is the link that udev makes; the kernel calls its device dm-0 and the like.
std::string MappedDevice(const std::string& sysfs, std::string_view source) {
  constexpr std::string_view kMapper = "/dev/mapper/";
  if (!source.starts_with(kMapper)) return {};
  std::error_code ignored;
  for (const auto& entry : std::filesystem::directory_iterator(sysfs + "/block", ignored)) {
    if (DiskAttribute(entry.path(), "dm/name") == source.substr(kMapper.size()))
      return entry.path();
  }
  return {};
}

/// The folder in sysfs of the device that a volume is on; empty when it is on none. Volumes of
/// several devices, such as those of btrfs, have no device number and are found by their source.
std::string FindDevice(const std::string& sysfs, const Mount& mount) {
  if (mount.device.major != 0) {
    const std::string number =
        std::to_string(mount.device.major) + ':' + std::to_string(mount.device.minor);
    if (std::string device = sysfs + "/dev/block/" + number; Exists(device)) return device;
  }
  const std::string name = SysfsName(mount.source);
  if (name.empty()) return {};
  for (const char* folder : {"/class/block/", "/block/"}) {
    if (std::string device = sysfs + folder + name; Exists(device)) return device;
  }
  return MappedDevice(sysfs, mount.source);
}

bool CallerMayWrite(const Mount& mount) {
  return !mount.readOnly && ::faccessat(AT_FDCWD, mount.folder.c_str(), W_OK, AT_EACCESS) == 0;
}

DriveTraits TraitsOf(const Mount& mount, const std::string& sysfs) {
  if (IsRemote(mount)) return {.remote = true};
  DriveTraits traits;
  traits.writable = CallerMayWrite(mount);
  const std::string device = FindDevice(sysfs, mount);
  if (device.empty()) return traits;
  traits.optical = IsOptical(device);
  traits.ejectable = traits.optical || IsEjectable(device);
  traits.writable &= DiskAttribute(device, "ro") != "1";
  return traits;
}

// --- The volume of an item

using StatusRecord = struct statx;

Result<StatusRecord> ReadMountId(const std::string& path, unsigned wanted) {
  constexpr int kFlags = AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT | AT_STATX_DONT_SYNC;
  StatusRecord status;
  const auto ask = [&] { return ::statx(AT_FDCWD, path.c_str(), kFlags, wanted, &status); };
  if (Retry(ask) != 0) return LastError();
  return status;
}

VolumeId IdOf(std::uint64_t mount, DeviceNumber device) {
  return {mount, std::uint64_t{device.major} << 32 | device.minor};
}

VolumeId IdOf(const StatusRecord& status) {
  if ((status.stx_mask & kUniqueMountId) != 0) return {status.stx_mnt_id, 0};
  const bool known = (status.stx_mask & STATX_MNT_ID) != 0;
  return IdOf(known ? status.stx_mnt_id : 0, {status.stx_dev_major, status.stx_dev_minor});
}

/// Keeps the mount table for a second: the questions about 10,000 items should not read it 10,000
/// times. Guarded by its lock.
class RecentMountTable {
 public:
  explicit RecentMountTable(std::string file) : file_(std::move(file)) {}

  /// The network mount that a path is on by its text.
  std::optional<Mount> FindRemote(std::string_view path) {
    const std::lock_guard lock(mutex_);
    if (!freshUntil_ || Clock::now() >= *freshUntil_) Refresh();
    const Mount* mount = hasRemote_ ? table_.FindByPath(path) : nullptr;
    return mount != nullptr && IsRemote(*mount) ? std::optional(*mount) : std::nullopt;
  }

  /// The mount with the number or, where the kernel tells none, the path's. A number that is not
  /// known may be that of a new mount.
  std::optional<Mount> Find(std::optional<std::uint64_t> id, std::string_view path) {
    const std::lock_guard lock(mutex_);
    const Mount* mount = id ? table_.FindById(*id) : nullptr;
    if (mount == nullptr) Refresh();
    if (mount == nullptr && id) mount = table_.FindById(*id);
    if (mount == nullptr) mount = table_.FindByPath(path);
    return mount != nullptr ? std::optional(*mount) : std::nullopt;
  }

 private:
  void Refresh() {
    Result<MountTable> table = MountTable::Read(file_);
    table_ = table ? std::move(table).Value() : MountTable();
    hasRemote_ = std::ranges::any_of(table_.Mounts(), IsRemote);
    freshUntil_ = Clock::now() + kTableAge;
  }

  const std::string file_;
  std::mutex mutex_;
  MountTable table_;
  bool hasRemote_ = false;
  std::optional<Clock::time_point> freshUntil_;
};

class SystemDrives final : public Drives {
 public:
  explicit SystemDrives(SystemRoots roots)
      : sysfs_(std::move(roots.sysfs)), mounts_(std::move(roots.mountTable)) {}

  Result<VolumeId> VolumeOf(const std::string& path) const override {
    const ErrnoKeeper errnoKeeper;
    if (const auto remote = mounts_.FindRemote(path)) return IdOf(remote->id, remote->device);
    const Result<StatusRecord> status = ReadMountId(path, kUniqueMountId);
    if (!status) return status.Reason();
    return IdOf(status.Value());
  }

  Result<DriveTraits> Read(const std::string& path) const override {
    const ErrnoKeeper errnoKeeper;
    if (mounts_.FindRemote(path)) return DriveTraits{.remote = true};
    const Result<StatusRecord> status = ReadMountId(path, STATX_MNT_ID);
    if (!status) return status.Reason();
    const bool known = (status.Value().stx_mask & STATX_MNT_ID) != 0;
    const auto id = known ? std::optional<std::uint64_t>(status.Value().stx_mnt_id) : std::nullopt;
    const std::optional<Mount> mount = mounts_.Find(id, path);
    if (!mount) return kNoSuchItem;
    return TraitsOf(*mount, sysfs_);
  }

 private:
  const std::string sysfs_;
  mutable RecentMountTable mounts_;
};

constinit std::atomic<const Drives*> currentDrives = nullptr;

}  // namespace

std::unique_ptr<const Drives> MakeDrives(SystemRoots roots) {
  return std::make_unique<SystemDrives>(std::move(roots));
}

const Drives& Drives::Current() {
  static const SystemDrives systemDrives{SystemRoots()};
  const Drives* replacement = currentDrives.load(std::memory_order_acquire);
  return replacement != nullptr ? *replacement : systemDrives;
}

ScopedDrives::ScopedDrives(const Drives& replacement)
    : previous_(currentDrives.exchange(&replacement)) {}

ScopedDrives::~ScopedDrives() { currentDrives.store(previous_); }

}  // namespace orb::platform

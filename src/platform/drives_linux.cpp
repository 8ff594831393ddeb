// SPDX-License-Identifier: MIT
#include "platform/drives.h"

#include <fcntl.h>
#include <linux/magic.h>
#include <linux/major.h>
#include <sys/stat.h>
#include <sys/vfs.h>
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

#include "platform/linux/mount_number.h"
#include "platform/linux/posix.h"
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

// --- The device below a volume, as sysfs tells of it

/// A disk, a partition, or what is made of such ones.
struct Device {
  /// Its folder in sysfs, by a link, and that of the disk which a partition is on.
  std::string folder;
  std::string disk;
  /// Where the link leads: "../../devices/pci0000:00/0000:00:14.0/usb1/1-2/.../block/sdb/sdb1".
  std::string path;
};

/// Whether a component of the path is the word and a number, as in usb1 and fw0.
bool HasNumbered(std::string_view path, std::string_view word) {
  const auto isDigit = [](char c) { return c >= '0' && c <= '9'; };
  for (std::size_t at = path.find(word); at != path.npos; at = path.find(word, at + 1)) {
    const std::size_t number = at + word.size();
    const std::size_t end = std::min(path.find('/', number), path.size());
    const std::string_view digits = path.substr(number, end - number);
    const bool begins = at > 0 && path[at - 1] == '/';
    if (begins && !digits.empty() && std::ranges::all_of(digits, isDigit)) return true;
  }
  return false;
}

bool IsTakenOut(const Device& device) {
  return HasNumbered(device.path, "usb") || HasNumbered(device.path, "fw");
}

/// By their drivers, which know no media that are changed. What a virtual SCSI adapter shows is
/// another matter.
bool IsNeverTakenOut(const Device& device) {
  if (IsTakenOut(device)) return false;
  const std::string_view above =
      std::string_view(device.path).substr(0, device.path.find("/block/"));
  const std::size_t last = above.rfind('/');
  return HasNumbered(device.path, "nvme") ||
         (last != above.npos && HasNumbered(above.substr(last), "virtio"));
}

/// A disk lies in a folder "block", and its partitions in that of the disk; where the path does not
/// show it, an attribute does.
bool IsPartition(const Device& device) {
  const std::string_view path = device.path;
  const std::string_view above = path.substr(0, path.rfind('/'));
  if (path.find("/devices/") != path.npos && above.ends_with("/block")) return false;
  return ::access((device.folder + "/partition").c_str(), F_OK) == 0;
}

std::optional<Device> FindDevice(const std::string& folder) {
  std::array<char, PATH_MAX> target;
  const ssize_t size = ::readlink(folder.c_str(), target.data(), target.size());
  if (size < 0 && errno != EINVAL) return std::nullopt;  // EINVAL: a folder, and no link.
  Device device{folder, folder, size < 0 ? folder : std::string(target.data(), std::size_t(size))};
  if (!IsNeverTakenOut(device) && IsPartition(device)) device.disk += "/..";
  return device;
}

/// Empty when there is none.
std::string ReadAttribute(const std::string& folder, const char* name) {
  const std::string path = folder + '/' + name;
  const UniqueFd file(Retry([&] { return ::open(path.c_str(), O_RDONLY | O_CLOEXEC); }));
  if (!file) return {};
  std::array<char, 64> text;
  const ssize_t size = Retry([&] { return ::read(file.Get(), text.data(), text.size()); });
  const std::string_view line(text.data(), static_cast<std::size_t>(std::max<ssize_t>(size, 0)));
  return std::string(line.substr(0, line.find('\n')));
}

/// Only devices that the kernel makes of others stand on some.
bool IsPhysical(const Device& device) {
  return device.path.find("/devices/") != std::string::npos &&
         device.path.find("/virtual/") == std::string::npos;
}

/// The disks and partitions that a device-mapper or md device stands on.
std::vector<Device> Slaves(const Device& device) {
  std::vector<Device> slaves;
  std::error_code ignored;
  for (const auto& entry :
       std::filesystem::directory_iterator(device.folder + "/slaves", ignored)) {
    if (auto slave = FindDevice(entry.path())) slaves.push_back(*std::move(slave));
  }
  return slaves;
}

/// Of a SCSI device its kind, where 5 is an optical drive; of a card "SD", or "MMC" for one that is
/// soldered in.
std::string TypeOf(const Device& device) {
  const std::string_view name = std::string_view(device.path).substr(device.path.rfind('/') + 1);
  if (name.starts_with("sd")) return {};  // A SCSI disk: the kernel calls optical drives sr.
  return ReadAttribute(device.disk, "device/type");
}

bool IsEjectable(const Device& device, const std::string& type, int depth = 0) {
  if (IsTakenOut(device)) return true;
  if (type.starts_with("SD") || ReadAttribute(device.disk, "removable") == "1") return true;
  if (IsPhysical(device) || depth == kMostSlaves) return false;
  return std::ranges::any_of(Slaves(device), [&](const auto& slave) {
    return IsEjectable(slave, TypeOf(slave), depth + 1);
  });
}

/// sysfs has "!" for the "/" of such names as cciss/c0d0.
std::string SysfsName(std::string_view source) {
  constexpr std::string_view kDevices = "/dev/";
  if (!source.starts_with(kDevices)) return {};
  std::string name(source.substr(kDevices.size()));
  std::ranges::replace(name, '/', '!');
  return name;
}

/// A mapping's source is the link that udev makes; the kernel calls its device dm-0 and the like.
std::optional<Device> FindMapping(const std::string& sysfs, std::string_view source) {
  constexpr std::string_view kMapper = "/dev/mapper/";
  if (!source.starts_with(kMapper)) return std::nullopt;
  std::error_code ignored;
  for (const auto& entry : std::filesystem::directory_iterator(sysfs + "/block", ignored)) {
    const std::string folder = entry.path();
    if (ReadAttribute(folder, "dm/name") == source.substr(kMapper.size())) {
      return FindDevice(folder);
    }
  }
  return std::nullopt;
}

std::optional<Device> FindDevice(const std::string& sysfs, DeviceNumber number) {
  return FindDevice(sysfs + "/dev/block/" + std::to_string(number.major) + ':' +
                    std::to_string(number.minor));
}

/// The device that a volume is on, if it is on one. Volumes that may be on several, such as those
/// of btrfs, have no device number and are found by their source.
std::optional<Device> FindDevice(const std::string& sysfs, const Mount& mount) {
  if (mount.device.major != 0) {
    if (auto device = FindDevice(sysfs, mount.device)) return device;
  }
  const std::string name = SysfsName(mount.source);
  if (name.empty()) return std::nullopt;
  if (auto device = FindDevice(sysfs + "/class/block/" + name)) return device;
  if (auto device = FindDevice(sysfs + "/block/" + name)) return device;
  return FindMapping(sysfs, mount.source);
}

bool CallerMayWrite(const Mount& mount, const Device& device) {
  if (mount.readOnly || ReadAttribute(device.folder, "ro") == "1") return false;
  if (device.folder != device.disk && ReadAttribute(device.disk, "ro") == "1") return false;
  return ::faccessat(AT_FDCWD, mount.folder.c_str(), W_OK, AT_EACCESS) == 0;
}

/// Nothing where there is none that a volume could be on.
DriveTraits TraitsOf(const std::optional<Device>& device) {
  constexpr std::string_view kScsiOptical = "5";
  if (!device || IsNeverTakenOut(*device)) return {};
  const std::string type = TypeOf(*device);
  const bool optical = type == kScsiOptical;
  return {.optical = optical, .ejectable = optical || IsEjectable(*device, type)};
}

DriveTraits TraitsOf(const Mount& mount, const std::string& sysfs) {
  if (IsRemote(mount)) return {.remote = true};
  const std::optional<Device> device = FindDevice(sysfs, mount);
  DriveTraits traits = TraitsOf(device);
  traits.writable = traits.ejectable && CallerMayWrite(mount, *device);
  return traits;
}

/// Where something else has been put in the place of the kernel's files, the kernel does not know.
bool IsOfKernel(const std::string& path, decltype(statfs::f_type) type) {
  struct statfs volume;
  return ::statfs(path.c_str(), &volume) == 0 && volume.f_type == type;
}

/// File systems that are on one disk of this machine, to which their number leads.
bool IsOnOneDisk(const MountedVolume& volume) {
  constexpr std::uint64_t kTypes[] = {EXFAT_SUPER_MAGIC,
                                      EXT4_SUPER_MAGIC,
                                      F2FS_SUPER_MAGIC,
                                      ISOFS_SUPER_MAGIC,
                                      MSDOS_SUPER_MAGIC,
                                      SQUASHFS_MAGIC,
                                      XFS_SUPER_MAGIC};
  return volume.device.major != 0 && std::ranges::find(kTypes, volume.magic) != std::end(kTypes);
}

/// Images in files are not taken out, and sysfs would take longer to say so than all the rest.
bool IsFixed(const MountedVolume& volume, const std::string& sysfs) {
  if (!IsOnOneDisk(volume)) return false;
  if (volume.device.major == LOOP_MAJOR && IsOfKernel(sysfs, SYSFS_MAGIC)) return true;
  const std::optional<Device> device = FindDevice(sysfs, volume.device);
  return device && !TraitsOf(device).ejectable;
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

bool IsOnRemote(const MountTable& table, std::string_view path) {
  const Mount* mount = table.FindByPath(path);
  return mount != nullptr && IsRemote(*mount);
}

/// The same place from the root, without "//", "." and "..". Nothing where a ".." leaves a folder
/// that may be a link: what that means only the kernel knows. On a network mount it is taken by the
/// text, for the kernel would ask the server.
std::optional<std::string> PlainPath(const MountTable& table, std::string_view path) {
  std::string plain;
  if (!path.starts_with('/')) {
    std::error_code failed;
    plain = std::filesystem::current_path(failed);
    if (failed) return std::nullopt;
    if (plain == "/") plain.clear();
  }
  while (!path.empty()) {
    const std::string_view name = path.substr(0, path.find('/'));
    path.remove_prefix(std::min(name.size() + 1, path.size()));
    if (name == "..") {
      if (!IsOnRemote(table, plain)) return std::nullopt;
      plain.erase(plain.rfind('/'));
    } else if (!name.empty() && name != ".") {
      plain.append("/").append(name);
    }
  }
  return plain;
}

/// Keeps the mount table for a second: the questions about 10,000 items should not read it 10,000
/// times. Guarded by its lock.
class RecentMountTable {
 public:
  explicit RecentMountTable(std::string file) : file_(std::move(file)) {}

  /// Whether it has been read so lately that it serves for now.
  bool IsFresh() {
    const std::lock_guard lock(mutex_);
    return freshUntil_ && Clock::now() < *freshUntil_;
  }

  /// The network mount that a path is on by its text.
  std::optional<Mount> FindRemote(std::string_view path) {
    const std::lock_guard lock(mutex_);
    if (!freshUntil_ || Clock::now() >= *freshUntil_) Refresh();
    const auto plain = hasRemote_ ? PlainPath(table_, path) : std::nullopt;
    const Mount* mount = plain ? table_.FindByPath(*plain) : nullptr;
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

/// Without the table an answer takes longer, but reading the table takes as long as many answers.
constexpr int kMostWithoutTable = 16;

class SystemDrives final : public Drives {
 public:
  explicit SystemDrives(SystemRoots roots)
      : sysfs_(std::move(roots.sysfs)),
        isOfKernel_(IsOfKernel(roots.mountTable, PROC_SUPER_MAGIC)),
        mounts_(std::move(roots.mountTable)) {}

  Result<VolumeId> VolumeOf(const std::string& path) const override {
    const ErrnoKeeper errnoKeeper;
    if (MayDoWithoutTable()) {
      if (const auto number = MountNumberInMemory(path)) return VolumeId{*number, 0};
    }
    if (const auto remote = mounts_.FindRemote(path)) return IdOf(remote->id, remote->device);
    const Result<StatusRecord> status = ReadMountId(path, kUniqueMountId);
    if (!status) return status.Reason();
    return IdOf(status.Value());
  }

  Result<DriveTraits> Read(const std::string& path, const VolumeId& volume) const override {
    const ErrnoKeeper errnoKeeper;
    const bool hasUniqueNumber = volume.device == 0;
    if (isOfKernel_ && hasUniqueNumber) {
      const auto known = ReadVolume(volume.mount);
      if (known && IsFixed(*known, sysfs_)) return DriveTraits{};
      if (const auto mount = ReadMount(volume.mount)) return TraitsOf(*mount, sysfs_);
    }
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
  bool MayDoWithoutTable() const {
    if (!isOfKernel_ || mounts_.IsFresh()) return false;
    if (withoutTable_.fetch_add(1, std::memory_order_relaxed) < kMostWithoutTable) return true;
    withoutTable_.store(0, std::memory_order_relaxed);
    return false;
  }

  const std::string sysfs_;
  const bool isOfKernel_;
  mutable RecentMountTable mounts_;
  mutable std::atomic<int> withoutTable_ = 0;
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

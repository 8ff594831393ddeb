// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "platform/error.h"

namespace orb::platform {

/// Tells a volume from all others that the process meets: the mount's number that the kernel never
/// gives out again, where it has one; else the one that it uses again, and the device.
struct VolumeId {
  std::uint64_t mount = 0;
  std::uint64_t device = 0;

  bool operator==(const VolumeId&) const = default;
};

/// What kind of drive a volume is on.
struct DriveTraits {
  /// The medium of an optical drive. An image of one in a file is not.
  bool optical = false;
  /// Not local: on another machine, or served by a program that fetches it from there.
  bool remote = false;
  /// Meant to be taken out: the disk says so, or hangs on USB or FireWire or in an SD slot.
  bool ejectable = false;
  /// It can be taken out, and the caller may write to the folder where it is mounted.
  bool writable = false;
};

/// The service that tells kinds of drives apart. Everything may be called from any thread. An item
/// whose path lies below a network mount is not looked at, so that a server that is gone does not
/// hang the answer; for a second after it was mounted it may not be known for one.
class Drives {
 public:
  /// The system's, unless a test has put another in place.
  static const Drives& Current();

  virtual ~Drives() = default;

  /// The volume of the item itself; a link is not followed.
  virtual Result<VolumeId> VolumeOf(const std::string& path) const = 0;
  /// Of the volume that VolumeOf() has just given for the path.
  virtual Result<DriveTraits> Read(const std::string& path, const VolumeId& volume) const = 0;
};

/// Where the system tells of itself; tests lay out machines of their own.
struct SystemRoots {
  std::string mountTable = "/proc/self/mountinfo";
  std::string sysfs = "/sys";
};

std::unique_ptr<const Drives> MakeDrives(SystemRoots roots);

/// Puts other drives in place of the current ones while it lives. For tests; not while another
/// thread asks.
class ScopedDrives {
 public:
  explicit ScopedDrives(const Drives& replacement);
  ~ScopedDrives();
  ScopedDrives(const ScopedDrives&) = delete;
  ScopedDrives& operator=(const ScopedDrives&) = delete;

 private:
  const Drives* previous_;
};

}  // namespace orb::platform

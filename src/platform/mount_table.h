// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "platform/error.h"

namespace orb::platform {

/// The kernel's number of a device; the major number 0 stands for no device at all.
struct DeviceNumber {
  std::uint32_t major = 0;
  std::uint32_t minor = 0;

  bool operator==(const DeviceNumber&) const = default;
};

/// One line of the mount table.
struct Mount {
  /// Used again for another mount once this one has ended.
  std::uint64_t id = 0;
  DeviceNumber device;
  /// Where the volume is seen.
  std::string folder;
  /// "ext4", "nfs4", "fuse.sshfs", ...
  std::string type;
  /// What was mounted: a device's path, a share's address, or any word.
  std::string source;
  bool readOnly = false;
};

/// What is mounted where, as it was when it was read. Nothing of it touches a volume, so that a
/// server that is gone does not hang a question.
class MountTable {
 public:
  MountTable() = default;
  /// Lines that are no mounts are left out.
  explicit MountTable(std::string_view text);
  /// `file` is laid out like /proc/self/mountinfo.
  static Result<MountTable> Read(const std::string& file);

  /// In the order in which they were made.
  const std::vector<Mount>& Mounts() const { return mounts_; }
  /// Null when there is none.
  const Mount* FindById(std::uint64_t id) const;
  /// By the text of an absolute path, for when the kernel is not or cannot be asked: links and ".."
  /// are not understood. Of two mounts at one folder the later one hides the other.
  const Mount* FindByPath(std::string_view path) const;

 private:
  std::vector<Mount> mounts_;
};

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace orb::platform {

/// The service that answers questions about the volume that holds an item. Everything may be called
/// from any thread.
class Volumes {
 public:
  /// The system's, unless a test has put another in place.
  static const Volumes& Current();

  virtual ~Volumes() = default;

  /// The bytes that the caller may still write to the volume at a path, following links. Nothing
  /// when nobody knows: nothing is there, or the volume keeps no count.
  virtual std::optional<std::uint64_t> AvailableCapacity(const std::string& path) const = 0;
};

/// Puts other volumes in place of the current ones while it lives. For tests; not while another
/// thread asks.
class ScopedVolumes {
 public:
  explicit ScopedVolumes(const Volumes& replacement);
  ~ScopedVolumes();
  ScopedVolumes(const ScopedVolumes&) = delete;
  ScopedVolumes& operator=(const ScopedVolumes&) = delete;

 private:
  const Volumes* previous_;
};

}  // namespace orb::platform

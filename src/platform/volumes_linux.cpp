// SPDX-License-Identifier: MIT
#include "platform/volumes.h"

#include <sys/statvfs.h>

#include <atomic>
#include <limits>

#include "platform/linux/posix.h"

namespace orb::platform {

namespace {

std::uint64_t SaturatingProduct(std::uint64_t a, std::uint64_t b) {
  std::uint64_t product = 0;
  return __builtin_mul_overflow(a, b, &product) ? std::numeric_limits<std::uint64_t>::max()
                                                : product;
}

class SystemVolumes final : public Volumes {
 public:
  std::optional<std::uint64_t> AvailableCapacity(const std::string& path) const override {
    const ErrnoKeeper errnoKeeper;
    struct statvfs volume;
    if (Retry([&] { return ::statvfs(path.c_str(), &volume); }) != 0) return std::nullopt;
    if (volume.f_blocks == 0) return std::nullopt;
    return SaturatingProduct(volume.f_bavail, volume.f_frsize);
  }
};

const SystemVolumes systemVolumes;
constinit std::atomic<const Volumes*> currentVolumes = nullptr;

}  // namespace

const Volumes& Volumes::Current() {
  const Volumes* replacement = currentVolumes.load(std::memory_order_acquire);
  return replacement != nullptr ? *replacement : systemVolumes;
}

ScopedVolumes::ScopedVolumes(const Volumes& replacement)
    : previous_(currentVolumes.exchange(&replacement)) {}

ScopedVolumes::~ScopedVolumes() { currentVolumes.store(previous_); }

}  // namespace orb::platform

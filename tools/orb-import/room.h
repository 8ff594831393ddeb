// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "plan.h"

namespace orbimport {

/// A volume on which plans do not all find room.
struct Shortage {
  std::string folder;        // In DESTINATION, on that volume.
  std::uint64_t needed = 0;  // Bytes, in whole blocks where that is known.
  std::uint64_t available = 0;
};

/// Whether it can be told that plans will fill a volume. Only what is certain counts: of a volume
/// that may compress or pack what it keeps, or that does not tell, less is believed.
std::optional<Shortage> FindShortage(const std::vector<ShotPlan>& plans,
                                     const std::vector<Item>& items,
                                     const std::string& destination);

}  // namespace orbimport

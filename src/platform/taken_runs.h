// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "platform/held_folder.h"

/// \file
/// Remembers of the series of names that were numbered last which numbers are taken, so that the
/// next free one is found at once. It is exact: the kernel reports every name that leaves a folder,
/// whoever removes or renames it, and what may have been one of the series ends the knowledge.
/// Where the kernel does not see everybody's changes, as on a network volume, nothing is
/// remembered.
///
/// Costs one descriptor and the watch of a few folders, so it is for long series. Where the kernel
/// grants no more of them, nothing is remembered. May be called from any thread; a forked child
/// begins anew.

namespace orb::platform {

/// What is known of a series in a folder.
struct TakenRun {
  /// All numbers below are taken.
  std::uint32_t end = 0;
  /// Stands for what is known; 0 where nothing can be remembered.
  std::uint64_t ticket = 0;
};

/// The series is known by its first name.
TakenRun RecallRun(const HeldFolder& folder, const std::string& name);

/// Gives a ticket. From now on it is seen what leaves the folder: look then which numbers are
/// taken, from the first one on, and keep that. All names of the series begin with `stem`.
std::uint64_t WatchRun(const HeldFolder& folder, const std::string& name, const std::string& stem);

/// For numbers that were taken, all of them, at some time since the ticket was given. It is
/// forgotten again when one may have left since.
void KeepRun(const TakenRun& run);

/// Whether an entry of this name may be one whose name begins with `stem`, also where the volume
/// takes several spellings for one name: those agree in their ASCII letters but for the case.
bool MayBeginWith(std::string_view name, std::string_view stem);

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/platform/core_foundation.h>

#include <cstdint>

#include "platform/items.h"

namespace orb {

/// 100-ns ticks since 1904, exact to the tick below. Times before 1904 give 0, and those that ticks
/// cannot count give the last one that they can.
std::uint64_t TicksOf(platform::Timestamp time);
/// The fraction goes to 1/65536 s, downwards.
UTCDateTime UtcOf(platform::Timestamp time);
/// Whole seconds: the fraction is dropped.
platform::Timestamp TimestampOf(const UTCDateTime& time);

}  // namespace orb

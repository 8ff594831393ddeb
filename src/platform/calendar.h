// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>

#include "platform/civil.h"

namespace orb::platform {

/// \file
/// Local time: that of the zone in TZ, else of the system's zone. A changed TZ is noticed at once,
/// a changed zone of the system within a second. Instants are seconds since 1970-01-01 00:00:00
/// GMT. Both functions may be called from any thread and have the same answer on each.

CivilTime LocalFromInstant(std::int64_t instant);

/// The fields must be in range; the year may be any that 32 bits hold. Fields that a clock change
/// repeats give the earlier of the two instants; fields that it skips are read with the offset that
/// was in force before the change.
std::int64_t InstantFromLocal(const CivilTime& local);

}  // namespace orb::platform

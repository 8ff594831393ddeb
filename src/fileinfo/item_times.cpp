// SPDX-License-Identifier: MIT
#include "fileinfo/item_times.h"

#include <orb/time/time.h>

#include <limits>

namespace orb {

namespace {

constexpr std::uint64_t kTicksPerSecond = 10'000'000;
constexpr std::uint32_t kNanosecondsPerTick = 100;
/// From 1904-01-01 to 1970-01-01.
constexpr std::int64_t kSecondsTo1970 = 2'082'844'800;
constexpr std::uint64_t kLastTick = std::numeric_limits<std::uint64_t>::max();
constexpr std::int64_t kLastSecond = kLastTick / kTicksPerSecond - 1 - kSecondsTo1970;

}  // namespace

std::uint64_t TicksOf(platform::Timestamp time) {
  if (time.seconds < -kSecondsTo1970) return 0;
  if (time.seconds > kLastSecond) return kLastTick;
  const auto seconds = static_cast<std::uint64_t>(time.seconds + kSecondsTo1970);
  return seconds * kTicksPerSecond + time.nanoseconds / kNanosecondsPerTick;
}

UTCDateTime UtcOf(platform::Timestamp time) {
  return COrbTime(static_cast<unsigned long long>(TicksOf(time))).GetUTCTime();
}

platform::Timestamp TimestampOf(const UTCDateTime& time) {
  const std::int64_t seconds = std::int64_t{time.highSeconds} << 32 | time.lowSeconds;
  return {seconds - kSecondsTo1970, 0};
}

}  // namespace orb

// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>

namespace orb::platform {

/// Calendar fields in the Gregorian calendar, without a zone of their own.
struct CivilTime {
  std::int64_t year = 1970;
  unsigned month = 1;
  unsigned day = 1;
  unsigned hour = 0;
  unsigned minute = 0;
  unsigned second = 0;

  bool operator==(const CivilTime&) const = default;
};

constexpr std::int64_t kSecondsPerDay = 86400;

/// Days from 1970-01-01 to a date. The year is taken to begin in March, so that the leap day is its
/// last; 400 of them are always 146097 days.
constexpr std::int64_t DaysFromCivil(std::int64_t year, unsigned month, unsigned day) {
  if (month <= 2) --year;
  const std::int64_t era = (year >= 0 ? year : year - 399) / 400;
  const std::int64_t yearOfEra = year - era * 400;
  const std::int64_t dayOfYear = (153 * (month > 2 ? month - 3 : month + 9) + 2) / 5 + day - 1;
  return era * 146097 + yearOfEra * 365 + yearOfEra / 4 - yearOfEra / 100 + dayOfYear - 719468;
}

/// Seconds from 1970-01-01 00:00:00 to the fields, as if every day had 86400.
constexpr std::int64_t SecondsFromCivil(const CivilTime& civil) {
  const std::int64_t minuteOfDay = std::int64_t{civil.hour} * 60 + civil.minute;
  return DaysFromCivil(civil.year, civil.month, civil.day) * kSecondsPerDay + minuteOfDay * 60 +
         civil.second;
}

/// Seconds from 0000-03-01 to 1970-01-01, and those of 400 years.
constexpr std::int64_t kSecondsToEpoch = 719468 * kSecondsPerDay;
constexpr std::int64_t kSecondsPerEra = 146097 * kSecondsPerDay;

/// The date of a day, counted from 0000-03-01. Centuries, years and months have lengths that are
/// all but even, so each comes from one linear function: the months of a year that begins in March
/// lie 30.59 days apart, which is 2^16 / 2141 parts.
constexpr CivilTime DateOfDay(std::uint64_t day) {
  constexpr std::uint32_t kYearParts = 2939745;  // 2^32 / 1461, rounded up: parts of a quarter day.
  const std::uint64_t century = (4 * day + 3) / 146097;
  const auto quarter = static_cast<std::uint32_t>((4 * day + 3) % 146097 | 3);
  const std::uint64_t years = std::uint64_t{quarter} * kYearParts;
  const std::uint32_t dayOfYear = static_cast<std::uint32_t>(years) / kYearParts / 4;
  const std::uint32_t months = 2141 * dayOfYear + 197913;
  const bool isNextYear = dayOfYear >= 306;  // January and February.
  CivilTime civil;
  civil.year = static_cast<std::int64_t>(100 * century + (years >> 32) + (isNextYear ? 1 : 0));
  civil.month = (months >> 16) - (isNextYear ? 12 : 0);
  civil.day = (months & 0xFFFF) / 2141 + 1;
  return civil;
}

/// The instant may be any within 290 billion years.
constexpr CivilTime CivilFromSeconds(std::int64_t seconds) {
  // Before the year 0 the calendar is read as many times 400 years later.
  const std::int64_t eras =
      seconds >= -kSecondsToEpoch ? 0 : 1 - (seconds + kSecondsToEpoch) / kSecondsPerEra;
  const auto counted =
      static_cast<std::uint64_t>(seconds + kSecondsToEpoch + eras * kSecondsPerEra);
  const auto secondOfDay = static_cast<unsigned>(counted % kSecondsPerDay);
  CivilTime civil = DateOfDay(counted / kSecondsPerDay);
  civil.year -= 400 * eras;
  civil.hour = secondOfDay / 3600;
  civil.minute = secondOfDay / 60 % 60;
  civil.second = secondOfDay % 60;
  return civil;
}

}  // namespace orb::platform

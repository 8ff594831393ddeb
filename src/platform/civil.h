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

constexpr CivilTime CivilFromSeconds(std::int64_t seconds) {
  std::int64_t days = seconds / kSecondsPerDay;
  std::int64_t secondOfDay = seconds % kSecondsPerDay;
  if (secondOfDay < 0) {
    secondOfDay += kSecondsPerDay;
    --days;
  }
  days += 719468;  // From 0000-03-01.
  const std::int64_t era = (days >= 0 ? days : days - 146096) / 146097;
  const auto dayOfEra = static_cast<unsigned>(days - era * 146097);
  const unsigned yearOfEra =
      (dayOfEra - dayOfEra / 1460 + dayOfEra / 36524 - dayOfEra / 146096) / 365;
  const unsigned dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
  const unsigned monthFromMarch = (5 * dayOfYear + 2) / 153;
  const auto second = static_cast<unsigned>(secondOfDay);
  CivilTime civil;
  civil.month = monthFromMarch < 10 ? monthFromMarch + 3 : monthFromMarch - 9;
  civil.year = era * 400 + yearOfEra + (civil.month <= 2 ? 1 : 0);
  civil.day = dayOfYear - (153 * monthFromMarch + 2) / 5 + 1;
  civil.hour = second / 3600;
  civil.minute = second / 60 % 60;
  civil.second = second % 60;
  return civil;
}

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/platform/core_foundation.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

#include <cstdint>
#include <ctime>

/// A point in time: 100-ns ticks since 1904-01-01 00:00:00 GMT, and a further fraction of a second
/// where it came from a UTCDateTime. Calendar fields are local time in the Gregorian calendar. A
/// plain value without locks.
class ORB_EXPORT COrbTime {
 public:
  /// Empty: both members 0.
  COrbTime() = default;
  COrbTime(const COrbTime&) = default;
  COrbTime(const unsigned long long& tickCount);
  COrbTime(const UTCDateTime& record);
  COrbTime& operator=(const COrbTime&) = default;
  COrbTime& operator=(const unsigned long long& tickCount);
  COrbTime& operator=(const UTCDateTime& record);
  virtual ~COrbTime();

  /// Sets the time to now. Always 0.
  OrbResult GetCurrentTime();

  /// `ticks` and `fraction` as one number of ticks: what comparisons use.
  operator unsigned long long() const;

  /// The whole seconds, and both fractions added; a carry out of 16 bits is dropped.
  UTCDateTime GetUTCTime() const;
  operator UTCDateTime() const;

  bool IsEmpty() const;

  bool operator==(const COrbTime& other) const;
  bool operator!=(const COrbTime& other) const;
  bool operator<(const COrbTime& other) const;
  bool operator<=(const COrbTime& other) const;
  bool operator>(const COrbTime& other) const;
  bool operator>=(const COrbTime& other) const;

  /// Local calendar fields: full year, month 1 to 12, day 1 to 31, hour, minute, second,
  /// millisecond, microsecond within it (0 to 999) and tick within that (0 to 9). Null pointers are
  /// skipped. The last three come from `ticks` alone, not from `fraction`. Always 0.
  OrbResult GetTime(unsigned int* year,
                    unsigned int* month,
                    unsigned int* day,
                    unsigned int* hour,
                    unsigned int* minute,
                    unsigned int* second,
                    unsigned int* millisecond,
                    unsigned int* microsecond,
                    unsigned int* tick) const;

  /// The local calendar fields as a tm; tm_isdst is 0, and so are the members that are no such
  /// field.
  std::tm GetLocalTm();

  /// Sets the time from the fields of GetTime(). kOrbErrInvalidTime for a field out of range (the
  /// year is not tested), and the time stays as it was. A local time that a clock change skips or
  /// repeats gives one of the two instants, always the same. An instant before 1904 gives the empty
  /// time; one beyond what `ticks` can count (in the year 60359) wraps, as with a UTCDateTime.
  OrbResult Initialize(unsigned int year,
                       unsigned int month,
                       unsigned int day,
                       unsigned int hour,
                       unsigned int minute,
                       unsigned int second,
                       unsigned int millisecond,
                       unsigned int microsecond,
                       unsigned int tick);

  /// Sets the time from the digits of a text, whatever stands between them: yyyyMMddHHmmss, then
  /// milliseconds, microseconds and tick; what is missing is 0. kOrbErrUnknown for an empty text,
  /// kOrbErrInvalidTime as above; the time then stays as it was.
  OrbResult Initialize(const COrbStringData& text);

  /// The local time as text: compact yyyyMMddHHmmssSSS (`dateOnly` is ignored, a null `out`
  /// allowed), otherwise yyyy/MM/dd HH:mm:ss or, with `dateOnly`, yyyy/MM/dd; kOrbErrUnknown for a
  /// null `out`.
  OrbResult ConvertToString(COrbStringData* out, bool dateOnly, bool compact) const;

  std::uint64_t ticks = 0;
  /// In 1/65536 s, on top of `ticks`.
  std::uint16_t fraction = 0;
};

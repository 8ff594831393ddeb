// SPDX-License-Identifier: MIT
#include <orb/time/time.h>

#include <array>
#include <chrono>
#include <string>
#include <string_view>

#include "platform/calendar.h"
#include "strings/string_access.h"

namespace {

using orb::platform::CivilTime;

constexpr std::uint64_t kTicksPerSecond = 10'000'000;
constexpr std::uint64_t kTicksPerMillisecond = 10'000;
constexpr std::uint64_t kTicksPerMicrosecond = 10;
constexpr std::uint64_t kFractionsPerSecond = 65536;
/// From 1904-01-01 to 1970-01-01, both 00:00:00 GMT.
constexpr std::int64_t kSecondsTo1970 = 2'082'844'800;

std::uint64_t WholeSeconds(const UTCDateTime& record) {
  return std::uint64_t{record.highSeconds} << 32 | record.lowSeconds;
}

CivilTime LocalFields(std::uint64_t ticks) {
  const auto seconds = static_cast<std::int64_t>(ticks / kTicksPerSecond);
  return orb::platform::LocalFromInstant(seconds - kSecondsTo1970);
}

void Store(unsigned int* out, std::uint64_t field) {
  if (out != nullptr) *out = static_cast<unsigned int>(field);
}

bool IsLeapYear(unsigned int year) { return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0); }

unsigned int DaysInMonth(unsigned int year, unsigned int month) {
  constexpr std::array<unsigned int, 12> kDays = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  return month == 2 && IsLeapYear(year) ? 29 : kDays[month - 1];
}

/// The ticks of a second since 1904 and those within it.
std::uint64_t TicksAt(std::int64_t second, std::uint64_t within) {
  return second < 0 ? 0 : static_cast<std::uint64_t>(second) * kTicksPerSecond + within;
}

/// Digits of a text, `position` and `count` as in the compact form; 0 beyond their end.
unsigned int Field(std::string_view digits, std::size_t position, std::size_t count) {
  unsigned int number = 0;
  if (position >= digits.size()) return number;
  for (const char digit : digits.substr(position, count)) {
    number = number * 10 + static_cast<unsigned int>(digit - '0');
  }
  return number;
}

std::string DigitsOf(const COrbStringData& text) {
  std::string digits;
  const char* bytes = text.GetPtrSystemEncoding();
  if (bytes == nullptr) return digits;
  for (const char byte : std::string_view(bytes)) {
    if (byte >= '0' && byte <= '9') digits += byte;
  }
  return digits;
}

/// Writes the few characters of a time.
class TimeText {
 public:
  void Digits(std::uint64_t number, std::size_t count) {
    for (std::size_t i = count; i-- > 0; number /= 10) {
      text_[length_ + i] = static_cast<char>('0' + number % 10);
    }
    length_ += count;
  }
  void Year(std::int64_t year) { Digits(static_cast<std::uint64_t>(year), year > 9999 ? 5 : 4); }
  void Separator(char character) { text_[length_++] = character; }
  COrbStringData Text() const { return orb::StringAccess::FromUtf8({text_.data(), length_}); }

 private:
  std::array<char, 24> text_;
  std::size_t length_ = 0;
};

COrbStringData CompactText(std::uint64_t ticks) {
  const CivilTime local = LocalFields(ticks);
  TimeText text;
  text.Year(local.year);
  for (const unsigned field : {local.month, local.day, local.hour, local.minute, local.second}) {
    text.Digits(field, 2);
  }
  text.Digits(ticks % kTicksPerSecond / kTicksPerMillisecond, 3);
  return text.Text();
}

void AddField(TimeText* text, char separator, unsigned field) {
  text->Separator(separator);
  text->Digits(field, 2);
}

COrbStringData DisplayText(std::uint64_t ticks, bool dateOnly) {
  const CivilTime local = LocalFields(ticks);
  TimeText text;
  text.Year(local.year);
  AddField(&text, '/', local.month);
  AddField(&text, '/', local.day);
  if (dateOnly) return text.Text();
  AddField(&text, ' ', local.hour);
  AddField(&text, ':', local.minute);
  AddField(&text, ':', local.second);
  return text.Text();
}

}  // namespace

COrbTime::COrbTime(const unsigned long long& tickCount) : ticks(tickCount) {}

COrbTime::COrbTime(const UTCDateTime& record)
    : ticks(WholeSeconds(record) * kTicksPerSecond), fraction(record.fraction) {}

COrbTime& COrbTime::operator=(const unsigned long long& tickCount) {
  ticks = tickCount;
  fraction = 0;
  return *this;
}

COrbTime& COrbTime::operator=(const UTCDateTime& record) { return *this = COrbTime(record); }

COrbTime::~COrbTime() = default;

OrbResult COrbTime::GetCurrentTime() {
  using std::chrono::floor, std::chrono::nanoseconds, std::chrono::seconds;
  const auto now = std::chrono::system_clock::now();
  const auto second = floor<seconds>(now);
  const auto rest = std::chrono::duration_cast<nanoseconds>(now - second).count();
  ticks = static_cast<std::uint64_t>(second.time_since_epoch().count() + kSecondsTo1970) *
          kTicksPerSecond;
  fraction = static_cast<std::uint16_t>(static_cast<std::uint64_t>(rest) * kFractionsPerSecond /
                                        1'000'000'000);
  return kOrbNoErr;
}

COrbTime::operator unsigned long long() const { return ticks + (fraction * kTicksPerSecond >> 16); }

UTCDateTime COrbTime::GetUTCTime() const {
  const std::uint64_t seconds = ticks / kTicksPerSecond;
  const std::uint64_t rest = ticks % kTicksPerSecond * kFractionsPerSecond / kTicksPerSecond;
  return {static_cast<UInt16>(seconds >> 32),
          static_cast<UInt32>(seconds),
          static_cast<UInt16>(rest + fraction)};
}

COrbTime::operator UTCDateTime() const { return GetUTCTime(); }

bool COrbTime::IsEmpty() const { return ticks == 0 && fraction == 0; }

bool COrbTime::operator==(const COrbTime& other) const {
  return static_cast<unsigned long long>(*this) == static_cast<unsigned long long>(other);
}

bool COrbTime::operator!=(const COrbTime& other) const { return !(*this == other); }

bool COrbTime::operator<(const COrbTime& other) const {
  return static_cast<unsigned long long>(*this) < static_cast<unsigned long long>(other);
}

bool COrbTime::operator<=(const COrbTime& other) const { return !(other < *this); }

bool COrbTime::operator>(const COrbTime& other) const { return other < *this; }

bool COrbTime::operator>=(const COrbTime& other) const { return !(*this < other); }

OrbResult COrbTime::GetTime(unsigned int* year,
                            unsigned int* month,
                            unsigned int* day,
                            unsigned int* hour,
                            unsigned int* minute,
                            unsigned int* second,
                            unsigned int* millisecond,
                            unsigned int* microsecond,
                            unsigned int* tick) const {
  const CivilTime local = LocalFields(ticks);
  Store(year, static_cast<std::uint64_t>(local.year));
  Store(month, local.month);
  Store(day, local.day);
  Store(hour, local.hour);
  Store(minute, local.minute);
  Store(second, local.second);
  Store(millisecond, ticks % kTicksPerSecond / kTicksPerMillisecond);
  Store(microsecond, ticks % kTicksPerMillisecond / kTicksPerMicrosecond);
  Store(tick, ticks % kTicksPerMicrosecond);
  return kOrbNoErr;
}

std::tm COrbTime::GetLocalTm() {
  const CivilTime local = LocalFields(ticks);
  std::tm fields{};
  fields.tm_year = static_cast<int>(local.year - 1900);
  fields.tm_mon = static_cast<int>(local.month - 1);
  fields.tm_mday = static_cast<int>(local.day);
  fields.tm_hour = static_cast<int>(local.hour);
  fields.tm_min = static_cast<int>(local.minute);
  fields.tm_sec = static_cast<int>(local.second);
  return fields;
}

OrbResult COrbTime::Initialize(unsigned int year,
                               unsigned int month,
                               unsigned int day,
                               unsigned int hour,
                               unsigned int minute,
                               unsigned int second,
                               unsigned int millisecond,
                               unsigned int microsecond,
                               unsigned int tick) {
  if (month < 1 || month > 12) return kOrbErrInvalidTime;
  if (millisecond > 999 || microsecond > 999 || tick > 9) return kOrbErrInvalidTime;
  if (day < 1 || day > DaysInMonth(year, month)) return kOrbErrInvalidTime;
  if (hour > 23 || minute > 59 || second > 59) return kOrbErrInvalidTime;
  const std::int64_t instant =
      orb::platform::InstantFromLocal({year, month, day, hour, minute, second});
  fraction = 0;
  ticks = TicksAt(instant + kSecondsTo1970,
                  millisecond * kTicksPerMillisecond + microsecond * kTicksPerMicrosecond + tick);
  return kOrbNoErr;
}

OrbResult COrbTime::Initialize(const COrbStringData& text) {
  if (text.IsEmpty()) return kOrbErrUnknown;
  const std::string digits = DigitsOf(text);
  return Initialize(Field(digits, 0, 4),
                    Field(digits, 4, 2),
                    Field(digits, 6, 2),
                    Field(digits, 8, 2),
                    Field(digits, 10, 2),
                    Field(digits, 12, 2),
                    Field(digits, 14, 3),
                    Field(digits, 17, 3),
                    Field(digits, 20, 1));
}

OrbResult COrbTime::ConvertToString(COrbStringData* out, bool dateOnly, bool compact) const {
  if (out == nullptr) return compact ? kOrbNoErr : kOrbErrUnknown;
  *out = compact ? CompactText(ticks) : DisplayText(ticks, dateOnly);
  return kOrbNoErr;
}

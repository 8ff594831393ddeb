// SPDX-License-Identifier: MIT
#include "platform/calendar.h"

#include <sys/stat.h>
#include <time.h>
#include <unistd.h>
#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include <algorithm>
#include <array>
#include <cstring>
#include <string_view>

namespace orb::platform {
namespace {

// glibc takes a lock and searches the zone for every conversion. Each thread therefore keeps what
// it learnt of the zone, in blocks of half a year; a block is surveyed when first needed.
constexpr int kBlockBits = 24;
constexpr std::int64_t kBlockLength = std::int64_t{1} << kBlockBits;
// Three days. No zone of the tz database has changed its offset twice within less than 3.98 days
// since 1900, so two probes that differ have one change between them and two that agree have none.
// (A rule in TZ itself could: a summer time of less than three days may be missed.)
constexpr std::int64_t kProbeDistance = std::int64_t{1} << 18;
// More than any zone is ahead of or behind GMT, and less than half of the distance above.
constexpr std::int64_t kFarthestOffset = std::int64_t{26} * 3600;

constexpr std::int64_t kNoBlock = INT64_MIN;
constexpr std::int64_t kNoChange = INT64_MAX;
constexpr std::size_t kMostChanges = 4;

/// What to add to the instants of one block to get local time.
struct Block {
  std::int64_t index = kNoBlock;
  std::size_t changes = 0;  // Above kMostChanges: too many to keep, every instant is asked for.
  std::array<std::int64_t, kMostChanges> at{kNoChange, kNoChange, kNoChange, kNoChange};
  std::array<std::int32_t, kMostChanges + 1> offsets{};
};

/// The zone as glibc has it now. A leap second, where the zone has them, counts as a change.
std::int32_t AskOffset(std::int64_t instant) {
  struct tm fields;
  const time_t time = instant;
  if (::localtime_r(&time, &fields) == nullptr) return 0;  // A year beyond what an int holds.
  const CivilTime local{fields.tm_year + std::int64_t{1900},
                        static_cast<unsigned>(fields.tm_mon + 1),
                        static_cast<unsigned>(fields.tm_mday),
                        static_cast<unsigned>(fields.tm_hour),
                        static_cast<unsigned>(fields.tm_min),
                        static_cast<unsigned>(fields.tm_sec)};
  return static_cast<std::int32_t>(SecondsFromCivil(local) - instant);
}

/// The first instant that no longer has the offset of `begin`; `end` is known not to have it.
std::int64_t FindChange(std::int64_t begin, std::int64_t end, std::int32_t offset) {
  while (end - begin > 1) {
    const std::int64_t middle = begin + (end - begin) / 2;
    (AskOffset(middle) == offset ? begin : end) = middle;
  }
  return end;
}

void AddChange(Block* block, std::int64_t at, std::int32_t offset) {
  const std::size_t position = block->changes++;
  if (position >= kMostChanges) return;
  block->at[position] = at;
  block->offsets[position + 1] = offset;
}

Block Survey(std::int64_t index) {
  ::tzset();  // Another thread may have put another zone in place meanwhile.
  Block block;
  block.index = index;
  const std::int64_t begin = index * kBlockLength;
  std::int32_t offset = AskOffset(begin);
  block.offsets[0] = offset;
  for (std::int64_t at = begin; at < begin + kBlockLength; at += kProbeDistance) {
    const std::int64_t end = at + kProbeDistance;
    const std::int32_t next = AskOffset(end);
    // A leap second may come with the zone's own change.
    for (std::int64_t from = at; offset != next && from != end;) {
      from = FindChange(from, end, offset);
      offset = AskOffset(from);
      AddChange(&block, from, offset);
    }
  }
  return block;
}

std::int32_t OffsetIn(const Block& block, std::int64_t instant) {
  if (block.changes > kMostChanges) return AskOffset(instant);
  std::size_t passed = 0;  // Counted without a branch, which instants at random would mislead.
  for (const std::int64_t at : block.at) passed += instant >= at ? 1 : 0;
  return block.offsets[passed];
}

#ifdef __SSE2__

/// Whether one of so many entries is null. Behind a null there may be no memory of ours any more,
/// but what is read with it lies within the same aligned 64 bytes, hence in its page; the
/// sanitizers are told so.
__attribute__((no_sanitize("address", "thread"))) bool HasNull(char* const* entries,
                                                               std::size_t count) {
  constexpr std::size_t kGroup = 8;
  for (; count != 0 && reinterpret_cast<std::uintptr_t>(entries) % 64 != 0; ++entries, --count) {
    if (*entries == nullptr) return true;
  }
  const __m128i minusOne = _mm_set1_epi32(-1);  // Of all addresses it makes only null negative.
  for (; count >= kGroup; entries += kGroup, count -= kGroup) {
    const auto* pairs = reinterpret_cast<const __m128i*>(entries);
    const __m128i any = _mm_or_si128(
        _mm_or_si128(_mm_add_epi64(pairs[0], minusOne), _mm_add_epi64(pairs[1], minusOne)),
        _mm_or_si128(_mm_add_epi64(pairs[2], minusOne), _mm_add_epi64(pairs[3], minusOne)));
    if (_mm_movemask_pd(_mm_castsi128_pd(any)) != 0) return true;
  }
  return std::find(entries, entries + count, nullptr) != entries + count;
}

#else

bool HasNull(char* const* entries, std::size_t count) {
  return std::find(entries, entries + count, nullptr) != entries + count;
}

#endif

/// TZ in the environment. It remembers where TZ stands, because looking into every entry would cost
/// more than the conversion. Where there is no TZ it remembers the last entry: a new one comes
/// behind it.
class TzEntry {
 public:
  /// Null when TZ is not set.
  const char* Value() {
    if (!IsWhereItWas()) Find();
    return isSet_ ? entry_ + kName.size() : nullptr;
  }
  void Forget() { environment_ = nullptr; }

 private:
  static constexpr std::string_view kName = "TZ=";

  bool IsWhereItWas() const {
    if (environment_ == nullptr || environ != environment_) return false;
    // An environment that was emptied and filled again may be a shorter one in the same place.
    if (HasNull(environment_, position_)) return false;
    if (environ[position_] != entry_) return false;
    return entry_ == nullptr || (environ[position_ + 1] == next_ && IsTz(entry_) == isSet_);
  }

  static bool IsTz(const char* entry) {
    return std::strncmp(entry, kName.data(), kName.size()) == 0;
  }

  void Find() {
    *this = TzEntry();
    environment_ = environ;
    if (environment_ == nullptr) return;
    for (std::size_t i = 0; !isSet_ && environment_[i] != nullptr; ++i) Remember(i);
  }

  void Remember(std::size_t position) {
    position_ = position;
    entry_ = environment_[position];
    next_ = environment_[position + 1];
    isSet_ = IsTz(entry_);
  }

  char** environment_ = nullptr;
  std::size_t position_ = 0;
  const char* entry_ = nullptr;
  const char* next_ = nullptr;
  bool isSet_ = false;
};

/// Tells whether the zone is still the one that it was.
class ZoneWatch {
 public:
  /// True on the first call.
  bool Changed() {
    const char* name = tz_.Value();
    return name == nullptr ? SystemZoneChanged() : NamedZoneChanged(name);
  }

 private:
  enum class Source { kNone, kSystem, kNamed, kTooLongToKeep };

  bool NamedZoneChanged(const char* name) {
    if (source_ == Source::kNamed && std::strcmp(name, name_.data()) == 0) return false;
    const std::size_t length = std::strlen(name);
    source_ = length < name_.size() ? Source::kNamed : Source::kTooLongToKeep;
    if (source_ == Source::kNamed) std::memcpy(name_.data(), name, length + 1);
    return true;
  }

  bool SystemZoneChanged() {
    struct timespec now;
    ::clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
    if (source_ == Source::kSystem && now.tv_sec == lookedAt_) return false;
    lookedAt_ = now.tv_sec;
    tz_.Forget();
    return SystemZoneFileChanged();
  }

  bool SystemZoneFileChanged() {
    struct stat file {};
    if (::stat("/etc/localtime", &file) != 0) file = {};  // GMT then.
    const bool same = source_ == Source::kSystem && file.st_dev == file_.st_dev &&
                      file.st_ino == file_.st_ino && file.st_mtime == file_.st_mtime;
    source_ = Source::kSystem;
    file_ = file;
    return !same;
  }

  TzEntry tz_;
  Source source_ = Source::kNone;
  std::array<char, 128> name_{};
  time_t lookedAt_ = 0;
  struct stat file_ {};
};

/// One thread's knowledge of the zone: some seventy years.
class Zone {
 public:
  void Refresh() {
    if (!watch_.Changed()) return;
    for (Block& block : blocks_) block.index = kNoBlock;
  }

  std::int32_t Offset(std::int64_t instant) {
    const std::int64_t index = instant >> kBlockBits;
    Block& block = blocks_[static_cast<std::size_t>(index) % blocks_.size()];
    if (block.index != index) block = Survey(index);
    return OffsetIn(block, instant);
  }

 private:
  ZoneWatch watch_;
  std::array<Block, 128> blocks_{};
};

Zone& CurrentZone() {
  static thread_local constinit Zone zone;
  zone.Refresh();
  return zone;
}

}  // namespace

CivilTime LocalFromInstant(std::int64_t instant) {
  return CivilFromSeconds(instant + CurrentZone().Offset(instant));
}

std::int64_t InstantFromLocal(const CivilTime& local) {
  Zone& zone = CurrentZone();
  const std::int64_t seconds = SecondsFromCivil(local);
  // A change of the clock, if it is near at all, lies between these two.
  const std::int32_t before = zone.Offset(seconds - kFarthestOffset);
  const std::int32_t after = zone.Offset(seconds + kFarthestOffset);
  const std::int64_t early = seconds - before;
  if (before == after || zone.Offset(early) == before) return early;
  // With a leap second beside the change there is a third offset between the two.
  for (const std::int32_t offset : {after, zone.Offset(early), zone.Offset(seconds - after)}) {
    if (zone.Offset(seconds - offset) == offset) return seconds - offset;
  }
  return early;
}

}  // namespace orb::platform

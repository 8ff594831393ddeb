// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/time/time.h>

#include <array>
#include <cstdint>
#include <cstring>
#include <ctime>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "support/texts.h"
#include "support/time_zone.h"

namespace {

using orb::test::TimeZone;

constexpr unsigned long long kSecond = 10'000'000;

using Fields = std::array<unsigned int, 9>;

OrbResult Set(COrbTime* time, const Fields& f) {
  return time->Initialize(f[0], f[1], f[2], f[3], f[4], f[5], f[6], f[7], f[8]);
}

Fields FieldsOf(const COrbTime& time) {
  Fields f{};
  EXPECT_EQ(time.GetTime(&f[0], &f[1], &f[2], &f[3], &f[4], &f[5], &f[6], &f[7], &f[8]), kOrbNoErr);
  return f;
}

TEST(Time, IsTicksAndFraction) {
  const std::tuple<std::uint64_t, std::uint16_t, unsigned long long, UTCDateTime> kCases[] = {
      {0, 1, 152, {0, 0, 1}},
      {9'999'999, 0, 9'999'999, {0, 0, 65535}},
      {4'294'967'298 * kSecond, 32768, 42'949'672'985'000'000, {1, 2, 32768}},
      {5'000'000, 40000, 11'103'515, {0, 0, 7232}},  // The carry is dropped.
      {UINT64_MAX, 65535, 9'999'846, {429, 2'133'437'386, 62596}},
  };
  for (const auto& [ticks, fraction, value, expected] : kCases) {
    SCOPED_TRACE(ticks);
    COrbTime time = ticks;
    time.fraction = fraction;
    const COrbTime same = value, next = value + 1;
    EXPECT_TRUE(time == same && time <= same && time >= same && time != next);
    EXPECT_TRUE(time < next && time <= next && next > time && next >= time);
    EXPECT_FALSE(time != same || time < same || time > same || next <= time || time >= next);
    const UTCDateTime record = time;
    EXPECT_EQ(std::memcmp(&record, &expected, sizeof(record)), 0);
    EXPECT_FALSE(time.IsEmpty());
    EXPECT_TRUE((time = 0).IsEmpty());
  }
  const COrbTime greatest = UTCDateTime{0xFFFF, 0xFFFFFFFF, 0xFFFF};
  EXPECT_EQ(greatest.ticks, 10'844'667'902'698'154'368u);
  EXPECT_EQ(greatest.fraction, 0xFFFF);
}

TEST(Time, NowIsNow) {
  COrbTime time;
  const auto now = [] { return static_cast<std::uint64_t>(std::time(nullptr)) + 2'082'844'800; };
  const std::uint64_t before = now();
  EXPECT_EQ(time.GetCurrentTime(), kOrbNoErr);
  EXPECT_EQ(time.ticks % kSecond, 0u);
  EXPECT_TRUE(before <= time.ticks / kSecond && time.ticks / kSecond <= now());
}

TEST(TimeFields, ComeBackAsTheyWereSet) {
  for (const char* name : {"UTC", "Europe/Paris", "Asia/Kathmandu", "America/St_Johns"}) {
    const TimeZone zone(name);
    for (const Fields& fields : {Fields{2024, 11, 16, 9, 30, 5, 42, 7, 3},
                                 Fields{1904, 2, 29, 23, 59, 59, 999, 999, 9},
                                 Fields{2000, 2, 29, 0, 0, 0, 0, 0, 0},
                                 Fields{9999, 12, 31, 12, 0, 0, 1, 0, 0}}) {
      COrbTime time = UTCDateTime{0, 0, 5};
      EXPECT_EQ(Set(&time, fields), kOrbNoErr);
      time.fraction += 65535;  // What stood there is gone, and what stands there is left out.
      EXPECT_EQ(FieldsOf(time), fields);
      EXPECT_EQ(time.fraction, 65535);
      const std::tm tm = time.GetLocalTm();
      char text[20];
      EXPECT_EQ(std::strftime(text, sizeof text, "%Y%m%d%H%M%S", &tm), 14u);
      COrbTime back;
      EXPECT_EQ(back.Initialize(S(text)), kOrbNoErr);
      EXPECT_EQ(back.ticks, time.ticks / kSecond * kSecond);
    }
  }
}

TEST(TimeFields, OutOfRangeLeaveTheTimeAlone) {
  const Fields right{2024, 2, 29, 23, 59, 59, 999, 999, 9};
  const Fields beyond{0, 13, 30, 24, 60, 60, 1000, 1000, 10};
  std::vector<Fields> wrong{{2023, 2, 29}, {1900, 2, 29}, {2024, 0, 1}, {2024, 1, 0}};
  for (std::size_t i = 1; i < right.size(); ++i) (wrong.emplace_back(right))[i] = beyond[i];
  for (const Fields& fields : wrong) {
    COrbTime time = UTCDateTime{0, 7, 7};
    EXPECT_EQ(Set(&time, fields), kOrbErrInvalidTime) << testing::PrintToString(fields);
    EXPECT_EQ(time.ticks, 7 * kSecond);
    EXPECT_EQ(time.fraction, 7);
  }
}

TEST(TimeFields, OfYearsThatCannotBeCountedWrapOrAreEmpty) {
  const TimeZone zone("UTC");
  COrbTime time = 1;
  EXPECT_EQ(time.Initialize(1903, 12, 31, 23, 59, 59, 5, 0, 0), kOrbNoErr);
  EXPECT_TRUE(time.IsEmpty());
  EXPECT_EQ(time.Initialize(60359, 5, 28, 5, 36, 10, 955, 161, 7), kOrbNoErr);
  EXPECT_EQ(time.ticks, 1u);
}

TEST(TimeText, IsReadByItsDigits) {
  const std::pair<std::string, Fields> kCases[] = {
      {"2024/11/16 09:30:05", {2024, 11, 16, 9, 30, 5, 0, 0, 0}},
      {"20241116093005042", {2024, 11, 16, 9, 30, 5, 42, 0, 0}},
      {"202411160930050420073 and 99 more", {2024, 11, 16, 9, 30, 5, 42, 7, 3}},
      {"2024111", {2024, 11, 1, 0, 0, 0, 0, 0, 0}},
      {"on \xE2\x98\x83 2024\xD9\xA1-e\xCC\x81 11-16", {2024, 11, 16, 0, 0, 0, 0, 0, 0}},
  };
  COrbTime time;
  for (const auto& [text, fields] : kCases) {
    EXPECT_EQ(time.Initialize(S(text)), kOrbNoErr) << text;
    EXPECT_EQ(FieldsOf(time), fields) << text;
  }
  time = 7;
  EXPECT_EQ(time.Initialize(COrbStringData()), kOrbErrUnknown);
  for (const char* text : {"202411", "none", "2024/02/30", "2024/11/16\xFF (not UTF-8)"}) {
    EXPECT_EQ(time.Initialize(S(text)), kOrbErrInvalidTime) << text;
  }
  EXPECT_EQ(time.ticks, 7u);
}

TEST(TimeText, IsWrittenInThreeForms) {
  const TimeZone zone("America/New_York");
  COrbTime time;
  time.Initialize(2024, 11, 6, 9, 30, 5, 42, 999, 9);
  time.fraction = 65535;  // Not another second.
  const std::tuple<COrbTime, bool, bool, const char*> kCases[] = {
      {time, false, true, "20241106093005042"},
      {time, true, true, "20241106093005042"},
      {time, false, false, "2024/11/06 09:30:05"},
      {time, true, false, "2024/11/06"},
      {COrbTime(), false, false, "1903/12/31 19:00:00"},
      {COrbTime(UINT64_MAX), false, true, "603590528013610955"},
  };
  for (const auto& [written, dateOnly, compact, expected] : kCases) {
    COrbStringData text;
    EXPECT_EQ(written.ConvertToString(&text, dateOnly, compact), kOrbNoErr);
    EXPECT_EQ(Text(text), expected);
  }
  EXPECT_EQ(time.ConvertToString(nullptr, false, false), kOrbErrUnknown);
}

}  // namespace

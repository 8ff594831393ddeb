// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/time/time.h>

#include <array>
#include <cstdint>
#include <cstring>
#include <ctime>
#include <string>
#include <vector>

#include "support/texts.h"
#include "support/time_zone.h"

namespace {

using orb::test::TimeZone;

constexpr unsigned long long kSecond = 10'000'000;
/// 1970-01-01 00:00:00 GMT.
constexpr unsigned long long k1970 = 2'082'844'800 * kSecond;

using Fields = std::array<unsigned int, 9>;

OrbResult Set(COrbTime* time, const Fields& f) {
  return time->Initialize(f[0], f[1], f[2], f[3], f[4], f[5], f[6], f[7], f[8]);
}

Fields FieldsOf(const COrbTime& time) {
  Fields f{};
  EXPECT_EQ(time.GetTime(&f[0], &f[1], &f[2], &f[3], &f[4], &f[5], &f[6], &f[7], &f[8]), kOrbNoErr);
  return f;
}

std::string Written(const COrbTime& time, bool dateOnly, bool compact) {
  COrbStringData text;
  EXPECT_EQ(time.ConvertToString(&text, dateOnly, compact), kOrbNoErr);
  return Text(text);
}

TEST(TimeValue, CountsTicksAndFraction) {
  const UTCDateTime half{1, 2, 32768};
  const COrbTime time = half;
  EXPECT_EQ(time.ticks, 4'294'967'298 * kSecond);
  const UTCDateTime back = time;
  EXPECT_EQ(back.highSeconds, 1);
  EXPECT_EQ(UInt32{back.lowSeconds}, 2u);
  EXPECT_EQ(back.fraction, 32768);
  EXPECT_EQ(static_cast<unsigned long long>(time), time.ticks + 5'000'000);

  COrbTime least;
  least.fraction = 1;
  EXPECT_FALSE(least.IsEmpty());
  EXPECT_GT(least, COrbTime(0));
  EXPECT_EQ(least, COrbTime(152));
  EXPECT_LT(least, COrbTime(153));
  least = 0;
  EXPECT_TRUE(least.IsEmpty());
  EXPECT_EQ(COrbTime(9'999'999).GetUTCTime().fraction, 65535);
}

TEST(TimeValue, WrapsWhereItDoesNotFit) {
  COrbTime time = kSecond / 2;
  time.fraction = 40000;
  EXPECT_EQ(time.GetUTCTime().fraction, 32768 + 40000 - 65536);
  EXPECT_EQ(UInt32{time.GetUTCTime().lowSeconds}, 0u);
  const COrbTime greatest = UTCDateTime{0xFFFF, 0xFFFFFFFF, 0xFFFF};
  EXPECT_EQ(greatest.ticks, 10'844'667'902'698'154'368u);
  EXPECT_EQ(greatest.fraction, 0xFFFF);
}

TEST(TimeValue, NowIsNow) {
  COrbTime time;
  const std::time_t before = std::time(nullptr);
  EXPECT_EQ(time.GetCurrentTime(), kOrbNoErr);
  const std::time_t after = std::time(nullptr);
  EXPECT_EQ(time.ticks % kSecond, 0u);
  EXPECT_GE(time.ticks, k1970 + static_cast<std::uint64_t>(before) * kSecond);
  EXPECT_LE(time.ticks, k1970 + static_cast<std::uint64_t>(after) * kSecond);
}

TEST(TimeFields, ComeBackAsTheyWereSet) {
  for (const char* name : {"UTC", "Europe/Paris", "Asia/Kathmandu", "America/St_Johns"}) {
    const TimeZone zone(name);
    for (const Fields& fields : {Fields{2024, 11, 16, 9, 30, 5, 42, 7, 3},
                                 Fields{1904, 2, 29, 23, 59, 59, 999, 999, 9},
                                 Fields{2000, 2, 29, 0, 0, 0, 0, 0, 0},
                                 Fields{9999, 12, 31, 12, 0, 0, 1, 0, 0}}) {
      COrbTime time;
      time.fraction = 5;
      EXPECT_EQ(Set(&time, fields), kOrbNoErr);
      EXPECT_EQ(FieldsOf(time), fields);
      EXPECT_EQ(time.fraction, 0);
    }
  }
}

TEST(TimeFields, OutOfRangeLeavesTheTimeAlone) {
  const Fields kFirst{0, 1, 1, 0, 0, 0, 0, 0, 0};
  const Fields kBeyond{0, 13, 30, 24, 60, 60, 1000, 1000, 10};
  std::vector<Fields> wrong{{2023, 2, 29}, {1900, 2, 29}};
  for (std::size_t i = 1; i < kFirst.size(); ++i) {
    const Fields right{2024, 2, 29, 23, 59, 59, 999, 999, 9};
    (wrong.emplace_back(right))[i] = kBeyond[i];
    if (kFirst[i] == 1) (wrong.emplace_back(right))[i] = 0;
  }
  for (const Fields& fields : wrong) {
    COrbTime time = UTCDateTime{0, 7, 7};
    EXPECT_EQ(Set(&time, fields), kOrbErrInvalidTime) << testing::PrintToString(fields);
    EXPECT_EQ(time.ticks, 7 * kSecond);
    EXPECT_EQ(time.fraction, 7);
  }
}

TEST(TimeFields, YearsBeyondTheCountAreHeldToItsEnds) {
  for (const unsigned int year : {0u, 1903u, 60'360u, 0xFFFFFFFFu}) {
    COrbTime time = 1;
    EXPECT_EQ(time.Initialize(year, 6, 1, 12, 0, 0, 5, 0, 0), kOrbNoErr);
    EXPECT_EQ(time.ticks, year < 1904 ? 0 : UINT64_MAX) << year;
  }
}

TEST(TimeFields, NullPointersAreSkippedAndFractionIsLeftOut) {
  const TimeZone zone("UTC");
  COrbTime time = k1970 + 1'234'567;
  time.fraction = 65535;
  unsigned int month = 0;
  time.GetTime(nullptr, &month, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
  EXPECT_EQ(month, 1u);
  EXPECT_EQ(FieldsOf(time), (Fields{1970, 1, 1, 0, 0, 0, 123, 456, 7}));
}

TEST(TimeFields, LocalTmHasTheListedMembersAlone) {
  const TimeZone zone("Europe/Paris");
  COrbTime time = 3'803'500'800 * kSecond;  // 2024-07-11, in summer time.
  const std::tm fields = time.GetLocalTm();
  std::tm expected{};
  expected.tm_year = 124;
  expected.tm_mon = 6;
  expected.tm_mday = 11;
  expected.tm_hour = 2;
  EXPECT_EQ(std::memcmp(&fields, &expected, sizeof(fields)), 0);
}

TEST(TimeText, IsReadByItsDigits) {
  const TimeZone zone("Europe/Paris");
  const struct {
    std::string text;
    Fields fields;
  } kCases[] = {
      {"2024/11/16 09:30:05", {2024, 11, 16, 9, 30, 5, 0, 0, 0}},
      {"2024/11/16", {2024, 11, 16, 0, 0, 0, 0, 0, 0}},
      {"20241116093005042", {2024, 11, 16, 9, 30, 5, 42, 0, 0}},
      {"202411160930050420073 and 99 more", {2024, 11, 16, 9, 30, 5, 42, 7, 3}},
      {"2024111", {2024, 11, 1, 0, 0, 0, 0, 0, 0}},
      {"on \xE2\x98\x83 2024\xD9\xA1-e\xCC\x81 11-16", {2024, 11, 16, 0, 0, 0, 0, 0, 0}},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.text);
    COrbTime time;
    EXPECT_EQ(time.Initialize(S(c.text)), kOrbNoErr);
    EXPECT_EQ(FieldsOf(time), c.fields);
  }
}

TEST(TimeText, WithoutADateLeavesTheTimeAlone) {
  COrbTime time = 7;
  EXPECT_EQ(time.Initialize(COrbStringData()), kOrbErrUnknown);
  EXPECT_EQ(time.Initialize(S("")), kOrbErrUnknown);
  for (const char* text : {"202411", "none", "2024/02/30", "2024/11/16\xFF (not UTF-8)"}) {
    EXPECT_EQ(time.Initialize(S(text)), kOrbErrInvalidTime) << text;
  }
  EXPECT_EQ(time.ticks, 7u);
}

TEST(TimeText, IsWrittenInThreeForms) {
  const TimeZone zone("Europe/Paris");
  COrbTime time;
  time.Initialize(2024, 11, 6, 9, 30, 5, 42, 999, 9);
  time.fraction = 65535;  // Not another second.
  EXPECT_EQ(Written(time, false, true), "20241106093005042");
  EXPECT_EQ(Written(time, true, true), "20241106093005042");
  EXPECT_EQ(Written(time, false, false), "2024/11/06 09:30:05");
  EXPECT_EQ(Written(time, true, false), "2024/11/06");
  EXPECT_EQ(time.ConvertToString(nullptr, false, false), kOrbErrUnknown);
  EXPECT_EQ(time.ConvertToString(nullptr, false, true), kOrbNoErr);
}

TEST(TimeText, ReachesBothEnds) {
  const TimeZone zone("America/New_York");
  EXPECT_EQ(Written(COrbTime(), false, false), "1903/12/31 19:00:00");
  const COrbTime last = UINT64_MAX;
  EXPECT_EQ(Written(last, false, true), "603590528013610955");
}

}  // namespace

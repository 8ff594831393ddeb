// SPDX-License-Identifier: MIT
#include "platform/calendar.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <ctime>
#include <random>
#include <sstream>
#include <string>
#include <thread>
#include <tuple>
#include <utility>
#include <vector>

#include "support/time_zone.h"

namespace orb::platform {
namespace {

using orb::test::TimeZone;

constexpr std::int64_t k1904 = -2'082'844'800;
constexpr std::int64_t k2200 = 7'258'118'400;

CivilTime SystemFields(std::time_t instant) {
  std::tm fields{};
  EXPECT_NE(::localtime_r(&instant, &fields), nullptr);
  const auto u = [](int field) { return static_cast<unsigned>(field); };
  return {fields.tm_year + std::int64_t{1900},
          u(fields.tm_mon + 1),
          u(fields.tm_mday),
          u(fields.tm_hour),
          u(fields.tm_min),
          u(fields.tm_sec)};
}

void ExpectAgreement(std::int64_t instant) {
  const CivilTime fields = SystemFields(instant);
  ASSERT_EQ(LocalFromInstant(instant), fields) << instant;
  // In an overlap it is the other instant of the same fields.
  ASSERT_EQ(SystemFields(InstantFromLocal(fields)), fields) << instant;
}

TEST(Calendar, AgreesWithTheSystemInEveryZone) {
  std::mt19937_64 random(1904);
  std::uniform_int_distribution<std::int64_t> anyInstant(k1904, k2200);
  std::istringstream zones(
      "UTC Europe/Paris America/St_Johns America/Sao_Paulo America/Boa_Vista Australia/Lord_Howe "
      "Asia/Kathmandu Africa/Casablanca Pacific/Apia EST5EDT,M3.2.0,M11.1.0 no/such/zone");
  for (std::string name; zones >> name;) {
    SCOPED_TRACE(name);
    const TimeZone zone(name);
    for (int i = 0; i < 3000; ++i) ExpectAgreement(anyInstant(random));
    for (std::int64_t at = 1'700'000'000; at < 1'732'000'000; at += 1799) ExpectAgreement(at);
  }
  const TimeZone zone("right/Indian/Chagos");  // Went ahead an hour after a leap second.
  for (std::int64_t at = 820'000'000; at < 820'800'000; at += 599) ExpectAgreement(at);
}

TEST(Calendar, SkippedAndRepeatedTimesHaveOneInstant) {
  const std::tuple<const char*, CivilTime, std::int64_t> kCases[] = {
      {"Europe/Paris", {2024, 3, 31, 2, 30, 0}, 1'711'848'600},   // Skipped.
      {"Europe/Paris", {2024, 10, 27, 2, 30, 0}, 1'729'989'000},  // Repeated.
      {"Pacific/Apia", {2011, 12, 30, 12, 0, 0}, 1'325'282'400},  // A whole day skipped.
      {"Pacific/Apia", {2011, 12, 31, 12, 0, 0}, 1'325'282'400},  // The same instant by right.
      {"Australia/Lord_Howe", {2024, 4, 7, 1, 45, 0}, 1'712'414'700},
      {"America/Sao_Paulo", {2018, 11, 4, 0, 15, 0}, 1'541'301'300},
  };
  for (const auto& [name, local, instant] : kCases) {
    const TimeZone zone(name);
    EXPECT_EQ(InstantFromLocal(local), instant) << name;
  }
}

TEST(Calendar, NoticesAnotherZoneWhereverItStands) {
  const TimeZone paris("Europe/Paris");
  const std::string longName = "/usr/share/zoneinfo" + std::string(200, '/') + "Asia/Kathmandu";
  EXPECT_EQ(LocalFromInstant(0).hour, 1u);
  ::unsetenv("TZ");
  ::tzset();
  ExpectAgreement(0);
  std::vector<std::string> names;
  for (int i = 0; i < 50; ++i) {  // Until the environment has been moved.
    ::setenv(names.emplace_back("ORB_TEST_" + std::to_string(i)).c_str(), "x", 1);
    ExpectAgreement(i);
  }
  ::setenv("TZ", longName.c_str(), 1);  // Nobody calls tzset() here.
  EXPECT_EQ(LocalFromInstant(0), (CivilTime{1970, 1, 1, 5, 30, 0}));
  for (const std::string& name : names) ::unsetenv(name.c_str());
  EXPECT_EQ(LocalFromInstant(0).minute, 30u);
  ::setenv("TZ", "Asia/Tokyo", 1);
  EXPECT_EQ(LocalFromInstant(0).hour, 9u);
  EXPECT_EQ(LocalFromInstant(1'000'000'000).hour, 10u);  // Not asked for before.
  std::thread([] { EXPECT_EQ(LocalFromInstant(0).hour, 9u); }).join();

  char other[] = "ORB_TEST=x", utc[] = "TZ=UTC", tokyo[] = "TZ=Asia/Tokyo";
  char* entries[] = {other, other, utc, nullptr};
  char** const old = std::exchange(environ, entries);
  EXPECT_EQ(LocalFromInstant(0).hour, 0u);
  entries[0] = tokyo;  // Emptied and filled again in the same place, TZ=UTC behind its end.
  entries[1] = nullptr;
  EXPECT_EQ(LocalFromInstant(0).hour, 9u);
  entries[1] = utc;
  EXPECT_EQ(LocalFromInstant(0).hour, 9u);
  tokyo[0] = 'X';  // As the owner of an entry may write in it.
  EXPECT_EQ(LocalFromInstant(0).hour, 0u);
  tokyo[0] = 'T';

  environ = old;
}

TEST(Calendar, FieldsOfDaysNearAndFarAreThoseOfTheSystem) {
  const TimeZone zone("UTC");
  std::mt19937_64 random(1904);
  for (std::int64_t day = -750'000; day < 150'000; day += 3) {
    ASSERT_EQ(CivilFromSeconds(day * 86400 + 86399), SystemFields(day * 86400 + 86399)) << day;
    const auto any = static_cast<std::int64_t>(random()) >> 9;
    ASSERT_EQ(CivilFromSeconds(any), SystemFields(any)) << any;
  }
}

}  // namespace
}  // namespace orb::platform

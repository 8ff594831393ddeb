// SPDX-License-Identifier: MIT
// Local calendar fields, instants and texts in Europe/Paris, instants over 24 years at random.
#include <benchmark/benchmark.h>
#include <orb/time/time.h>

#include <array>
#include <cstdlib>
#include <ctime>
#include <random>
#include <vector>

#ifdef ORB_BENCH_QT
#include <QDateTime>
#include <QString>
#endif
#ifdef ORB_BENCH_GLIB
#include <glib.h>
#endif

namespace {

constexpr std::time_t k2000 = 946'684'800;
constexpr std::time_t k2024 = 1'704'067'200;
constexpr std::uint64_t kSecondsTo1970 = 2'082'844'800;

const std::vector<std::time_t>& Instants() {
  static const std::vector<std::time_t> instants = [] {
    ::setenv("TZ", "Europe/Paris", 1);
    ::tzset();
    std::mt19937_64 random(24);
    std::uniform_int_distribution<std::time_t> any(k2000, k2024);
    std::vector<std::time_t> made(4096);
    for (std::time_t& instant : made) instant = any(random);
    return made;
  }();
  return instants;
}

std::vector<std::tm> Fields() {
  std::vector<std::tm> fields;
  for (const std::time_t instant : Instants()) ::localtime_r(&instant, &fields.emplace_back());
  return fields;
}

/// Runs `work` on one element after another.
template <typename Inputs, typename Work>
void OnEach(benchmark::State& state, const Inputs& inputs, Work work) {
  std::size_t next = 0;
  for (auto _ : state) {
    work(inputs[next]);
    if (++next == inputs.size()) next = 0;
  }
}

std::vector<COrbTime> Times() {
  std::vector<COrbTime> times;
  for (const std::time_t instant : Instants()) {
    times.emplace_back((static_cast<std::uint64_t>(instant) + kSecondsTo1970) * 10'000'000);
  }
  return times;
}

void FieldsFromInstant_Orb(benchmark::State& state) {
  OnEach(state, Times(), [](const COrbTime& time) {
    std::array<unsigned int, 9> f;
    time.GetTime(&f[0], &f[1], &f[2], &f[3], &f[4], &f[5], &f[6], &f[7], &f[8]);
    benchmark::DoNotOptimize(f);
  });
}
BENCHMARK(FieldsFromInstant_Orb)->Name("FieldsFromInstant/Orb");

void FieldsFromInstant_localtime_r(benchmark::State& state) {
  OnEach(state, Instants(), [](std::time_t instant) {
    std::tm fields;
    benchmark::DoNotOptimize(::localtime_r(&instant, &fields));
  });
}
BENCHMARK(FieldsFromInstant_localtime_r)->Name("FieldsFromInstant/libc");

void InstantFromFields_Orb(benchmark::State& state) {
  OnEach(state, Fields(), [](const std::tm& f) {
    const auto field = [](int number) { return static_cast<unsigned int>(number); };
    COrbTime time;
    time.Initialize(field(f.tm_year + 1900),
                    field(f.tm_mon + 1),
                    field(f.tm_mday),
                    field(f.tm_hour),
                    field(f.tm_min),
                    field(f.tm_sec),
                    0,
                    0,
                    0);
    benchmark::DoNotOptimize(time.ticks);
  });
}
BENCHMARK(InstantFromFields_Orb)->Name("InstantFromFields/Orb");

void InstantFromFields_mktime(benchmark::State& state) {
  OnEach(state, Fields(), [](std::tm fields) {
    fields.tm_isdst = -1;
    benchmark::DoNotOptimize(std::mktime(&fields));
  });
}
BENCHMARK(InstantFromFields_mktime)->Name("InstantFromFields/libc");

void CompactText_Orb(benchmark::State& state) {
  OnEach(state, Times(), [](const COrbTime& time) {
    COrbStringData text;
    time.ConvertToString(&text, false, true);
    benchmark::DoNotOptimize(text);
  });
}
BENCHMARK(CompactText_Orb)->Name("CompactText/Orb");

void CompactText_strftime(benchmark::State& state) {
  OnEach(state, Instants(), [](std::time_t instant) {
    std::tm fields;
    std::array<char, 32> text;
    ::localtime_r(&instant, &fields);
    benchmark::DoNotOptimize(std::strftime(text.data(), text.size(), "%Y%m%d%H%M%S000", &fields));
    benchmark::DoNotOptimize(text);
  });
}
BENCHMARK(CompactText_strftime)->Name("CompactText/libc");

#ifdef ORB_BENCH_QT
void FieldsFromInstant_QDateTime(benchmark::State& state) {
  OnEach(state, Instants(), [](std::time_t instant) {
    const QDateTime time = QDateTime::fromSecsSinceEpoch(instant);
    benchmark::DoNotOptimize(time.date().year() + time.date().month() + time.date().day());
    benchmark::DoNotOptimize(time.time().hour() + time.time().minute() + time.time().second());
  });
}
BENCHMARK(FieldsFromInstant_QDateTime)->Name("FieldsFromInstant/Qt");

void InstantFromFields_QDateTime(benchmark::State& state) {
  OnEach(state, Fields(), [](const std::tm& f) {
    const QDateTime time(QDate(f.tm_year + 1900, f.tm_mon + 1, f.tm_mday),
                         QTime(f.tm_hour, f.tm_min, f.tm_sec));
    benchmark::DoNotOptimize(time.toSecsSinceEpoch());
  });
}
BENCHMARK(InstantFromFields_QDateTime)->Name("InstantFromFields/Qt");

void CompactText_QDateTime(benchmark::State& state) {
  const QString format = QStringLiteral("yyyyMMddHHmmsszzz");
  OnEach(state, Instants(), [&](std::time_t instant) {
    benchmark::DoNotOptimize(QDateTime::fromSecsSinceEpoch(instant).toString(format));
  });
}
BENCHMARK(CompactText_QDateTime)->Name("CompactText/Qt");
#endif

#ifdef ORB_BENCH_GLIB
void FieldsFromInstant_GDateTime(benchmark::State& state) {
  OnEach(state, Instants(), [](std::time_t instant) {
    GDateTime* time = g_date_time_new_from_unix_local(instant);
    int year, month, day;
    g_date_time_get_ymd(time, &year, &month, &day);
    benchmark::DoNotOptimize(year + month + day + g_date_time_get_hour(time) +
                             g_date_time_get_minute(time) + g_date_time_get_second(time));
    g_date_time_unref(time);
  });
}
BENCHMARK(FieldsFromInstant_GDateTime)->Name("FieldsFromInstant/GLib");

void InstantFromFields_GDateTime(benchmark::State& state) {
  OnEach(state, Fields(), [](const std::tm& f) {
    GDateTime* time = g_date_time_new_local(
        f.tm_year + 1900, f.tm_mon + 1, f.tm_mday, f.tm_hour, f.tm_min, f.tm_sec);
    benchmark::DoNotOptimize(g_date_time_to_unix(time));
    g_date_time_unref(time);
  });
}
BENCHMARK(InstantFromFields_GDateTime)->Name("InstantFromFields/GLib");

void CompactText_GDateTime(benchmark::State& state) {
  OnEach(state, Instants(), [](std::time_t instant) {
    GDateTime* time = g_date_time_new_from_unix_local(instant);
    char* text = g_date_time_format(time, "%Y%m%d%H%M%S000");
    benchmark::DoNotOptimize(text);
    g_free(text);
    g_date_time_unref(time);
  });
}
BENCHMARK(CompactText_GDateTime)->Name("CompactText/GLib");
#endif

}  // namespace

BENCHMARK_MAIN();

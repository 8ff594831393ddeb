// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <orb/strings/string_data.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <string>
#include <vector>

#include "platform/transcode.h"
#include "support.h"

#ifdef ORB_BENCH_QT
#include <QByteArray>
#include <QString>
#endif
#ifdef ORB_BENCH_GLIB
#include <glib.h>
#endif

/// \file
/// Converting texts between UTF-8 and UTF-16; the size is that of the UTF-8 text.
///
/// Each direction is timed in three ways:
///   Derive: the other encoding of a text that is there, asked for the first time. The texts are
///           made before and end afterwards; the peers' results too.
///   Road:   the text made in one encoding, the other one asked for, and all of it ended.
///   Bare:   the conversion alone, into a buffer; of Qt, which has none, its whole call.
/// The UTF-16 copy is to have twice the room of its units, all zero behind them: limit-zeroed only
/// asks for that memory, as the least that Derive and Road can cost. A value has a copy of the text
/// it was made from: limit-kept makes that copy and asks for the room of the other one, and
/// converts nothing; the peers convert the caller's text.

namespace {

struct Kind {
  const char* name;
  const char* piece;
};

constexpr Kind kKinds[] = {
    {"ASCII", "The quick brown fox jumps over the lazy dog. "},
    {"Latin", "Größe, Übermut, déjà vu, façade, naïve, señor, Ångström: "},
    {"CJK", "日本語の写真を整理するための道具です。中文照片管理"},
    {"Emoji", "Holiday 😀🎉 by the sea 🌊 and 👍🏽 "},
    {"Captions", "A longer caption, with a smile at its end as people like to write them 😀. "},
};

/// Texts of whole characters, at most `size` bytes of UTF-8.
std::string Sample(Kind kind, std::size_t size) {
  const std::u16string piece = *orb::platform::Utf16FromUtf8(kind.piece);
  std::string text;
  while (true) {
    for (std::size_t at = 0; at < piece.size();) {
      const std::size_t units = (piece[at] & 0xFC00) == 0xD800 ? 2 : 1;
      const std::string next = orb::platform::Utf8FromUtf16(piece.substr(at, units));
      if (text.size() + next.size() > size) return text;
      text += next;
      at += units;
    }
  }
}

std::u16string SampleUnits(const benchmark::State& state, Kind kind) {
  return *orb::platform::Utf16FromUtf8(Sample(kind, static_cast<std::size_t>(state.range(0))));
}

std::string SampleBytes(const benchmark::State& state, Kind kind) {
  return Sample(kind, static_cast<std::size_t>(state.range(0)));
}

std::int64_t ThreadNanoseconds() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return std::int64_t{now.tv_sec} * 1'000'000'000 + now.tv_nsec;
}

/// An iteration is a whole batch, so that looking at the clock costs nothing.
template <typename Make, typename Convert>
void Derive(benchmark::State& state, Make make, Convert convert) {
  const std::size_t batch =
      std::max<std::size_t>(4, (std::size_t{1} << 18) / static_cast<std::size_t>(state.range(0)));
  std::vector<decltype(make())> texts(batch);
  for (auto _ : state) {
    for (auto& text : texts) text = make();
    const std::int64_t start = ThreadNanoseconds();
    for (auto& text : texts) convert(text);
    state.SetIterationTime(static_cast<double>(ThreadNanoseconds() - start) * 1e-9);
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(batch));
}

void DeriveUnicodeOrb(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  Derive(
      state,
      [&] { return COrbStringData(OrbCharUtf8(text.c_str())); },
      [](const COrbStringData& made) { benchmark::DoNotOptimize(made.GetPtrUnicode()); });
}

void DeriveUtf8Orb(benchmark::State& state, Kind kind) {
  const std::u16string units = SampleUnits(state, kind);
  const OrbCharUnicode from(reinterpret_cast<const unsigned short*>(units.c_str()));
  Derive(
      state,
      [&] { return COrbStringData(from); },
      [](const COrbStringData& made) { benchmark::DoNotOptimize(made.GetPtrUtf8()); });
}

void ZeroedUnicode(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  const std::size_t units = SampleUnits(state, kind).size();
  for (auto _ : state) {
    void* block = std::calloc(units + 1, 4);
    benchmark::DoNotOptimize(block);
    std::free(block);
  }
}

/// A text measured and copied, room for its other form, and both ended.
template <typename Measure, typename Ask>
void Keep(benchmark::State& state, const void* text, Measure measure, Ask ask) {
  for (auto _ : state) {
    const std::size_t size = measure();
    void* kept = std::malloc(size);
    std::memcpy(kept, text, size);
    void* room = ask();
    benchmark::DoNotOptimize(kept);
    benchmark::DoNotOptimize(room);
    benchmark::ClobberMemory();
    std::free(room);
    std::free(kept);
  }
}

void KeepForUnicode(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  const std::size_t units = SampleUnits(state, kind).size();
  Keep(
      state,
      text.c_str(),
      [&] { return std::strlen(text.c_str()) + 1; },
      [&] { return std::calloc(units + 1, 4); });
}

void KeepForUtf8(benchmark::State& state, Kind kind) {
  const std::size_t size = SampleBytes(state, kind).size();
  const std::u16string text = SampleUnits(state, kind);
  const auto* units = reinterpret_cast<const unsigned short*>(text.c_str());
  Keep(
      state,
      units,
      [&] { return (orb::platform::Utf16Length(units) + 1) * sizeof *units; },
      [&] { return std::malloc(size + 1); });
}

void RoadUnicodeOrb(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  for (auto _ : state) {
    COrbStringData made{OrbCharUtf8(text.c_str())};
    benchmark::DoNotOptimize(made.GetPtrUnicode());
  }
}

void BareUnicodeOrb(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  std::u16string out(text.size() + orb::platform::kSlack, u'\0');
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Utf16FromUtf8(text, out.data()));
    benchmark::ClobberMemory();
  }
}

/// Of ICU; `out` has room for the whole text.
template <auto Convert, typename In, typename Out>
void BareIcu(benchmark::State& state, const In& text, Out out) {
  for (auto _ : state) {
    UErrorCode status = U_ZERO_ERROR;
    std::int32_t length = 0;
    Convert(out.data(),
            static_cast<std::int32_t>(out.size()),
            &length,
            text.data(),
            static_cast<std::int32_t>(text.size()),
            &status);
    benchmark::DoNotOptimize(length);
    benchmark::ClobberMemory();
  }
}

void BareUnicodeIcu(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  BareIcu<u_strFromUTF8>(state, text, std::u16string(text.size() + 1, u'\0'));
}

void RoadUtf8Orb(benchmark::State& state, Kind kind) {
  const std::u16string units = SampleUnits(state, kind);
  const OrbCharUnicode from(reinterpret_cast<const unsigned short*>(units.c_str()));
  for (auto _ : state) {
    COrbStringData made{from};
    benchmark::DoNotOptimize(made.GetPtrUtf8());
  }
}

void BareUtf8Orb(benchmark::State& state, Kind kind) {
  const std::u16string units = SampleUnits(state, kind);
  std::string out(3 * units.size() + orb::platform::kSlack, '\0');
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Utf8FromUtf16(units, out.data()));
    benchmark::ClobberMemory();
  }
}

void BareUtf8Icu(benchmark::State& state, Kind kind) {
  const std::u16string units = SampleUnits(state, kind);
  BareIcu<u_strToUTF8>(state, units, std::string(3 * units.size() + 1, '\0'));
}

#ifdef ORB_BENCH_QT
void DeriveUnicodeQt(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  Derive(
      state,
      [] { return QString(); },
      [&](QString& made) {
        made = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
      });
}

void DeriveUtf8Qt(benchmark::State& state, Kind kind) {
  const QString units = QString::fromStdString(SampleBytes(state, kind));
  Derive(
      state, [] { return QByteArray(); }, [&](QByteArray& made) { made = units.toUtf8(); });
}

void RoadUnicodeQt(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  for (auto _ : state) {
    QString made = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
    benchmark::DoNotOptimize(made);
  }
}

void RoadUtf8Qt(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  const QString units = QString::fromStdString(text);
  for (auto _ : state) {
    QByteArray made = units.toUtf8();
    benchmark::DoNotOptimize(made);
  }
}
#endif

#ifdef ORB_BENCH_GLIB
void RoadUnicodeGlib(benchmark::State& state, Kind kind) {
  const std::string text = SampleBytes(state, kind);
  for (auto _ : state) {
    gunichar2* made =
        g_utf8_to_utf16(text.data(), static_cast<glong>(text.size()), nullptr, nullptr, nullptr);
    benchmark::DoNotOptimize(made);
    g_free(made);
  }
}

void RoadUtf8Glib(benchmark::State& state, Kind kind) {
  const std::u16string units = SampleUnits(state, kind);
  for (auto _ : state) {
    char* made = g_utf16_to_utf8(reinterpret_cast<const gunichar2*>(units.data()),
                                 static_cast<glong>(units.size()),
                                 nullptr,
                                 nullptr,
                                 nullptr);
    benchmark::DoNotOptimize(made);
    g_free(made);
  }
}
#endif

enum class Clock { kProcessor, kOwn };

struct Row {
  const char* workload;
  const char* row;
  void (*run)(benchmark::State&, Kind);
  Clock clock = Clock::kProcessor;
};

constexpr Row kRows[] = {
    {"ToUtf16Derive", "Orb", DeriveUnicodeOrb, Clock::kOwn},
    {"ToUtf16Derive", "limit-zeroed", ZeroedUnicode},
    {"ToUtf16Road", "Orb", RoadUnicodeOrb},
    {"ToUtf16Road", "limit-kept", KeepForUnicode},
    {"ToUtf16Bare", "Orb", BareUnicodeOrb},
    {"ToUtf16Bare", "ICU", BareUnicodeIcu},
    {"ToUtf8Derive", "Orb", DeriveUtf8Orb, Clock::kOwn},
    {"ToUtf8Road", "Orb", RoadUtf8Orb},
    {"ToUtf8Road", "limit-kept", KeepForUtf8},
    {"ToUtf8Bare", "Orb", BareUtf8Orb},
    {"ToUtf8Bare", "ICU", BareUtf8Icu},
#ifdef ORB_BENCH_QT
    {"ToUtf16Derive", "Qt", DeriveUnicodeQt, Clock::kOwn},
    {"ToUtf16Road", "Qt", RoadUnicodeQt},
    {"ToUtf16Bare", "Qt", RoadUnicodeQt},
    {"ToUtf8Derive", "Qt", DeriveUtf8Qt, Clock::kOwn},
    {"ToUtf8Road", "Qt", RoadUtf8Qt},
    {"ToUtf8Bare", "Qt", RoadUtf8Qt},
#endif
#ifdef ORB_BENCH_GLIB
    {"ToUtf16Road", "GLib", RoadUnicodeGlib},
    {"ToUtf8Road", "GLib", RoadUtf8Glib},
#endif
};

void Register(const Row& row, Kind kind) {
  const std::string name = std::string(row.workload) + "-" + kind.name + "/" + row.row;
  auto* registered = benchmark::RegisterBenchmark(name.c_str(), row.run, kind);
  for (const int size : {64, 1 << 10, 1 << 16, 1 << 20}) registered->Arg(size);
  if (row.clock == Clock::kOwn) registered->UseManualTime();
}

}  // namespace

int main(int count, char** arguments) {
  bench::KeepMemory();
  for (const Kind kind : kKinds) {
    for (const Row& row : kRows) Register(row, kind);
  }
  benchmark::Initialize(&count, arguments);
  benchmark::RunSpecifiedBenchmarks();
}

// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <malloc.h>
#include <orb/strings/string_data.h>
#include <pthread.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <ctime>
#include <memory>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "orb/thread/event.h"
#include "platform/transcode.h"

#ifdef ORB_BENCH_QT
#include <QByteArray>
#include <QString>
#endif
#ifdef ORB_BENCH_GLIB
#include <glib.h>
#endif

// Sharing and making a text, and converting it. The rows of a group do the same work, so compare
// the medians of rows within one run:
//   orb_strings_bench --benchmark_repetitions=9 --benchmark_report_aggregates_only=true

namespace {

constexpr const char* kPath = "/home/photographer/Pictures/2026/11/22/IMG_20261122.JPG";

class RecursiveMutex {
 public:
  RecursiveMutex() {
    pthread_mutexattr_t attribute;
    pthread_mutexattr_init(&attribute);
    pthread_mutexattr_settype(&attribute, PTHREAD_MUTEX_RECURSIVE);
    pthread_mutex_init(&mutex_, &attribute);
    pthread_mutexattr_destroy(&attribute);
  }
  void Pair() {
    pthread_mutex_lock(&mutex_);
    pthread_mutex_unlock(&mutex_);
  }

 private:
  pthread_mutex_t mutex_;
};

/// A second thread that does nothing: the process counts as threaded.
class IdleThread {
 public:
  explicit IdleThread(bool wanted) {
    if (wanted) thread_ = std::thread([this] { end_.Wait(); });
  }
  ~IdleThread() {
    end_.Set();
    if (thread_.joinable()) thread_.join();
  }
  IdleThread(const IdleThread&) = delete;
  IdleThread& operator=(const IdleThread&) = delete;

 private:
  COrbEvent end_;
  std::thread thread_;
};

void ShareLockPairs(benchmark::State& state) {
  static RecursiveMutex mutex;
  const IdleThread idle(state.range(0) == 1);
  for (auto _ : state) {
    mutex.Pair();
    mutex.Pair();
  }
}

template <typename Text>
void Share(benchmark::State& state, const Text& text) {
  const IdleThread idle(state.range(0) == 1);
  for (auto _ : state) {
    Text copy(text);
    benchmark::DoNotOptimize(copy);
  }
}

void ShareOrb(benchmark::State& state) {
  static const COrbStringData text{OrbCharUtf8(kPath)};
  Share(state, text);
}

void ShareShared(benchmark::State& state) {
  static const auto text = std::make_shared<const std::string>(kPath);
  Share(state, text);
}

void ShareDeep(benchmark::State& state) {
  static const std::string text(kPath);
  Share(state, text);
}

void MakeOrb(benchmark::State& state) {
  for (auto _ : state) {
    COrbStringData text{OrbCharUtf8(kPath)};
    benchmark::DoNotOptimize(text);
  }
}

void MakeShared(benchmark::State& state) {
  for (auto _ : state) {
    auto text = std::make_shared<const std::string>(kPath);
    benchmark::DoNotOptimize(text);
  }
}

/// Each text is its list's own, so that growing moves what nobody shares.
template <typename Text, typename From>
void Grow(benchmark::State& state, From from) {
  for (auto _ : state) {
    std::vector<Text> texts;
    for (int i = 0; i < 1000; ++i) texts.emplace_back(from);
    benchmark::DoNotOptimize(texts.data());
  }
}

void GrowOrb(benchmark::State& state) { Grow<COrbStringData>(state, OrbCharUtf8(kPath)); }
void GrowStd(benchmark::State& state) { Grow<std::string>(state, kPath); }

/// Texts of whole characters, at most `size` bytes of UTF-8.
std::string Sample(int kind, std::size_t size) {
  static const char* const kPieces[] = {
      "The quick brown fox jumps over the lazy dog. ",
      "Größe, Übermut, déjà vu, façade, naïve, señor, Ångström: ",
      "日本語の写真を整理するための道具です。中文照片管理",
      "Holiday 😀🎉 by the sea 🌊 and 👍🏽 ",
      "A longer caption, with a smile at its end as people like to write them 😀. ",
  };
  const std::u16string piece = *orb::platform::Utf16FromUtf8(kPieces[kind]);
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

std::u16string SampleUnits(const benchmark::State& state) {
  return *orb::platform::Utf16FromUtf8(
      Sample(static_cast<int>(state.range(0)), static_cast<std::size_t>(state.range(1))));
}

std::string SampleBytes(const benchmark::State& state) {
  return Sample(static_cast<int>(state.range(0)), static_cast<std::size_t>(state.range(1)));
}

void SetBytes(benchmark::State& state, const std::string& text) {
  state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(text.size()));
}

// Each direction is timed in three ways:
//   Derive: the other encoding of a text that is there, asked for the first time. The texts are
//           made before and end afterwards; the peers' results too.
//   Road:   the text made in one encoding, the other one asked for, and all of it ended.
//   Bare:   the conversion alone, into a buffer.
// The UTF-16 copy is to have twice the room of its units, all zero behind them: Zeroed only asks
// for that memory, as the least that Derive and Road can cost.

std::int64_t ThreadNanoseconds() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return std::int64_t{now.tv_sec} * 1'000'000'000 + now.tv_nsec;
}

/// An iteration is a whole batch, so that looking at the clock costs nothing; compare the rates.
template <typename Make, typename Convert>
void Derive(benchmark::State& state, Make make, Convert convert) {
  const std::size_t batch =
      std::max<std::size_t>(4, (std::size_t{1} << 18) / static_cast<std::size_t>(state.range(1)));
  std::vector<decltype(make())> texts(batch);
  for (auto _ : state) {
    for (auto& text : texts) text = make();
    const std::int64_t start = ThreadNanoseconds();
    for (auto& text : texts) convert(text);
    state.SetIterationTime(static_cast<double>(ThreadNanoseconds() - start) * 1e-9);
  }
  state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(batch) * state.range(1));
}

void DeriveUnicodeOrb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  Derive(
      state,
      [&] { return COrbStringData(OrbCharUtf8(text.c_str())); },
      [](const COrbStringData& made) { benchmark::DoNotOptimize(made.GetPtrUnicode()); });
}

/// Of a text whose length is known already.
void DeriveScannedUnicodeOrb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const auto make = [&] {
    COrbStringData made{OrbCharUtf8(text.c_str())};
    benchmark::DoNotOptimize(made.GetLengthChar());
    return made;
  };
  Derive(state, make, [](const COrbStringData& made) {
    benchmark::DoNotOptimize(made.GetPtrUnicode());
  });
}

void DeriveUtf8Orb(benchmark::State& state) {
  const std::u16string units = SampleUnits(state);
  const OrbCharUnicode from(reinterpret_cast<const unsigned short*>(units.c_str()));
  Derive(
      state,
      [&] { return COrbStringData(from); },
      [](const COrbStringData& made) { benchmark::DoNotOptimize(made.GetPtrUtf8()); });
}

void ZeroedUnicode(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const std::size_t units = SampleUnits(state).size();
  for (auto _ : state) {
    void* block = std::calloc(units + 1, 4);
    benchmark::DoNotOptimize(block);
    std::free(block);
  }
  SetBytes(state, text);
}

void RoadUnicodeOrb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  for (auto _ : state) {
    COrbStringData made{OrbCharUtf8(text.c_str())};
    benchmark::DoNotOptimize(made.GetPtrUnicode());
  }
  SetBytes(state, text);
}

void BareUnicodeOrb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  std::u16string out(text.size() + orb::platform::kSlack, u'\0');
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Utf16FromUtf8(text, out.data()));
    benchmark::ClobberMemory();
  }
  SetBytes(state, text);
}

void BareUnicodeIcu(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  std::u16string out(text.size() + 1, u'\0');
  for (auto _ : state) {
    UErrorCode status = U_ZERO_ERROR;
    std::int32_t length = 0;
    u_strFromUTF8(out.data(),
                  static_cast<std::int32_t>(out.size()),
                  &length,
                  text.data(),
                  static_cast<std::int32_t>(text.size()),
                  &status);
    benchmark::DoNotOptimize(length);
    benchmark::ClobberMemory();
  }
  SetBytes(state, text);
}

void RoadUtf8Orb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const std::u16string units = SampleUnits(state);
  const OrbCharUnicode from(reinterpret_cast<const unsigned short*>(units.c_str()));
  for (auto _ : state) {
    COrbStringData made{from};
    benchmark::DoNotOptimize(made.GetPtrUtf8());
  }
  SetBytes(state, text);
}

void BareUtf8Orb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const std::u16string units = SampleUnits(state);
  std::string out(3 * units.size() + orb::platform::kSlack, '\0');
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Utf8FromUtf16(units, out.data()));
    benchmark::ClobberMemory();
  }
  SetBytes(state, text);
}

void BareUtf8Icu(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const std::u16string units = SampleUnits(state);
  std::string out(3 * units.size() + 1, '\0');
  for (auto _ : state) {
    UErrorCode status = U_ZERO_ERROR;
    std::int32_t length = 0;
    u_strToUTF8(out.data(),
                static_cast<std::int32_t>(out.size()),
                &length,
                units.data(),
                static_cast<std::int32_t>(units.size()),
                &status);
    benchmark::DoNotOptimize(length);
    benchmark::ClobberMemory();
  }
  SetBytes(state, text);
}

/// Kinds: 0 ASCII, 1 accented Latin, 2 CJK, 3 emoji among ASCII, 4 fewer of them.
void KindsAndSizes(benchmark::internal::Benchmark* rows) {
  rows->ArgNames({"kind", "bytes"});
  rows->ArgsProduct({{0, 1, 2, 3, 4}, {64, 1 << 10, 1 << 16, 1 << 20}});
}

#ifdef ORB_BENCH_QT
void ShareQt(benchmark::State& state) {
  static const QString text = QString::fromUtf8(kPath);
  Share(state, text);
}
void MakeQt(benchmark::State& state) {
  for (auto _ : state) {
    QString text = QString::fromUtf8(kPath);
    benchmark::DoNotOptimize(text);
  }
}

void DeriveUnicodeQt(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  Derive(
      state,
      [] { return QString(); },
      [&](QString& made) {
        made = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
      });
}

void DeriveUtf8Qt(benchmark::State& state) {
  const QString units = QString::fromStdString(SampleBytes(state));
  Derive(
      state, [] { return QByteArray(); }, [&](QByteArray& made) { made = units.toUtf8(); });
}

void RoadUnicodeQt(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  for (auto _ : state) {
    QString made = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
    benchmark::DoNotOptimize(made);
  }
  SetBytes(state, text);
}

void RoadUtf8Qt(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const QString units = QString::fromStdString(text);
  for (auto _ : state) {
    QByteArray made = units.toUtf8();
    benchmark::DoNotOptimize(made);
  }
  SetBytes(state, text);
}
#endif

#ifdef ORB_BENCH_GLIB
void MakeGlib(benchmark::State& state) {
  for (auto _ : state) {
    char* text = g_ref_string_new(kPath);
    benchmark::DoNotOptimize(text);
    g_ref_string_release(text);
  }
}
#endif

// Once a thread has been started, locks cost more for good: the rows of a process with one thread
// stand before all others.
#define ORB_ROWS(row) \
  row(ShareLockPairs) row(ShareOrb) row(ShareShared) row(ShareDeep) ORB_QT_ROW(row)
#ifdef ORB_BENCH_QT
#define ORB_QT_ROW(row) row(ShareQt)
#else
#define ORB_QT_ROW(row)
#endif
#define ORB_ALONE(function) BENCHMARK(function)->Arg(0)->Name(#function "/alone");
#define ORB_IDLE(function) BENCHMARK(function)->Arg(1)->Name(#function "/idle");
#define ORB_TWO(function) \
  BENCHMARK(function)->Arg(2)->Threads(2)->UseRealTime()->Name(#function "/two");
ORB_ROWS(ORB_ALONE)
BENCHMARK(MakeOrb);
BENCHMARK(MakeShared);
#ifdef ORB_BENCH_QT
BENCHMARK(MakeQt);
#endif
#ifdef ORB_BENCH_GLIB
BENCHMARK(MakeGlib);
#endif
BENCHMARK(GrowOrb);
BENCHMARK(GrowStd);
ORB_ROWS(ORB_IDLE)
ORB_ROWS(ORB_TWO)
BENCHMARK(ZeroedUnicode)->Apply(KindsAndSizes);
BENCHMARK(DeriveUnicodeOrb)->Apply(KindsAndSizes)->UseManualTime();
BENCHMARK(DeriveScannedUnicodeOrb)->Apply(KindsAndSizes)->UseManualTime();
BENCHMARK(RoadUnicodeOrb)->Apply(KindsAndSizes);
BENCHMARK(BareUnicodeOrb)->Apply(KindsAndSizes);
BENCHMARK(BareUnicodeIcu)->Apply(KindsAndSizes);
BENCHMARK(DeriveUtf8Orb)->Apply(KindsAndSizes)->UseManualTime();
BENCHMARK(RoadUtf8Orb)->Apply(KindsAndSizes);
BENCHMARK(BareUtf8Orb)->Apply(KindsAndSizes);
BENCHMARK(BareUtf8Icu)->Apply(KindsAndSizes);
#ifdef ORB_BENCH_QT
BENCHMARK(DeriveUnicodeQt)->Apply(KindsAndSizes)->UseManualTime();
BENCHMARK(RoadUnicodeQt)->Apply(KindsAndSizes);
BENCHMARK(DeriveUtf8Qt)->Apply(KindsAndSizes)->UseManualTime();
BENCHMARK(RoadUtf8Qt)->Apply(KindsAndSizes);
#endif

}  // namespace

int main(int count, char** arguments) {
  // Memory that is freed stays with the process, so that no row is charged for the kernel clearing
  // the same pages again in every round.
  mallopt(M_TRIM_THRESHOLD, 1 << 30);
  mallopt(M_MMAP_THRESHOLD, 1 << 30);
  benchmark::Initialize(&count, arguments);
  benchmark::RunSpecifiedBenchmarks();
}

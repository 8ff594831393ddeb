// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <orb/strings/string_data.h>
#include <pthread.h>
#include <unicode/ustring.h>

#include <cstdlib>
#include <cstring>
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

// 0: alone; 1: an idle thread beside it. Two threads share one value in the last row of each.
#define ORB_SHARE_ROWS(function)                         \
  BENCHMARK(function)->Arg(0)->Name(#function "/alone"); \
  BENCHMARK(function)->Arg(1)->Name(#function "/idle");  \
  BENCHMARK(function)->Arg(2)->Threads(2)->UseRealTime()->Name(#function "/two")
ORB_SHARE_ROWS(ShareLockPairs);
ORB_SHARE_ROWS(ShareOrb);
ORB_SHARE_ROWS(ShareShared);
ORB_SHARE_ROWS(ShareDeep);

void MakeOrb(benchmark::State& state) {
  for (auto _ : state) {
    COrbStringData text{OrbCharUtf8(kPath)};
    benchmark::DoNotOptimize(text);
  }
}
BENCHMARK(MakeOrb);

void MakeShared(benchmark::State& state) {
  for (auto _ : state) {
    auto text = std::make_shared<const std::string>(kPath);
    benchmark::DoNotOptimize(text);
  }
}
BENCHMARK(MakeShared);

template <typename Text>
void Grow(benchmark::State& state, const Text& text) {
  for (auto _ : state) {
    std::vector<Text> texts;
    for (int i = 0; i < 1000; ++i) texts.push_back(text);
    benchmark::DoNotOptimize(texts.data());
  }
}

template <typename Text>
void GrowUnshared(benchmark::State& state) {
  for (auto _ : state) {
    std::vector<Text> texts;
    for (int i = 0; i < 1000; ++i) texts.push_back(Text(kPath));
    benchmark::DoNotOptimize(texts.data());
  }
}

void GrowOrb(benchmark::State& state) {
  for (auto _ : state) {
    std::vector<COrbStringData> texts;
    for (int i = 0; i < 1000; ++i) texts.emplace_back(OrbCharUtf8(kPath));
    benchmark::DoNotOptimize(texts.data());
  }
}
BENCHMARK(GrowOrb);
void GrowStd(benchmark::State& state) { GrowUnshared<std::string>(state); }
BENCHMARK(GrowStd);

/// Texts of whole characters, at most `size` bytes of UTF-8.
std::string Sample(int kind, std::size_t size) {
  static const char* const kPieces[] = {
      "The quick brown fox jumps over the lazy dog. ",
      "Größe, Übermut, déjà vu, façade, naïve, señor, Ångström: ",
      "日本語の写真を整理するための道具です。中文照片管理",
      "Holiday 😀🎉 by the sea 🌊 and 👍🏽 ",
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

/// The derivation alone: the value is made and ended outside the clock's view by being a member of
/// the row's own loop, which BareOrb leaves out.
void ToUnicodeOrb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  for (auto _ : state) {
    COrbStringData made{OrbCharUtf8(text.c_str())};
    benchmark::DoNotOptimize(made.GetPtrUnicode());
  }
  SetBytes(state, text);
}

void ToUnicodeBare(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  std::u16string out(text.size() + orb::platform::kSlack, u'\0');
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Utf16FromUtf8(text, out.data()));
    benchmark::ClobberMemory();
  }
  SetBytes(state, text);
}

void ToUnicodeIcu(benchmark::State& state) {
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

void ToUtf8Orb(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const std::u16string units = SampleUnits(state);
  const OrbCharUnicode from(reinterpret_cast<const unsigned short*>(units.c_str()));
  for (auto _ : state) {
    COrbStringData made{from};
    benchmark::DoNotOptimize(made.GetPtrUtf8());
  }
  SetBytes(state, text);
}

void ToUtf8Bare(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const std::u16string units = SampleUnits(state);
  std::string out(3 * units.size() + orb::platform::kSlack, '\0');
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Utf8FromUtf16(units, out.data()));
    benchmark::ClobberMemory();
  }
  SetBytes(state, text);
}

void ToUtf8Icu(benchmark::State& state) {
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

/// Kinds: 0 ASCII, 1 accented Latin, 2 CJK, 3 emoji among ASCII.
void KindsAndSizes(benchmark::internal::Benchmark* rows) {
  rows->ArgNames({"kind", "bytes"});
  rows->ArgsProduct({{0, 1, 2, 3}, {64, 1 << 10, 1 << 16, 1 << 20}});
}
BENCHMARK(ToUnicodeOrb)->Apply(KindsAndSizes);
BENCHMARK(ToUnicodeBare)->Apply(KindsAndSizes);
BENCHMARK(ToUnicodeIcu)->Apply(KindsAndSizes);
BENCHMARK(ToUtf8Orb)->Apply(KindsAndSizes);
BENCHMARK(ToUtf8Bare)->Apply(KindsAndSizes);
BENCHMARK(ToUtf8Icu)->Apply(KindsAndSizes);

#ifdef ORB_BENCH_QT
void ShareQt(benchmark::State& state) {
  static const QString text = QString::fromUtf8(kPath);
  Share(state, text);
}
ORB_SHARE_ROWS(ShareQt);

void MakeQt(benchmark::State& state) {
  for (auto _ : state) {
    QString text = QString::fromUtf8(kPath);
    benchmark::DoNotOptimize(text);
  }
}
BENCHMARK(MakeQt);

void ToUnicodeQt(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  for (auto _ : state) {
    QString made = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
    benchmark::DoNotOptimize(made);
  }
  SetBytes(state, text);
}
BENCHMARK(ToUnicodeQt)->Apply(KindsAndSizes);

void ToUtf8Qt(benchmark::State& state) {
  const std::string text = SampleBytes(state);
  const QString units = QString::fromStdString(text);
  for (auto _ : state) {
    QByteArray made = units.toUtf8();
    benchmark::DoNotOptimize(made);
  }
  SetBytes(state, text);
}
BENCHMARK(ToUtf8Qt)->Apply(KindsAndSizes);
#endif

#ifdef ORB_BENCH_GLIB
void MakeGlib(benchmark::State& state) {
  for (auto _ : state) {
    char* text = g_ref_string_new(kPath);
    benchmark::DoNotOptimize(text);
    g_ref_string_release(text);
  }
}
BENCHMARK(MakeGlib);
#endif

}  // namespace

BENCHMARK_MAIN();

// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <orb/path/file_path.h>
#include <orb/strings/string_data.h>
#include <orb/strings/string_functions.h>
#include <pthread.h>
#include <unicode/unistr.h>

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "orb/thread/event.h"
#include "support.h"

#ifdef ORB_BENCH_QT
#include <QString>
#endif
#ifdef ORB_BENCH_GLIB
#include <glib.h>
#endif

/// \file
/// Sharing, making, growing, formatting and cutting texts.

namespace {

using bench::PathOf;
using bench::TextOf;

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
  ~RecursiveMutex() { pthread_mutex_destroy(&mutex_); }
  RecursiveMutex(const RecursiveMutex&) = delete;
  RecursiveMutex& operator=(const RecursiveMutex&) = delete;

  void Enter() { pthread_mutex_lock(&mutex_); }
  void Leave() { pthread_mutex_unlock(&mutex_); }

 private:
  pthread_mutex_t mutex_;
};

/// The least that the contract allows: every owner stands in a chain that is changed under the
/// value's recursive lock.
class ChainOwner {
 public:
  struct Value {
    RecursiveMutex lock;
    std::string text;
  };

  explicit ChainOwner(Value* value) : value_(value) {}
  ChainOwner(const ChainOwner& other) : prev_(&other), value_(other.value_) {
    value_->lock.Enter();
    next_ = other.next_;
    if (next_ != nullptr) next_->prev_ = this;
    other.next_ = this;
    value_->lock.Leave();
  }
  ChainOwner& operator=(const ChainOwner&) = delete;
  ~ChainOwner() {
    value_->lock.Enter();
    if (prev_ != nullptr) prev_->next_ = next_;
    if (next_ != nullptr) next_->prev_ = prev_;
    value_->lock.Leave();
  }

  const char* Text() const { return value_->text.c_str(); }

 private:
  mutable const ChainOwner* prev_ = nullptr;
  mutable const ChainOwner* next_ = nullptr;
  Value* value_;
};

const char* Read(const COrbStringData& text) { return text.GetPtrUtf8(); }
const char* Read(const std::shared_ptr<const std::string>& text) { return text->c_str(); }
const char* Read(const std::string& text) { return text.c_str(); }
const char* Read(const ChainOwner& text) { return text.Text(); }

const ChainOwner& Chain() {
  static ChainOwner::Value value{{}, kPath};
  static const ChainOwner first(&value);
  return first;
}

const COrbStringData& SharedOrb() {
  static const COrbStringData text = TextOf(kPath);
  return text;
}

const std::shared_ptr<const std::string>& SharedPointer() {
  static const auto text = std::make_shared<const std::string>(kPath);
  return text;
}

const std::string& Deep() {
  static const std::string text(kPath);
  return text;
}

#ifdef ORB_BENCH_QT
const void* Read(const QString& text) { return text.constData(); }

const QString& SharedQt() {
  static const QString text = QString::fromUtf8(kPath);
  return text;
}
#endif

/// A second thread that does nothing: the process counts as threaded.
class IdleThread {
 public:
  IdleThread() : thread_([this] { end_.Wait(); }) {}
  ~IdleThread() {
    end_.Set();
    thread_.join();
  }
  IdleThread(const IdleThread&) = delete;
  IdleThread& operator=(const IdleThread&) = delete;

 private:
  COrbEvent end_;
  std::thread thread_;
};

template <auto kText>
void Share(benchmark::State& state) {
  const auto& text = kText();
  for (auto _ : state) {
    auto copy(text);
    benchmark::DoNotOptimize(copy);
  }
}

void ShareLockPairs(benchmark::State& state) {
  static RecursiveMutex mutex;
  for (auto _ : state) {
    for (int pair = 0; pair < 2; ++pair) {
      mutex.Enter();
      mutex.Leave();
    }
  }
}

template <auto kShare>
void ShareIdle(benchmark::State& state) {
  const IdleThread idle;
  kShare(state);
}

/// Every thread copies the one value, reads the copy and ends it.
template <auto kText>
void ShareAndRead(benchmark::State& state) {
  const auto& text = kText();
  for (auto _ : state) {
    auto copy(text);
    benchmark::DoNotOptimize(*static_cast<const volatile char*>(Read(copy)));
  }
}

template <typename Make>
void Repeat(benchmark::State& state, Make make) {
  for (auto _ : state) benchmark::DoNotOptimize(make());
}

void MakeOrb(benchmark::State& state) {
  Repeat(state, [] { return TextOf(kPath); });
}
void MakeShared(benchmark::State& state) {
  Repeat(state, [] { return std::make_shared<const std::string>(kPath); });
}

/// Each text is its list's own, so that growing moves what nobody shares.
template <typename Text, typename Make>
void Grow(benchmark::State& state, Make make) {
  for (auto _ : state) {
    std::vector<Text> texts;
    for (std::int64_t i = 0; i < state.range(0); ++i) texts.push_back(make());
    benchmark::DoNotOptimize(texts.data());
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
}

void GrowOrb(benchmark::State& state) {
  Grow<COrbStringData>(state, [] { return TextOf(kPath); });
}
void GrowStd(benchmark::State& state) {
  Grow<std::string>(state, [] { return std::string(kPath); });
}
void GrowPathsOrb(benchmark::State& state) {
  Grow<COrbFilePath>(state, [] { return PathOf(kPath); });
}
void GrowPathsStd(benchmark::State& state) {
  Grow<std::filesystem::path>(state, [] { return std::filesystem::path(kPath); });
}

// Formatting, cutting and appending.

void FormatOrb(benchmark::State& state) {
  const COrbStringData format = TextOf("%s_%04d (%d x %d) %.2f s.%s");
  Repeat(state,
         [&] { return OrbStringDataFormat(&format, "IMG", 1234, 6000, 4000, 0.125, "JPG"); });
}

void FormatStd(benchmark::State& state) {
  Repeat(state, [] {
    char text[64];
    const int length = std::snprintf(
        text, sizeof(text), "%s_%04d (%d x %d) %.2f s.%s", "IMG", 1234, 6000, 4000, 0.125, "JPG");
    return std::string(text, static_cast<std::size_t>(length));
  });
}

constexpr const char* kCaption = "Größe der Düne bei Rauschen, 14. Juli, mit Émile und Zoë am Meer";

void MidOrb(benchmark::State& state) {
  const COrbStringData text = TextOf(kCaption);
  Repeat(state, [&] { return text.Mid(10, 20); });
}

/// Bytes, not characters.
void MidStd(benchmark::State& state) {
  const std::string text(kCaption);
  Repeat(state, [&] { return text.substr(10, 20); });
}

void MidIcu(benchmark::State& state) {
  const icu::UnicodeString text = icu::UnicodeString::fromUTF8(kCaption);
  Repeat(state, [&] { return icu::UnicodeString(text, 10, 20); });
}

/// A text that grows piece by piece, and what reads it at the end.
template <typename Text>
void Append(benchmark::State& state, const Text& piece) {
  for (auto _ : state) {
    Text text;
    for (std::int64_t i = 0; i < state.range(0); ++i) text += piece;
    benchmark::DoNotOptimize(text);
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
}

constexpr const char* kPiece = "IMG_1234.JPG, ";

void AppendOrb(benchmark::State& state) { Append(state, TextOf(kPiece)); }
void AppendStd(benchmark::State& state) { Append<std::string>(state, kPiece); }
void AppendIcu(benchmark::State& state) {
  Append<icu::UnicodeString>(state, icu::UnicodeString::fromUTF8(kPiece));
}

/// What a new value at each step forces: a block of the whole length, and its bytes copied.
void AppendNewValues(benchmark::State& state) {
  const std::string piece(kPiece);
  for (auto _ : state) {
    std::unique_ptr<char[]> text(new char[1]);
    std::size_t length = 0;
    for (std::int64_t i = 0; i < state.range(0); ++i) {
      std::unique_ptr<char[]> next(new char[length + piece.size() + 1]);
      std::memcpy(next.get(), text.get(), length);
      std::memcpy(next.get() + length, piece.c_str(), piece.size() + 1);
      length += piece.size();
      text = std::move(next);
      benchmark::DoNotOptimize(text.get());
    }
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
}

#ifdef ORB_BENCH_QT
void MakeQt(benchmark::State& state) {
  Repeat(state, [] { return QString::fromUtf8(kPath); });
}
void GrowQt(benchmark::State& state) {
  Grow<QString>(state, [] { return QString::fromUtf8(kPath); });
}
void FormatQt(benchmark::State& state) {
  Repeat(state, [] {
    return QString::asprintf("%s_%04d (%d x %d) %.2f s.%s", "IMG", 1234, 6000, 4000, 0.125, "JPG");
  });
}
void MidQt(benchmark::State& state) {
  const QString text = QString::fromUtf8(kCaption);
  Repeat(state, [&] { return text.mid(10, 20); });
}
void AppendQt(benchmark::State& state) { Append(state, QString::fromUtf8(kPiece)); }
#endif

#ifdef ORB_BENCH_GLIB
/// Frees what `make` makes.
template <typename Make, typename End>
void MakeAndEnd(benchmark::State& state, Make make, End end) {
  for (auto _ : state) {
    auto* text = make();
    benchmark::DoNotOptimize(text);
    end(text);
  }
}

void MakeGlib(benchmark::State& state) {
  MakeAndEnd(
      state, [] { return g_ref_string_new(kPath); }, g_ref_string_release);
}
void FormatGlib(benchmark::State& state) {
  const auto format = [] {
    return g_strdup_printf("%s_%04d (%d x %d) %.2f s.%s", "IMG", 1234, 6000, 4000, 0.125, "JPG");
  };
  MakeAndEnd(state, format, g_free);
}
void MidGlib(benchmark::State& state) {
  MakeAndEnd(
      state, [] { return g_utf8_substring(kCaption, 10, 30); }, g_free);
}
void AppendGlib(benchmark::State& state) {
  for (auto _ : state) {
    GString* text = g_string_new(nullptr);
    for (std::int64_t i = 0; i < state.range(0); ++i) g_string_append(text, kPiece);
    benchmark::DoNotOptimize(text->str);
    g_string_free(text, TRUE);
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
}
#endif

// Once a thread has been started, locks cost more for good: the rows of a process with one thread
// stand before all others, and run.py starts them in a process of their own.

BENCHMARK(ShareLockPairs)->Name("Share-alone/limit-lock-pairs");
BENCHMARK(Share<Chain>)->Name("Share-alone/limit-owner-chain");
BENCHMARK(Share<SharedOrb>)->Name("Share-alone/Orb");
BENCHMARK(Share<SharedPointer>)->Name("Share-alone/std-shared");
BENCHMARK(Share<Deep>)->Name("Share-alone/std-deep");
#ifdef ORB_BENCH_QT
BENCHMARK(Share<SharedQt>)->Name("Share-alone/Qt");
#endif

BENCHMARK(ShareIdle<ShareLockPairs>)->Name("Share-idle/limit-lock-pairs");
BENCHMARK(ShareIdle<Share<Chain>>)->Name("Share-idle/limit-owner-chain");
BENCHMARK(ShareIdle<Share<SharedOrb>>)->Name("Share-idle/Orb");
BENCHMARK(ShareIdle<Share<SharedPointer>>)->Name("Share-idle/std-shared");
BENCHMARK(ShareIdle<Share<Deep>>)->Name("Share-idle/std-deep");
#ifdef ORB_BENCH_QT
BENCHMARK(ShareIdle<Share<SharedQt>>)->Name("Share-idle/Qt");
#endif

void Contended(benchmark::internal::Benchmark* row, int threads) {
  row->Arg(threads)->Threads(threads)->UseRealTime();
}
void Two(benchmark::internal::Benchmark* row) { Contended(row, 2); }
void Sixteen(benchmark::internal::Benchmark* row) { Contended(row, 16); }

#define ORB_CONTENDED(text, row)                                         \
  BENCHMARK(ShareAndRead<text>)->Name("Share-threads/" row)->Apply(Two); \
  BENCHMARK(ShareAndRead<text>)->Name("Share-threads/" row)->Apply(Sixteen)
ORB_CONTENDED(Chain, "limit-owner-chain");
ORB_CONTENDED(SharedOrb, "Orb");
ORB_CONTENDED(SharedPointer, "std-shared");
ORB_CONTENDED(Deep, "std-deep");
#ifdef ORB_BENCH_QT
ORB_CONTENDED(SharedQt, "Qt");
#endif

BENCHMARK(MakeOrb)->Name("Make/Orb");
BENCHMARK(MakeShared)->Name("Make/std-shared");

void Growing(benchmark::internal::Benchmark* row) {
  row->RangeMultiplier(10)->Range(1000, 1'000'000)->Unit(benchmark::kMillisecond);
}
BENCHMARK(GrowOrb)->Name("GrowVector/Orb")->Apply(Growing);
BENCHMARK(GrowPathsOrb)->Name("GrowVector-paths/Orb")->Apply(Growing);
BENCHMARK(GrowStd)->Name("GrowVector/std")->Apply(Growing);
BENCHMARK(GrowStd)->Name("GrowVector-paths/std-string")->Apply(Growing);
BENCHMARK(GrowPathsStd)->Name("GrowVector-paths/std")->Apply(Growing);

BENCHMARK(FormatOrb)->Name("Format/Orb");
BENCHMARK(FormatStd)->Name("Format/std");
BENCHMARK(MidOrb)->Name("Mid/Orb");
BENCHMARK(MidStd)->Name("Mid/std");
BENCHMARK(MidIcu)->Name("Mid/ICU");

void Steps(benchmark::internal::Benchmark* row) {
  for (const int steps : {10, 100, 1000}) row->Arg(steps);
}
BENCHMARK(AppendOrb)->Name("Append/Orb")->Apply(Steps);
BENCHMARK(AppendStd)->Name("Append/std")->Apply(Steps);
BENCHMARK(AppendIcu)->Name("Append/ICU")->Apply(Steps);
BENCHMARK(AppendNewValues)->Name("Append/limit-new-values")->Apply(Steps);

#ifdef ORB_BENCH_QT
BENCHMARK(MakeQt)->Name("Make/Qt");
BENCHMARK(GrowQt)->Name("GrowVector/Qt")->Apply(Growing);
BENCHMARK(FormatQt)->Name("Format/Qt");
BENCHMARK(MidQt)->Name("Mid/Qt");
BENCHMARK(AppendQt)->Name("Append/Qt")->Apply(Steps);
#endif
#ifdef ORB_BENCH_GLIB
BENCHMARK(MakeGlib)->Name("Make/GLib");
BENCHMARK(FormatGlib)->Name("Format/GLib");
BENCHMARK(MidGlib)->Name("Mid/GLib");
BENCHMARK(AppendGlib)->Name("Append/GLib")->Apply(Steps);
#endif

}  // namespace

int main(int count, char** arguments) {
  bench::KeepMemory();
  benchmark::Initialize(&count, arguments);
  benchmark::RunSpecifiedBenchmarks();
}

// SPDX-License-Identifier: MIT
// Searching, replacing, splitting, trimming and comparing, beside the installed peers. Only the
// ratios within one run mean something. The argument of a row is the size of the text in bytes.
#include <benchmark/benchmark.h>
#include <orb/strings/string_functions.h>
#include <unicode/unorm.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <cstdint>
#include <random>
#include <string>
#include <string_view>
#include <vector>

#include "platform/transcode.h"
#include "strings/string_access.h"
#include "strings/text_search.h"
#include "support.h"

#ifdef ORB_BENCH_QT
#include <QString>
#include <QStringList>
#endif

namespace {

using bench::TextOf;
using orb::platform::Utf16FromUtf8;

/// A text of about `size` bytes with a match every eight characters.
struct Sample {
  std::string text;
  std::string find;
  std::string with;
};

Sample Ascii(std::size_t size) {
  Sample sample{"", "zq", "--+"};
  while (sample.text.size() < size) sample.text += "IMG_01zq";
  return sample;
}

Sample Cjk(std::size_t size) {
  Sample sample{"", "京都", "東"};
  while (sample.text.size() < size) sample.text += "写真家族旅行京都";
  return sample;
}

template <Sample (*kMake)(std::size_t)>
Sample Take(const benchmark::State& state) {
  return kMake(static_cast<std::size_t>(state.range(0)));
}

void Finish(benchmark::State& state) {
  state.SetBytesProcessed(state.iterations() * state.range(0));
}

template <Sample (*kMake)(std::size_t)>
void FindOrb(benchmark::State& state) {
  const Sample sample = Take<kMake>(state);
  const orb::LiteralSearch search(sample.find);
  for (auto _ : state) {
    std::size_t sum = 0;
    search.ForEach(sample.text, [&](std::size_t place) {
      sum += place;
      return true;
    });
    benchmark::DoNotOptimize(sum);
  }
  Finish(state);
}

/// `find(from)` gives the next match, `end` when there is none.
template <typename Find>
void FindAll(benchmark::State& state, std::size_t step, std::size_t end, Find find) {
  for (auto _ : state) {
    std::size_t sum = 0;
    for (std::size_t at = find(0); at != end; at = find(at + step)) sum += at;
    benchmark::DoNotOptimize(sum);
  }
  Finish(state);
}

template <Sample (*kMake)(std::size_t)>
void FindStd(benchmark::State& state) {
  const Sample s = Take<kMake>(state);
  FindAll(state, s.find.size(), std::string::npos, [&](std::size_t at) {
    return s.text.find(s.find, at);
  });
}

template <Sample (*kMake)(std::size_t)>
void FindIcu(benchmark::State& state) {
  const Sample s = Take<kMake>(state);
  const std::u16string text = *Utf16FromUtf8(s.text);
  const std::u16string find = *Utf16FromUtf8(s.find);
  FindAll(state, find.size(), text.size(), [&](std::size_t at) {
    const char16_t* found = u_strFindFirst(text.data() + at,
                                           static_cast<std::int32_t>(text.size() - at),
                                           find.data(),
                                           static_cast<std::int32_t>(find.size()));
    return found == nullptr ? text.size() : static_cast<std::size_t>(found - text.data());
  });
}

template <Sample (*kMake)(std::size_t)>
void ReplaceOrb(benchmark::State& state) {
  const Sample sample = Take<kMake>(state);
  const COrbStringData text = TextOf(sample.text);
  const COrbStringData find = TextOf(sample.find);
  const COrbStringData with = TextOf(sample.with);
  for (auto _ : state) benchmark::DoNotOptimize(OrbStringDataReplace(text, find, with));
  Finish(state);
}

template <Sample (*kMake)(std::size_t)>
void ReplaceStd(benchmark::State& state) {
  const Sample s = Take<kMake>(state);
  for (auto _ : state) {
    std::string out;
    std::size_t done = 0;
    for (std::size_t at; (at = s.text.find(s.find, done)) != std::string::npos;) {
      out.append(s.text, done, at - done).append(s.with);
      done = at + s.find.size();
    }
    out.append(s.text, done);
    benchmark::DoNotOptimize(out);
  }
  Finish(state);
}

template <Sample (*kMake)(std::size_t)>
void SplitStd(benchmark::State& state) {
  const Sample s = Take<kMake>(state);
  for (auto _ : state) {
    std::vector<std::string> pieces;
    std::size_t done = 0;
    for (std::size_t at; (at = s.text.find(s.find, done)) != std::string::npos;) {
      if (at > done) pieces.push_back(s.text.substr(done, at - done));
      done = at + s.find.size();
    }
    if (done < s.text.size()) pieces.push_back(s.text.substr(done));
    benchmark::DoNotOptimize(pieces);
  }
  Finish(state);
}

template <Sample (*kMake)(std::size_t)>
void SplitOrb(benchmark::State& state) {
  const Sample sample = Take<kMake>(state);
  const COrbStringData text = TextOf(sample.text);
  const COrbStringData separator = TextOf(sample.find);
  for (auto _ : state) {
    std::vector<COrbStringData> pieces;
    OrbStringDataSplit(text, separator, &pieces);
    benchmark::DoNotOptimize(pieces);
  }
  Finish(state);
}

template <Sample (*kMake)(std::size_t)>
void TrimOrb(benchmark::State& state) {
  const Sample sample = Take<kMake>(state);
  const COrbStringData text = TextOf(std::string(sample.text.size() / 2, ' ') + sample.text);
  const COrbStringData set = TextOf(" \t");
  for (auto _ : state) benchmark::DoNotOptimize(OrbStringDataTrim(text, set));
  Finish(state);
}

#ifdef ORB_BENCH_QT
template <Sample (*kMake)(std::size_t)>
void FindQt(benchmark::State& state) {
  const Sample s = Take<kMake>(state);
  const QString text = QString::fromStdString(s.text);
  const QString find = QString::fromStdString(s.find);
  FindAll(state, static_cast<std::size_t>(find.size()), SIZE_MAX, [&](std::size_t at) {
    return static_cast<std::size_t>(text.indexOf(find, static_cast<qsizetype>(at)));
  });
}

template <Sample (*kMake)(std::size_t)>
void ReplaceQt(benchmark::State& state) {
  const Sample s = Take<kMake>(state);
  const QString text = QString::fromStdString(s.text);
  const QString find = QString::fromStdString(s.find);
  const QString with = QString::fromStdString(s.with);
  for (auto _ : state) benchmark::DoNotOptimize(QString(text).replace(find, with));
  Finish(state);
}

template <Sample (*kMake)(std::size_t)>
void SplitQt(benchmark::State& state) {
  const Sample s = Take<kMake>(state);
  const QString text = QString::fromStdString(s.text);
  const QString separator = QString::fromStdString(s.find);
  for (auto _ : state) benchmark::DoNotOptimize(text.split(separator, Qt::SkipEmptyParts));
  Finish(state);
}
#endif

void Sizes(benchmark::internal::Benchmark* row) {
  for (const std::int64_t size : {1 << 10, 1 << 16, 1 << 20, 1 << 23}) row->Arg(size);
}

BENCHMARK(FindOrb<Ascii>)->Name("Find-ASCII/Orb")->Apply(Sizes);
BENCHMARK(FindStd<Ascii>)->Name("Find-ASCII/std")->Apply(Sizes);
BENCHMARK(FindIcu<Ascii>)->Name("Find-ASCII/ICU")->Apply(Sizes);
BENCHMARK(FindOrb<Cjk>)->Name("Find-CJK/Orb")->Apply(Sizes);
BENCHMARK(FindStd<Cjk>)->Name("Find-CJK/std")->Apply(Sizes);
BENCHMARK(FindIcu<Cjk>)->Name("Find-CJK/ICU")->Apply(Sizes);
BENCHMARK(ReplaceOrb<Ascii>)->Name("Replace-ASCII/Orb")->Apply(Sizes);
BENCHMARK(ReplaceStd<Ascii>)->Name("Replace-ASCII/std")->Apply(Sizes);
BENCHMARK(ReplaceOrb<Cjk>)->Name("Replace-CJK/Orb")->Apply(Sizes);
BENCHMARK(ReplaceStd<Cjk>)->Name("Replace-CJK/std")->Apply(Sizes);
BENCHMARK(SplitOrb<Ascii>)->Name("Split-ASCII/Orb")->Apply(Sizes);
BENCHMARK(SplitOrb<Cjk>)->Name("Split-CJK/Orb")->Apply(Sizes);
BENCHMARK(SplitStd<Ascii>)->Name("Split-ASCII/std")->Apply(Sizes);
BENCHMARK(SplitStd<Cjk>)->Name("Split-CJK/std")->Apply(Sizes);
BENCHMARK(TrimOrb<Ascii>)->Name("Trim-ASCII/Orb")->Apply(Sizes);
#ifdef ORB_BENCH_QT
BENCHMARK(FindQt<Ascii>)->Name("Find-ASCII/Qt")->Apply(Sizes);
BENCHMARK(FindQt<Cjk>)->Name("Find-CJK/Qt")->Apply(Sizes);
BENCHMARK(ReplaceQt<Ascii>)->Name("Replace-ASCII/Qt")->Apply(Sizes);
BENCHMARK(ReplaceQt<Cjk>)->Name("Replace-CJK/Qt")->Apply(Sizes);
BENCHMARK(SplitQt<Ascii>)->Name("Split-ASCII/Qt")->Apply(Sizes);
BENCHMARK(SplitQt<Cjk>)->Name("Split-CJK/Qt")->Apply(Sizes);
#endif

/// 100,000 names as cameras and people give them, in no order.
std::vector<std::string> PhotoNames() {
  const std::vector<std::string> events = {
      "Sommerurlaub an der Ostsee", "Été à Paris", "Málaga", "家族写真", "Zürich bei Nacht"};
  std::mt19937 random(1904);
  std::vector<std::string> names;
  while (names.size() < 100000) {
    const std::string number = std::to_string(10000 + random() % 90000);
    switch (random() % 4) {
      case 0:
        names.push_back("img_" + number + ".jpg");
        break;
      case 1:
        names.push_back("IMG_" + number + ".JPG");
        break;
      default:
        names.push_back(events[random() % events.size()] + " 2026-07-14 IMG_" + number + ".JPG");
    }
  }
  return names;
}

/// Sorts pointers, so that comparing is what costs.
template <typename Text, typename Compare>
void Sort(benchmark::State& state, const std::vector<Text>& texts, Compare compare) {
  for (auto _ : state) {
    state.PauseTiming();
    std::vector<const Text*> order;
    for (const Text& text : texts) order.push_back(&text);
    state.ResumeTiming();
    std::sort(order.begin(), order.end(), [&](const Text* a, const Text* b) {
      return compare(*a, *b) < 0;
    });
    benchmark::DoNotOptimize(order);
  }
}

void SortOrb(benchmark::State& state) {
  std::vector<COrbStringData> names;
  for (const std::string& name : PhotoNames()) names.push_back(TextOf(name));
  Sort(state, names, OrbStringDataCmpi);
}
BENCHMARK(SortOrb)->Name("SortNames/Orb")->Unit(benchmark::kMillisecond);

/// What bounds it: the bytes as they are, reached in the same way.
void SortOrbBytes(benchmark::State& state) {
  std::vector<COrbStringData> names;
  for (const std::string& name : PhotoNames()) names.push_back(TextOf(name));
  Sort(state, names, [](const COrbStringData& a, const COrbStringData& b) {
    return orb::StringAccess::Read(a).bytes.compare(orb::StringAccess::Read(b).bytes);
  });
}
BENCHMARK(SortOrbBytes)->Name("SortNames/limit-bytes")->Unit(benchmark::kMillisecond);

constexpr const char* kName = "Sommerurlaub an der Ostsee, Größe M, IMG_20261122_1234.JPG";

/// Two equal texts that share nothing.
template <typename Text, typename Compare>
void CompareEqual(benchmark::State& state, const Text& a, const Text& b, Compare compare) {
  for (auto _ : state) {
    const Text* first = &a;
    benchmark::DoNotOptimize(first);
    benchmark::DoNotOptimize(compare(*first, b));
  }
}

void CompareEqualOrb(benchmark::State& state) {
  CompareEqual(state, TextOf(kName), TextOf(kName), OrbStringDataCmpi);
}
BENCHMARK(CompareEqualOrb)->Name("CompareEqual/Orb");

/// With the meaning that ours has: composed and decomposed forms are equal.
int CompareIcu(const std::u16string& a, const std::u16string& b) {
  UErrorCode status = U_ZERO_ERROR;
  return unorm_compare(a.data(),
                       static_cast<std::int32_t>(a.size()),
                       b.data(),
                       static_cast<std::int32_t>(b.size()),
                       U_COMPARE_IGNORE_CASE | U_FOLD_CASE_DEFAULT,
                       &status);
}

void CompareEqualIcu(benchmark::State& state) {
  CompareEqual(state, *Utf16FromUtf8(kName), *Utf16FromUtf8(kName), CompareIcu);
}
BENCHMARK(CompareEqualIcu)->Name("CompareEqual/ICU");

void SortIcu(benchmark::State& state) {
  std::vector<std::u16string> names;
  for (const std::string& name : PhotoNames()) names.push_back(*Utf16FromUtf8(name));
  Sort(state, names, CompareIcu);
}
BENCHMARK(SortIcu)->Name("SortNames/ICU")->Unit(benchmark::kMillisecond);

#ifdef ORB_BENCH_QT
int CompareQt(const QString& a, const QString& b) {
  return QString::compare(a, b, Qt::CaseInsensitive);
}

void CompareEqualQt(benchmark::State& state) {
  CompareEqual(state, QString::fromUtf8(kName), QString::fromUtf8(kName), CompareQt);
}
BENCHMARK(CompareEqualQt)->Name("CompareEqual/Qt");

void SortQt(benchmark::State& state) {
  std::vector<QString> names;
  for (const std::string& name : PhotoNames()) names.push_back(QString::fromStdString(name));
  Sort(state, names, CompareQt);
}
BENCHMARK(SortQt)->Name("SortNames/Qt")->Unit(benchmark::kMillisecond);
#endif

}  // namespace

int main(int count, char** arguments) {
  bench::KeepMemory();
  benchmark::Initialize(&count, arguments);
  benchmark::RunSpecifiedBenchmarks();
}

// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <orb/records/image_property.h>

#include <array>
#include <string>
#include <vector>

#include "support.h"

#ifdef ORB_BENCH_QT
#include <QList>
#include <QString>
#endif

/// \file
/// Copies of a record with seven texts and as many focus areas as the size says, beside a plain
/// struct of the same content. What the record has beyond that is in the struct as one block.

namespace {

constexpr const char* kText = "Sommerurlaub an der Ostsee, Familie am Strand von Prerow";

struct Area {
  float values[4] = {};
  std::int32_t kind = 0;
};

constexpr std::size_t kRest =
    sizeof(COrbImagePropertyData) - 7 * sizeof(COrbStringData) - sizeof(std::vector<COrbFocusArea>);

template <typename Text, template <typename> typename List>
struct Plain {
  std::array<Text, 7> texts;
  List<Area> areas;
  std::array<unsigned char, kRest> rest{};
};

template <typename Record>
void Copy(benchmark::State& state, const Record& record) {
  for (auto _ : state) {
    Record copy(record);
    benchmark::DoNotOptimize(copy);
  }
}

void CopyOrb(benchmark::State& state) {
  COrbImagePropertyData record;
  for (COrbStringData* text : {&record.text1,
                               &record.text2,
                               &record.text3,
                               &record.text4,
                               &record.text5,
                               &record.text6,
                               &record.text7})
    *text = bench::TextOf(kText);
  record.focusAreas.resize(static_cast<std::size_t>(state.range(0)));
  Copy(state, record);
}
BENCHMARK(CopyOrb)->Name("CopyRecord/Orb")->Arg(0)->Arg(50);

template <typename Text>
using Vector = std::vector<Text>;

void CopyStd(benchmark::State& state) {
  Plain<std::string, Vector> record;
  record.texts.fill(kText);
  record.areas.resize(static_cast<std::size_t>(state.range(0)));
  Copy(state, record);
}
BENCHMARK(CopyStd)->Name("CopyRecord/std")->Arg(0)->Arg(50);

#ifdef ORB_BENCH_QT
/// Its list is shared, not copied, until somebody changes it.
void CopyQt(benchmark::State& state) {
  Plain<QString, QList> record;
  for (QString& text : record.texts) text = QString::fromUtf8(kText);
  record.areas.resize(state.range(0));
  Copy(state, record);
}
BENCHMARK(CopyQt)->Name("CopyRecord/Qt")->Arg(0)->Arg(50);
#endif

}  // namespace

BENCHMARK_MAIN();

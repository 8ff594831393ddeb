// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <string>
#include <vector>

#include "support.h"

/// \file
/// orb-import, run as a whole program over a card whose photos all lie in one folder, beside a walk
/// that asks for the size and the time of each.

namespace {

/// A card with `files` photos, made once.
const std::string& Card(int files) {
  static const bench::Folder folder;
  static std::map<int, std::string> cards;
  std::string& card = cards[files];
  if (card.empty()) {
    card = folder / ("card" + std::to_string(files));
    std::filesystem::create_directories(card);
    for (int i = 0; i < files; ++i) {
      char name[32];
      std::snprintf(name, sizeof(name), "/IMG_%06d.JPG", i);
      bench::MakeFile(card + name, 16);
    }
  }
  return card;
}

using Command = std::vector<std::string> (*)(const std::string& card);

void Run(benchmark::State& state, Command command) {
  const std::vector<std::string> words = command(Card(static_cast<int>(state.range(0))));
  for (auto _ : state) bench::Run(words);
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.counters["peak_MiB"] = bench::PeakMebibytes(words);
}

std::vector<std::string> DryRun(const std::string& card) {
  return {ORB_BENCH_IMPORT, "--dry-run", card, card + ".photos"};
}

std::vector<std::string> Find(const std::string& card) {
  return {"find", card, "-printf", "%p %s %T@\n"};
}

void Sizes(benchmark::internal::Benchmark* row) {
  for (const int files : {1000, 10'000, 100'000}) row->Arg(files);
  row->UseRealTime()->Unit(benchmark::kMillisecond);
}
BENCHMARK_CAPTURE(Run, DryRun, DryRun)->Name("DryRun/Orb")->Apply(Sizes);
BENCHMARK_CAPTURE(Run, Find, Find)->Name("DryRun/limit-find")->Apply(Sizes);

}  // namespace

BENCHMARK_MAIN();

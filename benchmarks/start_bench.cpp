// SPDX-License-Identifier: MIT
// The start and end of a program that does nothing, linked to the library or to a peer.
#include <benchmark/benchmark.h>

#include <string>

#include "support.h"

namespace {

void Start(benchmark::State& state, const std::string& program) {
  for (auto _ : state) bench::Run({program});
  state.counters["peak_MiB"] = bench::PeakMebibytes({program});
}

}  // namespace

int main(int argc, char** argv) {
  const std::string own = argv[0];
  const std::string folder = own.substr(0, own.rfind('/') + 1);
  const struct {
    const char* name;
    const char* program;
  } kRows[] = {
      {"Start/std", "start_std"},
      {"Start/Orb", "start_orb"},
#ifdef ORB_BENCH_QT
      {"Start/Qt", "start_qt"},
#endif
#ifdef ORB_BENCH_GLIB
      {"Start/GIO", "start_gio"},
#endif
#ifdef ORB_BENCH_BOOST
      {"Start/Boost", "start_boost"},
#endif
  };
  for (const auto& row : kRows) {
    benchmark::RegisterBenchmark(row.name, Start, folder + row.program)
        ->UseRealTime()
        ->Unit(benchmark::kMicrosecond);
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
}

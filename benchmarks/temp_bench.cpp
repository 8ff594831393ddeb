// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <orb/fileops/create.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <optional>
#include <string>
#include <utility>

#include "support.h"

/// \file
/// photo.jpg, photo_1.jpg, ... in one folder, each made before the next is asked for. On ext4 use a
/// new file system (TMPDIR): one in use looks at every inode that was deleted a moment ago. The
/// plain loop takes a minute or two for 10,000, so it runs to 2,000 unless ORB_BENCH_LONG is set.

namespace {

std::string NumberedPath(const std::string& folder, std::int64_t number) {
  if (number == 0) return folder + "/photo.jpg";
  return folder + "/photo_" + std::to_string(number) + ".jpg";
}

bool CreateExclusively(const std::string& path) {
  const int file = ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
  if (file >= 0) ::close(file);
  return file >= 0;
}

/// Calls `create` with the folder for each name; in the end exactly the first names must be there.
template <typename Create>
void TimeNames(benchmark::State& state, Create create) {
  for (auto _ : state) {
    state.PauseTiming();
    std::optional<bench::Folder> folder(std::in_place);
    state.ResumeTiming();
    for (std::int64_t i = 0; i < state.range(0); ++i) create(folder->Path(), i);
    state.PauseTiming();
    if (::access(NumberedPath(folder->Path(), state.range(0) - 1).c_str(), F_OK) != 0) {
      state.SkipWithError("not the names of the plain loop");
    }
    folder.reset();
    state.ResumeTiming();
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
}

void UniqueNames_Orb(benchmark::State& state) {
  const COrbStringData name = OrbCharUtf8("photo.jpg");
  TimeNames(state, [&](const std::string& path, std::int64_t) {
    const COrbStringData text = OrbCharUtf8(path.c_str());
    COrbFilePath folder;
    folder.Initialize(&text);
    COrbFilePath result;
    benchmark::DoNotOptimize(OrbCreateUniqueFile(folder, name, &result));
  });
}

/// What cannot be beaten: somebody tells the number.
void UniqueNames_NumberKnown(benchmark::State& state) {
  TimeNames(state, [](const std::string& folder, std::int64_t number) {
    benchmark::DoNotOptimize(CreateExclusively(NumberedPath(folder, number)));
  });
}

void UniqueNames_PlainLoop(benchmark::State& state) {
  TimeNames(state, [](const std::string& folder, std::int64_t) {
    std::int64_t number = 0;
    while (::access(NumberedPath(folder, number).c_str(), F_OK) == 0) ++number;
    benchmark::DoNotOptimize(CreateExclusively(NumberedPath(folder, number)));
  });
}

void Usual(benchmark::internal::Benchmark* row) {
  row->Arg(1000)->Arg(2000)->Arg(10'000)->Iterations(1)->UseRealTime();
  row->Unit(benchmark::kMillisecond);
}

void Slow(benchmark::internal::Benchmark* row) {
  row->Arg(1000)->Arg(2000)->Iterations(1)->UseRealTime()->Unit(benchmark::kMillisecond);
  if (std::getenv("ORB_BENCH_LONG") != nullptr) row->Arg(10'000);
}

BENCHMARK(UniqueNames_Orb)->Name("UniqueNames/Orb")->Apply(Usual);
BENCHMARK(UniqueNames_NumberKnown)->Name("UniqueNames/limit-number-known")->Apply(Usual);
BENCHMARK(UniqueNames_PlainLoop)->Name("UniqueNames/loop")->Apply(Slow);

}  // namespace

BENCHMARK_MAIN();

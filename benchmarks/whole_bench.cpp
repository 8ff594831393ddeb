// SPDX-License-Identifier: MIT
// Whole programs that copy and remove, over the size of a tree (files of 8 KiB, 100 in a folder)
// and of a file (MiB): the time, and the most memory, which must not grow.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

#include "support.h"

namespace {

constexpr std::size_t kSmallFile = 8192;
constexpr std::size_t kMebibyte = 1 << 20;

using Words = std::vector<std::string>;

/// A folder with `source`, and what is done with it.
using Fill = void (*)(const std::string& source, std::int64_t size);
using Command = Words (*)(const bench::Folder& folder);

void FillTree(const std::string& source, std::int64_t files) {
  const int in_folder = static_cast<int>(std::min<std::int64_t>(files, 100));
  bench::MakeTree(source, static_cast<int>(files / in_folder), in_folder, kSmallFile);
}

void FillFile(const std::string& source, std::int64_t mebibytes) {
  bench::MakeFile(source, static_cast<std::size_t>(mebibytes) * kMebibyte);
}

Words CopyOrb(const bench::Folder& folder) {
  return {ORB_BENCH_WHOLE, "copy", folder / "source", folder.Path(), "copy"};
}
Words CopyCp(const bench::Folder& folder) {
  return {"cp", "-a", folder / "source", folder / "copy"};
}
Words RemoveOrb(const bench::Folder& folder) {
  return {ORB_BENCH_WHOLE, "remove", folder / "source"};
}
Words RemoveRm(const bench::Folder& folder) { return {"rm", "-rf", folder / "source"}; }

/// A round works on what was made for it; the memory is that of one more round.
void Run(benchmark::State& state, Fill fill, Command command) {
  for (auto _ : state) {
    state.PauseTiming();
    {
      const bench::Folder folder;
      fill(folder / "source", state.range(0));
      state.ResumeTiming();
      bench::Run(command(folder));
      state.PauseTiming();
    }
    state.ResumeTiming();
  }
  const bench::Folder folder;
  fill(folder / "source", state.range(0));
  state.counters["peak_MiB"] = bench::PeakMebibytes(command(folder));
}

void Trees(benchmark::internal::Benchmark* row) {
  for (const int files : {100, 1000, 10'000}) row->Arg(files);
  row->UseRealTime()->Unit(benchmark::kMillisecond);
}

void Files(benchmark::internal::Benchmark* row) {
  for (const int mebibytes : {1, 32, 256}) row->Arg(mebibytes);
  row->UseRealTime()->Unit(benchmark::kMillisecond);
}

BENCHMARK_CAPTURE(Run, CopyTreeOrb, FillTree, CopyOrb)->Name("WholeCopyTree/Orb")->Apply(Trees);
BENCHMARK_CAPTURE(Run, CopyTreeCp, FillTree, CopyCp)->Name("WholeCopyTree/cp")->Apply(Trees);
BENCHMARK_CAPTURE(Run, RemoveTreeOrb, FillTree, RemoveOrb)
    ->Name("WholeRemoveTree/Orb")
    ->Apply(Trees);
BENCHMARK_CAPTURE(Run, RemoveTreeRm, FillTree, RemoveRm)->Name("WholeRemoveTree/rm")->Apply(Trees);
BENCHMARK_CAPTURE(Run, CopyFileOrb, FillFile, CopyOrb)->Name("WholeCopyFile/Orb")->Apply(Files);
BENCHMARK_CAPTURE(Run, CopyFileCp, FillFile, CopyCp)->Name("WholeCopyFile/cp")->Apply(Files);

}  // namespace

BENCHMARK_MAIN();

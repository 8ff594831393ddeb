// SPDX-License-Identifier: MIT
// The start and end of a program that does nothing, linked to the library or to a peer.
#include <benchmark/benchmark.h>
#include <spawn.h>
#include <sys/wait.h>

#include <string>

extern char** environ;

namespace {

bool RunOnce(const std::string& program) {
  char* arguments[] = {const_cast<char*>(program.c_str()), nullptr};
  pid_t child = 0;
  if (posix_spawn(&child, program.c_str(), nullptr, nullptr, arguments, environ) != 0) return false;
  int status = 0;
  return waitpid(child, &status, 0) == child && status == 0;
}

void Start(benchmark::State& state, const std::string& program) {
  for (auto _ : state) {
    if (!RunOnce(program)) {
      state.SkipWithError("the program did not run");
      break;
    }
  }
}

}  // namespace

int main(int argc, char** argv) {
  const std::string own = argv[0];
  const std::string folder = own.substr(0, own.rfind('/') + 1);
  const struct {
    const char* name;
    const char* program;
  } kRows[] = {
      {"Start/libstdc++", "start_std"},
      {"Start/OrbRTL", "start_orb"},
#ifdef ORB_BENCH_QT
      {"Start/Qt", "start_qt"},
#endif
#ifdef ORB_BENCH_GLIB
      {"Start/GIO", "start_gio"},
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

// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <orb/fileops/copy.h>
#include <orb/fileops/create.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <initializer_list>
#include <string>
#include <vector>

#include "platform/copier.h"
#include "platform/removal.h"

namespace {

namespace fs = std::filesystem;

/// A folder below ORB_BENCH_FOLDER, or the temporary directory, that goes away with the program's
/// round.
class Folder {
 public:
  Folder() {
    const char* chosen = std::getenv("ORB_BENCH_FOLDER");
    const fs::path above = chosen != nullptr ? fs::path(chosen) : fs::temp_directory_path();
    path_ = (above / "orb-bench-XXXXXX").string();
    if (::mkdtemp(path_.data()) == nullptr) std::abort();
  }
  ~Folder() { fs::remove_all(path_); }
  Folder(const Folder&) = delete;
  Folder& operator=(const Folder&) = delete;

  const std::string& Path() const { return path_; }
  std::string operator/(const std::string& name) const { return path_ + "/" + name; }

 private:
  std::string path_;
};

COrbStringData TextOf(const std::string& utf8) { return COrbStringData(OrbCharUtf8(utf8.c_str())); }

COrbFilePath PathOf(const std::string& utf8) {
  const COrbStringData text = TextOf(utf8);
  COrbFilePath path;
  path.Initialize(&text);
  return path;
}

std::string MakeFile(const Folder& folder, std::int64_t mebibytes) {
  const std::string path = folder / "source";
  std::ofstream file(path, std::ios::binary);
  const std::string block(1 << 20, 'x');
  for (std::int64_t i = 0; i < mebibytes; ++i) file << block;
  return path;
}

std::string MakeTree(const Folder& folder) {
  const std::string block(8192, 'x');
  for (int i = 0; i < 50; ++i) {
    const std::string branch = folder / ("source/" + std::to_string(i));
    fs::create_directories(branch);
    for (int j = 0; j < 100; ++j)
      std::ofstream(branch + "/" + std::to_string(j), std::ios::binary) << block;
  }
  return folder / "source";
}

extern "C" char** environ;

/// Runs a program and waits for it.
void Run(std::initializer_list<std::string> command) {
  std::vector<std::string> words(command);
  std::vector<char*> arguments;
  for (std::string& word : words) arguments.push_back(word.data());
  arguments.push_back(nullptr);
  pid_t child = 0;
  int status = 0;
  const int failed =
      ::posix_spawnp(&child, arguments[0], nullptr, nullptr, arguments.data(), environ);
  if (failed != 0 || ::waitpid(child, &status, 0) != child || status != 0) std::abort();
}

/// What nobody can beat who moves every byte through 64 KiB.
void CopyBare(const std::string& source, const std::string& destination) {
  std::array<char, 65536> buffer;
  const int from = ::open(source.c_str(), O_RDONLY | O_CLOEXEC);
  const int to = ::open(destination.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0666);
  for (ssize_t count; (count = ::read(from, buffer.data(), buffer.size())) > 0;) {
    if (::write(to, buffer.data(), static_cast<std::size_t>(count)) != count) std::abort();
  }
  ::close(from);
  ::close(to);
}

/// Times `make`, which makes folder/copy; taking that away again is not timed.
template <typename Make>
void Measure(benchmark::State& state, const Folder& folder, Make make) {
  for ([[maybe_unused]] auto round : state) {
    make(folder / "copy");
    state.PauseTiming();
    fs::remove_all(folder / "copy");
    state.ResumeTiming();
  }
}

bool GoOn(void* calls) {
  ++*static_cast<int*>(calls);
  return true;
}

void StreamBare(benchmark::State& state) {
  const Folder folder;
  const std::string source = MakeFile(folder, state.range(0));
  Measure(state, folder, [&](const std::string& copy) { CopyBare(source, copy); });
}

void StreamOrb(benchmark::State& state) {
  const Folder folder;
  const COrbFilePath source = PathOf(MakeFile(folder, state.range(0)));
  const COrbFilePath above = PathOf(folder.Path());
  const bool reports = state.range(1) != 0;
  int calls = 0;
  Measure(state, folder, [&](const std::string&) {
    if (OrbCopyFileEx(source, above, TextOf("copy"), reports ? GoOn : nullptr, &calls) != 0)
      std::abort();
  });
}

void CopyOrb(benchmark::State& state) {
  const Folder folder;
  const COrbFilePath source = PathOf(MakeFile(folder, state.range(0)));
  const COrbFilePath above = PathOf(folder.Path());
  const COrbStringData name = TextOf("copy");
  Measure(state, folder, [&](const std::string&) {
    if (OrbCopyFileOverwriteEx(source, above, &name, nullptr, nullptr) != 0) std::abort();
  });
}

void CopyCp(benchmark::State& state) {
  const Folder folder;
  const std::string source = MakeFile(folder, state.range(0));
  Measure(state, folder, [&](const std::string& copy) { Run({"cp", "-a", source, copy}); });
}

void TreeOrb(benchmark::State& state) {
  const Folder folder;
  const std::string source = MakeTree(folder);
  Measure(state, folder, [&](const std::string& copy) {
    if (!orb::platform::CopyItem(source, copy)) std::abort();
  });
}

void TreeCp(benchmark::State& state) {
  const Folder folder;
  const std::string source = MakeTree(folder);
  Measure(state, folder, [&](const std::string& copy) { Run({"cp", "-a", source, copy}); });
}

/// Times the removal of a tree that is made afresh each round.
template <typename Remove>
void MeasureRemoval(benchmark::State& state, Remove remove) {
  for ([[maybe_unused]] auto round : state) {
    state.PauseTiming();
    const Folder folder;
    const std::string tree = MakeTree(folder);
    state.ResumeTiming();
    remove(tree);
    state.PauseTiming();
    fs::remove_all(folder.Path());
    state.ResumeTiming();
  }
}

void RemoveOrb(benchmark::State& state) {
  MeasureRemoval(state, [](const std::string& tree) {
    if (!orb::platform::RemoveItem(tree)) std::abort();
  });
}

void RemoveRm(benchmark::State& state) {
  MeasureRemoval(state, [](const std::string& tree) { Run({"rm", "-rf", tree}); });
}

/// Makes as many files of one wanted name as the argument says.
template <typename Create>
void MeasureNames(benchmark::State& state, Create create) {
  for ([[maybe_unused]] auto round : state) {
    const Folder folder;
    for (std::int64_t i = 0; i < state.range(0); ++i) create(folder);
    state.PauseTiming();
    fs::remove_all(folder.Path());
    fs::create_directory(folder.Path());
    state.ResumeTiming();
  }
}

void NamesOrb(benchmark::State& state) {
  MeasureNames(state, [](const Folder& folder) {
    COrbFilePath made;
    if (OrbCreateUniqueFile(PathOf(folder.Path()), TextOf("photo.jpg"), &made) != 0) std::abort();
  });
}

void NamesOneByOne(benchmark::State& state) {
  MeasureNames(state, [](const Folder& folder) {
    std::string path = folder / "photo.jpg";
    for (int i = 1; ::access(path.c_str(), F_OK) == 0; ++i)
      path = folder / ("photo_" + std::to_string(i) + ".jpg");
    ::close(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666));
  });
}

// Sizes in MiB. A run worth quoting takes 1024 and a folder on the file system in question.
BENCHMARK(StreamBare)->Arg(64)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(StreamOrb)->Args({64, 0})->Args({64, 1})->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(CopyOrb)->Arg(64)->Arg(1024)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(CopyCp)->Arg(64)->Arg(1024)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(TreeOrb)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(TreeCp)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(RemoveOrb)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(RemoveRm)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(NamesOrb)->Arg(1000)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(NamesOneByOne)->Arg(1000)->UseRealTime()->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();

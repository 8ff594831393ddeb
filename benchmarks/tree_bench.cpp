// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <orb/fileops/copy.h>
#include <orb/fileops/remove.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "file_peers.h"
#include "scratch_volume.h"

/// \file
/// Whole trees and big files, copied and removed on file systems that are made anew for each round.
/// Needs the right to mount and the mkfs programs; run it with random interleaving:
///
///   tree_bench --benchmark_enable_random_interleaving=true --benchmark_repetitions=5
///
/// A round is one operation, and cp and rm are whole commands, as a program would spawn them.

namespace {

namespace fs = std::filesystem;
using bench::PathOf;
using bench::PeakMemory;
using bench::PrivateMemory;
using bench::ScratchVolume;
using bench::TextOf;

constexpr std::uintmax_t kMebibyte = 1 << 20;
constexpr int kFilesInFolder = 100;
constexpr std::size_t kSmallFile = 8192;

struct FileSystem {
  const char* name;
  std::vector<std::string> make;
};

const std::vector<FileSystem>& FileSystems() {
  static const std::vector<FileSystem> all = {
      {"xfs", {"mkfs.xfs", "-q", "-m", "reflink=1"}},
      {"xfs-noreflink", {"mkfs.xfs", "-q", "-m", "reflink=0"}},
      {"ext4", {"mkfs.ext4", "-q", "-F", "-E", "lazy_itable_init=0"}},
      {"btrfs", {"mkfs.btrfs", "-q"}},
  };
  return all;
}

PrivateMemory& Memory() {
  static PrivateMemory memory("4g");
  return memory;
}

void WriteFile(const std::string& path, std::uintmax_t size) {
  const std::string block(static_cast<std::size_t>(std::min(size, kMebibyte)), 'x');
  const int file = ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0644);
  for (std::uintmax_t left = size; left > 0; left -= block.size()) {
    if (::write(file, block.data(), block.size()) != static_cast<ssize_t>(block.size()))
      std::abort();
  }
  const timespec times[2] = {{1500000000, 123456789}, {1400000000, 987654321}};
  ::futimens(file, times);
  ::close(file);
}

void WriteTree(const std::string& root, std::int64_t files) {
  fs::create_directory(root);
  for (std::int64_t i = 0; i < files; ++i) {
    const std::string folder = root + "/" + std::to_string(i / kFilesInFolder);
    if (i % kFilesInFolder == 0) fs::create_directory(folder);
    WriteFile(folder + "/" + std::to_string(i) + ".jpg", kSmallFile);
  }
}

using Seconds = std::chrono::duration<double>;

/// What this process and the commands it ran have used: it tells more than the clock where others
/// use the machine as well.
Seconds ProcessorTime() {
  double sum = 0;
  for (const int who : {RUSAGE_SELF, RUSAGE_CHILDREN}) {
    struct rusage used {};
    ::getrusage(who, &used);
    for (const timeval& time : {used.ru_utime, used.ru_stime})
      sum += static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
  }
  return Seconds(sum);
}

/// One operation from `source` to `copy`, or on `source` alone, for one round.
struct Row {
  const char* name;
  bool (*work)(const ScratchVolume& volume, benchmark::State& state);
};

bool RunCommand(std::vector<std::string> words, benchmark::State& state) {
  state.counters["peak_MiB"] = static_cast<double>(bench::Run(std::move(words))) / 1024;
  return true;
}

template <typename Work>
bool RunHere(benchmark::State& state, Work work) {
  const PeakMemory memory;
  const bool done = work();
  state.counters["peak_MiB"] = static_cast<double>(memory.GrownKibibytes()) / 1024;
  return done;
}

/// Times `row` on a new file system that `prepare` has filled.
template <typename Prepare>
void Measure(benchmark::State& state, const FileSystem& system, const Row& row, Prepare prepare) {
  constexpr std::uintmax_t kImage = 3072 * kMebibyte;
  for (auto round : state) {
    const ScratchVolume volume(Memory(), system.make, kImage);
    if (!volume.Mounted()) {
      state.SkipWithError("no file system can be made: needs mkfs and the right to mount");
      break;
    }
    prepare(volume);
    ::sync();
    const Seconds busy = ProcessorTime();
    const auto begin = std::chrono::steady_clock::now();
    const bool done = row.work(volume, state);
    state.SetIterationTime(Seconds(std::chrono::steady_clock::now() - begin).count());
    state.counters["cpu_ms"] = (ProcessorTime() - busy).count() * 1000;
    if (!done) {
      state.SkipWithError("the operation failed");
      break;
    }
  }
}

template <typename Prepare>
void Register(const std::string& workload,
              int size,
              const FileSystem& system,
              const std::vector<Row>& rows,
              Prepare prepare) {
  for (const Row& row : rows) {
    const std::string name =
        workload + "@" + system.name + "/" + row.name + "/" + std::to_string(size);
    benchmark::RegisterBenchmark(
        name.c_str(),
        [=, &system](benchmark::State& state) { Measure(state, system, row, prepare); })
        ->Iterations(1)
        ->UseManualTime()
        ->Unit(benchmark::kMillisecond);
  }
}

// Copies.

bool CopyTreeOrb(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    return OrbCopyFolderEx(
               PathOf(volume / "source"), PathOf(volume / ""), TextOf("copy"), nullptr, nullptr) ==
           kOrbNoErr;
  });
}

bool CopyFileOrb(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    return OrbCopyFile(PathOf(volume / "source"), PathOf(volume / ""), TextOf("copy"), nullptr) ==
           kOrbNoErr;
  });
}

bool CopyCp(const ScratchVolume& volume, benchmark::State& state) {
  return RunCommand({"cp", "-a", volume / "source", volume / "copy"}, state);
}

/// Keeps no times.
bool CopyStd(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    std::error_code failed;
    fs::copy(volume / "source", volume / "copy", fs::copy_options::recursive, failed);
    return !failed;
  });
}

/// Nothing but the system calls that a file with its times costs, for what these calls bound.
bool CopyBare(const fs::path& source, const fs::path& copy, bool inPlace) {
  const int from = ::open(source.c_str(), O_RDONLY | O_NOATIME | O_CLOEXEC);
  struct statx status {};
  ::statx(from, "", AT_EMPTY_PATH, STATX_BASIC_STATS | STATX_BTIME, &status);
  const int to = inPlace ? ::open(copy.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0644)
                         : ::open(copy.parent_path().c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0644);
  std::array<char, kSmallFile> block;
  const ssize_t count = ::read(from, block.data(), block.size());
  bool done = count > 0 && ::write(to, block.data(), block.size()) == count;
  done = done && ::fsetxattr(to, "user.orb.bench", "1400000000 123456789", 20, 0) == 0;
  const timespec times[2] = {{status.stx_atime.tv_sec, status.stx_atime.tv_nsec},
                             {status.stx_mtime.tv_sec, status.stx_mtime.tv_nsec}};
  done = done && ::futimens(to, times) == 0;
  if (!inPlace) done = done && ::linkat(to, "", AT_FDCWD, copy.c_str(), AT_EMPTY_PATH) == 0;
  ::close(to);
  ::close(from);
  return done;
}

bool CopyTreeBare(const ScratchVolume& volume, benchmark::State& state, bool inPlace) {
  return RunHere(state, [&] {
    const fs::path copy = volume / "copy";
    bool done = fs::create_directory(copy);
    for (const auto& folder : fs::directory_iterator(volume / "source")) {
      const fs::path below = copy / folder.path().filename();
      done = done && fs::create_directory(below);
      for (const auto& file : fs::directory_iterator(folder))
        done = done && CopyBare(file.path(), below / file.path().filename(), inPlace);
    }
    return done;
  });
}

/// A file is seen before it is complete, and half of it stays when the process is killed.
bool CopyTreeInPlace(const ScratchVolume& volume, benchmark::State& state) {
  return CopyTreeBare(volume, state, true);
}

/// Complete or absent, as ours.
bool CopyTreeNameless(const ScratchVolume& volume, benchmark::State& state) {
  return CopyTreeBare(volume, state, false);
}

bool GoOn(void* calls) {
  ++*static_cast<int*>(calls);
  return true;
}

bool StreamOrb(const ScratchVolume& volume, benchmark::State& state, OrbProgressProc progress) {
  int calls = 0;
  const bool copied = RunHere(state, [&] {
    return OrbCopyFileEx(
               PathOf(volume / "source"), PathOf(volume / ""), TextOf("copy"), progress, &calls) ==
           kOrbNoErr;
  });
  state.counters["calls"] = calls;
  return copied;
}

bool StreamOrbSilent(const ScratchVolume& volume, benchmark::State& state) {
  return StreamOrb(volume, state, nullptr);
}

bool StreamOrbReporting(const ScratchVolume& volume, benchmark::State& state) {
  return StreamOrb(volume, state, GoOn);
}

/// What nobody can beat who moves every byte through 64 KiB.
bool StreamBare(const ScratchVolume& volume, benchmark::State&) {
  std::array<char, 65536> buffer;
  const int from = ::open((volume / "source").c_str(), O_RDONLY | O_CLOEXEC);
  const int to = ::open((volume / "copy").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0666);
  ssize_t count = 0;
  while ((count = ::read(from, buffer.data(), buffer.size())) > 0) {
    if (::write(to, buffer.data(), static_cast<std::size_t>(count)) != count) return false;
  }
  ::close(from);
  return ::close(to) == 0 && count == 0;
}

// Removals.

bool RemoveOrb(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state,
                 [&] { return OrbRemoveFileRecursive(PathOf(volume / "source")) == kOrbNoErr; });
}

bool RemoveRm(const ScratchVolume& volume, benchmark::State& state) {
  return RunCommand({"rm", "-rf", volume / "source"}, state);
}

bool RemoveStd(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    std::error_code failed;
    fs::remove_all(volume / "source", failed);
    return !failed;
  });
}

#ifdef ORB_BENCH_QT
/// Keeps nothing but the permissions, and brings the file to the device.
bool CopyQt(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    return QFile::copy(QString::fromStdString(volume / "source"),
                       QString::fromStdString(volume / "copy"));
  });
}

bool RemoveQt(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(
      state, [&] { return QDir(QString::fromStdString(volume / "source")).removeRecursively(); });
}
#endif

#ifdef ORB_BENCH_GLIB
bool CopyGio(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    GFile* source = g_file_new_for_path((volume / "source").c_str());
    GFile* copy = g_file_new_for_path((volume / "copy").c_str());
    const gboolean copied =
        g_file_copy(source, copy, G_FILE_COPY_ALL_METADATA, nullptr, nullptr, nullptr, nullptr);
    g_object_unref(source);
    g_object_unref(copy);
    return copied != FALSE;
  });
}
#endif

#ifdef ORB_BENCH_BOOST
bool CopyBoost(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    boost::system::error_code failed;
    boost::filesystem::copy(
        volume / "source", volume / "copy", boost::filesystem::copy_options::recursive, failed);
    return !failed;
  });
}

bool RemoveBoost(const ScratchVolume& volume, benchmark::State& state) {
  return RunHere(state, [&] {
    boost::system::error_code failed;
    boost::filesystem::remove_all(volume / "source", failed);
    return !failed;
  });
}
#endif

const std::vector<Row> kTreeCopies = {
    {"Orb", CopyTreeOrb},
    {"limit-in-place", CopyTreeInPlace},
    {"limit-nameless", CopyTreeNameless},
    {"cp", CopyCp},
    {"std", CopyStd},
#ifdef ORB_BENCH_BOOST
    {"Boost", CopyBoost},
#endif
};

const std::vector<Row> kFileCopies = {
    {"Orb", CopyFileOrb},
    {"cp", CopyCp},
    {"std", CopyStd},
#ifdef ORB_BENCH_QT
    {"Qt", CopyQt},
#endif
#ifdef ORB_BENCH_GLIB
    {"GIO", CopyGio},
#endif
#ifdef ORB_BENCH_BOOST
    {"Boost", CopyBoost},
#endif
};

const std::vector<Row> kStreamCopies = {
    {"Orb", StreamOrbSilent},
    {"Orb-progress", StreamOrbReporting},
    {"limit-read-write", StreamBare},
    {"cp", CopyCp},
};

const std::vector<Row> kRemovals = {
    {"Orb", RemoveOrb},
    {"rm", RemoveRm},
    {"std", RemoveStd},
#ifdef ORB_BENCH_QT
    {"Qt", RemoveQt},
#endif
#ifdef ORB_BENCH_BOOST
    {"Boost", RemoveBoost},
#endif
};

void RegisterAll() {
  constexpr int kFiles = 10'000;
  constexpr int kMebibytes = 1024;
  const auto tree = [](const ScratchVolume& volume) { WriteTree(volume / "source", kFiles); };
  const auto file = [](const ScratchVolume& volume) {
    WriteFile(volume / "source", kMebibytes * kMebibyte);
  };
  for (const FileSystem& system : FileSystems()) {
    Register("CopyTree", kFiles, system, kTreeCopies, tree);
    Register("RemoveTree", kFiles, system, kRemovals, tree);
    Register("CopyFile", kMebibytes, system, kFileCopies, file);
    Register("Stream", kMebibytes, system, kStreamCopies, file);
  }
}

}  // namespace

int main(int argc, char** argv) {
  (void)Memory();  // Before anything else: the name space of mounts is the whole program's.
  benchmark::Initialize(&argc, argv);
  RegisterAll();
  benchmark::RunSpecifiedBenchmarks();
}

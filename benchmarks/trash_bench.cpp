// SPDX-License-Identifier: MIT
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/trash.h>
#include <sys/stat.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "file_peers.h"
#include "platform/drives.h"
#include "support.h"

/// \file
/// 200 items into the home trash in one call, and the kind of drive of an item. On ext4 use a new
/// file system (TMPDIR): one in use looks at every inode that was deleted a moment ago.

namespace {

namespace fs = std::filesystem;

constexpr int kItems = 200;

const std::string& Folder() {
  static const bench::Folder folder;
  return folder.Path();
}

std::vector<std::string> MakeItems() {
  fs::remove_all(Folder() + "/data");
  fs::create_directory(Folder() +
                       "/data");  // QFile does not make it, and takes the volume's trash.
  fs::create_directories(Folder() + "/items");
  std::vector<std::string> paths;
  for (int i = 0; i < kItems; ++i) {
    paths.push_back(Folder() + "/items/photo " + std::to_string(i) + ".jpg");
    std::ofstream(paths.back()) << "photo";
  }
  return paths;
}

/// Times what `move` does to new items; anything left is a failure.
template <typename Move>
void TimeTrash(benchmark::State& state, Move move) {
  for (auto _ : state) {
    state.PauseTiming();
    const std::vector<std::string> paths = MakeItems();
    state.ResumeTiming();
    move(paths);
    state.PauseTiming();
    if (!fs::is_empty(Folder() + "/items")) {
      state.SkipWithError("items are left");
      break;
    }
    state.ResumeTiming();
  }
  state.SetItemsProcessed(state.iterations() * kItems);
}

void Trash_Orb(benchmark::State& state) {
  TimeTrash(state, [](const std::vector<std::string>& paths) {
    std::vector<COrbFilePath> items;
    for (const std::string& path : paths) items.push_back(bench::PathOf(path));
    OrbMoveToTrash(items, false);
  });
}
BENCHMARK(Trash_Orb)->Name("Trash/Orb")->UseRealTime()->Unit(benchmark::kMillisecond);

void Drive_Statx(benchmark::State& state) {
  for (auto _ : state) {
    struct statx status;
    benchmark::DoNotOptimize(
        ::statx(AT_FDCWD, Folder().c_str(), AT_SYMLINK_NOFOLLOW, STATX_BASIC_STATS, &status));
  }
}
BENCHMARK(Drive_Statx)->Name("DriveCached/limit-statx");

void Drive_OrbCached(benchmark::State& state) {
  COrbFileHandle handle(bench::PathOf(Folder()));
  for (auto _ : state) benchmark::DoNotOptimize(handle.GetDriveType());
}
BENCHMARK(Drive_OrbCached)->Name("DriveCached/Orb");

/// The first question of a process, which reads the mount table.
void Drive_OrbFirst(benchmark::State& state) {
  for (auto _ : state) {
    const auto drives = orb::platform::MakeDrives({});
    const auto volume = drives->VolumeOf(Folder());
    benchmark::DoNotOptimize(drives->Read(Folder(), volume.Value()));
  }
}
BENCHMARK(Drive_OrbFirst)->Name("DriveFirst/Orb");

/// The first question about one more volume.
void Drive_OrbNextVolume(benchmark::State& state) {
  const auto drives = orb::platform::MakeDrives({});
  for (auto _ : state) {
    const auto volume = drives->VolumeOf(Folder());
    benchmark::DoNotOptimize(drives->Read(Folder(), volume.Value()));
  }
}
BENCHMARK(Drive_OrbNextVolume)->Name("DriveNextVolume/Orb");

#ifdef ORB_BENCH_QT
void Trash_QFile(benchmark::State& state) {
  TimeTrash(state, [](const std::vector<std::string>& paths) {
    for (const std::string& path : paths) QFile::moveToTrash(QString::fromStdString(path));
  });
}
BENCHMARK(Trash_QFile)->Name("Trash/Qt")->UseRealTime()->Unit(benchmark::kMillisecond);

void Drive_QStorageInfo(benchmark::State& state) {
  const QString path = QString::fromStdString(Folder());
  for (auto _ : state) {
    const QStorageInfo info(path);
    benchmark::DoNotOptimize(info.isReadOnly());
  }
}
BENCHMARK(Drive_QStorageInfo)->Name("DriveFirst/Qt");
#endif

#ifdef ORB_BENCH_GLIB
void Trash_GFile(benchmark::State& state) {
  TimeTrash(state, [](const std::vector<std::string>& paths) {
    for (const std::string& path : paths) {
      GFile* file = g_file_new_for_path(path.c_str());
      g_file_trash(file, nullptr, nullptr);
      g_object_unref(file);
    }
  });
}
BENCHMARK(Trash_GFile)->Name("Trash/GIO")->UseRealTime()->Unit(benchmark::kMillisecond);
#endif

}  // namespace

int main(int argc, char** argv) {
  // Before anybody remembers where the trash is.
  ::setenv("XDG_DATA_HOME", (Folder() + "/data").c_str(), 1);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
}

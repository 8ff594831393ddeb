// SPDX-License-Identifier: MIT
// What is known of each file of one folder: kind, size, times, permissions, readable, writable; and
// of its volume.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <orb/fileinfo/file_handle.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <filesystem>
#include <string>
#include <vector>

#include "file_peers.h"
#include "platform/volumes.h"
#include "support.h"

namespace {

namespace fs = std::filesystem;

constexpr int kFiles = 10'000;

const bench::Folder& Photos() {
  static const bench::Folder photos;
  return photos;
}

const std::vector<std::string>& Paths() {
  static const std::vector<std::string> paths = [] {
    std::vector<std::string> made;
    for (int i = 0; i < kFiles; ++i) {
      made.push_back(Photos() / ("IMG_" + std::to_string(10'000 + i) + ".JPG"));
      bench::MakeFile(made.back(), 5);
    }
    return made;
  }();
  return paths;
}

template <typename Ask>
void OnEachFile(benchmark::State& state, Ask ask) {
  const std::vector<std::string>& paths = Paths();
  for (auto _ : state) {
    for (const std::string& path : paths) ask(path);
  }
  state.SetItemsProcessed(state.iterations() * kFiles);
}

void FileInfoOrb(benchmark::State& state) {
  OnEachFile(state, [](const std::string& path) {
    const COrbStringData text = OrbCharUtf8(path.c_str());
    COrbFileHandle handle;
    handle.Initialize(&text);
    COrbTime created;
    benchmark::DoNotOptimize(handle.GetAttribute());
    benchmark::DoNotOptimize(handle.GetFileType());
    benchmark::DoNotOptimize(handle.GetFileSize());
    benchmark::DoNotOptimize(handle.GetUpdateTime());
    benchmark::DoNotOptimize(handle.GetCreateTime(&created));
  });
}
BENCHMARK(FileInfoOrb)->Name("FileInfo/Orb")->Unit(benchmark::kMillisecond);

/// The calls that ours cannot do without.
void FileInfoCalls(benchmark::State& state) {
  OnEachFile(state, [](const std::string& path) {
    struct statx status;
    struct statvfs volume;
    benchmark::DoNotOptimize(::statx(
        AT_FDCWD, path.c_str(), AT_SYMLINK_NOFOLLOW, STATX_BASIC_STATS | STATX_BTIME, &status));
    benchmark::DoNotOptimize(::access(path.c_str(), W_OK));
    benchmark::DoNotOptimize(::statvfs(path.c_str(), &volume));
  });
}
BENCHMARK(FileInfoCalls)->Name("FileInfo/limit-calls")->Unit(benchmark::kMillisecond);

/// std's and Boost's, which know no creation time, volume, lock or file type.
template <typename Path, typename Error, typename Ask>
void FileInfoPath(benchmark::State& state, Ask ask) {
  OnEachFile(state, [&](const std::string& text) {
    const Path path(text);
    Error error;
    ask(path, error);
    benchmark::DoNotOptimize(::access(path.c_str(), R_OK));
    benchmark::DoNotOptimize(::access(path.c_str(), W_OK));
  });
}

void FileInfoStd(benchmark::State& state) {
  FileInfoPath<fs::path, std::error_code>(state, [](const fs::path& path, std::error_code& error) {
    benchmark::DoNotOptimize(fs::symlink_status(path, error));
    benchmark::DoNotOptimize(fs::file_size(path, error));
    benchmark::DoNotOptimize(fs::last_write_time(path, error));
  });
}
BENCHMARK(FileInfoStd)->Name("FileInfo/std")->Unit(benchmark::kMillisecond);

void SpaceOrb(benchmark::State& state) {
  const std::string& folder = Photos().Path();
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Volumes::Current().AvailableCapacity(folder));
  }
}
BENCHMARK(SpaceOrb)->Name("Space/Orb");

void SpaceStatvfs(benchmark::State& state) {
  struct statvfs volume;
  for (auto _ : state) benchmark::DoNotOptimize(::statvfs(Photos().Path().c_str(), &volume));
}
BENCHMARK(SpaceStatvfs)->Name("Space/limit-statvfs");

void SpaceStd(benchmark::State& state) {
  std::error_code error;
  for (auto _ : state) benchmark::DoNotOptimize(fs::space(Photos().Path(), error));
}
BENCHMARK(SpaceStd)->Name("Space/std");

#ifdef ORB_BENCH_BOOST
void FileInfoBoost(benchmark::State& state) {
  using boost::filesystem::path;
  using boost::system::error_code;
  FileInfoPath<path, error_code>(state, [](const path& item, error_code& error) {
    benchmark::DoNotOptimize(boost::filesystem::symlink_status(item, error));
    benchmark::DoNotOptimize(boost::filesystem::file_size(item, error));
    benchmark::DoNotOptimize(boost::filesystem::last_write_time(item, error));
  });
}
BENCHMARK(FileInfoBoost)->Name("FileInfo/Boost")->Unit(benchmark::kMillisecond);
#endif

#ifdef ORB_BENCH_QT
void FileInfoQt(benchmark::State& state) {
  OnEachFile(state, [](const std::string& path) {
    const QFileInfo info(QString::fromStdString(path));
    benchmark::DoNotOptimize(info.isSymLink());
    benchmark::DoNotOptimize(info.isDir());
    benchmark::DoNotOptimize(info.size());
    benchmark::DoNotOptimize(info.lastModified());
    benchmark::DoNotOptimize(info.birthTime());
    benchmark::DoNotOptimize(info.isReadable());
    benchmark::DoNotOptimize(info.isWritable());
  });
}
BENCHMARK(FileInfoQt)->Name("FileInfo/Qt")->Unit(benchmark::kMillisecond);

void SpaceQt(benchmark::State& state) {
  const QString folder = QString::fromStdString(Photos().Path());
  for (auto _ : state) benchmark::DoNotOptimize(QStorageInfo(folder).bytesAvailable());
}
BENCHMARK(SpaceQt)->Name("Space/Qt");
#endif

#ifdef ORB_BENCH_GLIB
void FileInfoGio(benchmark::State& state) {
  OnEachFile(state, [](const std::string& path) {
    GFile* file = g_file_new_for_path(path.c_str());
    GFileInfo* info =
        g_file_query_info(file,
                          "standard::type,standard::size,standard::is-symlink,time::*,access::*",
                          G_FILE_QUERY_INFO_NOFOLLOW_SYMLINKS,
                          nullptr,
                          nullptr);
    benchmark::DoNotOptimize(g_file_info_get_size(info));
    g_object_unref(info);
    g_object_unref(file);
  });
}
BENCHMARK(FileInfoGio)->Name("FileInfo/GIO")->Unit(benchmark::kMillisecond);
#endif

}  // namespace

BENCHMARK_MAIN();

// SPDX-License-Identifier: MIT
// What is known of each file of one folder: kind, size, times, permissions, readable, writable.
#include <benchmark/benchmark.h>
#include <orb/fileinfo/file_handle.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "platform/volumes.h"

namespace {

namespace fs = std::filesystem;

constexpr int kFiles = 10'000;

/// A folder of small photos, removed at the end.
class PhotoFolder {
 public:
  PhotoFolder() {
    std::string pattern = (fs::temp_directory_path() / "orb-bench-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) std::abort();
    folder_ = pattern;
    for (int i = 0; i < kFiles; ++i) {
      paths_.push_back(folder_ + "/IMG_" + std::to_string(10'000 + i) + ".JPG");
      std::ofstream(paths_.back()) << "photo";
    }
  }
  ~PhotoFolder() {
    std::error_code ignored;
    fs::remove_all(folder_, ignored);
  }
  PhotoFolder(const PhotoFolder&) = delete;
  PhotoFolder& operator=(const PhotoFolder&) = delete;

  const std::string& Path() const { return folder_; }
  const std::vector<std::string>& Paths() const { return paths_; }

 private:
  std::string folder_;
  std::vector<std::string> paths_;
};

const PhotoFolder& Photos() {
  static const PhotoFolder photos;
  return photos;
}

template <typename Ask>
void OnEachFile(benchmark::State& state, Ask ask) {
  const std::vector<std::string>& paths = Photos().Paths();
  for (auto _ : state) {
    for (const std::string& path : paths) ask(path);
  }
  state.SetItemsProcessed(state.iterations() * kFiles);
}

void BM_FileHandle(benchmark::State& state) {
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
BENCHMARK(BM_FileHandle)->Unit(benchmark::kMillisecond);

/// Knows no creation time, volume, lock or file type.
void BM_StdFilesystemAndAccess(benchmark::State& state) {
  OnEachFile(state, [](const std::string& text) {
    const fs::path path(text);
    std::error_code error;
    benchmark::DoNotOptimize(fs::symlink_status(path, error));
    benchmark::DoNotOptimize(fs::file_size(path, error));
    benchmark::DoNotOptimize(fs::last_write_time(path, error));
    benchmark::DoNotOptimize(::access(path.c_str(), R_OK));
    benchmark::DoNotOptimize(::access(path.c_str(), W_OK));
  });
}
BENCHMARK(BM_StdFilesystemAndAccess)->Unit(benchmark::kMillisecond);

void BM_AvailableCapacity(benchmark::State& state) {
  const std::string& folder = Photos().Path();
  for (auto _ : state) {
    benchmark::DoNotOptimize(orb::platform::Volumes::Current().AvailableCapacity(folder));
  }
}
BENCHMARK(BM_AvailableCapacity);

void BM_StdFilesystemSpace(benchmark::State& state) {
  std::error_code error;
  for (auto _ : state) benchmark::DoNotOptimize(fs::space(Photos().Path(), error));
}
BENCHMARK(BM_StdFilesystemSpace);

}  // namespace

BENCHMARK_MAIN();

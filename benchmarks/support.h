// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <malloc.h>
#include <orb/path/file_path.h>
#include <orb/strings/string_data.h>
#include <spawn.h>
#include <stdlib.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <utility>
#include <vector>

/// \file
/// What the benchmark programs share.

namespace bench {

inline COrbStringData TextOf(const std::string& utf8) {
  return COrbStringData(OrbCharUtf8(utf8.c_str()));
}

inline COrbFilePath PathOf(const std::string& utf8) {
  const COrbStringData text = TextOf(utf8);
  COrbFilePath path;
  path.Initialize(&text);
  return path;
}

/// Memory that is freed stays with the process, so that no row is charged for the kernel clearing
/// the same pages again in every round.
inline void KeepMemory() {
  mallopt(M_TRIM_THRESHOLD, 1 << 30);
  mallopt(M_MMAP_THRESHOLD, 1 << 30);
}

/// A new folder below ORB_BENCH_FOLDER, or the temporary directory, that goes away with its owner.
class Folder {
 public:
  Folder() {
    const char* chosen = std::getenv("ORB_BENCH_FOLDER");
    const std::filesystem::path above =
        chosen != nullptr ? std::filesystem::path(chosen) : std::filesystem::temp_directory_path();
    path_ = (above / "orb-bench-XXXXXX").string();
    if (::mkdtemp(path_.data()) == nullptr) std::abort();
  }
  ~Folder() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  Folder(const Folder&) = delete;
  Folder& operator=(const Folder&) = delete;

  const std::string& Path() const { return path_; }
  std::string operator/(const std::string& name) const { return path_ + "/" + name; }

 private:
  std::string path_;
};

inline void MakeFile(const std::string& path, std::size_t size) {
  const std::string block(std::min<std::size_t>(size, 1 << 20), 'x');
  std::ofstream file(path, std::ios::binary);
  for (std::size_t left = size; left > 0; left -= std::min(left, block.size()))
    file.write(block.data(), static_cast<std::streamsize>(std::min(left, block.size())));
  if (!file.flush()) std::abort();
}

/// `folders` folders of `files` files each, of `size` bytes, below `root`, which is made.
inline void MakeTree(const std::string& root, int folders, int files, std::size_t size) {
  for (int i = 0; i < folders; ++i) {
    const std::string branch = root + "/" + std::to_string(i);
    std::filesystem::create_directories(branch);
    for (int j = 0; j < files; ++j) MakeFile(branch + "/" + std::to_string(j), size);
  }
}

/// Runs a program to its end, which must be a good one, its output thrown away. Gives the largest
/// resident size it had, in KiB, which is at least this program's own: a child begins with it.
inline long Run(std::vector<std::string> command) {
  std::vector<char*> arguments;
  for (std::string& word : command) arguments.push_back(word.data());
  arguments.push_back(nullptr);
  posix_spawn_file_actions_t quiet;
  posix_spawn_file_actions_init(&quiet);
  posix_spawn_file_actions_addopen(&quiet, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
  pid_t child = 0;
  const int failed =
      ::posix_spawnp(&child, arguments[0], &quiet, nullptr, arguments.data(), environ);
  posix_spawn_file_actions_destroy(&quiet);
  int status = 0;
  struct rusage used {};
  if (failed != 0 || ::wait4(child, &status, 0, &used) != child || status != 0) std::abort();
  return used.ru_maxrss;
}

/// The largest resident size of a program, in MiB, as seen from a parent that is tiny.
inline double PeakMebibytes(std::vector<std::string> command) {
  const Folder folder;
  command.insert(command.begin(), {"time", "-f", "%M", "-o", folder / "peak"});
  Run(std::move(command));
  double kibibytes = 0;
  std::ifstream(folder / "peak") >> kibibytes;
  return kibibytes / 1024;
}

}  // namespace bench

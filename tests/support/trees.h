// SPDX-License-Identifier: MIT
#pragma once

#include <dirent.h>
#include <fcntl.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <functional>
#include <map>
#include <set>
#include <string>

#include "support/temp_folder.h"

namespace orb::test {

inline int OpenDescriptors() {
  int count = 0;
  for ([[maybe_unused]] const auto& fd : std::filesystem::directory_iterator("/proc/self/fd"))
    ++count;
  return count;
}

inline bool LimitDescriptors(rlim_t count) {
  const rlimit limit{count, count};
  return ::setrlimit(RLIMIT_NOFILE, &limit) == 0;
}

/// What is written beyond so many bytes of a file fails.
inline bool LimitFiles(rlim_t size) {
  const rlimit limit{size, size};
  return ::signal(SIGXFSZ, SIG_IGN) != SIG_ERR && ::setrlimit(RLIMIT_FSIZE, &limit) == 0;
}

/// The extended attributes of an item, its lock among them. The time of creation is left out: only
/// a copy has it there.
inline std::set<std::string> XattrsOf(const std::string& path) {
  char list[1 << 16];
  char value[1 << 12];
  std::set<std::string> found;
  const ssize_t size = ::llistxattr(path.c_str(), list, sizeof list);
  for (const char* name = list; name < list + size; name += std::string(name).size() + 1) {
    const ssize_t length = ::lgetxattr(path.c_str(), name, value, sizeof value);
    if (std::string(name) == "user.orb.created") continue;
    found.insert(std::string(name) + "=" +
                 std::string(value, value + std::max<ssize_t>(length, 0)));
  }
  return found;
}

inline std::string Shortened(const std::string& text) {
  return text.size() < 1000 ? text : std::to_string(std::hash<std::string>()(text));
}

/// What lies below a folder by relative path: kind and mode, time of modification, attributes,
/// content.
inline std::map<std::string, std::string> Describe(const std::string& folder) {
  namespace fs = std::filesystem;
  std::map<std::string, std::string> items;
  for (const auto& item : fs::recursive_directory_iterator(folder)) {
    const std::string path = item.path().string();
    struct stat status {};
    ::lstat(path.c_str(), &status);
    std::string text = std::to_string(status.st_mode) + " " +
                       std::to_string(status.st_mtim.tv_sec) + "." +
                       std::to_string(status.st_mtim.tv_nsec);
    for (const std::string& attribute : XattrsOf(path)) text += " " + attribute;
    if (item.is_symlink()) text += " -> " + fs::read_symlink(item.path()).string();
    if (item.is_regular_file() && !item.is_symlink()) text += " " + Shortened(ReadAll(path));
    items[path.substr(folder.size())] = text;
  }
  return items;
}

/// A chain of folders d/d/d/..., `depth` levels with a file at the end, deeper than a path can
/// tell.
inline bool MakeChain(const std::string& folder, int depth) {
  int level = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  for (int i = 0; i < depth && level >= 0; ++i) {
    const int next = ::mkdirat(level, "d", 0755) == 0
                         ? ::openat(level, "d", O_RDONLY | O_DIRECTORY | O_CLOEXEC)
                         : -1;
    ::close(level);
    level = next;
  }
  const int file = level < 0 ? -1 : ::openat(level, "end", O_CREAT | O_WRONLY | O_CLOEXEC, 0644);
  if (level >= 0) ::close(level);
  return file >= 0 && ::close(file) == 0;
}

/// How many levels of a chain there are, with the file at its end counted as one.
inline int ChainDepth(const std::string& folder) {
  int depth = 0;
  int level = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  for (int next = level; next >= 0; level = next) {
    next = ::openat(level, "d", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (next >= 0 || ::faccessat(level, "end", F_OK, 0) == 0) ++depth;
    ::close(level);
  }
  return depth;
}

}  // namespace orb::test

// SPDX-License-Identifier: MIT
#pragma once

#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <utility>
#include <vector>

#include "support.h"

/// \file
/// New file systems in memory, so that neither the disk nor the past of a file system is measured.

namespace bench {

/// A tmpfs that only this program sees and that ends with it, also when it is killed.
class PrivateMemory {
 public:
  explicit PrivateMemory(const char* size) {
    std::string pattern = (std::filesystem::temp_directory_path() / "orb-bench-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) return;
    path_ = pattern;
    const std::string options = std::string("size=") + size;
    usable_ = ::unshare(CLONE_NEWNS) == 0 &&
              ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
              ::mount("tmpfs", path_.c_str(), "tmpfs", 0, options.c_str()) == 0;
  }
  ~PrivateMemory() {
    if (usable_) ::umount2(path_.c_str(), MNT_DETACH);
    if (!path_.empty()) ::rmdir(path_.c_str());
  }
  PrivateMemory(const PrivateMemory&) = delete;
  PrivateMemory& operator=(const PrivateMemory&) = delete;

  /// False without the right to mount.
  bool Usable() const { return usable_; }
  const std::string& Path() const { return path_; }

 private:
  std::string path_;
  bool usable_ = false;
};

/// A new file system on an image in such a memory.
class ScratchVolume {
 public:
  /// `make` is the command that makes it, to which the image's path is added.
  ScratchVolume(const PrivateMemory& memory, std::vector<std::string> make, std::uintmax_t size)
      : image_(memory.Path() + "/image"), path_(memory.Path() + "/volume") {
    if (!memory.Usable()) return;
    std::filesystem::create_directory(path_);
    std::ofstream(image_).close();
    std::filesystem::resize_file(image_, size);
    make.push_back(image_);
    Run(std::move(make));
    Run({"mount", "-o", "loop", image_, path_});
    mounted_ = true;
  }
  ~ScratchVolume() {
    if (mounted_) ::umount2(path_.c_str(), 0);
    std::error_code ignored;
    std::filesystem::remove(image_, ignored);
  }
  ScratchVolume(const ScratchVolume&) = delete;
  ScratchVolume& operator=(const ScratchVolume&) = delete;

  bool Mounted() const { return mounted_; }
  std::string operator/(const char* name) const { return path_ + "/" + name; }

 private:
  std::string image_;
  std::string path_;
  bool mounted_ = false;
};

/// The most memory that this process holds beyond what it holds now.
class PeakMemory {
 public:
  PeakMemory() {
    std::ofstream("/proc/self/clear_refs") << 5;
    before_ = Field("VmRSS:");
  }
  long GrownKibibytes() const { return Field("VmHWM:") - before_; }

 private:
  static long Field(const std::string& name) {
    std::ifstream status("/proc/self/status");
    for (std::string word; status >> word;) {
      long value = 0;
      if (word == name && status >> value) return value;
    }
    return 0;
  }

  long before_ = 0;
};

}  // namespace bench

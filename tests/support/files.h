// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <orb/fileinfo/file_handle.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <optional>
#include <set>
#include <string>
#include <tuple>
#include <utility>

#include "platform/error.h"
#include "platform/items.h"
#include "platform/volumes.h"
#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"
#include "support/trees.h"

/// \file
/// The vocabulary of the tests of files: a tree made from a line, and watched for changes.

namespace orb::test {

namespace fs = std::filesystem;

constexpr uid_t kStranger = 65534;

/// What Done() tells of an operation that succeeded.
constexpr platform::Error kDone{platform::ErrorDomain::kMach, 0};

template <typename T>
platform::Error ErrorOf(const platform::Result<T>& result) {
  return result ? kDone : result.Reason();
}

inline bool SetLock(const std::string& path, bool locked) {
  return platform::Items::Current().SetLocked(path, locked).Ok();
}

/// The permissions; 0 for what is not there.
inline mode_t ModeOf(const std::string& path) {
  struct stat status {};
  ::lstat(path.c_str(), &status);
  return status.st_mode & 07777;
}

inline bool SetMode(const std::string& path, mode_t mode) {
  return ::chmod(path.c_str(), mode) == 0;
}

inline std::set<std::string> NamesIn(const std::string& folder) {
  std::set<std::string> names;
  for (const auto& item : fs::directory_iterator(folder)) names.insert(item.path().filename());
  return names;
}

/// A temporary folder with items in it, made with the folders above them in the order given,
/// "a/b/, f=text, l -> f":
///   "a/b/" a folder             "f=text" a file        "f" a file that holds its name
///   "l -> target" a link        "h => f" a hard link   "p|" a pipe
/// with the permissions behind it, "f 0444", and locked at the end, "f!". Everybody may write to
/// it.
class Tree : public TempFolder {
 public:
  explicit Tree(const std::string& items = "") {
    Make(items);
    SetMode(Path(), 0777);
  }

  void Make(const std::string& items) const {
    std::set<std::string> locked;
    for (std::size_t at = 0; at < items.size();) {
      const std::size_t end = std::min(items.find(", ", at), items.size());
      std::string item = items.substr(at, end - at);
      const bool lock = item.back() == '!';
      if (lock) item.pop_back();
      const std::string path = MakeItem(TakeMode(&item), item);
      if (lock) locked.insert(path);
      at = end + 2;
    }
    for (const std::string& path : locked) EXPECT_TRUE(SetLock(path, true)) << path;
  }

  /// The empty path and those from the root as they are, others below the folder.
  std::string At(const std::string& path) const {
    return path.empty() || path.front() == '/' ? path : *this / path;
  }
  std::string Read(const std::string& name) const { return ReadAll(*this / name); }
  bool Has(const std::string& name) const { return fs::exists(fs::symlink_status(*this / name)); }

 private:
  static std::optional<mode_t> TakeMode(std::string* item) {
    const std::size_t at = item->rfind(" 0");
    if (at == std::string::npos) return std::nullopt;
    const auto mode = static_cast<mode_t>(std::stoul(item->substr(at), nullptr, 8));
    item->resize(at);
    return mode;
  }
  std::string MakeItem(std::optional<mode_t> mode, const std::string& item) const {
    const auto [name, mark, rest] = Split(item);
    const std::string path = *this / name;
    fs::create_directories(fs::path(path).parent_path());
    if (mark == "/") fs::create_directories(path);
    EXPECT_TRUE(mark != "|" || ::mkfifo(path.c_str(), 0600) == 0);
    if (mark == " -> ") fs::create_symlink(rest, path);
    if (mark == " => ") fs::create_hard_link(*this / rest, path);
    if (mark == "=") TempFolder::Write(name, rest);
    EXPECT_TRUE(!mode || SetMode(path, *mode));
    return path;
  }
  static std::tuple<std::string, std::string, std::string> Split(const std::string& item) {
    for (const std::string mark : {" -> ", " => ", "="}) {
      const std::size_t at = item.find(mark);
      if (at != std::string::npos) return {item.substr(0, at), mark, item.substr(at + mark.size())};
    }
    const char last = item.back();
    if (last == '/' || last == '|')
      return {item.substr(0, item.size() - 1), std::string(1, last), ""};
    return {item, "=", item};
  }
};

/// Sees at its end that the folder holds what it held, and that no descriptor was left open.
class Unchanged {
 public:
  explicit Unchanged(const std::string& folder) : folder_(folder), before_(Describe(folder)) {}
  ~Unchanged() {
    EXPECT_EQ(Describe(folder_), before_);
    EXPECT_EQ(OpenDescriptors(), descriptors_);
  }
  Unchanged(const Unchanged&) = delete;
  Unchanged& operator=(const Unchanged&) = delete;

 private:
  const std::string folder_;
  const std::map<std::string, std::string> before_;
  const int descriptors_ = OpenDescriptors();
};

/// What an operation from one path to another shall give.
template <typename Code>
struct Row {
  std::string from;
  std::string to;
  Code expected;
};

/// Each row gives its code, and none of them changes anything in the tree.
template <typename Code, std::size_t kCount, typename Call>
void ExpectRefusals(const Tree& tree, const Row<Code> (&rows)[kCount], Call call) {
  const Unchanged unchanged(tree.Path());
  for (const Row<Code>& row : rows)
    EXPECT_EQ(call(tree.At(row.from), tree.At(row.to)), row.expected)
        << row.from << " to " << row.to;
}

/// Counts its calls and answers false at one of them.
struct Progress {
  int falseAt = 0;
  int calls = 0;

  static bool Call(void* data) {
    auto* self = static_cast<Progress*>(data);
    return ++self->calls != self->falseAt;
  }
};

/// While it lives, every volume has so many bytes left.
class SpaceLeft final : public platform::Volumes {
 public:
  explicit SpaceLeft(std::uint64_t bytes) : bytes_(bytes) {}
  std::optional<std::uint64_t> AvailableCapacity(const std::string&) const override {
    return bytes_;
  }

 private:
  std::uint64_t bytes_;
  platform::ScopedVolumes scoped_{*this};
};

/// Mounts a card as it comes from a camera, served by a process. For the body of
/// RunWithPrivateMounts, which is skipped where the programs are missing.
inline void MountCard(const Tree& tree, const std::string& folder) {
  const std::string make = "cd '" + tree.Path() + "' && mkdir " + folder +
                           " && truncate -s 8M image && mkfs.exfat image && "
                           "loop=$(losetup -f --show image) && { mount.exfat-fuse $loop " +
                           folder + "; status=$?; losetup -d $loop; } && [ $status -eq 0 ]";
  if (std::system(("{ " + make + "; } >/dev/null 2>&1").c_str()) != 0) ::_exit(kImpossibleStatus);
}

}  // namespace orb::test

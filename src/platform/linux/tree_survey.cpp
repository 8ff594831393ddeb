// SPDX-License-Identifier: MIT
#include "platform/linux/tree_survey.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <functional>
#include <optional>
#include <utility>
#include <vector>

#include "platform/linux/folder_stream.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/posix.h"

namespace orb::platform {

namespace {

/// Of the units in which the kernel counts.
constexpr std::uint64_t kBlock = 512;

/// Sums of these do not depend on the order in which a folder is listed.
std::uint64_t StateOf(std::string entry, const struct stat& status) {
  for (const auto value : {status.st_size,
                           status.st_mtim.tv_sec,
                           status.st_mtim.tv_nsec,
                           status.st_ctim.tv_sec,
                           status.st_ctim.tv_nsec})
    entry.append(1, '/').append(std::to_string(value));
  return std::hash<std::string>()(entry);
}

class Surveyor {
 public:
  Surveyor(int folder, SurveyFor purpose) : folder_(folder), purpose_(purpose) {}

  Result<TreeSurvey> Survey(const std::string& name) {
    if (Status visited = Visit(name); !visited) return visited.Reason();
    while (!pending_.empty()) {
      const std::string path = std::move(pending_.back());
      pending_.pop_back();
      if (Status entered = VisitEntries(path); !entered) return entered.Reason();
    }
    return survey_;
  }

 private:
  Status Visit(const std::string& path) {
    struct stat status;
    if (::fstatat(folder_, path.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) return LastError();
    if (!device_) device_ = status.st_dev;
    survey_.bytes += static_cast<std::uint64_t>(status.st_blocks) * kBlock;
    survey_.canBeRemoved &= status.st_dev == *device_;
    survey_.state += StateOf(path, status);
    if (S_ISDIR(status.st_mode)) pending_.push_back(path);
    return purpose_ == SurveyFor::kRemoval ? LookForLock(path) : Status();
  }

  Status LookForLock(const std::string& path) {
    constexpr int kFlags = O_PATH | O_NOFOLLOW | O_CLOEXEC;
    const UniqueFd item(Retry([&] { return ::openat(folder_, path.c_str(), kFlags); }));
    if (!item) return LastError();
    const Result<bool> locked = IsLocked(item.Get());
    if (!locked) return locked.Reason();
    survey_.canBeRemoved &= !locked.Value();
    return {};
  }

  /// Only a folder that is not empty needs it.
  void LookForPermission(int folder) {
    if (purpose_ != SurveyFor::kRemoval) return;
    survey_.canBeRemoved &= ::faccessat(folder, ".", W_OK | X_OK, AT_EACCESS) == 0;
  }

  Status VisitEntries(const std::string& path) {
    constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
    auto entries = FolderStream::Open(
        UniqueFd(Retry([&] { return ::openat(folder_, path.c_str(), kFlags); })));
    if (!entries) return entries.Reason();
    for (bool isFirst = true;; isFirst = false) {
      const auto entry = entries.Value().Next();
      if (!entry) return entry.Reason();
      if (entry.Value().name == nullptr) return {};
      if (isFirst) LookForPermission(entries.Value().Descriptor());
      const Status visited = Visit(path + '/' + entry.Value().name);
      if (!visited) return visited;
    }
  }

  const int folder_;
  const SurveyFor purpose_;
  TreeSurvey survey_;
  std::optional<dev_t> device_;
  std::vector<std::string> pending_;  // Folders that were seen and not entered yet.
};

}  // namespace

Result<TreeSurvey> SurveyTree(int folder, const std::string& name, SurveyFor purpose) {
  return Surveyor(folder, purpose).Survey(name);
}

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#include "platform/linux/tree_survey.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <functional>
#include <optional>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/linux/folder_stream.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/place.h"
#include "platform/linux/posix.h"

namespace orb::platform {

namespace {

/// Of the units in which the kernel counts.
constexpr std::uint64_t kBlock = 512;
/// How many levels of a tree are held open at once.
constexpr std::size_t kOpenLevels = 32;

std::uint64_t HashOf(std::uint64_t folder, std::string_view name) {
  return std::hash<std::string>()(std::to_string(folder).append(name));
}

/// Sums of these do not depend on the order in which a folder is listed.
std::uint64_t StateOf(std::uint64_t path, const struct stat& status) {
  for (const auto value : {status.st_size,
                           status.st_mtim.tv_sec,
                           status.st_mtim.tv_nsec,
                           status.st_ctim.tv_sec,
                           status.st_ctim.tv_nsec})
    path = HashOf(path, std::to_string(value));
  return path;
}

struct Level {
  UniqueFd folder;
  Identity identity;
  std::uint64_t path = 0;
  /// The folders in it that are still to be entered.
  std::vector<std::string> pending;
};

/// Goes through a tree level by level, in a loop of its own stack so that no depth is too deep.
/// Levels far above the current one are closed meanwhile and found again through "..".
class Surveyor {
 public:
  explicit Surveyor(SurveyFor purpose) : purpose_(purpose) {}

  Result<TreeSurvey> Survey(int folder, const std::string& name) {
    const auto isFolder = Visit(folder, name.c_str(), 0);
    if (!isFolder) return isFolder.Reason();
    if (isFolder.Value()) {
      if (Status entered = Enter(folder, name, 0); !entered) return entered.Reason();
    }
    while (!levels_.empty()) {
      if (Status done = Proceed(); !done) return done.Reason();
    }
    return survey_;
  }

 private:
  /// Whether it is a folder.
  Result<bool> Visit(int folder, const char* name, std::uint64_t path) {
    struct stat status;
    if (::fstatat(folder, name, &status, AT_SYMLINK_NOFOLLOW) != 0) return LastError();
    if (!device_) device_ = status.st_dev;
    survey_.bytes += static_cast<std::uint64_t>(status.st_blocks) * kBlock;
    survey_.canBeRemoved &= status.st_dev == *device_;
    survey_.state += StateOf(HashOf(path, name), status);
    if (purpose_ != SurveyFor::kSize)
      survey_.canBeCopied &= CanBeCopied(folder, name, status.st_mode);
    if (purpose_ == SurveyFor::kRemoval) {
      if (Status looked = LookForLock(folder, name); !looked) return looked.Reason();
    }
    return S_ISDIR(status.st_mode);
  }

  /// A volume mounted inside takes up no space on this one and cannot be removed.
  Result<bool> VisitEntry(const FolderStream::Entry& entry) {
    const Level& level = levels_.back();
    const bool isMounted = entry.type == DT_DIR && IsMountPoint(level.folder.Get(), entry.name);
    if (!isMounted) return Visit(level.folder.Get(), entry.name, level.path);
    survey_.canBeRemoved = false;
    return false;
  }

  Status LookForLock(int folder, const char* name) {
    constexpr int kFlags = O_PATH | O_NOFOLLOW | O_CLOEXEC;
    const UniqueFd item(Retry([&] { return ::openat(folder, name, kFlags); }));
    if (!item) return LastError();
    const Result<bool> locked = IsLocked(item.Get());
    if (!locked) return locked.Reason();
    survey_.canBeRemoved &= !locked.Value();
    return {};
  }

  /// A folder shows it when it is entered.
  static bool CanBeCopied(int folder, const char* name, mode_t mode) {
    if (S_ISREG(mode)) return ::faccessat(folder, name, R_OK, AT_EACCESS) == 0;
    return S_ISLNK(mode) || S_ISDIR(mode);
  }

  /// Only a folder that is not empty needs it.
  void LookForPermission(int folder) {
    if (purpose_ != SurveyFor::kRemoval) return;
    survey_.canBeRemoved &= ::faccessat(folder, ".", W_OK | X_OK, AT_EACCESS) == 0;
  }

  Status Proceed() {
    Level& level = levels_.back();
    if (level.pending.empty()) return Leave();
    const std::string name = std::move(level.pending.back());
    level.pending.pop_back();
    return Enter(level.folder.Get(), name, level.path);
  }

  Status Enter(int above, const std::string& name, std::uint64_t path) {
    constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
    UniqueFd folder(Retry([&] { return ::openat(above, name.c_str(), kFlags); }));
    if (!folder) return LastError();
    const auto identity = IdentityOf(folder.Get());
    if (!identity) return identity.Reason();
    levels_.push_back({std::move(folder), identity.Value(), HashOf(path, name), {}});
    if (levels_.size() > kOpenLevels) levels_[levels_.size() - 1 - kOpenLevels].folder.Reset();
    return VisitEntries(&levels_.back());
  }

  Status VisitEntries(Level* level) {
    constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
    const int folder = level->folder.Get();
    auto entries =
        FolderStream::Open(UniqueFd(Retry([&] { return ::openat(folder, ".", kFlags); })));
    if (!entries) return entries.Reason();
    for (bool isFirst = true;; isFirst = false) {
      const auto entry = entries.Value().Next();
      if (!entry) return entry.Reason();
      if (entry.Value().name == nullptr) return {};
      if (isFirst) LookForPermission(folder);
      const auto isFolder = VisitEntry(entry.Value());
      if (!isFolder) return isFolder.Reason();
      if (isFolder.Value()) level->pending.emplace_back(entry.Value().name);
    }
  }

  Status Leave() {
    const Level left = std::move(levels_.back());
    levels_.pop_back();
    if (levels_.empty() || levels_.back().folder) return {};
    auto above = OpenAbove(left.folder.Get(), levels_.back().identity);
    if (!above) return above.Reason();
    levels_.back().folder = std::move(above).Value();
    return {};
  }

  const SurveyFor purpose_;
  TreeSurvey survey_;
  std::optional<dev_t> device_;
  std::vector<Level> levels_;
};

}  // namespace

Result<TreeSurvey> SurveyTree(int folder, const std::string& name, SurveyFor purpose) {
  return Surveyor(purpose).Survey(folder, name);
}

}  // namespace orb::platform

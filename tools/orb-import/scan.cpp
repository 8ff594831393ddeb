// SPDX-License-Identifier: MIT
#include "scan.h"

#include <algorithm>
#include <filesystem>
#include <system_error>

#include "text.h"

namespace orbimport {
namespace {

namespace fs = std::filesystem;

OrbResult CodeOf(const std::error_code& error) {
  if (error == std::errc::permission_denied) return kOrbErrAccessDenied;
  if (error == std::errc::no_such_file_or_directory) return kOrbErrNotFound;
  if (error == std::errc::filename_too_long) return kOrbErrNameTooLong;
  if (error == std::errc::not_enough_memory) return kOrbErrOutOfMemory;
  return kOrbErrUnknown;
}

/// The walk keeps its own list of folders instead of calling itself: the depth of a card is not in
/// our hands.
class Walk {
 public:
  Walk(const std::string& root, const std::string& destination, const std::function<bool()>& stop)
      : root_(root), destination_(destination), stop_(stop) {}

  ScanResult Run() {
    folders_.emplace_back();
    while (!folders_.empty() && !stop_()) {
      const std::string folder = folders_.back();
      folders_.pop_back();
      ReadFolder(folder);
    }
    return std::move(result_);
  }

 private:
  struct Entry {
    std::string name;
    fs::file_type kind;
  };

  std::string FullPath(const std::string& path) const {
    return path.empty() ? root_ : root_ == "/" ? root_ + path : root_ + "/" + path;
  }

  void ReadFolder(const std::string& folder) {
    std::vector<std::string> below;
    for (const Entry& entry : SortedEntries(folder)) {
      if (stop_()) return;
      const std::string path = folder.empty() ? entry.name : folder + "/" + entry.name;
      if (!Passed(path, entry)) {
        if (entry.kind == fs::file_type::directory)
          below.push_back(path);
        else
          TakeFile(path, entry);
      }
    }
    folders_.insert(folders_.end(), below.rbegin(), below.rend());
  }

  std::vector<Entry> SortedEntries(const std::string& folder) {
    std::vector<Entry> entries;
    std::error_code error;
    fs::directory_iterator at(FullPath(folder), error);
    for (; !error && at != fs::directory_iterator(); at.increment(error)) {
      std::error_code ignored;  // The kind is then none, and the item a special one.
      entries.push_back({at->path().filename().string(), at->symlink_status(ignored).type()});
    }
    if (error) result_.failures.push_back({folder.empty() ? "." : folder, CodeOf(error)});
    std::sort(entries.begin(), entries.end(), [](const Entry& a, const Entry& b) {
      return a.name < b.name;
    });
    return entries;
  }

  bool Passed(const std::string& path, const Entry& entry) {
    const auto pass = [&](SkipReason reason) {
      result_.skips.push_back({path, reason});
      return true;
    };
    const bool isFolder = entry.kind == fs::file_type::directory;
    if (isFolder && FullPath(path) == destination_) return pass(SkipReason::kDestination);
    if (entry.name.front() == '.') return pass(SkipReason::kHidden);
    if (entry.kind == fs::file_type::symlink) return pass(SkipReason::kLink);
    if (isFolder) return false;
    if (TypeOfName(entry.name) == eOrbFileType_Unknown) return pass(SkipReason::kUnknownType);
    return entry.kind != fs::file_type::regular && pass(SkipReason::kSpecial);
  }

  void TakeFile(const std::string& path, const Entry& entry) {
    if (!IsUtf8(path)) {
      result_.failures.push_back({path, kOrbErrInvalidName});
      return;
    }
    COrbFileHandle file(OrbPath(FullPath(path)));
    const OrbResult collected = file.CollectFileInformatioin();
    if (collected >= kOrbErrFirst) {
      result_.failures.push_back({path, collected});
      return;
    }
    Item item{path, TypeOfName(entry.name), file.GetFileSize(), {}, {}};
    file.GetUpdateTime(&item.modified);
    file.GetCreateTime(&item.created);
    result_.items.push_back(std::move(item));
  }

  const std::string& root_;
  const std::string& destination_;
  const std::function<bool()>& stop_;
  std::vector<std::string> folders_;  // Still to be read, the next one last.
  ScanResult result_;
};

}  // namespace

std::uint64_t WholeSeconds(const COrbTime& time) {
  const UTCDateTime utc = time.GetUTCTime();
  return static_cast<std::uint64_t>(utc.highSeconds) << 32 | utc.lowSeconds;
}

eOrbFileType TypeOfName(const std::string& name) {
  const std::size_t dot = name.rfind('.');
  if (dot == std::string::npos) return eOrbFileType_Unknown;
  return OrbPathConvertExtensionToType(OrbText(name.substr(dot)));
}

ScanResult Scan(const std::string& root,
                const std::string& destination,
                const std::function<bool()>& stop) {
  return Walk(root, destination, stop).Run();
}

}  // namespace orbimport

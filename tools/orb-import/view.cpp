// SPDX-License-Identifier: MIT
#include "view.h"

#include <algorithm>
#include <filesystem>
#include <fstream>

#include "text.h"

namespace orbimport {
namespace {

namespace fs = std::filesystem;

struct Standing {
  bool isThere = false;
  eOrbFileType type = eOrbFileType_Unknown;
  std::uint64_t size = 0;
  std::uint64_t seconds = 0;
};

Standing StandingAt(const std::string& path) {
  const COrbFileHandle file(OrbPath(path));
  COrbTime modified;
  if (file.GetUpdateTime(&modified) >= kOrbErrFirst) return {};
  return {true, file.GetFileType(), file.GetFileSize(), WholeSeconds(modified)};
}

/// Whether the file at `path` holds the first `size` bytes of the one at `source`, and they are all
/// that it holds.
bool IsBeginning(const std::string& path, const std::string& source, std::uint64_t size) {
  std::ifstream a(path, std::ios::binary), b(source, std::ios::binary);
  std::vector<char> left(1 << 20), right(1 << 20);
  while (a && b && size > 0) {
    const std::uint64_t piece = std::min<std::uint64_t>(size, left.size());
    const auto count = static_cast<std::streamsize>(piece);
    if (!a.read(left.data(), count) || !b.read(right.data(), count)) return false;
    if (!std::equal(left.begin(), left.begin() + count, right.begin())) return false;
    size -= piece;
  }
  return a && b && a.peek() == std::ifstream::traits_type::eof();
}

}  // namespace

bool KeptTime(std::uint64_t given, std::uint64_t there) {
  return there == given || there == given - given % 2;
}

const std::set<std::string>& FolderView::Names(const std::string& folder) {
  const auto [at, isNew] = names_.try_emplace(folder);
  if (!isNew) return at->second;
  std::error_code error;
  fs::directory_iterator entry(destination_ + "/" + folder, error);
  for (; !error && entry != fs::directory_iterator(); entry.increment(error)) {
    at->second.insert(entry->path().filename().string());
  }
  return at->second;
}

std::vector<unsigned> FolderView::Numbers(const std::string& folder,
                                          const std::string& stem,
                                          const std::string& tail) {
  return NumbersAmong(Names(folder), stem, tail);
}

Found FolderView::Look(const std::string& path, const Item& item) {
  const std::size_t slash = path.rfind('/');
  const std::string folder = slash == std::string::npos ? "" : path.substr(0, slash);
  if (Names(folder).count(path.substr(slash + 1)) == 0) return Found::kFree;
  const auto [at, isNew] = looks_.try_emplace({path, item.path}, Found::kOther);
  if (isNew) at->second = LookNow(path, item);
  return at->second;
}

Found FolderView::LookNow(const std::string& path, const Item& item) {
  const Standing there = StandingAt(destination_ + "/" + path);
  if (!there.isThere || there.type != item.type) return Found::kOther;
  const bool isLong = there.size == item.size;
  if (isLong && KeptTime(WholeSeconds(item.modified), there.seconds)) return Found::kSame;
  if (!IsPromised(path, item)) return Found::kOther;
  // The journal may be wrong about who wrote the file: only bytes that the source has as well are
  // ever given up.
  if (IsBeginning(destination_ + "/" + path, source_ + "/" + item.path, there.size)) {
    return isLong ? Found::kUndated : Found::kUnfinished;
  }
  strangers_.insert(path);
  return Found::kOther;
}

void FolderView::Refresh() {
  names_.clear();
  looks_.clear();
}

bool FolderView::IsPromised(const std::string& path, const Item& item) const {
  const auto found = promises_.find(path);
  return found != promises_.end() &&
         found->second == Promise{path, item.size, WholeSeconds(item.modified)};
}

std::vector<std::string> FolderView::Unfinished() const {
  std::vector<std::string> paths;
  for (const auto& [path, promise] : promises_) {
    const Standing there = StandingAt(destination_ + "/" + path);
    if (!there.isThere || strangers_.count(path) != 0) continue;
    const bool isWhole = there.size == promise.size && KeptTime(promise.seconds, there.seconds);
    if (!isWhole) paths.push_back(path);
  }
  return paths;
}

}  // namespace orbimport

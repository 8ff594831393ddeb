// SPDX-License-Identifier: MIT
#include "platform/item_relations.h"

#include <fcntl.h>
#include <stdlib.h>

#include <memory>

#include "platform/linux/place.h"
#include "platform/linux/spelling.h"

namespace orb::platform {
namespace {

struct Free {
  void operator()(char* text) const { ::free(text); }
};

Result<std::string> Resolve(const std::string& path) {
  const std::unique_ptr<char, Free> resolved(::realpath(path.c_str(), nullptr));
  if (!resolved) return LastError();
  return std::string(resolved.get());
}

/// One file may have several names; a folder, or a file whose link count says so, has only one.
bool HasOneName(const struct stat& status) {
  return S_ISDIR(status.st_mode) || status.st_nlink == 1;
}

Result<bool> IsSameEntry(const Place& a, const struct stat& statusA, const Place& b) {
  const auto statusB = ReadStatus(b);
  if (!statusB) return statusB.Reason();
  if (IdentityOf(statusA) != IdentityOf(statusB.Value())) return false;
  if (HasOneName(statusA)) return true;
  const auto folderA = IdentityOf(a.folder.Get());
  const auto folderB = IdentityOf(b.folder.Get());
  if (!folderA || !folderB) return (folderA ? folderB : folderA).Reason();
  return folderA.Value() == folderB.Value() && a.name == b.name;
}

}  // namespace

Result<std::string> ResolvedPath(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  const auto place = Locate(path);
  if (!place) return place.Reason();
  if (place.Value().NamesNoEntry()) return Resolve(path);
  const std::string item = path.substr(0, path.find_last_not_of('/') + 1);
  const std::string above = item.substr(0, item.size() - place.Value().name.size());
  const auto folder = Resolve(above.empty() ? "." : above);
  if (!folder) return folder.Reason();
  const bool isRoot = folder.Value() == "/";
  return (isRoot ? "/" : folder.Value() + '/') + place.Value().name;
}

Result<bool> IsItemOrAbove(const std::string& candidate, const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  const auto a = Locate(candidate);
  if (!a) return a.Reason();
  const auto status = ReadStatus(a.Value());
  if (!status) return status.Reason();
  const auto b = Locate(path);
  if (!b) return b.Reason();
  auto same = IsSameEntry(a.Value(), status.Value(), b.Value());
  if (same && !same.Value()) same = IsOneItemInTwoSpellings(a.Value(), b.Value());
  if (!same || same.Value() || !S_ISDIR(status.Value().st_mode)) return same;
  return IsInOrBelow(b.Value().folder.Get(), IdentityOf(status.Value()));
}

}  // namespace orb::platform

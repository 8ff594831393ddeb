// SPDX-License-Identifier: MIT
#include "fileops/path_in.h"

#include <algorithm>

#include "fileinfo/item_path.h"

namespace orb {

std::string JoinPath(std::string_view folder, std::string_view name) {
  if (folder.empty()) return std::string(name);
  folder = folder.substr(0, folder.find_last_not_of('/') + 1);
  name.remove_prefix(std::min(name.find_first_not_of('/'), name.size()));
  return std::string(folder).append("/").append(name);
}

OrbResult PathIn(const COrbFilePath& folder, const COrbStringData& name, std::string* path) {
  const auto above = ItemPath(folder.GetFullPath());
  const auto last = ItemPath(name);
  if (above && above->empty()) return kOrbErrEmptyPath;
  if (!above || !last) return kOrbErrInvalidName;
  *path = JoinPath(*above, *last);
  return kOrbNoErr;
}

}  // namespace orb

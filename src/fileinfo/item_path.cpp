// SPDX-License-Identifier: MIT
#include "fileinfo/item_path.h"

#include "platform/items.h"
#include "strings/string_access.h"

namespace orb {

const char* ItemPathInPlace(const COrbStringData& fullPath) {
  if (StringAccess::Read(fullPath).scan.kind == TextKind::kInvalid) return nullptr;
  return fullPath.GetPtrUtf8();
}

std::optional<std::string> ItemPath(const COrbStringData& fullPath) {
  const char* path = ItemPathInPlace(fullPath);
  return path == nullptr ? std::nullopt : std::optional<std::string>(path);
}

bool ItemExists(const COrbStringData& fullPath) {
  const char* path = ItemPathInPlace(fullPath);
  return path != nullptr && *path != '\0' && platform::Items::Current().Exists(path);
}

}  // namespace orb

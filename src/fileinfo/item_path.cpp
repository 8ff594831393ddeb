// SPDX-License-Identifier: MIT
#include "fileinfo/item_path.h"

#include "platform/items.h"
#include "strings/string_access.h"

namespace orb {

std::optional<std::string> ItemPath(const COrbStringData& fullPath) {
  const Utf8Text text = StringAccess::Read(fullPath);
  if (text.scan.kind == TextKind::kInvalid) return std::nullopt;
  return std::string(text.bytes);
}

bool ItemExists(const COrbStringData& fullPath) {
  const std::optional<std::string> path = ItemPath(fullPath);
  return path && !path->empty() && platform::Items::Current().Exists(*path);
}

}  // namespace orb

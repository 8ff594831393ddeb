// SPDX-License-Identifier: MIT
#include "fileops/transfer_checks.h"

#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/path_relations.h>

#include <cstdint>

#include "fileinfo/item_path.h"
#include "fileops/error_mapping.h"
#include "fileops/path_in.h"
#include "platform/item_relations.h"
#include "platform/items.h"
#include "platform/removal.h"
#include "platform/volumes.h"
#include "strings/string_access.h"

namespace orb {
namespace {

constexpr std::uint64_t kEnoughSpace = std::uint64_t{100} << 20;  // 100 MiB.

bool IsSubFolder(const std::string& a, const std::string& b) {
  return OrbIsSubFolder(StringAccess::FromUtf8(a), StringAccess::FromUtf8(b));
}

/// The rule of the texts on the paths without links, which also holds on volumes that are blind to
/// case, and then the items themselves, for volumes mounted twice.
platform::Result<bool> IsSameOrAbove(const std::string& destination, const std::string& source) {
  if (IsSubFolder(destination, source)) return true;
  const auto realDestination = platform::ResolvedPath(destination);
  if (!realDestination) return realDestination.Reason();
  const auto realSource = platform::ResolvedPath(source);
  if (!realSource) return realSource.Reason();
  if (IsSubFolder(realDestination.Value(), realSource.Value())) return true;
  return platform::IsItemOrAbove(destination, source);
}

}  // namespace

OrbResult ExpectSource(const std::string& source) {
  const auto record = platform::Items::Current().ReadRecord(source);
  return record ? kOrbNoErr : OrbMapErrorForFileOperation(record.Reason());
}

OrbResult RemoveExistingDestination(const std::string& source, const std::string& destination) {
  const auto forbidden = IsSameOrAbove(destination, source);
  if (!forbidden) return kOrbErrAccessDenied;  // What cannot be told apart is not removed.
  if (forbidden.Value()) return kOrbErrInsideSource;
  return platform::RemoveItem(destination) ? kOrbNoErr : kOrbErrAccessDenied;
}

bool IsLowOnSpace(const COrbFilePath& folder) {
  if ((COrbFileHandle(folder).GetAttribute() & kOrbFileAttrWritable) == 0) return false;
  const auto path = ItemPath(folder.GetFullPath());
  if (!path) return false;
  const auto available = platform::Volumes::Current().AvailableCapacity(*path);
  return available && *available < kEnoughSpace;
}

}  // namespace orb

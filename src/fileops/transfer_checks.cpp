// SPDX-License-Identifier: MIT
#include "fileops/transfer_checks.h"

#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/path_relations.h>
#include <orb/path/path_text.h>

#include <cstdint>

#include "fileinfo/item_path.h"
#include "fileops/error_mapping.h"
#include "fileops/path_in.h"
#include "platform/copier.h"
#include "platform/item_relations.h"
#include "platform/items.h"
#include "platform/mover.h"
#include "platform/removal.h"
#include "platform/volumes.h"
#include "strings/string_access.h"

namespace orb {
namespace {

constexpr std::uint64_t kEnoughSpace = std::uint64_t{100} << 20;  // 100 MiB.

bool IsSubFolder(const std::string& a, const std::string& b) {
  return OrbIsSubFolder(StringAccess::FromUtf8(a), StringAccess::FromUtf8(b));
}

/// The rule of the texts, then the same on the paths without links, which also holds on volumes
/// that are blind to case.
platform::Result<bool> IsSameOrAboveByText(const std::string& destination,
                                           const std::string& source) {
  if (IsSubFolder(destination, source)) return true;
  const auto realDestination = platform::ResolvedPath(destination);
  if (!realDestination) return realDestination.Reason();
  const auto realSource = platform::ResolvedPath(source);
  if (!realSource) return realSource.Reason();
  return IsSubFolder(realDestination.Value(), realSource.Value());
}

/// Whether removing the destination would take the source, or a part of it, away. Volumes that are
/// mounted twice show only on disk.
platform::Result<bool> IsEntangled(const std::string& source,
                                   const std::string& destination,
                                   Alike alike) {
  if (alike == Alike::kByTextToo) {
    const auto byText = IsSameOrAboveByText(destination, source);
    if (!byText || byText.Value()) return byText;
  }
  const auto above = platform::IsItemOrAbove(destination, source);
  if (!above || above.Value()) return above;
  return platform::IsItemOrAbove(source, destination);
}

bool IsLowOnSpace(const COrbFilePath& folder) {
  if ((COrbFileHandle(folder).GetAttribute() & kOrbFileAttrWritable) == 0) return false;
  const auto path = ItemPath(folder.GetFullPath());
  if (!path) return false;
  const auto available = platform::Volumes::Current().AvailableCapacity(*path);
  return available && *available < kEnoughSpace;
}

}  // namespace

OrbResult ExpectCopyable(const std::string& source) {
  using platform::ItemKind;
  const auto info = platform::Items::Current().Read(source);
  if (!info) return OrbMapErrorForFileOperation(info.Reason());
  const ItemKind kind = info.Value().kind;
  const bool readable = kind == ItemKind::kLink || info.Value().readable;
  return readable && kind != ItemKind::kOther ? kOrbNoErr : kOrbErrAccessDenied;
}

OrbResult ExpectMovable(const std::string& source) {
  return FileOperationResult(platform::ExpectMovable(source));
}

OrbResult ExpectCopyableTo(const std::string& source, const std::string& destination) {
  if (!platform::Items::Current().Exists(destination)) return kOrbNoErr;
  return FileOperationResult(platform::ExpectCopyable(source));
}

OrbResult ExpectMovableTo(const std::string& source, const std::string& destination) {
  if (!platform::Items::Current().Exists(destination)) return kOrbNoErr;
  return FileOperationResult(platform::ExpectMovableTo(source, destination));
}

OrbResult OrbCheckCopyTarget(const COrbStringData& source, const COrbStringData& destination) {
  if (OrbPathCompareNoCase(source, destination) == 0) return kOrbErrSamePath;
  return OrbIsSubFolder(source, destination) ? kOrbErrInsideSource : kOrbNoErr;
}

OrbResult RemoveExistingDestination(const std::string& source,
                                    const std::string& destination,
                                    Alike alike) {
  if (!platform::Items::Current().Exists(destination)) return kOrbNoErr;
  const auto entangled = IsEntangled(source, destination, alike);
  if (!entangled) return kOrbErrAccessDenied;  // What cannot be told apart is not removed.
  if (entangled.Value()) return kOrbErrInsideSource;
  const bool removed = platform::ExpectRemovable(destination) && platform::RemoveItem(destination);
  return removed ? kOrbNoErr : kOrbErrAccessDenied;
}

OrbResult ConsiderSpace(const Outcome& failed, LowSpace lowSpace, const COrbFilePath& folder) {
  const bool mayExplain =
      lowSpace == LowSpace::kAnything || (lowSpace == LowSpace::kUntold && !failed.explained);
  if (!mayExplain || failed.code == kOrbErrCanceled) return failed.code;
  return IsLowOnSpace(folder) ? kOrbErrDiskFull : failed.code;
}

}  // namespace orb

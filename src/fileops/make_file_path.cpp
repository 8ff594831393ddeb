// SPDX-License-Identifier: MIT
#include <orb/fileops/copy.h>

#include "fileinfo/item_path.h"
#include "fileops/path_in.h"
#include "strings/string_access.h"

namespace {

using orb::ItemPath;
using orb::JoinPath;
using orb::StringAccess;

constexpr unsigned long kMaxPathLength = 1024;  // In UTF-16 units or UTF-8 bytes: both too long.
constexpr unsigned long kMaxNameLength = 256;   // In UTF-16 units: too long.

}  // namespace

OrbResult OrbMakeFilePath(const COrbStringData& folder,
                          const COrbStringData& name,
                          COrbStringData* result) {
  const auto above = ItemPath(folder);
  const auto last = ItemPath(name);
  if (!above || !last) return kOrbErrInvalidName;
  const COrbStringData joined = StringAccess::FromUtf8(JoinPath(*above, *last));
  if (joined.GetLengthChar() >= kMaxPathLength || name.GetLengthChar() >= kMaxNameLength)
    return kOrbErrNameTooLong;
  if (result == nullptr) return kOrbErrNotFound;
  *result = joined;
  return kOrbNoErr;
}

OrbResult OrbMakeFilePath(const COrbFilePath& folder,
                          const COrbStringData& name,
                          COrbFilePath* result) {
  const auto above = ItemPath(folder.GetFullPath());
  const auto last = ItemPath(name);
  if (!above || !last) return kOrbErrInvalidName;
  if (above->size() + last->size() + 1 >= kMaxPathLength) return kOrbErrPathTooLong;
  if (name.GetLengthChar() >= kMaxNameLength) return kOrbErrNameTooLong;
  const COrbStringData joined = StringAccess::FromUtf8(JoinPath(*above, *last));
  return result->Initialize(&joined);
}

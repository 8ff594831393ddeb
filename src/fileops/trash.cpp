// SPDX-License-Identifier: MIT
#include "platform/trash.h"

#include <orb/fileops/trash.h>

#include "fileinfo/item_path.h"

OrbResult OrbMoveToTrash(const std::vector<COrbFilePath>& paths, bool) {
  orb::platform::Trash trash;
  for (const COrbFilePath& path : paths) {
    const auto item = orb::ItemPath(path.GetFullPath());
    if (item) (void)trash.Put(*item);
  }
  return kOrbNoErr;
}

OrbResult OrbMoveToTrashEx(const COrbFilePath& path, OrbProgressProc progress, void* data) {
  const auto item = orb::ItemPath(path.GetFullPath());
  if (!item) return kOrbErrAccessDenied;
  if (progress != nullptr && !progress(data)) return kOrbErrCanceled;
  return orb::platform::Trash().Put(*item) ? kOrbNoErr : kOrbErrAccessDenied;
}

// SPDX-License-Identifier: MIT
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/copy.h>
#include <orb/fileops/path_relations.h>

#include <string>

#include "fileinfo/item_path.h"
#include "fileops/copy_worker.h"
#include "fileops/path_in.h"
#include "fileops/transfer_checks.h"
#include "platform/items.h"

namespace orb {
namespace {

/// What the copy would refuse is refused before anything is removed to make way for it: what cannot
/// be read, sockets, pipes and devices.
OrbResult CheckAttributes(const COrbFilePath& source, const std::string& path) {
  if ((COrbFileHandle(source).GetAttribute() & kOrbFileAttrReadable) == 0)
    return kOrbErrAccessDenied;
  const auto record = platform::Items::Current().ReadRecord(path);
  const bool usable = record && record.Value().kind != platform::ItemKind::kOther;
  return usable ? kOrbNoErr : kOrbErrAccessDenied;
}

/// The name in the destination folder: the given one or the source's own. One that names no entry
/// would lead to the folder itself or above it.
OrbResult ChooseName(const COrbFilePath& source,
                     const COrbStringData* given,
                     COrbStringData* name) {
  if (given != nullptr)
    *name = *given;
  else
    OrbGetFileNameFromPath(source, name);
  const auto text = ItemPath(*name);
  const bool isEntry = text && !text->empty() && *text != "." && *text != "..";
  return isEntry ? kOrbNoErr : kOrbErrInvalidName;
}

OrbResult MakeWay(const std::string& source, const std::string& destination) {
  if (!platform::Items::Current().Exists(destination)) return kOrbNoErr;
  return RemoveExistingDestination(source, destination);
}

/// A cancel is the caller's own wish, however full the volume is.
OrbResult ConsiderSpace(OrbResult result, const COrbFilePath& folder) {
  if (!Failed(result) || result == kOrbErrCanceled) return result;
  return IsLowOnSpace(folder) ? kOrbErrDiskFull : result;
}

}  // namespace
}  // namespace orb

OrbResult OrbCopyFileOverwriteEx(const COrbFilePath& source,
                                 const COrbFilePath& folder,
                                 const COrbStringData* name,
                                 OrbProgressProc progress,
                                 void* data) {
  const auto from = orb::ItemPath(source.GetFullPath());
  if (!from) return kOrbErrAccessDenied;
  if (OrbResult found = orb::ExpectSource(*from); orb::Failed(found)) return found;
  if (OrbResult usable = orb::CheckAttributes(source, *from); orb::Failed(usable)) return usable;
  COrbStringData newName;
  if (OrbResult named = orb::ChooseName(source, name, &newName); orb::Failed(named)) return named;
  std::string to;
  if (OrbResult joined = orb::PathIn(folder, newName, &to); orb::Failed(joined)) return joined;
  if (OrbResult free = orb::MakeWay(*from, to); orb::Failed(free)) return free;
  orb::OrbCopyPath worker(*from, to);
  worker.SetProgress(progress, data);
  return orb::ConsiderSpace(worker.Perform(), folder);
}

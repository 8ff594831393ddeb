// SPDX-License-Identifier: MIT
#include <orb/fileops/copy.h>

#include "fileinfo/item_path.h"
#include "fileops/error_mapping.h"
#include "fileops/path_in.h"
#include "fileops/transfer.h"
#include "platform/copier.h"

using orb::ItemPath;
using orb::Transfer;

OrbResult OrbCopyFile(const COrbStringData& source, const COrbStringData& destination) {
  if (!orb::ItemExists(source)) return kOrbErrNoSuchFile;
  const auto from = ItemPath(source);
  const auto to = ItemPath(destination);
  if (!from || !to) return kOrbErrAccessDenied;
  return orb::FileOperationResult(orb::platform::CopyItem(*from, *to));
}

OrbResult OrbCopyFile(const COrbFilePath& source,
                      const COrbFilePath& folder,
                      const COrbStringData& name,
                      COrbFilePath* result) {
  if (!orb::ItemExists(source.GetFullPath())) return kOrbErrNoSuchFile;
  return Transfer(orb::form::kOrbCopyFile, {source, folder, &name, nullptr, nullptr, result});
}

OrbResult OrbCopyFileOverwrite(const COrbFilePath& source, const COrbFilePath& destination) {
  const auto from = ItemPath(source.GetFullPath());
  const auto to = ItemPath(destination.GetFullPath());
  if (!from || !to || *from == *to) return kOrbErrAccessDenied;
  if (OrbResult found = orb::ExpectCopyable(*from); orb::Failed(found)) return found;
  if (OrbResult comes = orb::ExpectCopyableTo(*from, *to); orb::Failed(comes)) return comes;
  const OrbResult free = orb::RemoveExistingDestination(*from, *to, orb::Alike::kOnDisk);
  if (orb::Failed(free)) return free;
  return orb::FileOperationResult(orb::platform::CopyItem(*from, *to));
}

OrbResult OrbCopyFileOverwrite(const COrbFilePath& source,
                               const COrbFilePath& folder,
                               const COrbStringData* name,
                               COrbFilePath* result) {
  return Transfer(orb::form::kOrbCopyFileOverwrite,
                  {source, folder, name, nullptr, nullptr, result});
}

OrbResult OrbCopyFileOverwriteEx(const COrbFilePath& source,
                                 const COrbFilePath& folder,
                                 const COrbStringData* name,
                                 OrbProgressProc progress,
                                 void* data) {
  return Transfer(orb::form::kOrbCopyFileOverwriteEx, {source, folder, name, progress, data});
}

// NOLINTBEGIN(performance-unnecessary-value-param): the interface takes these by value.
OrbResult OrbCopyFolder(COrbFilePath source,
                        COrbFilePath folder,
                        const COrbStringData& name,
                        COrbFilePath* result) {
  return Transfer(orb::form::kOrbCopyFolder, {source, folder, &name, nullptr, nullptr, result});
}
// NOLINTEND(performance-unnecessary-value-param)

OrbResult OrbCopyFolderEx(const COrbFilePath& source,
                          const COrbFilePath& folder,
                          const COrbStringData& name,
                          OrbProgressProc progress,
                          void* data) {
  return Transfer(orb::form::kOrbCopyFolderEx, {source, folder, &name, progress, data});
}

OrbResult OrbCopyFolderEx(const COrbFilePath&, const COrbFilePath&, OrbProgressProc, void*) {
  return kOrbErrNotSupported;
}

OrbResult OrbCopyFolderOverwriteEx(const COrbFilePath& source,
                                   const COrbFilePath& folder,
                                   const COrbStringData* name,
                                   OrbProgressProc progress,
                                   void* data) {
  return Transfer(orb::form::kOrbCopyFolderOverwriteEx, {source, folder, name, progress, data});
}

// SPDX-License-Identifier: MIT
#include <orb/fileops/move.h>

#include <algorithm>
#include <string>

#include "fileinfo/item_path.h"
#include "fileops/error_mapping.h"
#include "fileops/path_in.h"
#include "fileops/transfer.h"
#include "platform/mover.h"
#include "strings/string_access.h"

using orb::ItemPath;
using orb::StringAccess;
using orb::Transfer;

namespace {

/// Whatever follows the "/": what stays would lead into another folder.
COrbStringData WithoutSeparators(const COrbStringData& name) {
  std::string text(StringAccess::Read(name).Readable());
  std::ranges::replace(text, '/', ':');
  return StringAccess::FromUtf8(text);
}

}  // namespace

OrbResult OrbMoveFile(const COrbFilePath& source, const COrbFilePath& destination) {
  const auto from = ItemPath(source.GetFullPath());
  const auto to = ItemPath(destination.GetFullPath());
  if (!from || !to) return kOrbErrAccessDenied;
  return orb::platform::MoveItem(*from, *to) ? kOrbNoErr : kOrbErrAccessDenied;
}

OrbResult OrbMoveFile(const COrbFilePath& source,
                      const COrbFilePath& folder,
                      const COrbStringData& name,
                      COrbFilePath* result) {
  const COrbStringData oneComponent = WithoutSeparators(name);
  return Transfer(orb::form::kOrbMoveFile,
                  {source, folder, &oneComponent, nullptr, nullptr, result});
}

OrbResult OrbMoveFile(const COrbStringData& source, const COrbStringData& destination) {
  const OrbResult target = orb::OrbCheckCopyTarget(source, destination);
  if (orb::Failed(target)) return target;
  const auto from = ItemPath(source);
  const auto to = ItemPath(destination);
  if (!from || !to || orb::ItemExists(destination)) return kOrbErrAccessDenied;
  return orb::FileOperationResult(orb::platform::MoveItem(*from, *to));
}

OrbResult OrbMoveFileEx(const COrbFilePath& source,
                        const COrbFilePath& folder,
                        const COrbStringData& name,
                        OrbProgressProc progress,
                        void* data) {
  return Transfer(orb::form::kOrbMoveFileEx, {source, folder, &name, progress, data});
}

OrbResult OrbMoveFileEx(const COrbFilePath&, const COrbFilePath&, OrbProgressProc, void*) {
  return kOrbErrNotSupported;
}

OrbResult OrbMoveFileOverwrite(const COrbFilePath& source,
                               const COrbFilePath& folder,
                               const COrbStringData* name,
                               COrbFilePath* result) {
  return Transfer(orb::form::kOrbMoveFileOverwrite,
                  {source, folder, name, nullptr, nullptr, result});
}

OrbResult OrbMoveFileOverwriteEx(const COrbFilePath& source,
                                 const COrbFilePath& folder,
                                 const COrbStringData* name,
                                 OrbProgressProc progress,
                                 void* data) {
  return Transfer(orb::form::kOrbMoveFileOverwriteEx, {source, folder, name, progress, data});
}

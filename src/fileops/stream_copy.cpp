// SPDX-License-Identifier: MIT
#include <orb/fileops/copy.h>
#include <orb/fileops/remove.h>

#include <array>
#include <cstddef>
#include <span>

#include "fileinfo/item_path.h"
#include "fileops/error_mapping.h"
#include "fileops/path_in.h"
#include "platform/streams.h"

namespace orb {
namespace {

using platform::InputStream;
using platform::OutputStream;

constexpr std::size_t kPiece = 65536;

OrbResult CodeOf(const platform::Status& status) {
  return status ? kOrbNoErr : OrbMapError(status.Reason());
}

OrbResult CopyPieces(InputStream* source,
                     OutputStream* destination,
                     OrbProgressProc progress,
                     void* data) {
  std::array<std::byte, kPiece> buffer;
  for (;;) {
    const auto count = source->Read(buffer);
    if (!count) return OrbMapError(count.Reason());
    if (count.Value() == 0) return kOrbNoErr;
    const auto written = destination->Write(std::span(buffer).first(count.Value()));
    if (!written) return OrbMapError(written.Reason());
    if (progress != nullptr && !progress(data)) return kOrbErrCanceled;
  }
}

/// Who cancels wants no destination, also where one was reserved before. What somebody else has put
/// in its place is not his.
OrbResult Cancel(OutputStream* destination, const COrbStringData& path) {
  COrbFilePath item;
  item.Initialize(&path);
  if (destination->Undo()) (void)OrbDeleteFile(item);
  return kOrbErrCanceled;
}

/// What is not finished is taken back when the destination goes out of scope.
OrbResult AppendFile(InputStream* source,
                     const COrbStringData& path,
                     OrbProgressProc progress,
                     void* data) {
  auto destination = OutputStream::Append(path.GetPtrUtf8());
  if (!destination) return OrbMapError(destination.Reason());
  if (destination.Value().Writes(*source)) return kOrbErrSamePath;
  const OrbResult copied = CopyPieces(source, &destination.Value(), progress, data);
  if (copied == kOrbErrCanceled) return Cancel(&destination.Value(), path);
  return Failed(copied) ? copied : CodeOf(destination.Value().Finish());
}

}  // namespace
}  // namespace orb

OrbResult OrbCopyFileEx(const COrbFilePath& source,
                        const COrbFilePath& folder,
                        const COrbStringData& name,
                        OrbProgressProc progress,
                        void* data) {
  if (folder.IsEmpty()) return kOrbErrEmptyPath;
  COrbStringData destination;
  const OrbResult joined = OrbMakeFilePath(folder.GetFullPath(), name, &destination);
  if (orb::Failed(joined)) return joined;
  const auto from = orb::ItemPath(source.GetFullPath());
  if (!from) return kOrbErrAccessDenied;
  auto input = orb::platform::InputStream::Open(*from);
  if (!input) {
    const bool missing = input.Reason() == orb::platform::kNoSuchItem;
    return missing ? kOrbNoErr : orb::OrbMapError(input.Reason());
  }
  return orb::AppendFile(&input.Value(), destination, progress, data);
}

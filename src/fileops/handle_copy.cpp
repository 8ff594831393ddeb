// SPDX-License-Identifier: MIT
#include <orb/fileops/copy.h>
#include <orb/fileops/remove.h>

#include <string>
#include <string_view>
#include <utility>

#include "fileinfo/item_path.h"
#include "fileops/failure_diagnosis.h"
#include "fileops/path_in.h"
#include "platform/file_handle.h"
#include "platform/items.h"

namespace orb {
namespace {

using platform::FileHandle;
using platform::Items;

/// What ends the work of a handle from inside a handler.
struct HandleException {
  std::string_view reason;
};

constexpr std::string_view kAbort = "Abort";

/// Reads all before anything is written. A failure of the system has no code of its own here.
OrbResult CopyBytes(FileHandle* source, FileHandle* destination) {
  try {
    const auto bytes = source->ReadToEnd();
    return bytes && destination->Write(bytes.Value()) ? kOrbNoErr : kOrbErrUnknown;
  } catch (const HandleException& exception) {
    return exception.reason == kAbort ? kOrbErrCanceled : kOrbErrUnknown;
  }
}

/// Of the values that an item has beside its bytes, those that the system keeps: the times of
/// creation and modification, and the lock, which would refuse the others if it came first. Refused
/// ones are left out.
void CopyValues(const std::string& source, const std::string& destination) {
  const Items& items = Items::Current();
  const auto record = items.ReadRecord(source);
  if (!record) return;
  (void)items.SetCreated(destination, record.Value().created);
  (void)items.SetModified(destination, record.Value().modified);
  if (record.Value().locked) (void)items.SetLocked(destination, true);
}

/// Both handles are closed when this returns or lets an exception of the callback pass.
OrbResult Copy(FileHandle source,
               FileHandle destination,
               const std::string& from,
               const std::string& to,
               OrbProgressProc progress,
               void* data) {
  destination.SetWriteabilityHandler([=] {
    if (progress != nullptr && !progress(data)) throw HandleException{kAbort};
  });
  const OrbResult result = CopyBytes(&source, &destination);
  if (!Failed(result)) CopyValues(from, to);
  return result;
}

OrbResult Diagnose(const platform::Result<FileHandle>& failed,
                   const COrbFilePath& path,
                   eOrbFailedOperation operation) {
  return OrbDiagnoseFailure(failed.Reason(), path.GetFullPath(), nullptr, operation);
}

}  // namespace
}  // namespace orb

OrbResult OrbCopyFileEx(const COrbFilePath& source,
                        const COrbFilePath& destination,
                        OrbProgressProc progress,
                        void* data) {
  using orb::platform::FileHandle;
  const auto from = orb::ItemPath(source.GetFullPath());
  const auto to = orb::ItemPath(destination.GetFullPath());
  if (!from || !to) return kOrbErrNotFound;
  auto reading = FileHandle::OpenForReading(*from);
  if (!reading) return orb::Diagnose(reading, source, orb::kOrbOpRead);
  auto writing = FileHandle::OpenForWriting(*to);
  if (!writing) return orb::Diagnose(writing, destination, orb::kOrbOpWrite);
  if (writing.Value().IsSameFile(reading.Value())) return kOrbErrSamePath;
  const OrbResult result =
      orb::Copy(std::move(reading).Value(), std::move(writing).Value(), *from, *to, progress, data);
  if (orb::Failed(result)) (void)OrbDeleteFile(destination);
  return result;
}

// SPDX-License-Identifier: MIT
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/remove.h>

#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "fileinfo/item_path.h"
#include "fileops/error_mapping.h"
#include "fileops/failure_diagnosis.h"
#include "fileops/path_in.h"
#include "platform/items.h"
#include "platform/removal.h"
#include "strings/string_access.h"

namespace orb {
namespace {

constexpr int kTries = 100;
constexpr std::chrono::milliseconds kPause{40};

bool IsBusy(const platform::Status& removed) {
  return !removed && removed.Reason() == platform::kBusy;
}

OrbResult DiagnoseDeletion(const platform::Status& failed, const std::string& path) {
  return OrbDiagnoseFailure(failed.Reason(), StringAccess::FromUtf8(path), nullptr, kOrbOpDelete);
}

/// Only an item that is there and busy is worth another try.
OrbResult WaitUntilRemoved(const std::string& path) {
  for (int i = 0; i < kTries; ++i) {
    std::this_thread::sleep_for(kPause);
    const auto removed = platform::RemoveItem(path);
    if (removed) return kOrbNoErr;
    if (!IsBusy(removed)) return DiagnoseDeletion(removed, path);
    const auto there = platform::Items::Current().ReadRecord(path);
    if (!there) return DiagnoseDeletion(there.Reason(), path);
  }
  return kOrbErrUnknown;
}

OrbResult RemoveOrWait(const std::string& path) {
  const auto removed = platform::RemoveItem(path);
  if (removed) return kOrbNoErr;
  const OrbResult code = DiagnoseDeletion(removed, path);
  if (code != kOrbErrUnknown) return code;
  return platform::UnlinkItem(path) ? kOrbNoErr : WaitUntilRemoved(path);
}

template <typename Remove>
OrbResult RemoveInOrder(const std::vector<COrbFilePath>& paths, Remove remove) {
  for (const COrbFilePath& path : paths) {
    if (const OrbResult result = remove(path); Failed(result)) return result;
  }
  return kOrbNoErr;
}

}  // namespace
}  // namespace orb

OrbResult OrbDeleteFile(const COrbFilePath& path) {
  constexpr unsigned int kDecisive = kOrbFileAttrWritable | kOrbFileAttrLocked;
  const unsigned int attributes = COrbFileHandle(path).GetAttribute();
  if (path.IsEmpty()) return kOrbErrNoSuchFile;
  if ((attributes & kDecisive) != kOrbFileAttrWritable) return kOrbErrAccessDenied;
  const auto item = orb::ItemPath(path.GetFullPath());
  return item ? orb::RemoveOrWait(*item) : kOrbErrNoSuchFile;
}

OrbResult OrbDeleteFile(const std::vector<COrbFilePath>& paths, bool) {
  return orb::RemoveInOrder(paths, [](const auto& path) { return OrbDeleteFile(path); });
}

OrbResult OrbRemoveFileRecursive(const COrbFilePath& path) {
  const auto item = orb::ItemPath(path.GetFullPath());
  return item ? orb::FileOperationResult(orb::platform::RemoveItem(*item)) : kOrbErrNotFound;
}

OrbResult OrbDeleteFolder(const COrbFilePath& path) { return OrbRemoveFileRecursive(path); }

OrbResult OrbDeleteFolder(const std::vector<COrbFilePath>& paths, bool) {
  return orb::RemoveInOrder(paths, OrbRemoveFileRecursive);
}

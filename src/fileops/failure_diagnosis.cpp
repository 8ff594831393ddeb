// SPDX-License-Identifier: MIT
#include "fileops/failure_diagnosis.h"

#include <orb/fileinfo/file_handle.h>

#include <optional>
#include <string>
#include <string_view>

#include "fileinfo/item_path.h"
#include "platform/transcode.h"
#include "strings/string_access.h"

namespace orb {

namespace {

constexpr std::size_t kLongestName = 255;
constexpr std::size_t kLongestPath = 1024;
constexpr unsigned int kAnyAccess = kOrbFileAttrReadable | kOrbFileAttrWritable;

COrbFileHandle HandleOf(const COrbStringData& path) {
  COrbFileHandle handle;
  handle.Initialize(&path);
  return handle;
}

unsigned int Attributes(const COrbStringData& path) { return HandleOf(path).GetAttribute(); }

/// No attributes where there is no folder above.
unsigned int ParentAttributes(const COrbStringData& path) {
  COrbFileHandle parent;
  HandleOf(path).GetParent(&parent);
  return parent.GetAttribute();
}

bool IsBlocked(unsigned int attributes) {
  return (attributes & kOrbFileAttrLocked) != 0 || (attributes & kAnyAccess) == 0;
}

bool Creates(eOrbFailedOperation operation) {
  return operation == kOrbOpCreateFile || operation == kOrbOpCreateFolder;
}

bool NewPathExists(const COrbStringData* newPath) {
  return newPath != nullptr && ItemExists(*newPath);
}

OrbResult TestExistence(const COrbStringData& path,
                        const COrbStringData* newPath,
                        eOrbFailedOperation operation) {
  const bool exists = ItemExists(path);
  if (Creates(operation)) return exists ? kOrbErrFileExists : kOrbNoErr;
  if (!exists) return kOrbErrNoSuchFile;
  return operation == kOrbOpRename && NewPathExists(newPath) ? kOrbErrFileExists : kOrbNoErr;
}

std::string_view LastComponent(std::string_view path) {
  path = path.substr(0, path.find_last_not_of('/') + 1);
  return path.substr(path.rfind('/') + 1);
}

OrbResult TestName(std::string_view path) {
  if (platform::Utf16LengthOfUtf8(LastComponent(path)) > kLongestName) return kOrbErrInvalidName;
  return path.size() > kLongestPath ? kOrbErrNameTooLong : kOrbNoErr;
}

OrbResult DeniedIf(bool blocked) { return blocked ? kOrbErrAccessDenied : kOrbErrUnknown; }

OrbResult TestRename(const COrbStringData& path, const COrbStringData* newPath) {
  return DeniedIf(IsBlocked(ParentAttributes(path)) || IsBlocked(Attributes(path)) ||
                  (newPath != nullptr && IsBlocked(ParentAttributes(*newPath))));
}

OrbResult TestDelete(const COrbStringData& path) {
  if (IsBlocked(ParentAttributes(path))) return kOrbErrAccessDenied;
  const unsigned int attributes = Attributes(path);
  return DeniedIf((attributes & kOrbFileAttrLocked) != 0 ||
                  (attributes & kOrbFileAttrVolumeWritable) == 0);
}

OrbResult TestCreate(const COrbStringData& path) {
  const unsigned int parent = ParentAttributes(path);
  return DeniedIf((parent & kOrbFileAttrWritable) == 0 || (parent & kOrbFileAttrLocked) != 0);
}

OrbResult TestPermission(const COrbStringData& path,
                         const COrbStringData* newPath,
                         eOrbFailedOperation operation) {
  if (operation == kOrbOpRename) return TestRename(path, newPath);
  if (operation == kOrbOpDelete) return TestDelete(path);
  return Creates(operation) ? TestCreate(path) : kOrbErrUnknown;
}

}  // namespace

OrbResult OrbDiagnoseFailure(const ErrorObject& error,
                             const COrbStringData& path,
                             const COrbStringData* newPath,
                             eOrbFailedOperation operation) {
  const OrbResult mapped = OrbMapError(error);
  if (mapped != kOrbNoErr && mapped != kOrbErrUnknown) return mapped;
  const std::string_view text = StringAccess::Read(path).Readable();
  if (text.empty()) return kOrbErrNotFound;
  const OrbResult existence = TestExistence(path, newPath, operation);
  if (existence != kOrbNoErr) return existence;
  const bool namesAnItem = Creates(operation) || operation == kOrbOpRename;
  const OrbResult name = namesAnItem ? TestName(text) : kOrbNoErr;
  if (name != kOrbNoErr) return name;
  return TestPermission(path, newPath, operation);
}

}  // namespace orb

// SPDX-License-Identifier: MIT
#include "fileops/error_mapping.h"

#include <span>

namespace orb {

namespace {

using platform::Error;
using platform::ErrorDomain;

struct Row {
  Error error;
  OrbResult result;
};

constexpr Row kCommonRows[] = {
    {{ErrorDomain::kOSStatus, -34}, kOrbErrDiskFull},         // Disk full.
    {{ErrorDomain::kOSStatus, -33}, kOrbErrDiskFull},         // Folder full.
    {{ErrorDomain::kOSStatus, -46}, kOrbErrAccessDenied},     // Volume locked.
    {{ErrorDomain::kOSStatus, -61}, kOrbErrAccessDenied},     // No write permission.
    {{ErrorDomain::kOSStatus, -5000}, kOrbErrAccessDenied},   // Access denied.
    {{ErrorDomain::kOSStatus, -35}, kOrbErrNotFound},         // No such volume.
    {{ErrorDomain::kOSStatus, -1301}, kOrbErrAlreadyExists},  // File id exists.
    {{ErrorDomain::kCocoa, 257}, kOrbErrAccessDenied},        // No read permission.
    {{ErrorDomain::kCocoa, 513}, kOrbErrAccessDenied},        // No write permission.
    {{ErrorDomain::kCocoa, 260}, kOrbErrNotFound},            // No such file, on read.
    {{ErrorDomain::kCocoa, 640}, kOrbErrDiskFull},            // Out of space.
    {{ErrorDomain::kUrl, -1000}, kOrbErrNotFound},            // Bad URL.
    {{ErrorDomain::kUrl, -1100}, kOrbErrNotFound},            // File does not exist.
    {{ErrorDomain::kUrl, -1102}, kOrbErrAccessDenied},        // No permission to read.
    {{ErrorDomain::kPosix, 1}, kOrbErrAccessDenied},          // Not permitted.
    {{ErrorDomain::kPosix, 13}, kOrbErrAccessDenied},         // Access denied.
    {{ErrorDomain::kPosix, 30}, kOrbErrAccessDenied},         // Read-only file system.
    {{ErrorDomain::kPosix, 2}, kOrbErrNotFound},              // No such file.
    {{ErrorDomain::kPosix, 12}, kOrbErrOutOfMemory},          // Out of memory.
    {{ErrorDomain::kPosix, 17}, kOrbErrAlreadyExists},        // Exists.
    {{ErrorDomain::kPosix, 27}, kOrbErrDiskFull},             // File too large.
    {{ErrorDomain::kPosix, 28}, kOrbErrDiskFull},             // No space.
};

constexpr Row kGeneralRows[] = {
    {{ErrorDomain::kCocoa, 4}, kOrbErrNotFound},        // No such file.
    {{ErrorDomain::kCocoa, 642}, kOrbErrAccessDenied},  // Volume read-only.
    {{ErrorDomain::kCocoa, 514}, kOrbErrInvalidName},   // Invalid file name.
    {{ErrorDomain::kCocoa, 516}, kOrbErrFileExists},    // File exists.
};

bool IsNull(const ErrorObject& error) { return !error || error->domain == ErrorDomain::kNone; }

OrbResult Find(std::span<const Row> rows, const Error& error) {
  for (const Row& row : rows) {
    if (row.error == error) return row.result;
  }
  return kOrbErrUnknown;
}

}  // namespace

OrbResult OrbMapError(const ErrorObject& error) {
  if (IsNull(error)) return kOrbNoErr;
  const OrbResult general = Find(kGeneralRows, *error);
  return general != kOrbErrUnknown ? general : Find(kCommonRows, *error);
}

OrbResult OrbMapErrorForFileOperation(const ErrorObject& error) {
  return IsNull(error) ? kOrbNoErr : Find(kCommonRows, *error);
}

OrbResult FileOperationResult(const platform::Status& status) {
  if (status) return kOrbNoErr;
  const OrbResult code = OrbMapErrorForFileOperation(status.Reason());
  return code == kOrbNoErr ? kOrbErrAccessDenied : code;
}

}  // namespace orb

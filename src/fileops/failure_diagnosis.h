// SPDX-License-Identifier: MIT
#pragma once

#include <orb/result.h>
#include <orb/strings/string_data.h>

#include "fileops/error_mapping.h"

namespace orb {

/// What failed on the path that the diagnosis is given.
enum eOrbFailedOperation : unsigned int {
  kOrbOpRead = 0x01,
  kOrbOpWrite = 0x02,
  kOrbOpCreateFile = 0x10,
  kOrbOpCreateFolder = 0x20,
  kOrbOpRename = 0x40,
  kOrbOpDelete = 0x80,
};

/// Says why an operation failed: by the error object if there is one that tells, else by what the
/// file system shows of the path, and for a rename of the new path too (null otherwise).
/// kOrbErrUnknown when that tells nothing either.
OrbResult OrbDiagnoseFailure(const ErrorObject& error,
                             const COrbStringData& path,
                             const COrbStringData* newPath,
                             eOrbFailedOperation operation);

}  // namespace orb

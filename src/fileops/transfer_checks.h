// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_path.h>
#include <orb/result.h>

#include <string>

/// \file
/// What the forms of copy and move ask before and after the work.

namespace orb {

/// The code that the copy of a source gives when nothing is there.
OrbResult ExpectSource(const std::string& source);

/// Makes way at a destination where something exists. kOrbErrInsideSource, and nothing is removed,
/// when it is the source or a folder above it, as the texts say or as the file system knows it: the
/// same item may be reached through a linked folder, through ".." or in other letters' case.
/// kOrbErrAccessDenied when it cannot be removed.
OrbResult RemoveExistingDestination(const std::string& source, const std::string& destination);

/// Whether a failure in a writable folder is put down to its volume being nearly full: below
/// 100 MiB.
bool IsLowOnSpace(const COrbFilePath& folder);

}  // namespace orb

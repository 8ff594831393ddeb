// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/result.h>

/// \file
/// Links are followed; pipes and devices are refused with kOrbErrAccessDenied. What cannot be
/// opened gives kOrbErrNotFound, also for a path that is not valid UTF-8 or leads to a folder,
/// kOrbErrAccessDenied or the code of what failed. Everything here may be called from any thread.

/// Reads up to `size` bytes from the start of a file straight into the buffer. A file that is
/// shorter fills only its own length; the rest of the buffer is untouched. kOrbErrUnknown when
/// reading fails.
ORB_EXPORT OrbResult OrbReadFile(const COrbFilePath& path, void* buffer, unsigned int size);

/// Writes over the start of a file that is there; what lies behind the first `size` bytes stays. A
/// locked file is refused with kOrbErrAccessDenied. kOrbErrUnknown when writing fails; a file that
/// had to grow and could not for want of space is then as it was.
ORB_EXPORT OrbResult OrbWriteFile(const COrbFilePath& path, const void* data, unsigned int size);

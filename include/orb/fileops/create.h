// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// \file
/// New items. Everything here may be called from any thread.

/// Makes a folder, and the folders above it that are missing. `result` may be null; it receives the
/// path on success alone. kOrbErrEmptyPath for an empty folder, which is never taken for the
/// working directory; kOrbErrFileExists, kOrbErrAccessDenied, kOrbErrInvalidName,
/// kOrbErrNameTooLong, kOrbErrDiskFull, kOrbErrNotFound, kOrbErrUnknown; folders made above it
/// stay.
ORB_EXPORT OrbResult OrbCreateFolder(const COrbFilePath& folder,
                                     const COrbStringData& name,
                                     COrbFilePath* result);

/// Makes an empty file, in the place of a file that is there already; a link is replaced, not
/// followed. `result`, which must not be null, receives the path on success alone. The codes of
/// OrbCreateFolder; an existing item that cannot be replaced gives kOrbErrFileExists, a missing
/// folder kOrbErrAccessDenied.
ORB_EXPORT OrbResult OrbCreateFile(const COrbFilePath& folder,
                                   const COrbStringData& name,
                                   COrbFilePath* result);

/// Makes an empty file under a name that nothing has: photo.jpg, else photo_1.jpg, photo_2.jpg and
/// so on. Testing and making are one step, so two callers never get the same file. `result`, which
/// must not be null, receives the path on success alone. The codes of OrbCreateFile;
/// kOrbErrInvalidName also when the number makes the name longer than the volume takes.
ORB_EXPORT OrbResult OrbCreateUniqueFile(const COrbFilePath& folder,
                                         const COrbStringData& name,
                                         COrbFilePath* result);

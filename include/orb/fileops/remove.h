// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/result.h>

/// Removes an item, waiting up to 4 seconds (100 tries, 40 ms apart) for one that is busy.
/// kOrbErrNoSuchFile for an empty path; kOrbErrAccessDenied for an item that is locked or not
/// writable and where nothing exists; kOrbErrUnknown for one that stays busy; otherwise the code of
/// what failed. On failure the item is still there; a folder may have lost some of its content.
ORB_EXPORT OrbResult OrbDeleteFile(const COrbFilePath& path);

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/result.h>

#include <vector>

/// \file
/// Removal for good. Links are removed and never followed, and a volume that is mounted inside a
/// folder is not entered. Everything here may be called from any thread.

/// Removes an item, waiting up to 4 seconds (100 tries, 40 ms apart) for one that is busy.
/// kOrbErrNoSuchFile for an empty path; kOrbErrAccessDenied for an item that is locked or not
/// writable and where nothing exists or a link leads nowhere; kOrbErrUnknown for one that stays
/// busy; otherwise the code of what failed. On failure the item is still there; a folder may have
/// lost some of its content.
ORB_EXPORT OrbResult OrbDeleteFile(const COrbFilePath& path);

/// OrbDeleteFile() of one path after another, up to the first that fails: its code is the result,
/// and what comes after it stays. The flag means nothing.
ORB_EXPORT OrbResult OrbDeleteFile(const std::vector<COrbFilePath>& paths, bool unused);

/// Removes an item, and a folder with all that it holds. Nothing is asked before and nothing is
/// waited for. kOrbErrAccessDenied for what is locked, protected or busy, in the folder too, and
/// for a path that ends in "." or ".."; kOrbErrNotFound, also for one that is empty or not valid
/// UTF-8; kOrbErrUnknown. On failure a folder may have lost some of its content.
ORB_EXPORT OrbResult OrbRemoveFileRecursive(const COrbFilePath& path);

/// The same.
ORB_EXPORT OrbResult OrbDeleteFolder(const COrbFilePath& path);

/// OrbDeleteFolder() of one path after another, up to the first that fails: its code is the result,
/// and what comes after it stays. The flag means nothing.
ORB_EXPORT OrbResult OrbDeleteFolder(const std::vector<COrbFilePath>& paths, bool unused);

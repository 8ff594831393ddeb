// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// Gives an item another name in its folder, keeping its lock. Nothing is ever replaced. A change
/// of letters' case alone works on every volume. A "/" in the name leads into another folder, also
/// on another volume. May be called from any thread. `result` may be null and may be the path; it
/// receives the new path on success alone, and what it answers to that is then the result.
///
/// kOrbErrNoSuchFile for an empty path; kOrbErrAccessDenied for an item that is not writable or not
/// there, for a link that leads nowhere, and in a folder that is locked or forbids it;
/// kOrbErrFileExists when something has the new name, the item itself included, and for "", "." and
/// ".."; kOrbErrInvalidName for a name that is too long or not valid UTF-8; otherwise the code of
/// what failed. On failure the item has its old name and its lock.
ORB_EXPORT OrbResult OrbRenameFile(const COrbFilePath& path,
                                   const COrbStringData& name,
                                   COrbFilePath* result);

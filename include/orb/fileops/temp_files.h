// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// \file
/// Scratch files. Everything here may be called from any thread.

/// The project whose temporary folder the functions below use from now on, for the whole process;
/// empty at first. Folders made under an earlier name stay. Always 0.
ORB_EXPORT OrbResult OrbSetProjectName(const COrbStringData& name);

/// The project's folder below the system's temporary directory: Calyx/RTL, or Calyx/P/RTL for the
/// project P. What is missing is made, open to nobody else for writing; a folder that cannot be
/// made, or is a link or somebody else's, shows when a file is to be created. `result` must not be
/// null. kOrbErrInvalidName for a project name that is longer than 255 bytes, not valid UTF-8 or
/// has a ".." in it, kOrbErrAccessDenied where there is no temporary directory; `result` is then
/// untouched, and nothing is made.
ORB_EXPORT OrbResult OrbGetProjectTempFolder(COrbFilePath* result);

/// Removes the project's temporary folder with all that it holds, but nothing through a link and
/// nothing that is somebody else's.
ORB_EXPORT void OrbClearProjectTempFolder();

/// Makes an empty file OrbTmp0000 to OrbTmp9999, with the suffix behind the number, in a folder;
/// for null in the project's temporary folder, which must be the user's own and closed to others.
/// The numbers go round and round, one for each name that the process has tried. Testing and making
/// are one step: nobody else gets the same file, and nobody's file is emptied. `result`, which must
/// not be null, receives the path on success alone. kOrbErrAccessDenied, also for a folder that is
/// not there, is locked or, the project's own, is somebody else's or open to others;
/// kOrbErrDiskFull, also when all numbers are taken; kOrbErrEmptyPath for an empty folder;
/// kOrbErrInvalidName for a folder or suffix that is not valid UTF-8 and for a suffix that is too
/// long; either of the two for a suffix with a "/"; kOrbErrNotFound; kOrbErrNameTooLong;
/// kOrbErrUnknown.
ORB_EXPORT OrbResult OrbCreateTempFile(const COrbFilePath* folder, COrbFilePath* result);
ORB_EXPORT OrbResult OrbCreateTempFile(const COrbFilePath* folder,
                                       COrbFilePath* result,
                                       COrbStringData suffix);

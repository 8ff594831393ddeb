// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/fileops/progress.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// Joins a folder and a name with exactly one "/"; a name joined to an empty folder is the name
/// alone. kOrbErrNameTooLong when the joined text has 1024 UTF-16 units or more or the name 256,
/// then kOrbErrNotFound for a null `result`; `result` is untouched on failure.
ORB_EXPORT OrbResult OrbMakeFilePath(const COrbStringData& folder,
                                     const COrbStringData& name,
                                     COrbStringData* result);
/// The same. kOrbErrPathTooLong when folder, separator and name come to 1024 UTF-8 bytes or more,
/// kOrbErrNameTooLong for a name of 256 UTF-16 units or more; `result`, which must not be null, is
/// untouched on failure.
ORB_EXPORT OrbResult OrbMakeFilePath(const COrbFilePath& folder,
                                     const COrbStringData& name,
                                     COrbFilePath* result);

/// Copies a file's bytes in pieces of 64 KiB to the end of the file `name` in `folder`, which is
/// made when it is not there. Times, mode and attributes do not go along. `progress` is called
/// after each piece that was written. When the copy fails or is cancelled, what it wrote is taken
/// away again: a file that it made is removed, an older one has its former length. kOrbErrCanceled;
/// kOrbErrSamePath when source and destination are one file; the codes of OrbMakeFilePath;
/// kOrbErrNotFound, kOrbErrAccessDenied, kOrbErrDiskFull, kOrbErrInvalidName and kOrbErrUnknown for
/// what failed. A source that does not exist copies nothing and gives 0.
ORB_EXPORT OrbResult OrbCopyFileEx(const COrbFilePath& source,
                                   const COrbFilePath& folder,
                                   const COrbStringData& name,
                                   OrbProgressProc progress,
                                   void* data);

/// Copies an item, with times, mode, attributes and lock, into `folder` under `name`, or under its
/// own name for a null `name`. What is there already is removed first, but not before the source
/// was seen to be there. `progress` is called once before anything is copied, when it can cancel,
/// and once at the end. The copy is complete or absent. kOrbErrAccessDenied for a source that can
/// neither be read nor written and for a destination that cannot be removed; kOrbErrInsideSource
/// when the destination is the source or one of its folders, and nothing is removed;
/// kOrbErrCanceled; kOrbErrDiskFull, also for any failed copy while the destination's volume has
/// less than 100 MiB free; the codes of what failed.
ORB_EXPORT OrbResult OrbCopyFileOverwriteEx(const COrbFilePath& source,
                                            const COrbFilePath& folder,
                                            const COrbStringData* name,
                                            OrbProgressProc progress,
                                            void* data);

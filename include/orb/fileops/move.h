// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/fileops/progress.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// \file
/// Moves of files, links and folders. On one volume a move is one step that never replaces
/// anything, and an item that is at the destination already makes it fail. To another volume the
/// item is copied as OrbCopyFile() does, and the source goes when the copy is complete and on the
/// device; a failed copy is taken away again, also when the source was written to meanwhile. If the
/// source cannot be removed then, or has gone, the copy stays and the failure is reported. A locked
/// item does not move, nor to another volume a folder that holds one.
///
/// A form that removes what is at the destination looks at the source first: kOrbErrNotFound, and
/// nothing is removed, when it is empty or not there; kOrbErrAccessDenied for a locked one, for one
/// that may not be taken out of its folder, to another folder for a folder that the caller may not
/// write to and, to another volume, for one that cannot be read, a socket, pipe or device, and a
/// folder with something inside that could not be removed. Nor is
/// anything removed when the destination is the source, one of its folders or something inside it,
/// by its text or on disk: kOrbErrInsideSource. kOrbErrAccessDenied when it cannot be removed. Of a
/// folder nothing is removed when something inside is locked, a volume of its own or in a folder
/// that the caller may not read or write to; after any other failure it may have lost some of its
/// content.
///
/// Forms that take a folder give kOrbErrSamePath when it is the source and kOrbErrInsideSource when
/// it lies inside it, by their texts; kOrbErrAccessDenied for a source that is not valid UTF-8;
/// kOrbErrInvalidName for a folder or name that is not, and for a name that is, or whose last
/// component is, "", "." or ".." (a "/" at its end is left out, one inside leads into another
/// folder); kOrbErrEmptyPath for an empty folder. A source that ends in "." or ".." does not move:
/// kOrbErrAccessDenied.
///
/// `name` is null for the source's own where it is a pointer. `result` may be null; it receives the
/// destination on success alone. All other failures have the codes kOrbErrNotFound,
/// kOrbErrAccessDenied, kOrbErrDiskFull, kOrbErrOutOfMemory and kOrbErrUnknown, the last for an
/// existing destination and a name that the volume does not take.
///
/// Everything here may be called from any thread.

/// Every failure is kOrbErrAccessDenied.
ORB_EXPORT OrbResult OrbMoveFile(const COrbFilePath& source, const COrbFilePath& destination);
/// Each "/" in the name becomes ":".
ORB_EXPORT OrbResult OrbMoveFile(const COrbFilePath& source,
                                 const COrbFilePath& folder,
                                 const COrbStringData& name,
                                 COrbFilePath* result);
/// kOrbErrSamePath and kOrbErrInsideSource by the texts of source and destination, also where they
/// differ in letters' case alone; kOrbErrAccessDenied for an existing destination.
ORB_EXPORT OrbResult OrbMoveFile(const COrbStringData& source, const COrbStringData& destination);

/// Removes what is at the destination first. `progress` is called once before anything is moved,
/// when it can cancel (what was there already is gone by then), and once at the end unless the move
/// failed for a reason that the system gives. kOrbErrCanceled; kOrbErrDiskFull for any failed move
/// while the destination's volume has less than 100 MiB free.
ORB_EXPORT OrbResult OrbMoveFileEx(const COrbFilePath& source,
                                   const COrbFilePath& folder,
                                   const COrbStringData& name,
                                   OrbProgressProc progress,
                                   void* data);
/// Does nothing. Always kOrbErrNotSupported.
ORB_EXPORT OrbResult OrbMoveFileEx(const COrbFilePath& source,
                                   const COrbFilePath& destination,
                                   OrbProgressProc progress,
                                   void* data);

/// OrbMoveFileEx() without the calls.
ORB_EXPORT OrbResult OrbMoveFileOverwrite(const COrbFilePath& source,
                                          const COrbFilePath& folder,
                                          const COrbStringData* name,
                                          COrbFilePath* result);
/// OrbMoveFileEx(), also under the source's own name.
ORB_EXPORT OrbResult OrbMoveFileOverwriteEx(const COrbFilePath& source,
                                            const COrbFilePath& folder,
                                            const COrbStringData* name,
                                            OrbProgressProc progress,
                                            void* data);

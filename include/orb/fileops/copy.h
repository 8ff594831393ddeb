// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/fileops/progress.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// Joins a folder and a name with exactly one "/"; a name joined to an empty folder is the name
/// alone. kOrbErrInvalidName for a text that is not UTF-8, kOrbErrNameTooLong when the joined text
/// has 1024 UTF-16 units or more or the name 256, then kOrbErrNotFound for a null `result`;
/// `result` is untouched on failure.
ORB_EXPORT OrbResult OrbMakeFilePath(const COrbStringData& folder,
                                     const COrbStringData& name,
                                     COrbStringData* result);
/// The same. kOrbErrInvalidName for a text that is not UTF-8, kOrbErrPathTooLong when folder,
/// separator and name come to 1024 UTF-8 bytes or more, kOrbErrNameTooLong for a name of 256 UTF-16
/// units or more; `result`, which must not be null, is untouched on failure.
ORB_EXPORT OrbResult OrbMakeFilePath(const COrbFilePath& folder,
                                     const COrbStringData& name,
                                     COrbFilePath* result);

/// Copies a file's bytes in pieces of 64 KiB to the end of the file `name` in `folder`, which is
/// made when it is not there. Times, mode and attributes do not go along. `progress` is called
/// after each piece that was written. When the copy fails, what it wrote is taken away again: an
/// older file has its former length and times, and a new one is not there, because it gets its name
/// when it is complete. When `progress` cancels, an older file is deleted as well, under the rules
/// of OrbDeleteFile: a file that was reserved for the copy goes with it. While an older file grows,
/// a process that is killed leaves it longer than it was. A source that is a link is read through
/// it; a destination that is a link, is locked or is no regular file is refused with
/// kOrbErrAccessDenied.
///
/// kOrbErrEmptyPath for an empty folder; the codes of OrbMakeFilePath; kOrbErrCanceled;
/// kOrbErrSamePath when source and destination are one file, under whichever names;
/// kOrbErrNotFound, kOrbErrAccessDenied, kOrbErrDiskFull, kOrbErrInvalidName, kOrbErrFileExists
/// (somebody else made the destination meanwhile) and kOrbErrUnknown for what failed. A source that
/// is empty or does not exist copies nothing, makes nothing and gives 0.
ORB_EXPORT OrbResult OrbCopyFileEx(const COrbFilePath& source,
                                   const COrbFilePath& folder,
                                   const COrbStringData& name,
                                   OrbProgressProc progress,
                                   void* data);

/// Copies a file, a link (as a link) or a folder with all it holds, with times, mode, attributes
/// and lock, into `folder` under `name`, or under its own name for a null `name`. What is there
/// already is removed first, but not before the source was seen to be there. `progress` is called
/// once before anything is copied, when it can cancel (what was there already is gone by then), and
/// once at the end. A copied file is complete or absent; what the copy of a folder finished before
/// a failure stays.
///
/// In this order: kOrbErrNotFound for a source that is empty or not there; kOrbErrAccessDenied for
/// one that cannot be read, a link that leads nowhere among them, and for a socket, pipe or device;
/// kOrbErrInvalidName for a name that is empty, "." or ".."; kOrbErrEmptyPath for an empty folder;
/// kOrbErrInsideSource when the destination is the source or one of its folders, by its text or on
/// disk, and kOrbErrAccessDenied when it cannot be removed. Up to here nothing has changed, but a
/// folder that could not be removed may have lost some of its content. Then kOrbErrCanceled;
/// kOrbErrDiskFull, also for any failed copy while the destination's volume has less than 100 MiB
/// free; the codes of what failed.
ORB_EXPORT OrbResult OrbCopyFileOverwriteEx(const COrbFilePath& source,
                                            const COrbFilePath& folder,
                                            const COrbStringData* name,
                                            OrbProgressProc progress,
                                            void* data);

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/fileops/progress.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// \file
/// Copies of items, and the joining of a folder and a name. Unless a form says otherwise, it copies
/// a file, a link (as a link) or a folder with all it holds, with times, mode, attributes and lock,
/// and an item that is at the destination already makes it fail with kOrbErrUnknown. A copied file
/// is complete or absent; what the copy of a folder finished before a failure stays. Attributes
/// that the destination cannot carry are left out; of an item with more than 64 KiB of attribute
/// names, which the system does not list, only the creation time, the lock and the access control
/// lists go along. Where the caller owns it, a file that is copied keeps its access time, but in
/// OrbCopyFileEx(). Sockets, pipes and devices, also inside a folder, give kOrbErrAccessDenied.
///
/// A form that removes what is at the destination looks at the source first: kOrbErrNotFound, and
/// nothing is removed, when it is empty or not there; kOrbErrAccessDenied for one that cannot be
/// read, and for a socket, pipe or device, also inside a folder. Nor is anything removed when the
/// destination is the source, one of its folders or something inside it, by its text or on disk:
/// kOrbErrInsideSource. kOrbErrAccessDenied when it cannot be removed. Of a folder nothing is
/// removed when something inside is locked, a volume of its own or in a folder that the caller may
/// not read or write to; after any other failure it may have lost some of its content.
///
/// Every form may give kOrbErrAccessDenied for a source that is not valid UTF-8. Forms that take a
/// folder and a name give kOrbErrEmptyPath for an empty folder, and kOrbErrInvalidName when either
/// is not valid UTF-8 and for a name that is, or whose last component is, "", "." or ".."; a "/" at
/// the end of a name is left out, and one inside leads into another folder. `name` is null for the
/// source's own where it is a pointer. `result` may be null; it receives the destination on success
/// alone. All other failures have the codes kOrbErrNotFound, kOrbErrAccessDenied, kOrbErrDiskFull,
/// kOrbErrOutOfMemory and kOrbErrUnknown, the last also for a name that the volume does not take.
///
/// Everything here may be called from any thread.

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

/// kOrbErrNoSuchFile when the source does not exist; a link that leads nowhere does not.
ORB_EXPORT OrbResult OrbCopyFile(const COrbStringData& source, const COrbStringData& destination);
/// The same to `name` in `folder`. A failure that the system gives no reason for is kOrbErrDiskFull
/// while the destination's volume has less than 100 MiB free.
ORB_EXPORT OrbResult OrbCopyFile(const COrbFilePath& source,
                                 const COrbFilePath& folder,
                                 const COrbStringData& name,
                                 COrbFilePath* result);

/// Copies a file's bytes in pieces of 64 KiB to the end of the file `name` in `folder`, which is
/// made when it is not there. Times, mode and attributes do not go along. `progress` is called
/// after each piece that was written. When the copy fails, what it wrote is taken away again: an
/// older file has its former length and times, and a new one is not there, because it gets its name
/// when it is complete. When `progress` cancels, an older file is deleted as well, under the rules
/// of OrbDeleteFile: a file that was reserved for the copy goes with it. While an older file grows,
/// a process that is killed leaves it longer than it was. A source that is a link is read through
/// it; a destination that is a link, a pipe or a device, or is locked, is refused with
/// kOrbErrAccessDenied, and a folder in the place of either with kOrbErrUnknown.
///
/// kOrbErrEmptyPath for an empty folder; the codes of OrbMakeFilePath; kOrbErrInvalidName also for
/// an empty name and one that ends in "/"; kOrbErrUnknown for "." and ".."; kOrbErrCanceled;
/// kOrbErrSamePath when source and destination are one file, under whichever names;
/// kOrbErrNotFound, kOrbErrAccessDenied, kOrbErrDiskFull, kOrbErrInvalidName, kOrbErrFileExists
/// (somebody else made the destination meanwhile), kOrbErrOutOfMemory and kOrbErrUnknown for what
/// failed. An empty source makes an empty destination; one that does not exist makes nothing and
/// gives 0.
ORB_EXPORT OrbResult OrbCopyFileEx(const COrbFilePath& source,
                                   const COrbFilePath& folder,
                                   const COrbStringData& name,
                                   OrbProgressProc progress,
                                   void* data);

/// Overwrites an existing file from its start with a file's bytes, which are read into memory
/// before the first is written; what is beyond them stays. Times of creation and modification and
/// the lock go along as far as the volume takes them. `progress` is called before each piece of 64
/// KiB that is written. When the copy fails or is cancelled the destination is deleted, unless
/// `progress` itself throws: that passes on, with the files closed, and the destination stays.
///
/// Before anything is changed: kOrbErrNotFound, also for a path that is not valid UTF-8;
/// kOrbErrAccessDenied, also for a destination that is locked, a link, a pipe or a device;
/// kOrbErrSamePath when both are one file, under whichever names; kOrbErrUnknown for a folder.
/// After that: kOrbErrCanceled, or kOrbErrUnknown for whatever failed.
ORB_EXPORT OrbResult OrbCopyFileEx(const COrbFilePath& source,
                                   const COrbFilePath& destination,
                                   OrbProgressProc progress,
                                   void* data);

/// Removes what is at the destination first. kOrbErrAccessDenied, and nothing is touched, when both
/// texts are equal; otherwise only the file system is asked whether both are one item.
ORB_EXPORT OrbResult OrbCopyFileOverwrite(const COrbFilePath& source,
                                          const COrbFilePath& destination);
/// Removes what is at the destination first. A failure that the system gives no reason for is
/// kOrbErrDiskFull while the destination's volume has less than 100 MiB free.
ORB_EXPORT OrbResult OrbCopyFileOverwrite(const COrbFilePath& source,
                                          const COrbFilePath& folder,
                                          const COrbStringData* name,
                                          COrbFilePath* result);

/// Removes what is at the destination first. `progress` is called once before anything is copied,
/// when it can cancel (what was there already is gone by then), and once at the end, also when the
/// copy failed.
///
/// kOrbErrAccessDenied for a source that cannot be used, a link that leads nowhere among them;
/// kOrbErrCanceled; kOrbErrDiskFull for any failed copy while the destination's volume has less
/// than 100 MiB free.
ORB_EXPORT OrbResult OrbCopyFileOverwriteEx(const COrbFilePath& source,
                                            const COrbFilePath& folder,
                                            const COrbStringData* name,
                                            OrbProgressProc progress,
                                            void* data);

/// Before anything else kOrbErrSamePath when the folder is the source and kOrbErrInsideSource when
/// it lies inside it, by their texts.
ORB_EXPORT OrbResult OrbCopyFolder(COrbFilePath source,
                                   COrbFilePath folder,
                                   const COrbStringData& name,
                                   COrbFilePath* result);

/// OrbCopyFileOverwriteEx() with the test of the folder that OrbCopyFolder() makes. A failure keeps
/// its code, however full the volume is.
ORB_EXPORT OrbResult OrbCopyFolderEx(const COrbFilePath& source,
                                     const COrbFilePath& folder,
                                     const COrbStringData& name,
                                     OrbProgressProc progress,
                                     void* data);
/// Does nothing. Always kOrbErrNotSupported.
ORB_EXPORT OrbResult OrbCopyFolderEx(const COrbFilePath& source,
                                     const COrbFilePath& destination,
                                     OrbProgressProc progress,
                                     void* data);

/// OrbCopyFileOverwriteEx() with the test of the folder that OrbCopyFolder() makes, and without
/// asking whether the source can be read or written.
ORB_EXPORT OrbResult OrbCopyFolderOverwriteEx(const COrbFilePath& source,
                                              const COrbFilePath& folder,
                                              const COrbStringData* name,
                                              OrbProgressProc progress,
                                              void* data);

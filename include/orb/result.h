// SPDX-License-Identifier: MIT
#pragma once

/// The outcome of every fallible call. Test a result for being below kOrbErrFirst, not for being 0.
using OrbResult = unsigned int;

constexpr OrbResult kOrbNoErr = 0x0000;
/// The lowest failure value. Never returned itself.
constexpr OrbResult kOrbErrFirst = 0x1000;
/// The progress callback returned false.
constexpr OrbResult kOrbErrCanceled = 0x1002;
constexpr OrbResult kOrbErrOutOfMemory = 0x1003;
constexpr OrbResult kOrbErrEmptyPath = 0x1004;
/// Disk, folder or quota full, file too large, or a copy or move that failed while the
/// destination's volume had less than 100 MiB free.
constexpr OrbResult kOrbErrDiskFull = 0x1005;
/// A failure that maps to no other code; also a null text argument or output.
constexpr OrbResult kOrbErrUnknown = 0x1008;
/// No such file, folder or volume as the system reports it; nothing found in a lookup; a missing
/// out-argument.
constexpr OrbResult kOrbErrNotFound = 0x1101;
/// Folder path, separator and name together are 1024 UTF-8 bytes or more.
constexpr OrbResult kOrbErrPathTooLong = 0x1102;
/// The operation has no implementation on this platform, or an unknown lock number.
constexpr OrbResult kOrbErrNotSupported = 0x1103;
/// The item already exists, as the system reports it.
constexpr OrbResult kOrbErrAlreadyExists = 0x1105;
/// The library's own existence test failed: the item does not exist, or its path is empty.
constexpr OrbResult kOrbErrNoSuchFile = 0x1200;
/// No permission, a locked item, a read-only volume, or a system operation that failed without
/// saying why.
constexpr OrbResult kOrbErrAccessDenied = 0x1202;
/// The item to be created, or the new name of a rename, already exists.
constexpr OrbResult kOrbErrFileExists = 0x1203;
/// An invalid file name, or a last path component longer than 255 characters.
constexpr OrbResult kOrbErrInvalidName = 0x1204;
/// A name longer than 255 characters, or a path that is too long.
constexpr OrbResult kOrbErrNameTooLong = 0x1206;
/// Source and destination are the same path.
constexpr OrbResult kOrbErrSamePath = 0x1310;
/// The destination is the source or lies inside it.
constexpr OrbResult kOrbErrInsideSource = 0x1311;
/// A date or time field is out of range.
constexpr OrbResult kOrbErrInvalidTime = 0x1331;

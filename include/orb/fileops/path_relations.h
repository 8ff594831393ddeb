// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// \file
/// How paths lie to each other, by their texts alone: the file system is not asked. Everything
/// here may be called from any thread.

/// Whether a is the same path as b or one of its ancestor folders, without regard to case.
ORB_EXPORT bool OrbIsSubFolder(const COrbFilePath& a, const COrbFilePath& b);
ORB_EXPORT bool OrbIsSubFolder(const COrbStringData& a, const COrbStringData& b);

/// The text before the last "/": /a/b/ gives /a/b. `result` may be null and may be the path.
/// kOrbErrNotFound for a bare name and where the only "/" is the first character; `result` is then
/// untouched.
ORB_EXPORT OrbResult OrbGetParentFolder(const COrbStringData& path, COrbStringData* result);
/// COrbFilePath::GetParent().
ORB_EXPORT OrbResult OrbGetParentFolder(const COrbFilePath& path, COrbFilePath* result);

/// The text after the last "/", or the whole text. `result` must not be null. Always 0.
ORB_EXPORT OrbResult OrbGetFileNameFromPath(const COrbStringData& path, COrbStringData* result);
ORB_EXPORT OrbResult OrbGetFileNameFromPath(const COrbFilePath& path, COrbStringData* result);

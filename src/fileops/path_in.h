// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

#include <string>
#include <string_view>

namespace orb {

inline bool Failed(OrbResult result) { return result >= kOrbErrFirst; }

/// Folder and name with exactly one "/" between them; the name alone for an empty folder.
std::string JoinPath(std::string_view folder, std::string_view name);

/// The path of `name` in `folder`, for what is about to touch it: an empty folder is never taken
/// for the working directory. kOrbErrEmptyPath without a folder, kOrbErrInvalidName when a text is
/// not UTF-8; `path` is then untouched.
OrbResult PathIn(const COrbFilePath& folder, const COrbStringData& name, std::string* path);

}  // namespace orb

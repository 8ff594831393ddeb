// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "options.h"

namespace orbimport {

/// Makes both paths absolute, without links and dots, so that they can be told apart. False when
/// they cannot be used; `why` then says so. DESTINATION need not be there yet.
bool ResolvePaths(Options& options, std::string& why);

/// The folder itself or, where it is not there yet, the nearest one above it. `path` is absolute.
std::string NearestFolder(std::string path);

/// Whether the names lead to one file, so that removing one removes the other as well.
bool IsSameFile(const std::string& a, const std::string& b);

}  // namespace orbimport

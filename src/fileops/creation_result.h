// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_path.h>
#include <orb/result.h>

#include <string>

#include "platform/error.h"

namespace orb {

/// The path of what was made, for the caller. Always 0: it was made.
OrbResult Deliver(const std::string& path, COrbFilePath* result);

/// Why no file could be made. What the diagnosis sees comes first; the system's own error speaks
/// where it sees nothing.
OrbResult DiagnoseCreation(const platform::Status& failed, const std::string& path);

}  // namespace orb

// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/error.h"

namespace orb::platform {

/// The content of a file that the kernel makes up while it is read, so that its size says nothing.
Result<std::string> ReadSystemFile(const std::string& path);

}  // namespace orb::platform

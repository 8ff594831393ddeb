// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>
#include <string_view>

#include "platform/error.h"

namespace orb::platform {

/// Calls `use` with the name of everything in a folder, in no order and as it is stored.
Status ForEachName(const std::string& folder, const std::function<void(std::string_view)>& use);

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include "platform/linux/place.h"

namespace orb::platform {

/// CopyItem() between entries of open folders.
Status CopyItemAt(const Place& from, const Place& to);

}  // namespace orb::platform

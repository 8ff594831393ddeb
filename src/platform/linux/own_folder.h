// SPDX-License-Identifier: MIT
#pragma once

#include <sys/types.h>

#include "platform/linux/posix.h"

namespace orb::platform {

/// Opens a folder in another one when it is the effective user's own, nobody else may write to it,
/// and it is no link: kNotPermitted and kNoSuchItem otherwise. What is in such a folder cannot be
/// swapped by others.
Result<UniqueFd> OpenOwnFolder(int above, const char* name);

/// The same, and makes the folder when nothing is there, with exactly this mode: the process's mask
/// takes nothing from it. kNotPermitted where the folder above is locked.
Result<UniqueFd> OpenOrMakeOwnFolder(int above, const char* name, mode_t mode);

}  // namespace orb::platform

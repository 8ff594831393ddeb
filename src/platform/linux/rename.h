// SPDX-License-Identifier: MIT
#pragma once

#include "platform/error.h"

namespace orb::platform {

/// Gives an entry of an open folder another name, there or in another folder of the volume, and
/// never replaces anything: kItemExists. Where the file system does not know that as one step, a
/// file goes by a link, which does, and only where it knows no links either the name is looked at
/// before.
Status RenameWithoutReplacing(int from, const char* name, int to, const char* newName);

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include "platform/error.h"
#include "platform/linux/item_metadata.h"

namespace orb::platform {

/// Gives a copied file or folder what its source has beside the content: creation time, attributes
/// of the user (user.*), access control lists, mode, times and the lock, in that order, because
/// each would be undone or refused after the next. Never security.* or trusted.*; the set-id bits
/// only where the copy has the same owner. `source` is the record of when the source was opened.
/// What the destination's volume cannot carry is left out, and is no error.
Status CarryAttributes(int from, int to, const StatusRecord& source);

}  // namespace orb::platform

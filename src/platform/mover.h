// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/error.h"

namespace orb::platform {

/// Moves an item to a path where nothing is. Links are moved and not followed. On one volume that
/// is one step: at every moment the item is at one of the two paths. A change of an item's own name
/// in nothing but letters' case works also where the volume takes both for one, in two steps there.
///
/// To another volume the item is copied, a folder under a hidden name at first, and the source is
/// removed when the copy is complete, on the device and in its place. A failed copy is taken away
/// again, also when the source was written to meanwhile. If removing the source fails, or the
/// source is gone by then, the copy stays. A process that is killed leaves the source whole, or the
/// copy; it may leave a part of a copied folder under the hidden name.
///
/// kItemExists when anything is at the destination, also a link that leads nowhere. kNotPermitted
/// for a locked item, in and into a locked folder, for a source that ends in "." or "..", and to
/// another volume also for a folder that holds a locked item or a volume of its own. Whenever it
/// fails before the source is removed, the item is where it was.
Status MoveItem(const std::string& source, const std::string& destination);

/// For those who make way for a source first: the failure that MoveItem() would end with when there
/// is no source, it or its folder is locked, or the caller may not take it out of the folder.
Status ExpectMovable(const std::string& source);
/// The same for a source that cannot go to the destination's folder: on its own volume, a folder
/// that the caller may not write to; on another, what cannot be read, what is no file, link or
/// folder, and a folder that could not be removed with all it holds.
Status ExpectMovableTo(const std::string& source, const std::string& destination);

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/error.h"

namespace orb::platform {

/// Copies a file, a link (as a link) or a folder with all it holds, with mode, times, attributes,
/// access control lists, creation time and lock; the owner is the copier. Holes stay holes. Hard
/// links inside a folder become files of their own. Of an item with more than 64 KiB of attribute
/// names, which the kernel does not list, only the creation time, the lock and the access control
/// lists.
///
/// kItemExists when anything is at the destination, also a link that leads nowhere. kNotPermitted
/// for sockets, pipes and devices, also inside a folder, and for a locked destination folder. A
/// destination inside the source is refused. A copied file is complete or absent, also when the
/// process is killed; what the copy of a folder finished before a failure stays.
Status CopyItem(const std::string& source, const std::string& destination);

/// For those who make way for a copy first: kNotPermitted when the caller may not read the source,
/// or anything in it, or when that is a socket, a pipe or a device.
Status ExpectCopyable(const std::string& source);

}  // namespace orb::platform

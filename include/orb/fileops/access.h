// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/fileinfo/file_handle.h>

/// \file
/// What may be done to an item, by what its handle has collected; false where nothing exists.
/// A handle that has not collected does so: threads that share one need the caller's own lock.

/// Whether the item's volume is writable.
ORB_EXPORT bool OrbIsDeletable(const COrbFileHandle& item);
ORB_EXPORT bool OrbIsReadable(const COrbFileHandle& item);
/// Whether the item is writable and not locked, and so is the folder that holds it, with every
/// package on the way up to it. A folder is judged by itself.
ORB_EXPORT bool OrbIsWritable(const COrbFileHandle& item);

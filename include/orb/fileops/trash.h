// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/fileops/progress.h>
#include <orb/path/file_path.h>
#include <orb/result.h>

#include <vector>

/// \file
/// The trash is the desktop's own: its file managers, and trash-cli, list what was put there and
/// bring it back. It is the trash of the item's volume or, where that has none, the user's home
/// trash, by copy and removal if the item fits there. A link goes there itself. An item that cannot
/// go there stays where it is; so do locked items, folders where a volume is mounted, and the
/// trash. Everything here may be called from any thread.

/// Moves the items to the trash, in order; one that fails or whose path is empty does not stop the
/// others. Always kOrbNoErr. The bool is not used.
ORB_EXPORT OrbResult OrbMoveToTrash(const std::vector<COrbFilePath>& paths, bool);

/// Moves one item to the trash. `progress` is called once, before anything is touched; when it
/// returns false the result is kOrbErrCanceled. kOrbErrAccessDenied when the item cannot be moved
/// for any reason, or the path has no UTF-8 form, in which case `progress` is not called.
ORB_EXPORT OrbResult OrbMoveToTrashEx(const COrbFilePath& path,
                                      OrbProgressProc progress,
                                      void* data);

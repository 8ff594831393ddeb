// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_path.h>
#include <orb/result.h>

#include <string>

#include "fileops/path_workers.h"

/// \file
/// What the forms of copy and move ask before and after the work.

namespace orb {

/// What the copy, or the move, would refuse anyway is refused before anything is removed for it:
/// what is not there, with the code that the copy would give; what cannot be read, sockets, pipes
/// and devices; what is locked, or may not be taken out of its folder.
OrbResult ExpectCopyable(const std::string& source);
OrbResult ExpectMovable(const std::string& source);
/// The same for what only concerns a destination where something is in the way: of the source not
/// all can be copied, or it cannot come to that folder.
OrbResult ExpectCopyableTo(const std::string& source, const std::string& destination);
OrbResult ExpectMovableTo(const std::string& source, const std::string& destination);

/// By the texts alone: kOrbErrSamePath when both are one, kOrbErrInsideSource when the destination
/// lies inside the source.
OrbResult OrbCheckCopyTarget(const COrbStringData& source, const COrbStringData& destination);

/// What makes a destination count as the source or a folder above it.
enum class Alike { kByTextToo, kOnDisk };

/// Makes way at a destination where something exists. kOrbErrInsideSource, and nothing is removed,
/// when it is the source, a folder above it or something inside it, as the texts say or as the file
/// system knows it: the same item may be reached through a linked folder, through ".." or in other
/// letters' case. kOrbErrAccessDenied when it cannot be removed, also for something locked inside.
OrbResult RemoveExistingDestination(const std::string& source,
                                    const std::string& destination,
                                    Alike alike);

/// Which failures are put down to a volume that is nearly full: kUntold those alone that the
/// platform gave no reason for.
enum class LowSpace { kNothing, kUntold, kAnything };

/// The code of a failed copy or move into a writable folder: kOrbErrDiskFull if the failure may be
/// put down to its volume, which then has less than 100 MiB left. A cancel is the caller's own
/// wish, however full the volume is.
OrbResult ConsiderSpace(const Outcome& failed, LowSpace lowSpace, const COrbFilePath& folder);

}  // namespace orb

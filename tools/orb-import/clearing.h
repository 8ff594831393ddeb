// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "importer.h"

namespace orbimport {

/// Puts the files of shots that came through whole into the trash of their volume. A shot that
/// changed since stays; so does a file that is its own copy, and what the trash does not take, with
/// what is left of its shot. Ends between two shots once a signal asked for it.
void ClearSource(const Work& work, const std::vector<ShotPlan>& shots);

}  // namespace orbimport

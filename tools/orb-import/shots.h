// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "scan.h"

namespace orbimport {

/// One file of a shot. Its name is stem + tail: IMG_1 and .CR2, or IMG_1 and .CR2.xmp.
struct Member {
  std::size_t item = 0;  // In the list of items.
  std::string stem;
  std::string tail;
};

/// What belongs together, as files of one folder with one stem do: the RAW, the JPEG, the sidecars,
/// the spoken note. The first member is the main one, whose time stands for the shot.
struct Shot {
  std::vector<Member> members;
};

/// Stem and tail of a name: the extension is the tail; so is, for a sidecar, a photo's extension
/// before it.
Member SplitName(const std::string& name);

/// Sorts the items into shots, in the order of the items. Stems are compared as the library
/// compares names, without regard to case and to composition; two files whose whole names are
/// equal in this way are never one shot, since a volume may have room for only one of the names.
std::vector<Shot> MakeShots(const std::vector<Item>& items);

}  // namespace orbimport

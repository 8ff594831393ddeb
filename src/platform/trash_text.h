// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/civil.h"

/// \file
/// The texts of the freedesktop.org trash: what is written, as bytes in and bytes out.

namespace orb::platform {

inline constexpr std::string_view kInfoSuffix = ".trashinfo";

/// All bytes but letters, digits and "-_.~/" as "%" and two hexadecimal digits: "/a b%" gives
/// "/a%20b%25".
std::string PercentEncoded(std::string_view bytes);

/// What is recorded of an item: where it was, and when it was put into the trash by local time.
std::string InfoText(std::string_view path, const CivilTime& deleted);

/// The name that an item gets in the trash at the n-th try, from 1: photo.jpg, photo.2.jpg, ... Cut
/// in the middle, and never inside a character, so that it fits into a name with ".trashinfo".
std::string NumberedName(std::string_view name, unsigned number);

/// How much a folder in the trash takes up.
struct FolderSize {
  std::uint64_t bytes = 0;
  /// When its record was written, in seconds since 1970.
  std::int64_t recorded = 0;
  std::string name;
};

/// The list of folder sizes with a line more for each folder. Lines of the same names, and those of
/// folders that are there no longer, are left out.
std::string WithFolderSizes(std::string_view list,
                            const std::vector<FolderSize>& folders,
                            const std::function<bool(const std::string& name)>& isThere);

}  // namespace orb::platform

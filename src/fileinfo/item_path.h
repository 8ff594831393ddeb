// SPDX-License-Identifier: MIT
#pragma once

#include <orb/strings/string_data.h>

#include <optional>
#include <string>

namespace orb {

/// The text as the platform layer takes it, also when it is empty. Nothing for a text that is not
/// valid UTF-8: no item can be reached through it.
std::optional<std::string> ItemPath(const COrbStringData& fullPath);

/// The same in place, null instead of nothing; valid while the string's value lives.
const char* ItemPathInPlace(const COrbStringData& fullPath);

/// Whether something exists at the path now, following links.
bool ItemExists(const COrbStringData& fullPath);

}  // namespace orb

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_type.h>

#include <string_view>

namespace orb {

/// The type of a file by the text after the last "." of its name, without regard to case;
/// eOrbFileType_Unknown for any other name. May be called from any thread.
eOrbFileType FileTypeOfName(std::string_view name);

}  // namespace orb

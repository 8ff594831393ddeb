// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_type.h>
#include <orb/strings/string_data.h>

#include <string_view>

namespace orb {

/// The type of an extension given as UTF-8 without its dot, without regard to case;
/// eOrbFileType_Unknown for any other text. May be called from any thread.
eOrbFileType TypeOfExtension(std::string_view extension);

/// The type of a file by the text after the last "." of its name.
eOrbFileType FileTypeOfName(const COrbStringData& name);

}  // namespace orb

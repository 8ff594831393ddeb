// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_type.h>
#include <orb/strings/string_data.h>

namespace orb {

/// The type of a file by the text after the last "." of its name, without regard to case;
/// eOrbFileType_Unknown for any other name. May be called from any thread.
eOrbFileType FileTypeOfName(const COrbStringData& name);

}  // namespace orb

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/fileinfo/file_handle.h>
#include <orb/path/file_path.h>

#include <string>

#include "support/texts.h"

namespace orb::test {

inline COrbFilePath PathOf(const std::string& text) {
  const COrbStringData data = S(text);
  COrbFilePath path;
  path.Initialize(&data);
  return path;
}

inline unsigned int AttributesOf(const std::string& path) {
  return COrbFileHandle(PathOf(path)).GetAttribute();
}

inline bool IsLocked(const std::string& path) {
  return (AttributesOf(path) & kOrbFileAttrLocked) != 0;
}

inline bool Lock(const std::string& path) {
  return COrbFileHandle(PathOf(path)).SetAttribute(kOrbFileAttrLocked) == kOrbNoErr;
}

}  // namespace orb::test

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/path/file_path.h>

#include <string>

#include "support/texts.h"

inline COrbFilePath PathOf(const std::string& utf8) {
  const COrbStringData text = S(utf8);
  COrbFilePath path;
  path.Initialize(&text);
  return path;
}

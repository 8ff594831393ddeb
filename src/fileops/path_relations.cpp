// SPDX-License-Identifier: MIT
#include <orb/fileops/path_relations.h>
#include <orb/path/path_text.h>

#include <string_view>

#include "strings/string_access.h"

using orb::StringAccess;

bool OrbIsSubFolder(const COrbFilePath& a, const COrbFilePath& b) {
  return OrbIsSubFolder(a.GetFullPath(), b.GetFullPath());
}

bool OrbIsSubFolder(const COrbStringData& a, const COrbStringData& b) {
  return OrbPathIsEqualOrRootActually(a, b, true);
}

OrbResult OrbGetParentFolder(const COrbStringData& path, COrbStringData* result) {
  const std::string_view text = StringAccess::Read(path).bytes;
  const std::size_t slash = text.rfind('/');
  if (slash == std::string_view::npos || slash == 0) return kOrbErrNotFound;
  if (result != nullptr) *result = StringAccess::FromUtf8(text.substr(0, slash));
  return kOrbNoErr;
}

OrbResult OrbGetParentFolder(const COrbFilePath& path, COrbFilePath* result) {
  return path.GetParent(result);
}

OrbResult OrbGetFileNameFromPath(const COrbStringData& path, COrbStringData* result) {
  const std::string_view text = StringAccess::Read(path).bytes;
  const std::size_t slash = text.rfind('/');
  *result = slash == std::string_view::npos ? path : StringAccess::FromUtf8(text.substr(slash + 1));
  return kOrbNoErr;
}

OrbResult OrbGetFileNameFromPath(const COrbFilePath& path, COrbStringData* result) {
  return OrbGetFileNameFromPath(path.GetFullPath(), result);
}

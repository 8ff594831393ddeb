// SPDX-License-Identifier: MIT
#include <orb/platform/core_foundation.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <climits>
#include <cstring>
#include <string>
#include <string_view>

#include "platform/transcode.h"

namespace {

constexpr OSStatus kSuccess = 0;
constexpr OSStatus kFileNotFound = -43;
constexpr OSStatus kBadParameter = -50;
constexpr OSStatus kPathTooLong = -2110;

/// Empty when the working directory has no path.
std::string AbsolutePath(std::string_view path) {
  if (path.starts_with('/')) return std::string(path);
  std::array<char, PATH_MAX> folder;
  if (::getcwd(folder.data(), folder.size()) == nullptr || folder[0] != '/') return {};
  std::string absolute = folder.data();
  if (absolute != "/") absolute += '/';
  return absolute.append(path);
}

/// The item's own path has no separator at its end; the root keeps its one.
void DropTrailingSeparators(std::string* path) {
  while (path->size() > 1 && path->back() == '/') path->pop_back();
}

std::string_view PathIn(const FSRef& reference) {
  const char* text = reinterpret_cast<const char*>(reference.hidden);
  return {text, ::strnlen(text, sizeof(reference.hidden))};
}

}  // namespace

OSStatus FSPathMakeRef(const UInt8* path, FSRef* ref, Boolean* isDirectory) {
  if (path == nullptr || ref == nullptr) return kBadParameter;
  const std::string_view text = reinterpret_cast<const char*>(path);
  if (text.empty() || !orb::platform::Utf16LengthOfUtf8(text)) return kFileNotFound;
  struct stat item;
  if (::stat(text.data(), &item) != 0) return kFileNotFound;
  std::string absolute = AbsolutePath(text);
  DropTrailingSeparators(&absolute);
  if (absolute.empty()) return kFileNotFound;
  if (absolute.size() >= sizeof(ref->hidden)) return kPathTooLong;
  std::memcpy(ref->hidden, absolute.c_str(), absolute.size() + 1);
  if (isDirectory != nullptr) *isDirectory = S_ISDIR(item.st_mode) ? 1 : 0;
  return kSuccess;
}

OSStatus FSRefMakePath(const FSRef* ref, UInt8* path, UInt32 maxPathSize) {
  if (ref == nullptr || path == nullptr) return kBadParameter;
  const std::string_view text = PathIn(*ref);
  const bool wasMade = text.starts_with('/') && text.size() < sizeof(ref->hidden);
  if (!wasMade) return kBadParameter;
  if (text.size() >= maxPathSize) return kPathTooLong;
  std::memcpy(path, text.data(), text.size());
  path[text.size()] = 0;
  return kSuccess;
}

// SPDX-License-Identifier: MIT
#include <orb/path/file_path.h>

#include <array>
#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "strings/string_access.h"

namespace {

constexpr UInt32 kReferencePathSize = 2048;

struct ReleaseObject {
  void operator()(CFTypeRef object) const { CFRelease(object); }
};
using OwnedString = std::unique_ptr<const __CFString, ReleaseObject>;

/// No value when there is no text or it has no UTF-8 form.
COrbStringData TextOf(CFStringRef text) {
  COrbStringData made;
  if (text == nullptr) return made;
  const CFIndex size =
      CFStringGetMaximumSizeForEncoding(CFStringGetLength(text), kCFStringEncodingUTF8) + 1;
  std::string buffer(static_cast<std::size_t>(size), '\0');
  if (CFStringGetCString(text, buffer.data(), size, kCFStringEncodingUTF8)) {
    made.InitWithUtf8(buffer.c_str());
  }
  return made;
}

/// The folder part of a path without its one trailing separator; empty when it has none.
std::string_view FolderOf(std::string_view path) {
  if (path.ends_with('/')) path.remove_suffix(1);
  const std::size_t separator = path.rfind('/');
  if (separator == std::string_view::npos) return {};
  return separator == 0 ? "/" : path.substr(0, separator);
}

}  // namespace

COrbFilePath::COrbFilePath(const COrbFilePath& other) : path(other.path) {}

COrbFilePath::COrbFilePath(COrbFilePath&& other) noexcept : path(std::move(other.path)) {
  other.Free();
}

COrbFilePath::~COrbFilePath() = default;

COrbFilePath& COrbFilePath::operator=(const COrbFilePath& other) {
  if (this != &other) Initialize(&other.path);
  return *this;
}

void COrbFilePath::Free() { path.Clear(); }

bool COrbFilePath::IsEmpty() const { return path.IsEmpty(); }

OrbResult COrbFilePath::Initialize(const COrbStringData* fullPath) {
  if (path.IsEmpty() && fullPath != &path) {
    Free();
    path = *fullPath;
    return kOrbNoErr;
  }
  COrbStringData kept = *fullPath;  // Free() may end the text that was handed in.
  Free();
  path = std::move(kept);
  return kOrbNoErr;
}

OrbResult COrbFilePath::Initialize(const FSRef* reference) {
  Free();
  if (reference == nullptr) return kOrbErrNoSuchFile;
  const OrbResult result = OrbFSRefToFullPath(*reference, &path);
  if (result != kOrbNoErr) Free();
  return result;
}

OrbResult COrbFilePath::Initialize(const CFStringRef* fullPath) {
  COrbStringData text = TextOf(fullPath == nullptr ? nullptr : *fullPath);
  Free();
  path = std::move(text);
  return kOrbNoErr;
}

OrbResult COrbFilePath::Initialize(const CFURLRef& url) {
  const OwnedString text(CFURLCopyFileSystemPath(url, kCFURLPOSIXPathStyle));
  Free();
  path.InitWithCFString(text.get());
  return kOrbNoErr;
}

COrbStringData COrbFilePath::GetFullPath() const { return path; }

OrbResult COrbFilePath::GetFSRef(FSRef* reference) const {
  if (path.IsEmpty()) return kOrbErrNotFound;
  const auto* text = reinterpret_cast<const UInt8*>(path.GetPtrUtf8());
  return FSPathMakeRef(text, reference, nullptr) == 0 ? kOrbNoErr : kOrbErrNotFound;
}

CFURLRef COrbFilePath::CreateCopyCFURL() const {
  const OwnedString text(path.CreateCopyCFString());
  return CFURLCreateWithFileSystemPath(kCFAllocatorDefault, text.get(), kCFURLPOSIXPathStyle, 0);
}

OrbResult COrbFilePath::GetParent(COrbFilePath* parent) const {
  if (IsEmpty()) return kOrbErrEmptyPath;
  const char* bytes = path.GetPtrUtf8();
  const std::string_view text = bytes == nullptr ? "" : bytes;
  if (text == "/") return kOrbErrNoSuchFile;
  if (text.empty() || parent == nullptr) return kOrbErrNotFound;
  const std::string_view folder = FolderOf(text);
  if (folder.empty()) return kOrbErrNoSuchFile;
  const COrbStringData folderText = orb::StringAccess::FromUtf8(folder);
  return parent->Initialize(&folderText);
}

OrbResult OrbFSRefToFullPath(const FSRef& reference, COrbStringData* out) {
  std::array<char, kReferencePathSize> buffer{};
  auto* bytes = reinterpret_cast<UInt8*>(buffer.data());
  if (FSRefMakePath(&reference, bytes, kReferencePathSize) != 0) return kOrbErrNoSuchFile;
  if (out == nullptr) return kOrbErrNotFound;
  out->InitWithUtf8(buffer.data());
  return kOrbNoErr;
}

bool OrbIsPathEmpty(const COrbFilePath& path) { return path.IsEmpty(); }

void OrbClearPath(COrbFilePath* path) {
  if (path != nullptr) path->Free();
}

// SPDX-License-Identifier: MIT
#include <orb/path/path_text.h>
#include <orb/strings/string_functions.h>

#include <algorithm>
#include <limits>
#include <string>
#include <string_view>
#include <utility>

#include "strings/string_access.h"

namespace {

using orb::StringAccess;

constexpr char kSeparator = '/';
constexpr char kDot = '.';

/// The bytes as they are, valid or not. A string without value stays without.
std::string_view Bytes(const COrbStringData& text) {
  if (text.IsEmpty()) return {};
  const char* bytes = text.GetPtrUtf8();
  return bytes == nullptr ? std::string_view() : std::string_view(bytes);
}

/// What a search sees: nothing of a text that is not UTF-8.
std::string_view Readable(const COrbStringData& text) {
  return text.IsEmpty() ? std::string_view() : StringAccess::Read(text).Readable();
}

/// A cut beyond the end of a text has no value.
COrbStringData CutAtEnd(std::string_view rest) {
  return rest.empty() ? COrbStringData() : StringAccess::FromUtf8(rest);
}

/// All but the last "." and what follows it.
std::string_view WithoutExtension(std::string_view name) {
  return name.substr(0, name.rfind(kDot));
}

/// What stands between separators and is not empty.
std::vector<std::string_view> PiecesOf(std::string_view path) {
  std::vector<std::string_view> pieces;
  while (!path.empty()) {
    const std::size_t end = std::min(path.find(kSeparator), path.size());
    if (end != 0) pieces.push_back(path.substr(0, end));
    path.remove_prefix(std::min(end + 1, path.size()));
  }
  return pieces;
}

/// The folders of a path that is rebuilt from its pieces: "/" and all pieces but the last, each
/// with its separator. Empty when there are no pieces.
std::string FoldersOf(const std::vector<std::string_view>& pieces) {
  std::string folders;
  if (pieces.empty()) return folders;
  folders += kSeparator;
  for (std::size_t i = 0; i + 1 < pieces.size(); ++i) folders.append(pieces[i]) += kSeparator;
  return folders;
}

/// The length that counts when paths are ordered.
std::size_t LengthWithoutSeparator(std::string_view path) {
  return path.ends_with(kSeparator) ? path.size() - 1 : path.size();
}

std::int32_t Difference(std::size_t a, std::size_t b) {
  using Limits = std::numeric_limits<std::int32_t>;
  const auto difference = static_cast<std::int64_t>(a) - static_cast<std::int64_t>(b);
  return static_cast<std::int32_t>(
      std::clamp<std::int64_t>(difference, Limits::min(), Limits::max()));
}

}  // namespace

COrbStringData OrbPathFindExtension(const COrbStringData& path, bool includeDot) {
  const std::string_view text = Readable(path);
  const std::size_t dot = text.rfind(kDot);
  if (dot == std::string_view::npos) return {};
  return CutAtEnd(text.substr(includeDot ? dot : dot + 1));
}

COrbStringData OrbPathFindExtension(const COrbFilePath& path, bool includeDot) {
  return OrbPathFindExtension(path.GetFullPath(), includeDot);
}

COrbStringData OrbPathFindFileName(const COrbStringData& path, bool removeExtension) {
  const std::string_view text = Readable(path);
  const std::size_t begin = text.rfind(kSeparator) + 1;  // 0 where there is none.
  const std::string_view name = text.substr(begin);
  const bool isCut = removeExtension && name.find(kDot) != std::string_view::npos;
  if (isCut) return StringAccess::FromUtf8(WithoutExtension(name));
  if (begin == 0) return path;
  return CutAtEnd(name);
}

COrbStringData OrbPathFindFileName(const COrbFilePath& path, bool removeExtension) {
  return OrbPathFindFileName(path.GetFullPath(), removeExtension);
}

void OrbSplitFilePath(const COrbStringData& path, std::vector<COrbStringData>* out) {
  if (out == nullptr) return;
  std::vector<COrbStringData> pieces;  // The path may be one of the old pieces.
  for (const std::string_view piece : PiecesOf(Readable(path))) {
    pieces.push_back(StringAccess::FromUtf8(piece));
  }
  *out = std::move(pieces);
}

void OrbSplitFilePath(const COrbFilePath& path, std::vector<COrbStringData>* out) {
  if (!path.IsEmpty()) OrbSplitFilePath(path.GetFullPath(), out);
}

COrbStringData OrbPathRenameExtension(const COrbStringData& path,
                                      const COrbStringData& newExtension) {
  const std::vector<std::string_view> pieces = PiecesOf(Readable(path));
  std::string renamed = FoldersOf(pieces);
  renamed +=
      pieces.empty() ? Bytes(OrbPathFindFileName(path, true)) : WithoutExtension(pieces.back());
  std::string_view extension = Bytes(newExtension);
  if (Readable(newExtension).starts_with(kDot)) extension.remove_prefix(1);
  if (!extension.empty()) (renamed += kDot).append(extension);
  return StringAccess::FromUtf8(renamed);
}

COrbStringData OrbPathRenameExtension(const COrbFilePath& path,
                                      const COrbStringData& newExtension) {
  if (path.IsEmpty()) return {};
  return OrbPathRenameExtension(path.GetFullPath(), newExtension);
}

COrbStringData OrbPathRenameFileName(const COrbStringData& path, const COrbStringData& newName) {
  std::string renamed = FoldersOf(PiecesOf(Readable(path)));
  renamed += Bytes(newName);
  const COrbStringData extension = OrbPathFindExtension(path, false);
  if (!extension.IsEmpty()) (renamed += kDot).append(Bytes(extension));
  return StringAccess::FromUtf8(renamed);
}

COrbStringData OrbPathRenameFileName(const COrbFilePath& path, const COrbStringData& newName) {
  return path.IsEmpty() ? COrbStringData() : OrbPathRenameFileName(path.GetFullPath(), newName);
}

COrbStringData OrbPathRemoveBackslash(const COrbStringData& path) {
  const std::string_view text = Bytes(path);
  if (!text.ends_with(kSeparator)) return path;
  return StringAccess::FromUtf8(text.substr(0, text.size() - 1));
}

COrbStringData OrbPathRemoveBackslash(const COrbFilePath& path) {
  return OrbPathRemoveBackslash(path.GetFullPath());
}

COrbStringData OrbPathAddBackslash(const COrbStringData& path) {
  const std::string_view text = Bytes(path);
  if (text.ends_with(kSeparator)) return path;
  return StringAccess::FromUtf8(std::string(text) += kSeparator);
}

COrbStringData OrbPathAddBackslash(const COrbFilePath& path) {
  return path.IsEmpty() ? COrbStringData() : OrbPathAddBackslash(path.GetFullPath());
}

namespace OrbPathUtility {

std::int32_t ComparePath(const COrbStringData& a, const COrbStringData& b, bool ignoreCase) {
  const std::string_view textA = Bytes(a);
  const std::string_view textB = Bytes(b);
  const std::size_t lengthA = LengthWithoutSeparator(textA);
  const std::size_t lengthB = LengthWithoutSeparator(textB);
  if (lengthA != lengthB) return Difference(lengthA, lengthB);
  if (textA.substr(0, lengthA) == textB.substr(0, lengthB)) return 0;
  const COrbStringData pathA = OrbPathRemoveBackslash(a);
  const COrbStringData pathB = OrbPathRemoveBackslash(b);
  return ignoreCase ? OrbStringDataCmpi(pathA, pathB) : OrbStringDataCmp(pathA, pathB);
}

}  // namespace OrbPathUtility

std::int32_t OrbPathCompare(const COrbStringData& a, const COrbStringData& b) {
  return OrbPathUtility::ComparePath(a, b, false);
}

std::int32_t OrbPathCompareNoCase(const COrbStringData& a, const COrbStringData& b) {
  return OrbPathUtility::ComparePath(a, b, true);
}

bool OrbPathIsEqualOrRootActually(const COrbStringData& a,
                                  const COrbStringData& b,
                                  bool addSeparator) {
  if (a.IsEmpty() || b.IsEmpty()) return false;
  if (OrbPathCompareNoCase(a, b) == 0) return true;
  if (a.GetLengthChar() > b.GetLengthChar()) return false;
  const COrbStringData prefix = addSeparator ? OrbPathAddBackslash(a) : a;
  return OrbStringDataCmpni(prefix, b, prefix.GetLengthChar()) == 0;
}

bool OrbPathIsEndofInvalidCharactor(const COrbStringData&) { return false; }

// SPDX-License-Identifier: MIT
#include "path/file_types.h"

#include <orb/strings/string_functions.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <iterator>
#include <optional>
#include <utility>

#include "strings/string_access.h"

namespace {

using orb::StringAccess;

/// An extension of up to eight ASCII characters as one number. Numbers order as the texts do.
using PackedExtension = std::uint64_t;
constexpr std::size_t kMostCharacters = sizeof(PackedExtension);

constexpr unsigned char LowerAscii(char character) {
  const auto byte = static_cast<unsigned char>(character);
  return byte >= 'A' && byte <= 'Z' ? static_cast<unsigned char>(byte + ('a' - 'A')) : byte;
}

constexpr PackedExtension Pack(std::string_view extension) {
  PackedExtension packed = 0;
  for (const char character : extension) packed = packed << 8 | LowerAscii(character);
  return packed << 8 * (kMostCharacters - extension.size());
}

struct Row {
  constexpr Row(const char* extensionWithDot, eOrbFileType itsType)
      : dotted(extensionWithDot), packed(Pack(Extension())), type(itsType) {}

  constexpr std::string_view Extension() const { return std::string_view(dotted).substr(1); }

  const char* dotted;
  PackedExtension packed;
  eOrbFileType type;
};

// In alphabetical order, in which a type's extensions are listed as well.
constexpr Row kRows[] = {
    {".avi", eOrbFileType_Avi},   {".bmp", eOrbFileType_Bmp},   {".cr2", eOrbFileType_Cr2},
    {".crw", eOrbFileType_Crw},   {".csv", eOrbFileType_Csv},   {".dsq", eOrbFileType_Dsq},
    {".jpeg", eOrbFileType_Jpeg}, {".jpg", eOrbFileType_Jpeg},  {".lga", eOrbFileType_Lga},
    {".lgb", eOrbFileType_Lgb},   {".log", eOrbFileType_Log},   {".mov", eOrbFileType_Mov},
    {".mp4", eOrbFileType_Mp4},   {".mpeg", eOrbFileType_Mpeg}, {".mpg", eOrbFileType_Mpeg},
    {".mpo", eOrbFileType_Mpo},   {".pct", eOrbFileType_Pict},  {".pict", eOrbFileType_Pict},
    {".png", eOrbFileType_Png},   {".pqf", eOrbFileType_Pqf},   {".rwc", eOrbFileType_Rwc},
    {".rwq", eOrbFileType_Rwq},   {".rwv", eOrbFileType_Rwv},   {".sdcq", eOrbFileType_Sdcq},
    {".tif", eOrbFileType_Tiff},  {".tiff", eOrbFileType_Tiff}, {".txt", eOrbFileType_Txt},
    {".wav", eOrbFileType_Wav},   {".wmv", eOrbFileType_Wmv},   {".xmp", eOrbFileType_Xmp},
};
static_assert(std::size(kRows) == 30);
static_assert(std::is_sorted(std::begin(kRows), std::end(kRows), [](const Row& a, const Row& b) {
  return a.packed < b.packed;
}));

bool IsAscii(std::string_view text) {
  return std::all_of(
      text.begin(), text.end(), [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

eOrbFileType TypeOfAscii(std::string_view extension) {
  if (extension.size() > kMostCharacters) return eOrbFileType_Unknown;
  const PackedExtension packed = Pack(extension);
  const Row* row = std::lower_bound(
      std::begin(kRows), std::end(kRows), packed, [](const Row& each, PackedExtension wanted) {
        return each.packed < wanted;
      });
  return row != std::end(kRows) && row->packed == packed ? row->type : eOrbFileType_Unknown;
}

/// A few characters beyond ASCII fold to ASCII letters: the long s, the ligature ff.
eOrbFileType TypeOfFolded(std::string_view extension) {
  const COrbStringData text = StringAccess::FromUtf8(extension);
  if (StringAccess::Read(text).Readable().empty()) return eOrbFileType_Unknown;
  for (const Row& row : kRows) {
    const COrbStringData known = StringAccess::FromUtf8(row.Extension());
    if (OrbStringDataCmpi(text, known) == 0) return row.type;
  }
  return eOrbFileType_Unknown;
}

}  // namespace

namespace orb {

eOrbFileType TypeOfExtension(std::string_view extension) {
  return IsAscii(extension) ? TypeOfAscii(extension) : TypeOfFolded(extension);
}

eOrbFileType FileTypeOfName(const COrbStringData& name) {
  if (name.IsEmpty()) return eOrbFileType_Unknown;
  const std::string_view text = StringAccess::Read(name).Readable();
  const std::size_t dot = text.rfind('.');
  if (dot == std::string_view::npos) return eOrbFileType_Unknown;
  return TypeOfExtension(text.substr(dot + 1));
}

}  // namespace orb

eOrbFileType OrbPathConvertExtensionToType(const COrbStringData& extension) {
  if (extension.IsEmpty()) return eOrbFileType_Unknown;
  const char* text = extension.GetPtrUtf8();
  if (text == nullptr || text[0] != '.') return eOrbFileType_Unknown;
  return orb::TypeOfExtension(text + 1);
}

OrbResult OrbPathFindTypeExtension(eOrbFileType type, std::vector<COrbStringData>& extensions) {
  std::vector<COrbStringData> found;
  for (const Row& row : kRows) {
    if (row.type == type) found.push_back(OrbCharUtf8(row.dotted));
  }
  if (found.empty()) return kOrbErrNotFound;
  extensions = std::move(found);
  return kOrbNoErr;
}

// SPDX-License-Identifier: MIT
#include "path/file_types.h"

#include <orb/strings/string_functions.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <iterator>
#include <string_view>
#include <utility>

#include "strings/string_access.h"

namespace {

using orb::StringAccess;

constexpr unsigned char Byte(char character) { return static_cast<unsigned char>(character); }

/// The lower-case letters of an extension with its dot as one number. Every known one has four or
/// five bytes.
using PackedExtension = std::uint64_t;
constexpr PackedExtension kEveryByte = 0x01'01'01'01'01;

constexpr bool HasPackableSize(std::string_view dotted) {
  return dotted.size() == 4 || dotted.size() == 5;
}

/// All bytes at once; each must be ASCII, so that none carries into the next.
constexpr PackedExtension LowerAscii(PackedExtension packed) {
  const PackedExtension fromA = packed + kEveryByte * (0x80 - 'A');
  const PackedExtension beyondZ = packed + kEveryByte * (0x80 - 'Z' - 1);
  return packed | (fromA & ~beyondZ & kEveryByte * 0x80) >> 2;
}

constexpr PackedExtension Pack(std::string_view dotted) {
  PackedExtension packed = 0;
  for (std::size_t i = 0; i < 4; ++i) packed |= PackedExtension{Byte(dotted[i])} << 8 * i;
  // The last of four again, or the fifth: no branch for the two sizes.
  return packed | PackedExtension{Byte(dotted.back())} << 8 * (dotted.size() - 1);
}

struct Row {
  constexpr std::string_view Extension() const { return dotted; }

  char dotted[6];  // No pointer, so that loading the library has nothing to relocate.
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
  return a.Extension() < b.Extension();
}));

/// Finds a row by its packed extension in one step: a multiplication that sends every known
/// extension to a slot of its own.
class RowIndex {
 public:
  constexpr RowIndex() {
    while (!Fill()) multiplier_ += 0x9E37'79B9'7F4A'7C16;  // Even, so the multiplier stays odd.
  }

  constexpr eOrbFileType TypeOf(PackedExtension packed) const {
    const Slot& slot = slots_[SlotOf(packed)];
    return slot.packed == packed ? slot.type : eOrbFileType_Unknown;
  }

 private:
  struct Slot {
    PackedExtension packed = 0;
    eOrbFileType type = eOrbFileType_Unknown;
  };

  constexpr std::size_t SlotOf(PackedExtension packed) const { return packed * multiplier_ >> 57; }

  constexpr bool Fill() {
    slots_ = {};
    for (const Row& row : kRows) {
      const PackedExtension packed = Pack(row.Extension());
      Slot& slot = slots_[SlotOf(packed)];
      if (slot.packed != 0) return false;
      slot = {packed, row.type};
    }
    return true;
  }

  std::uint64_t multiplier_ = 1;
  std::array<Slot, 128> slots_;
};
constexpr RowIndex kRowIndex;

bool IsAscii(std::string_view text) {
  return std::all_of(text.begin(), text.end(), [](char c) { return Byte(c) < 0x80; });
}

/// A few characters beyond ASCII fold to ASCII letters: the long s, the ligature ff.
eOrbFileType TypeOfFolded(std::string_view dotted) {
  const COrbStringData text = StringAccess::FromUtf8(dotted);
  if (StringAccess::Read(text).Readable().empty()) return eOrbFileType_Unknown;
  for (const Row& row : kRows) {
    if (OrbStringDataCmpi(text, StringAccess::FromUtf8(row.dotted)) == 0) return row.type;
  }
  return eOrbFileType_Unknown;
}

eOrbFileType TypeOfExtension(std::string_view dotted) {
  if (HasPackableSize(dotted)) {
    const PackedExtension packed = Pack(dotted);
    if ((packed & kEveryByte * 0x80) == 0) return kRowIndex.TypeOf(LowerAscii(packed));
  }
  return IsAscii(dotted) ? eOrbFileType_Unknown : TypeOfFolded(dotted);
}

}  // namespace

namespace orb {

eOrbFileType FileTypeOfName(std::string_view name) {
  const std::size_t dot = name.rfind('.');
  return dot == std::string_view::npos ? eOrbFileType_Unknown : TypeOfExtension(name.substr(dot));
}

}  // namespace orb

eOrbFileType OrbPathConvertExtensionToType(const COrbStringData& extension) {
  if (extension.IsEmpty()) return eOrbFileType_Unknown;
  const char* text = extension.GetPtrUtf8();
  return text == nullptr ? eOrbFileType_Unknown : TypeOfExtension(text);
}

OrbResult OrbPathFindTypeExtension(eOrbFileType type, std::vector<COrbStringData>& extensions) {
  std::vector<COrbStringData> found;
  for (const Row& row : kRows) {
    if (row.type == type) found.push_back(StringAccess::FromUtf8(row.dotted));
  }
  if (found.empty()) return kOrbErrNotFound;
  extensions = std::move(found);
  return kOrbNoErr;
}

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <cstdint>
#include <string>
#include <string_view>

/// \file
/// Texts for people and programs. Names are bytes as the file system has them.
namespace orbimport {

/// What an import finds out by itself, beside the library's codes and above them all.
enum ImportResult : OrbResult {
  kImportErrCopyDiffers = 0x10001,
  kImportErrCopyUnreadable,
  kImportErrPresentDiffers,
  kImportErrSourceChanged,
  kImportErrNotTrashed,
  kImportErrShotIncomplete,
};

/// Whether a name can be given to the library at all.
bool IsUtf8(std::string_view bytes);

/// A name that is safe on a terminal and in a line: as it is when it is plain, otherwise in double
/// quotes with \n, \", \\, \xHH for a byte that is no UTF-8 and \u{...} for a character that
/// controls the terminal or the direction of the text.
std::string Quote(std::string_view name);

/// A JSON string with its quotes. Valid whatever the bytes are: one that is no UTF-8 gives U+FFFD.
std::string JsonText(std::string_view bytes);

/// Every byte but ASCII letters, digits and "-._~/" as %HH, so that any name can be had back.
std::string PercentEncode(std::string_view bytes);
/// False for a text that PercentEncode() does not make; `bytes` is then not to be used.
bool PercentDecode(std::string_view text, std::string& bytes);

/// 999 B, 1.5 kB, 12.3 MB: decimal units.
std::string FormatBytes(std::uint64_t bytes);
/// 0:07, 12:30, 1:02:03.
std::string FormatDuration(std::uint64_t seconds);

/// JPEG, CR2, ...: the first extension of the type, in capitals.
std::string TypeName(eOrbFileType type);
/// A fixed disk, a network volume, ...: what COrbFileHandle::GetDriveType() says, for people.
std::string DriveText(unsigned int driveType);
/// kOrbErrDiskFull and the like, or the number of a code without a name.
std::string CodeName(OrbResult code);
/// What the code means, in a few words.
std::string CodeMeaning(OrbResult code);

inline COrbStringData OrbText(const std::string& utf8) {
  return COrbStringData(OrbCharUtf8(utf8.c_str()));
}
inline COrbFilePath OrbPath(const std::string& path) {
  const COrbStringData text = OrbText(path);
  COrbFilePath result;
  result.Initialize(&text);
  return result;
}

/// Makes a folder, given by its absolute path, and those above it, where they are missing.
OrbResult MakeFolder(const std::string& path);

}  // namespace orbimport

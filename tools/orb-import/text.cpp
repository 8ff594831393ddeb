// SPDX-License-Identifier: MIT
#include "text.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdarg>
#include <cstdio>
#include <vector>

namespace orbimport {
namespace {

constexpr char kHex[] = "0123456789ABCDEF";

struct Character {
  char32_t code = 0;
  std::string_view bytes;
  bool valid = false;
};

std::size_t SequenceLength(unsigned char lead) {
  if (lead < 0x80) return 1;
  if (lead >= 0xC2 && lead <= 0xDF) return 2;
  if (lead >= 0xE0 && lead <= 0xEF) return 3;
  if (lead >= 0xF0 && lead <= 0xF4) return 4;
  return 0;
}

bool IsScalar(char32_t code, std::size_t length) {
  constexpr char32_t kLowest[] = {0, 0, 0x80, 0x800, 0x10000};
  return code >= kLowest[length] && code <= 0x10FFFF && (code < 0xD800 || code > 0xDFFF);
}

/// Takes the first character off `rest`; a byte that begins none is taken alone.
Character TakeCharacter(std::string_view& rest) {
  const auto byteAt = [&](std::size_t i) { return static_cast<unsigned char>(rest[i]); };
  Character character{byteAt(0), rest.substr(0, 1), false};
  const std::size_t length = SequenceLength(byteAt(0));
  if (length != 0 && length <= rest.size()) {
    char32_t code = length == 1 ? byteAt(0) : byteAt(0) & (0x7Fu >> length);
    bool continued = true;
    for (std::size_t i = 1; i < length; ++i) {
      continued = continued && (byteAt(i) & 0xC0u) == 0x80u;
      code = code << 6 | (byteAt(i) & 0x3Fu);
    }
    if (continued && IsScalar(code, length)) character = {code, rest.substr(0, length), true};
  }
  rest.remove_prefix(character.bytes.size());
  return character;
}

/// Characters that move the cursor, break the line or turn the direction of what follows.
bool IsUnsafe(char32_t code) {
  return code < 0x20 || (code >= 0x7F && code <= 0x9F) || (code >= 0x200B && code <= 0x200F) ||
         (code >= 0x2028 && code <= 0x202E) || (code >= 0x2060 && code <= 0x206F) ||
         code == 0xFEFF || code == 0x061C || (code >= 0xE0000 && code <= 0xE007F);
}

void AppendHex(std::string& out, unsigned char byte) {
  out += kHex[byte >> 4];
  out += kHex[byte & 0xF];
}

[[gnu::format(printf, 1, 2)]] std::string Printed(const char* format, ...) {
  std::array<char, 64> text{};
  std::va_list values;
  va_start(values, format);
  std::vsnprintf(text.data(), text.size(), format, values);
  va_end(values);
  return text.data();
}

/// \n and the like; nothing for a character without a short form.
std::string_view ShortEscape(char32_t code) {
  switch (code) {
    case '\n':
      return "\\n";
    case '\r':
      return "\\r";
    case '\t':
      return "\\t";
    case '"':
      return "\\\"";
    case '\\':
      return "\\\\";
    default:
      return {};
  }
}

std::string QuotedCharacter(const Character& character) {
  if (!character.valid) {
    std::string out = "\\x";
    AppendHex(out, static_cast<unsigned char>(character.bytes[0]));
    return out;
  }
  if (const auto escape = ShortEscape(character.code); !escape.empty()) return std::string(escape);
  if (!IsUnsafe(character.code)) return std::string(character.bytes);
  return Printed("\\u{%x}", static_cast<unsigned>(character.code));
}

std::string JsonCharacter(const Character& character) {
  if (!character.valid) return "\\ufffd";
  if (const auto escape = ShortEscape(character.code); !escape.empty()) return std::string(escape);
  if (!IsUnsafe(character.code)) return std::string(character.bytes);
  const auto code = static_cast<unsigned>(character.code);
  if (code < 0x10000) return Printed("\\u%04x", code);
  return Printed("\\u%04x\\u%04x", 0xD7C0 + (code >> 10), 0xDC00 + (code & 0x3FF));
}

bool IsUnreserved(unsigned char byte) {
  return (byte < 0x80 && std::isalnum(byte) != 0) ||
         std::string_view("-._~/").find(static_cast<char>(byte)) != std::string_view::npos;
}

int HexValue(char digit) {
  const auto* const found = std::find(std::begin(kHex), std::end(kHex) - 1, digit);
  return found == std::end(kHex) - 1 ? -1 : static_cast<int>(found - std::begin(kHex));
}

struct CodeRow {
  OrbResult code;
  const char* name;
  const char* meaning;
};
#define ORB_CODE(name, meaning) \
  { name, #name, meaning }
constexpr CodeRow kCodes[] = {
    ORB_CODE(kOrbNoErr, "success"),
    ORB_CODE(kOrbErrCanceled, "cancelled"),
    ORB_CODE(kOrbErrOutOfMemory, "out of memory"),
    ORB_CODE(kOrbErrEmptyPath, "empty path"),
    ORB_CODE(kOrbErrDiskFull, "there is no room in the destination"),
    ORB_CODE(kOrbErrUnknown, "failed for an unknown reason"),
    ORB_CODE(kOrbErrNotFound, "not found"),
    ORB_CODE(kOrbErrPathTooLong, "the path is too long"),
    ORB_CODE(kOrbErrNotSupported, "not supported"),
    ORB_CODE(kOrbErrAlreadyExists, "exists already"),
    ORB_CODE(kOrbErrNoSuchFile, "no such file"),
    ORB_CODE(kOrbErrAccessDenied, "access denied"),
    ORB_CODE(kOrbErrFileExists, "the name is taken"),
    ORB_CODE(kOrbErrInvalidName, "invalid name, such as one that is not UTF-8"),
    ORB_CODE(kOrbErrNameTooLong, "the name is too long"),
    ORB_CODE(kOrbErrSamePath, "source and destination are the same"),
    ORB_CODE(kOrbErrInsideSource, "the destination is inside the source"),
    ORB_CODE(kOrbErrInvalidTime, "invalid time"),
    ORB_CODE(kImportErrCopyDiffers, "the copy, read back, is not what the source holds"),
    ORB_CODE(kImportErrCopyUnreadable, "the copy cannot be read back"),
    ORB_CODE(kImportErrPresentDiffers, "what is in its place already holds other bytes"),
    ORB_CODE(kImportErrSourceChanged, "the file changed meanwhile"),
    ORB_CODE(kImportErrNotTrashed, "the trash did not take it, so it stays"),
    ORB_CODE(kImportErrShotIncomplete, "stays with what is left of its shot"),
};
#undef ORB_CODE

const CodeRow* FindCode(OrbResult code) {
  const auto* const found = std::find_if(
      std::begin(kCodes), std::end(kCodes), [&](const CodeRow& row) { return row.code == code; });
  return found == std::end(kCodes) ? nullptr : found;
}

}  // namespace

bool IsUtf8(std::string_view bytes) {
  while (!bytes.empty()) {
    if (!TakeCharacter(bytes).valid) return false;
  }
  return true;
}

std::string Quote(std::string_view name) {
  std::string text;
  for (std::string_view rest = name; !rest.empty();) text += QuotedCharacter(TakeCharacter(rest));
  const bool edged = name.empty() || name.front() == ' ' || name.back() == ' ';
  return text == name && !edged ? text : '"' + text + '"';
}

std::string JsonText(std::string_view bytes) {
  std::string text = "\"";
  while (!bytes.empty()) text += JsonCharacter(TakeCharacter(bytes));
  return text + '"';
}

std::string PercentEncode(std::string_view bytes) {
  std::string text;
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    if (IsUnreserved(byte)) {
      text += c;
    } else {
      text += '%';
      AppendHex(text, byte);
    }
  }
  return text;
}

bool PercentDecode(std::string_view text, std::string& bytes) {
  bytes.clear();
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '%') {
      if (!IsUnreserved(static_cast<unsigned char>(text[i]))) return false;
      bytes += text[i];
      continue;
    }
    if (text.size() - i < 3) return false;
    const int high = HexValue(text[i + 1]);
    const int low = HexValue(text[i + 2]);
    if (high < 0 || low < 0) return false;
    bytes += static_cast<char>(high << 4 | low);
    i += 2;
  }
  return true;
}

std::string FormatBytes(std::uint64_t bytes) {
  if (bytes < 1000) return Printed("%u B", static_cast<unsigned>(bytes));
  constexpr const char* kUnits[] = {"kB", "MB", "GB", "TB", "PB", "EB"};
  double value = static_cast<double>(bytes) / 1000;
  std::size_t unit = 0;
  for (; value >= 999.95 && unit + 1 < std::size(kUnits); ++unit) value /= 1000;
  return Printed("%.1f %s", value, kUnits[unit]);
}

std::string FormatDuration(std::uint64_t seconds) {
  const auto hours = static_cast<unsigned long long>(seconds / 3600);
  const auto minutes = static_cast<unsigned>(seconds / 60 % 60);
  const auto rest = static_cast<unsigned>(seconds % 60);
  return hours > 0 ? Printed("%llu:%02u:%02u", hours, minutes, rest)
                   : Printed("%u:%02u", minutes, rest);
}

std::string TypeName(eOrbFileType type) {
  std::vector<COrbStringData> extensions;
  if (OrbPathFindTypeExtension(type, extensions) >= kOrbErrFirst) return "other";
  std::string name = extensions.front().GetPtrUtf8() + 1;
  for (char& c : name) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  return name;
}

std::string DriveText(unsigned int driveType) {
  switch (driveType) {
    case eOrbDriveType_Optical:
      return "a CD or DVD";
    case eOrbDriveType_Removable:
      return "a removable medium";
    case eOrbDriveType_RemovableReadOnly:
      return "a write-protected medium";
    case eOrbDriveType_Remote:
      return "a network volume";
    default:
      return "a fixed disk";
  }
}

std::string CodeName(OrbResult code) {
  const CodeRow* const row = FindCode(code);
  return row != nullptr ? row->name : Printed("0x%04x", code);
}

std::string CodeMeaning(OrbResult code) {
  const CodeRow* const row = FindCode(code);
  return row != nullptr ? row->meaning : "failed";
}

OrbResult MakeFolder(const std::string& path) {
  // Through the dot, so that a link to a folder will do and a file will not.
  const auto isFolder = [&] { return COrbFileHandle(OrbPath(path + "/.")).IsExist(); };
  if (isFolder()) return kOrbNoErr;
  const std::size_t slash = path.rfind('/');
  const OrbResult made = OrbCreateFolder(
      OrbPath(slash == 0 ? "/" : path.substr(0, slash)), OrbText(path.substr(slash + 1)), nullptr);
  return made == kOrbErrFileExists && isFolder() ? kOrbNoErr : made;
}

}  // namespace orbimport

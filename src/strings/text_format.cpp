// SPDX-License-Identifier: MIT
// A "%n" in a caller's format must not end the host program, as the checked printf would.
#undef _FORTIFY_SOURCE
#include <orb/strings/string_functions.h>

#include <array>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cwchar>
#include <memory>
#include <string>

#include "platform/errno_keeper.h"
#include "strings/text_utf8.h"

namespace {

using orb::platform::ErrnoKeeper;

/// A text that is too long for the room on the stack.
COrbStringData LongFormatted(const char* format, std::va_list arguments) {
  char* text = nullptr;
  if (::vasprintf(&text, format, arguments) < 0) return {};
  COrbStringData result;
  result.InitWithUtf8(text);
  std::free(text);
  return result;
}

COrbStringData Formatted(const char* format, std::va_list arguments) {
  const ErrnoKeeper errnoKeeper;
  std::array<char, 512> text;
  std::va_list again;
  va_copy(again, arguments);
  const int length = std::vsnprintf(text.data(), text.size(), format, arguments);
  COrbStringData result;
  if (length >= static_cast<int>(text.size())) {
    result = LongFormatted(format, again);
  } else if (length >= 0) {
    result.InitWithUtf8(text.data());  // Up to a zero among the arguments.
  }
  va_end(again);
  return result;
}

std::u16string Utf16FromWide(const wchar_t* text) {
  std::u16string units;
  for (; *text != 0; ++text) {
    const auto c = static_cast<char32_t>(*text);
    units.push_back(orb::LeadUnit(c > 0x10FFFF ? 0xFFFD : c));
    if (c >= 0x10000 && c <= 0x10FFFF) units.push_back(orb::TrailUnit(c));
  }
  return units;
}

constexpr std::size_t kWideLimit = 2048;

}  // namespace

int OrbStringDataToNumber(const OrbCharPlatform& text) {
  const ErrnoKeeper errnoKeeper;
  const char* digits = text;
  return digits == nullptr ? 0 : std::atoi(digits);
}

double OrbStringDataToFloat(const OrbCharPlatform& text) {
  const ErrnoKeeper errnoKeeper;
  const char* digits = text;
  return digits == nullptr ? 0 : std::atof(digits);
}

COrbStringData OrbStringDataFormat(const COrbStringData* format, ...) {
  if (format == nullptr || format->GetPtrSystemEncoding() == nullptr) return {};
  std::va_list arguments;
  va_start(arguments, format);
  COrbStringData result = Formatted(format->GetPtrUtf8(), arguments);
  va_end(arguments);
  return result;
}

COrbStringData OrbStringDataFormat(const OrbCharPlatform* format, ...) {
  if (format == nullptr || static_cast<const char*>(*format) == nullptr) return {};
  std::va_list arguments;
  va_start(arguments, format);
  COrbStringData result = Formatted(*format, arguments);
  va_end(arguments);
  return result;
}

COrbStringData OrbStringDataFormatW(const OrbCharUnicode* format, ...) {
  if (format == nullptr || static_cast<const wchar_t*>(*format) == nullptr) return {};
  const ErrnoKeeper errnoKeeper;
  const auto buffer = std::make_unique<wchar_t[]>(kWideLimit);
  std::va_list arguments;
  va_start(arguments, format);
  const int length = std::vswprintf(buffer.get(), kWideLimit, *format, arguments);
  va_end(arguments);
  if (length < 0) return {};
  COrbStringData result;
  result.InitWithUnicode(
      reinterpret_cast<const unsigned short*>(Utf16FromWide(buffer.get()).c_str()));
  return result;
}

// SPDX-License-Identifier: MIT
#include "layout.h"

#include <array>
#include <cstdio>
#include <string_view>

#include "text.h"

namespace orbimport {
namespace {

constexpr std::string_view kConversions = "YymdjHMS%";

struct Fields {
  unsigned year = 0, month = 0, day = 0, hour = 0, minute = 0, second = 0;
};

Fields LocalFields(const COrbTime& time) {
  Fields f;
  time.GetTime(&f.year, &f.month, &f.day, &f.hour, &f.minute, &f.second, nullptr, nullptr, nullptr);
  return f;
}

bool IsLeap(unsigned year) { return (year % 4 == 0 && year % 100 != 0) || year % 400 == 0; }

unsigned DayOfYear(const Fields& f) {
  constexpr unsigned kBefore[] = {0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
  return kBefore[f.month - 1] + f.day + (f.month > 2 && IsLeap(f.year) ? 1 : 0);
}

std::string Digits(unsigned value, int width) {
  std::array<char, 16> text{};
  std::snprintf(text.data(), text.size(), "%0*u", width, value);
  return text.data();
}

std::string Convert(char conversion, const Fields& f) {
  switch (conversion) {
    case 'Y':
      return Digits(f.year, 4);
    case 'y':
      return Digits(f.year % 100, 2);
    case 'm':
      return Digits(f.month, 2);
    case 'd':
      return Digits(f.day, 2);
    case 'j':
      return Digits(DayOfYear(f), 3);
    case 'H':
      return Digits(f.hour, 2);
    case 'M':
      return Digits(f.minute, 2);
    case 'S':
      return Digits(f.second, 2);
    default:
      return "%";
  }
}

/// No conversion gives a dot or a separator, so what the pattern's pieces are now decides.
bool HasBadPiece(std::string_view pattern) {
  while (!pattern.empty()) {
    const std::size_t end = pattern.find('/');
    const std::string_view piece = pattern.substr(0, end);
    if (piece.empty() || piece == "." || piece == "..") return true;
    if (end == std::string_view::npos) return false;
    pattern.remove_prefix(end + 1);
  }
  return true;  // It ended in a separator.
}

bool HasBadConversion(std::string_view pattern, std::string& why) {
  for (std::size_t i = pattern.find('%'); i < pattern.size(); i = pattern.find('%', i + 2)) {
    if (i + 1 < pattern.size() && kConversions.find(pattern[i + 1]) != std::string_view::npos)
      continue;
    why = "unknown conversion " + Quote(pattern.substr(i, 2));
    return true;
  }
  return false;
}

}  // namespace

bool Layout::Set(const std::string& pattern, std::string& why) {
  if (!IsUtf8(pattern)) {
    why = "not valid UTF-8";
  } else if (!pattern.empty() && HasBadPiece(pattern)) {
    why = "a folder in it is empty, . or .., or it begins or ends with /";
  } else if (!HasBadConversion(pattern, why)) {
    pattern_ = pattern;
    return true;
  }
  return false;
}

std::string Layout::Expand(const COrbTime& time) const {
  const Fields fields = LocalFields(time);
  std::string path;
  for (std::size_t i = 0; i < pattern_.size(); ++i) {
    if (pattern_[i] == '%')
      path += Convert(pattern_[++i], fields);
    else
      path += pattern_[i];
  }
  return path;
}

}  // namespace orbimport

// SPDX-License-Identifier: MIT
#include "fileops/numbered_name.h"

#include <orb/path/path_text.h>

#include <algorithm>
#include <charconv>
#include <system_error>

#include "strings/string_access.h"

namespace orb {
namespace {

std::string Bytes(const COrbStringData& text) {
  return std::string(StringAccess::Read(text).Readable());
}

std::string ExtensionOf(const COrbStringData& name) {
  const std::string extension = Bytes(OrbPathFindExtension(name, false));
  return extension.empty() ? extension : '.' + extension;
}

/// As a number is written after the "_": no sign and no leading zero.
std::optional<std::uint32_t> ParseNumber(std::string_view digits) {
  std::uint32_t number = 0;
  const char* end = digits.data() + digits.size();
  const auto parsed = std::from_chars(digits.data(), end, number);
  const bool whole = parsed.ec == std::errc() && parsed.ptr == end;
  if (!whole || digits.front() == '0') return std::nullopt;
  return number;
}

}  // namespace

NumberedName::NumberedName(const COrbStringData& name)
    : name_(Bytes(name)),
      stem_(Bytes(OrbPathFindFileName(name, true)) + '_'),
      extension_(ExtensionOf(name)) {}

std::string NumberedName::With(std::uint32_t number) const {
  return number == 0 ? name_ : stem_ + std::to_string(number) + extension_;
}

std::optional<std::uint32_t> NumberedName::NumberOf(std::string_view name) const {
  const std::size_t fixed = stem_.size() + extension_.size();
  if (name.size() <= fixed || !name.starts_with(stem_) || !name.ends_with(extension_))
    return std::nullopt;
  return ParseNumber(name.substr(stem_.size(), name.size() - fixed));
}

bool NumberedName::AreOfEntries() const {
  const bool isSpecial = name_.empty() || name_ == "." || name_ == "..";
  return !isSpecial && name_.find('/') == std::string::npos;
}

TakenNumbers::TakenNumbers(const std::vector<std::uint32_t>& numbers) : taken_(numbers.size() + 2) {
  for (const std::uint32_t number : numbers) {
    if (number < taken_.size()) taken_[number] = true;
  }
}

std::uint32_t TakenNumbers::NextFree(std::uint32_t start) const {
  if (start >= taken_.size()) return start;
  const auto free = std::find(taken_.begin() + start, taken_.end(), false);
  return static_cast<std::uint32_t>(free - taken_.begin());
}

}  // namespace orb

// SPDX-License-Identifier: MIT
#include "platform/trash_text.h"

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <set>

namespace orb::platform {

namespace {

constexpr std::size_t kLongestName = 255;

bool IsPlain(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
         std::string_view("-_.~/").find(c) != std::string_view::npos;
}

std::string PercentDecoded(std::string_view text) {
  std::string bytes;
  for (std::size_t i = 0; i < text.size(); ++i) {
    unsigned byte = 0;
    const bool isEscape = text[i] == '%' && i + 2 < text.size();
    const char* digits = text.data() + i + 1;
    if (isEscape && std::from_chars(digits, digits + 2, byte, 16).ptr == digits + 2) {
      bytes += static_cast<char>(byte);
      i += 2;
    } else {
      bytes += text[i];
    }
  }
  return bytes;
}

std::string Padded(std::int64_t number, std::size_t width) {
  const std::string digits = std::to_string(number);
  return std::string(width - std::min(width, digits.size()), '0') + digits;
}

std::string DateText(const CivilTime& t) {
  return Padded(t.year, 4) + '-' + Padded(t.month, 2) + '-' + Padded(t.day, 2) + 'T' +
         Padded(t.hour, 2) + ':' + Padded(t.minute, 2) + ':' + Padded(t.second, 2);
}

bool ContinuesCharacter(char c) { return (static_cast<unsigned char>(c) & 0xC0) == 0x80; }

std::string_view CutTo(std::string_view text, std::size_t size) {
  if (text.size() <= size) return text;
  while (size > 0 && ContinuesCharacter(text[size])) --size;
  return text.substr(0, size);
}

/// With its dot. A name that begins with its only dot has none, and a long one is no extension.
std::string_view ExtensionOf(std::string_view name) {
  constexpr std::size_t kLongest = 32;
  const std::size_t dot = name.rfind('.');
  if (dot == std::string_view::npos || dot == 0 || name.size() - dot > kLongest) return {};
  return name.substr(dot);
}

/// The name is the last of the three words.
std::string_view NameOf(std::string_view line) { return line.substr(line.rfind(' ') + 1); }

}  // namespace

std::string PercentEncoded(std::string_view bytes) {
  constexpr std::string_view kDigits = "0123456789ABCDEF";
  std::string text;
  text.reserve(bytes.size());
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    if (IsPlain(c)) {
      text += c;
    } else {
      text += {'%', kDigits[byte >> 4], kDigits[byte & 15]};
    }
  }
  return text;
}

std::string InfoText(std::string_view path, const CivilTime& deleted) {
  return "[Trash Info]\nPath=" + PercentEncoded(path) + "\nDeletionDate=" + DateText(deleted) +
         '\n';
}

std::string NumberedName(std::string_view name, unsigned number) {
  const std::string_view extension = ExtensionOf(name);
  const std::string_view stem = name.substr(0, name.size() - extension.size());
  const std::string tail =
      (number > 1 ? '.' + std::to_string(number) : std::string()) + std::string(extension);
  return std::string(CutTo(stem, kLongestName - kInfoSuffix.size() - tail.size())) + tail;
}

std::string WithFolderSizes(std::string_view list,
                            const std::vector<FolderSize>& folders,
                            const std::function<bool(const std::string& name)>& isThere) {
  std::set<std::string_view> names;
  for (const FolderSize& folder : folders) names.insert(folder.name);
  std::string text;
  while (!list.empty()) {
    const std::size_t end = std::min(list.find('\n'), list.size());
    const std::string_view line = list.substr(0, end);
    list.remove_prefix(std::min(end + 1, list.size()));
    const std::string name = PercentDecoded(NameOf(line));
    if (!names.contains(name) && isThere(name)) text.append(line) += '\n';
  }
  for (const auto& [bytes, recorded, name] : folders) {
    text += std::to_string(bytes) + ' ' + std::to_string(recorded) + ' ' + PercentEncoded(name);
    text += '\n';
  }
  return text;
}

}  // namespace orb::platform

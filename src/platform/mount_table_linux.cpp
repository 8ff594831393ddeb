// SPDX-License-Identifier: MIT
#include "platform/mount_table.h"

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <optional>
#include <utility>

#include "platform/linux/system_file.h"

namespace orb::platform {

namespace {

/// Cuts off and returns what comes before the separator, or all there is.
std::string_view TakeUntil(std::string_view& text, char separator) {
  const std::size_t end = std::min(text.find(separator), text.size());
  const std::string_view taken = text.substr(0, end);
  text.remove_prefix(std::min(end + 1, text.size()));
  return taken;
}

template <typename Number>
bool ParseNumber(std::string_view text, Number& number) {
  const char* end = text.data() + text.size();
  const auto [parsed, error] = std::from_chars(text.data(), end, number);
  return error == std::errc() && parsed == end;
}

bool IsOctal(char c) { return c >= '0' && c <= '7'; }

/// The kernel writes space, tab, newline, backslash and "#" as a backslash and three octal digits.
std::string Unescape(std::string_view text) {
  std::string plain;
  plain.reserve(text.size());
  while (!text.empty()) {
    if (text.size() > 3 && text[0] == '\\' && std::ranges::all_of(text.substr(1, 3), IsOctal)) {
      plain += static_cast<char>((text[1] - '0') * 64 + (text[2] - '0') * 8 + (text[3] - '0'));
      text.remove_prefix(4);
    } else {
      plain += text.front();
      text.remove_prefix(1);
    }
  }
  return plain;
}

bool HasOption(std::string_view options, std::string_view sought) {
  while (!options.empty()) {
    if (TakeUntil(options, ',') == sought) return true;
  }
  return false;
}

bool ParseDevice(std::string_view text, DeviceNumber& device) {
  const std::string_view major = TakeUntil(text, ':');
  return ParseNumber(major, device.major) && ParseNumber(text, device.minor);
}

/// 36 35 98:0 /root /folder rw,noatime shared:1 - ext3 /dev/sda1 rw,errors=continue
/// with any number of words before the dash.
std::optional<Mount> ParseLine(std::string_view line) {
  Mount mount;
  if (!ParseNumber(TakeUntil(line, ' '), mount.id)) return std::nullopt;
  TakeUntil(line, ' ');  // The mount above.
  if (!ParseDevice(TakeUntil(line, ' '), mount.device)) return std::nullopt;
  TakeUntil(line, ' ');  // What of the volume is seen.
  mount.folder = Unescape(TakeUntil(line, ' '));
  mount.readOnly = HasOption(TakeUntil(line, ' '), "ro");
  while (!line.empty() && TakeUntil(line, ' ') != "-") {
  }
  mount.type = Unescape(TakeUntil(line, ' '));
  mount.source = Unescape(TakeUntil(line, ' '));
  mount.readOnly |= HasOption(line, "ro");
  if (!mount.folder.starts_with('/') || mount.type.empty()) return std::nullopt;
  return mount;
}

bool IsInOrBelow(std::string_view path, std::string_view folder) {
  if (folder == "/") return path.starts_with('/');
  return path.starts_with(folder) && (path.size() == folder.size() || path[folder.size()] == '/');
}

}  // namespace

MountTable::MountTable(std::string_view text) {
  while (!text.empty()) {
    std::optional<Mount> mount = ParseLine(TakeUntil(text, '\n'));
    if (mount) mounts_.push_back(*std::move(mount));
  }
}

Result<MountTable> MountTable::Read(const std::string& file) {
  const Result<std::string> text = ReadSystemFile(file);
  if (!text) return text.Reason();
  return MountTable(text.Value());
}

const Mount* MountTable::FindById(std::uint64_t id) const {
  const auto found = std::ranges::find(mounts_, id, &Mount::id);
  return found != mounts_.end() ? &*found : nullptr;
}

const Mount* MountTable::FindByPath(std::string_view path) const {
  const Mount* best = nullptr;
  for (const Mount& mount : mounts_) {
    const bool isCloser = best == nullptr || mount.folder.size() >= best->folder.size();
    if (isCloser && IsInOrBelow(path, mount.folder)) best = &mount;
  }
  return best;
}

}  // namespace orb::platform

// SPDX-License-Identifier: MIT
#include "strings/text_utf8.h"

namespace orb {

UnitPlace PlaceOfUnit(std::string_view text, std::size_t unit, std::size_t from) {
  std::size_t at = from;
  while (unit != 0 && at < text.size()) {
    const unsigned lead = ByteAt(text, at);
    if (CharUnits(lead) > unit) return {at, true};
    unit -= CharUnits(lead);
    at += CharSize(lead);
  }
  return {at, false};
}

std::size_t CountUnits(std::string_view text) {
  std::size_t units = 0;
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    units +=
        static_cast<std::size_t>((byte & 0xC0) != 0x80) + static_cast<std::size_t>(byte >= 0xF0);
  }
  return units;
}

}  // namespace orb

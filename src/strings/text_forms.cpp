// SPDX-License-Identifier: MIT
#include "strings/text_forms.h"

#include <utility>

namespace orb {
namespace {

using platform::CharForm;
using platform::Form;

std::u16string Utf16Of(std::string_view text) {
  std::u16string units;
  units.reserve(text.size());
  for (std::size_t at = 0; at < text.size(); at += CharSize(ByteAt(text, at))) {
    const char32_t c = CharAt(text, at);
    units.push_back(LeadUnit(c));
    if (c >= 0x10000) units.push_back(TrailUnit(c));
  }
  return units;
}

}  // namespace

std::u16string_view FormReader::NextAtEnd() {
  units_[0] = std::exchange(lone_, u'\0');
  return {units_.data(), units_[0] == 0 ? 0U : 1U};
}

std::u16string_view FormReader::NextBeyondAscii() {
  const std::size_t from = at_;
  const CharForm made = platform::FormOf(form_, CharAt(text_, at_));
  at_ += CharSize(ByteAt(text_, at_));
  const bool alone = made.endsWithStarter || form_ == Form::kFolded;
  if (made.length == 0 || (!alone && !AtEnd() && !NextLeadsWithStarter())) return Gather(from);
  units_ = made.units;
  return {units_.data(), made.length};
}

std::u16string_view FormReader::Gather(std::size_t from) {
  if (form_ != Form::kFolded) {
    while (!AtEnd() && !NextLeadsWithStarter()) at_ += CharSize(ByteAt(text_, at_));
  }
  gathered_ = platform::FormOfRun(form_, Utf16Of(text_.substr(from, at_ - from)));
  return gathered_;
}

std::u16string FormOfText(Form form, std::string_view text) {
  return platform::FormOfRun(form, Utf16Of(text));
}

}  // namespace orb

// SPDX-License-Identifier: MIT
#include "plan.h"

#include <algorithm>
#include <charconv>
#include <string_view>

namespace orbimport {
namespace {

std::string NameOf(const Member& member, unsigned number) {
  if (number == 0) return member.stem + member.tail;
  return member.stem + "_" + std::to_string(number) + member.tail;
}

std::string Join(const std::string& folder, const std::string& name) {
  return folder.empty() ? name : folder + "/" + name;
}

/// The number that `digits` spells as NameOf() would; 0 for any other text.
unsigned NumberOf(std::string_view digits) {
  unsigned number = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (error != std::errc() || end != digits.data() + digits.size() || digits[0] == '0') return 0;
  return number;
}

bool IsOurs(Found found) {
  return found == Found::kSame || found == Found::kUnfinished || found == Found::kUndated;
}

Action ActionFor(Found found) {
  switch (found) {
    case Found::kSame:
      return Action::kLeave;
    case Found::kUndated:
      return Action::kSetTimes;
    case Found::kUnfinished:
      return Action::kReplaceUnfinished;
    default:
      return Action::kCopy;
  }
}

}  // namespace

std::vector<unsigned> NumbersAmong(const std::set<std::string>& names,
                                   const std::string& stem,
                                   const std::string& tail) {
  std::vector<unsigned> numbers;
  if (names.count(stem + tail) != 0) numbers.push_back(0);
  const std::string start = stem + "_";
  for (auto at = names.lower_bound(start); at != names.end() && at->starts_with(start); ++at) {
    if (at->size() <= start.size() + tail.size() || !at->ends_with(tail)) continue;
    const std::string_view digits =
        std::string_view(*at).substr(start.size(), at->size() - start.size() - tail.size());
    if (const unsigned number = NumberOf(digits); number != 0) numbers.push_back(number);
  }
  std::sort(numbers.begin(), numbers.end());
  return numbers;
}

Found Planner::At(const std::string& folder, const Member& member, unsigned number) {
  const std::string path = Join(folder, NameOf(member, number));
  return claimed_.count(path) != 0 ? Found::kOther : view_.Look(path, items_[member.item]);
}

/// The number under which the shot's main file is there, and with the fewest strangers beside it.
bool Planner::HasHome(const std::string& folder, const Shot& shot, unsigned& number) {
  const Member& main = shot.members.front();
  auto fewest = static_cast<std::ptrdiff_t>(shot.members.size());
  for (const unsigned n : view_.Numbers(folder, main.stem, main.tail)) {
    if (!IsOurs(At(folder, main, n))) continue;
    const auto strangers =
        std::count_if(shot.members.begin(), shot.members.end(), [&](const Member& member) {
          return At(folder, member, n) == Found::kOther;
        });
    if (strangers >= fewest) continue;
    fewest = strangers;
    number = n;
  }
  return fewest < static_cast<std::ptrdiff_t>(shot.members.size());
}

unsigned Planner::FreeNumber(const std::string& folder, const Shot& shot) {
  const auto fits = [&](unsigned n) {
    return std::all_of(shot.members.begin(), shot.members.end(), [&](const Member& member) {
      return At(folder, member, n) != Found::kOther;
    });
  };
  unsigned n = 0;
  while (!fits(n)) ++n;
  return n;
}

Step Planner::StepAt(const std::string& folder, const Member& member, unsigned number) {
  const Found found = At(folder, member, number);
  return {member.item, NameOf(member, number), ActionFor(found)};
}

/// For a file whose place beside its shot a stranger has, such as a sidecar that was edited since:
/// where it is already, or else a number of its own.
Step Planner::StepElsewhere(const std::string& folder, const Member& member) {
  const Shot alone{{member}};
  unsigned number = 0;
  if (!HasHome(folder, alone, number)) number = FreeNumber(folder, alone);
  return StepAt(folder, member, number);
}

ShotPlan Planner::Plan(const Shot& shot, std::size_t index) {
  ShotPlan plan;
  plan.shot = index;
  const std::string folder = layout_.Expand(items_[shot.members.front().item].modified);
  plan.folder = folder;
  unsigned number = 0;
  if (!HasHome(folder, shot, number)) number = FreeNumber(folder, shot);
  for (const Member& member : shot.members) {
    plan.steps.push_back(At(folder, member, number) == Found::kOther
                             ? StepElsewhere(folder, member)
                             : StepAt(folder, member, number));
    claimed_.insert(plan.PathOf(plan.steps.back()));
  }
  return plan;
}

void Planner::Forget(const ShotPlan& plan) {
  for (const Step& step : plan.steps) claimed_.erase(plan.PathOf(step));
}

}  // namespace orbimport

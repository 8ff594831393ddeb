// SPDX-License-Identifier: MIT
#include "room.h"

#include <algorithm>
#include <limits>
#include <map>

#include "device_linux.h"
#include "paths.h"
#include "text.h"

namespace orbimport {
namespace {

/// Photos and movies are compressed already, and even an uncompressed RAW does not shrink by more.
constexpr std::uint64_t kMostShrinking = 2;

std::uint64_t Sum(std::uint64_t a, std::uint64_t b) {
  constexpr std::uint64_t kMost = std::numeric_limits<std::uint64_t>::max();
  return a > kMost - b ? kMost : a + b;
}

std::uint64_t WholeBlocks(std::uint64_t size, const Room& room) {
  const std::uint64_t rest = room.isExact ? size % room.block : 0;
  return rest == 0 ? size : Sum(size, room.block - rest);
}

/// What copies to one volume come to.
struct Need {
  Shortage sum;
  std::uint64_t least = 0;  // However well the volume packs it.
};

class Account {
 public:
  explicit Account(const std::string& destination) : destination_(destination) {}

  void Add(const ShotPlan& plan, const Step& step, const Item& item) {
    const std::string folder = destination_ + "/" + plan.folder;
    Need& need = NeedFor(folder);
    const Room& room = rooms_.at(folder);
    // The bytes are written anew, never shared with the source, also where the volume could. What a
    // killed import left of the file is removed first.
    const std::uint64_t left = step.action == Action::kReplaceUnfinished ? SizeAt(plan, step) : 0;
    const std::uint64_t freed = WholeBlocks(left, room);
    const std::uint64_t taken = WholeBlocks(item.size, room);
    const std::uint64_t least = room.isExact ? taken : taken / kMostShrinking;
    need.sum.needed = Sum(need.sum.needed, taken - std::min(taken, freed));
    need.least = Sum(need.least, least - std::min(least, freed));
  }

  std::optional<Shortage> First() const {
    for (const auto& [volume, need] : needs_) {
      if (volume != 0 && need.least > need.sum.available) return need.sum;
    }
    return std::nullopt;
  }

 private:
  std::uint64_t SizeAt(const ShotPlan& plan, const Step& step) const {
    return COrbFileHandle(OrbPath(destination_ + "/" + plan.PathOf(step))).GetFileSize();
  }

  Need& NeedFor(const std::string& folder) {
    const auto [room, isNew] = rooms_.try_emplace(folder);
    if (isNew) room->second = RoomAt(NearestFolder(folder));
    const auto [need, isFirst] = needs_.try_emplace(room->second.volume);
    if (isFirst) need->second.sum = {NearestFolder(folder), 0, room->second.available};
    return need->second;
  }

  const std::string& destination_;
  std::map<std::string, Room> rooms_;
  std::map<std::uint64_t, Need> needs_;
};

}  // namespace

std::optional<Shortage> FindShortage(const std::vector<ShotPlan>& plans,
                                     const std::vector<Item>& items,
                                     const std::string& destination) {
  Account account(destination);
  for (const ShotPlan& plan : plans) {
    for (const Step& step : plan.steps) {
      if (step.Copies()) account.Add(plan, step, items[step.item]);
    }
  }
  return account.First();
}

}  // namespace orbimport

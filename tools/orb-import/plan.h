// SPDX-License-Identifier: MIT
#pragma once

#include <set>
#include <string>
#include <unordered_set>
#include <vector>

#include "layout.h"
#include "scan.h"
#include "shots.h"

namespace orbimport {

/// What stands under a name in DESTINATION, as seen from the item that is to go there.
enum class Found {
  kFree,
  kSame,        // Same type, size and time: it was imported before.
  kUnfinished,  // The beginning of the item, written by an import that was killed.
  kUndated,     // All of the item, written by an import that was killed before it set the times.
  kOther,       // Somebody else's. Never touched.
};

/// Questions about DESTINATION. Paths are below it.
class View {
 public:
  virtual ~View() = default;
  /// The numbers n, ascending, for which stem_n + tail is there; 0 stands for stem + tail.
  virtual std::vector<unsigned> Numbers(const std::string& folder,
                                        const std::string& stem,
                                        const std::string& tail) = 0;
  /// What stands there.
  virtual Found Look(const std::string& path, const Item& item) = 0;
};

/// View::Numbers() for a folder that holds `names`.
std::vector<unsigned> NumbersAmong(const std::set<std::string>& names,
                                   const std::string& stem,
                                   const std::string& tail);

enum class Action { kCopy, kReplaceUnfinished, kSetTimes, kLeave };

struct Step {
  std::size_t item = 0;
  std::string name;
  Action action = Action::kCopy;

  bool Copies() const { return action == Action::kCopy || action == Action::kReplaceUnfinished; }
};

/// Where the files of one shot go: all into one folder below DESTINATION.
struct ShotPlan {
  std::size_t shot = 0;
  std::string folder;
  std::vector<Step> steps;

  std::string PathOf(const Step& step) const {
    return folder.empty() ? step.name : folder + "/" + step.name;
  }
};

/// Finds names. A name in DESTINATION stands for one item of a run only, so that two photos of the
/// same name, size and time both come through.
class Planner {
 public:
  Planner(const std::vector<Item>& items, const Layout& layout, View& view)
      : items_(items), layout_(layout), view_(view) {}

  /// A shot whose main file is there already stays with it: only what is missing is added there.
  /// Otherwise all its files get the lowest number that is free for each of them.
  ShotPlan Plan(const Shot& shot, std::size_t index);
  /// Gives the names of a plan free again.
  void Forget(const ShotPlan& plan);

 private:
  Found At(const std::string& folder, const Member& member, unsigned number);
  bool HasHome(const std::string& folder, const Shot& shot, unsigned& number);
  unsigned FreeNumber(const std::string& folder, const Shot& shot);
  Step StepAt(const std::string& folder, const Member& member, unsigned number);
  Step StepElsewhere(const std::string& folder, const Member& member);

  const std::vector<Item>& items_;
  const Layout& layout_;
  View& view_;
  std::unordered_set<std::string> claimed_;
};

}  // namespace orbimport

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <string>
#include <vector>

#include "journal.h"
#include "plan.h"
#include "progress.h"
#include "report.h"
#include "view.h"

namespace orbimport {

/// What an import works with. `source` and `destination` are absolute.
struct Work {
  const std::string& source;
  const std::string& destination;
  const std::vector<Item>& items;
  const std::vector<Shot>& shots;
  Planner& planner;
  FolderView& view;
  Journal& journal;
  Progress& progress;
  Report& report;
};

/// Carries plans out. A name is reserved by making an empty file of it, for all files of a shot
/// before the first is filled; then the bytes go in, and the modification time comes last of all:
/// a file that has the size and the time of its source is whole.
class Importer {
 public:
  explicit Importer(const Work& work) : work_(work) {}

  /// Stops between two pieces of a file once a signal asked for it.
  void Run(std::vector<ShotPlan> plans);

  /// What is half done and could not be taken away again, below DESTINATION.
  const std::vector<std::string>& Left() const { return left_; }

 private:
  enum class Reserved { kYes, kTaken, kFailed };

  OrbResult Promise(const std::vector<ShotPlan>& plans);
  void ImportShot(ShotPlan& plan, OrbResult promised);
  OrbResult Prepare(ShotPlan& plan);
  Reserved ReserveAll(const ShotPlan& plan, OrbResult& code);
  Reserved Reserve(const ShotPlan& plan, const Step& step, OrbResult& code);
  void CarryOut(const ShotPlan& plan, const Step& step);
  OrbResult Fill(const ShotPlan& plan, const Step& step);
  OrbResult Copy(const ShotPlan& plan, const Step& step);
  OrbResult SetTimes(const std::string& path, const Item& item);
  void ReleaseAll();
  void Release(const std::string& path);
  void Finish(Status status, const ShotPlan& plan, const Step& step, OrbResult code);

  std::string FullPath(const ShotPlan& plan, const Step& step) const {
    return work_.destination + "/" + plan.PathOf(step);
  }

  const Work& work_;
  std::vector<std::string> reserved_;           // Made and not yet filled, of the shot at work.
  std::uint64_t tooLarge_ = ~std::uint64_t{0};  // The smallest size for which there was no room.
  std::vector<std::string> left_;
};

/// The files and bytes that plans have to copy.
Totals TotalsOf(const std::vector<ShotPlan>& plans, const std::vector<Item>& items);

}  // namespace orbimport

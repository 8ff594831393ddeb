// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <functional>
#include <set>
#include <string>
#include <vector>

#include "device_linux.h"
#include "journal.h"
#include "options.h"
#include "plan.h"
#include "progress.h"
#include "report.h"
#include "view.h"

namespace orbimport {

/// What an import works with. The paths in `options` are absolute.
struct Work {
  const Options& options;
  const std::vector<Item>& items;
  const std::vector<Shot>& shots;
  Planner& planner;
  FolderView& view;
  Journal& journal;
  Progress& progress;
  Report& report;
  std::function<decltype(CompareOnDevice)> compare = CompareOnDevice;

  std::string SourceOf(const Step& step) const {
    return options.source + "/" + items[step.item].path;
  }
  std::string CopyOf(const ShotPlan& plan, const Step& step) const {
    return options.destination + "/" + plan.PathOf(step);
  }
};

/// Carries plans out. A name is reserved by making an empty file of it, for all files of a shot
/// before the first is filled; then the bytes go in and are compared, if that is wanted, and the
/// modification time comes last of all: a file that has the size and the time of its source is
/// whole.
class Importer {
 public:
  explicit Importer(const Work& work) : work_(work) {}

  /// Stops between two pieces of a file once a signal asked for it.
  void Run(std::vector<ShotPlan> plans);

  /// The folders that hold what was made.
  const std::set<std::string>& Folders() const { return folders_; }
  /// The shots that may leave SOURCE: all their files are in DESTINATION, as comparing has shown.
  const std::vector<ShotPlan>& Safe() const { return safe_; }
  /// What is half done and could not be taken away again, below DESTINATION.
  const std::vector<std::string>& Left() const { return left_; }

 private:
  enum class Reserved { kYes, kTaken, kFailed };

  OrbResult Promise(const std::vector<ShotPlan>& plans);
  void ImportShot(ShotPlan& plan, OrbResult promised);
  void NoteShot(const ShotPlan& plan, const std::vector<Step>& whole);
  OrbResult Prepare(ShotPlan& plan);
  Reserved ReserveAll(const ShotPlan& plan, OrbResult& code);
  Reserved Reserve(const ShotPlan& plan, const Step& step, OrbResult& code);
  OrbResult CarryOut(const ShotPlan& plan, const Step& step);
  OrbResult CheckPresent(const ShotPlan& plan, const Step& step);
  OrbResult Fill(const ShotPlan& plan, const Step& step);
  OrbResult Copy(const ShotPlan& plan, const Step& step);
  OrbResult Verify(const ShotPlan& plan, const Step& step);
  OrbResult SetTimes(const std::string& path, const Item& item);
  void ReleaseAll();
  void Release(const std::string& path);
  void Finish(const ShotPlan& plan, const Step& step, OrbResult code);

  const Work& work_;
  std::vector<std::string> reserved_;           // Made and not yet filled, of the shot at work.
  std::uint64_t tooLarge_ = ~std::uint64_t{0};  // The smallest size for which there was no room.
  std::set<std::string> folders_;
  std::vector<ShotPlan> safe_;
  std::vector<std::string> left_;
};

/// Whether a source is still what was planned, and its copy has its size: only what came through as
/// it was planned counts.
OrbResult CheckUnchanged(const std::string& source, const Item& item, const std::string& copy);

/// The files and bytes that plans have to copy.
Totals TotalsOf(const std::vector<ShotPlan>& plans, const std::vector<Item>& items);

}  // namespace orbimport

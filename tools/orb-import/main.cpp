// SPDX-License-Identifier: MIT
#include <exception>
#include <iostream>

#include "clearing.h"
#include "device_linux.h"
#include "importer.h"
#include "interrupt.h"
#include "journal.h"
#include "options.h"
#include "paths.h"
#include "plan.h"
#include "progress.h"
#include "report.h"
#include "room.h"
#include "scan.h"
#include "shots.h"
#include "text.h"
#include "view.h"

namespace orbimport {
namespace {

enum ExitCode : int { kDone = 0, kSomeFailed = 1, kUsage = 2, kSignalBase = 128 };

int Complain(int exitCode, const std::string& what) {
  std::cerr << "orb-import: " << what << '\n';
  if (exitCode == kUsage) std::cerr << "Try 'orb-import --help'.\n";
  return exitCode;
}

class Run {
 public:
  explicit Run(const Options& options)
      : options_(options),
        report_(options, std::cout, std::cerr),
        progress_(options.dryRun ? Progress::Form::kNone : Progress::FormFor(options.quiet)) {}

  int Execute() {
    scan_ = Scan(options_.source, options_.destination, [] { return InterruptingSignal() != 0; });
    for (const Skip& skip : scan_.skips) report_.AddSkip(skip);
    for (const Failure& failure : scan_.failures) report_.AddFailure(failure);
    shots_ = MakeShots(scan_.items);
    const int exitCode = PlanAndImport();
    if (exitCode != kDone) return exitCode;
    const int signal = InterruptingSignal();
    report_.Close(signal != 0);
    if (!flushed_) return Complain(kSomeFailed, "the destination's device reports an error");
    if (!std::cout) return Complain(kSomeFailed, "cannot write to the standard output");
    if (signal != 0) return kSignalBase + signal;
    return report_.HasFailures() ? kSomeFailed : kDone;
  }

 private:
  /// What is planned holds the names as they were a moment ago; the importer looks again. So the
  /// journal is opened only when something is going to be done, and nothing is written before.
  int PlanAndImport() {
    const auto promises = Journal::Read(options_.destination);
    FolderView view(options_.source, options_.destination, promises);
    Planner planner(scan_.items, options_.layout, view);
    std::vector<ShotPlan> plans = PlanAll(planner);
    if (InterruptingSignal() != 0) return kDone;
    if (options_.dryRun) ShowPlans(plans);
    if (IsTooMuch(plans) || options_.dryRun) return kDone;
    if (plans.empty() && promises.empty()) return kDone;
    if (!journal_.Open(options_.destination)) {
      return Complain(kSomeFailed,
                      "another import into " + Quote(options_.destination) + " is at work");
    }
    if (journal_.Old() == promises)
      CarryOut(planner, view, std::move(plans));
    else
      ImportAnew();
    return kDone;
  }

  /// For when another import ended between our reading its journal and our opening it.
  void ImportAnew() {
    FolderView view(options_.source, options_.destination, journal_.Old());
    Planner planner(scan_.items, options_.layout, view);
    CarryOut(planner, view, PlanAll(planner));
  }

  std::vector<ShotPlan> PlanAll(Planner& planner) {
    std::vector<ShotPlan> plans;
    for (std::size_t i = 0; i < shots_.size() && InterruptingSignal() == 0; ++i) {
      plans.push_back(planner.Plan(shots_[i], i));
    }
    return plans;
  }

  /// Tells so, too.
  bool IsTooMuch(const std::vector<ShotPlan>& plans) {
    if (options_.fill) return false;
    const auto shortage = FindShortage(plans, scan_.items, options_.destination);
    if (shortage) report_.AddShortage(*shortage);
    return shortage.has_value();
  }

  void ShowPlans(const std::vector<ShotPlan>& plans) {
    for (const ShotPlan& plan : plans) {
      for (const Step& step : plan.steps) {
        const Status status = step.action == Action::kLeave ? Status::kPresent : Status::kPlanned;
        report_.Add(status, scan_.items[step.item], plan.PathOf(step), kOrbNoErr);
      }
    }
  }

  void CarryOut(Planner& planner, FolderView& view, std::vector<ShotPlan> plans) {
    progress_.Begin(TotalsOf(plans, scan_.items));
    const Work work{options_, scan_.items, shots_, planner, view, journal_, progress_, report_};
    Importer importer(work);
    importer.Run(std::move(plans));
    if (InterruptingSignal() == 0) Secure(work, importer);
    progress_.Hide();
    std::vector<std::string> unfinished = view.Unfinished();
    unfinished.insert(unfinished.end(), importer.Left().begin(), importer.Left().end());
    for (const std::string& path : unfinished) report_.AddUnfinished(path);
    if (unfinished.empty() && flushed_) journal_.Remove();
  }

  /// So that the photos are on the device, and not only in memory, when the tool says so, and
  /// before their sources go anywhere.
  void Secure(const Work& work, const Importer& importer) {
    if (report_.Copied() == 0 && importer.Safe().empty()) return;
    progress_.Say("Writing to the device...");
    flushed_ = FlushVolumes(importer.Folders());
    if (!flushed_ || importer.Safe().empty()) return;
    progress_.Say("Moving to the trash...");
    ClearSource(work, importer.Safe());
  }

  const Options& options_;
  Report report_;
  Progress progress_;
  ScanResult scan_;
  std::vector<Shot> shots_;
  Journal journal_;
  bool flushed_ = true;
};

int Main(int argc, char** argv) {
  Options options;
  std::string why;
  switch (ParseOptions(argc, argv, options, why)) {
    case Request::kHelp:
      std::cout << kHelpText << std::flush;
      return std::cout ? kDone : kSomeFailed;
    case Request::kVersion:
      std::cout << "orb-import " ORB_VERSION "\n" << std::flush;
      return std::cout ? kDone : kSomeFailed;
    case Request::kBad:
      return Complain(kUsage, why);
    case Request::kImport:
      break;
  }
  if (!ResolvePaths(options, why)) return Complain(kUsage, why);
  InstallSignalHandlers();
  return Run(options).Execute();
}

}  // namespace
}  // namespace orbimport

int main(int argc, char** argv) {
  try {
    return orbimport::Main(argc, argv);
  } catch (const std::exception& error) {  // Out of memory, most likely.
    std::cerr << "orb-import: " << error.what() << '\n';
    return 1;
  }
}

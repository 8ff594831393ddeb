// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <unistd.h>

#include <exception>
#include <filesystem>
#include <iostream>
#include <system_error>

#include "importer.h"
#include "interrupt.h"
#include "journal.h"
#include "options.h"
#include "plan.h"
#include "progress.h"
#include "report.h"
#include "scan.h"
#include "shots.h"
#include "text.h"
#include "view.h"

namespace orbimport {
namespace {

namespace fs = std::filesystem;

enum ExitCode : int { kDone = 0, kSomeFailed = 1, kUsage = 2, kSignalBase = 128 };

int Complain(int exitCode, const std::string& what) {
  std::cerr << "orb-import: " << what << '\n';
  if (exitCode == kUsage) std::cerr << "Try 'orb-import --help'.\n";
  return exitCode;
}

std::string WithoutSlash(std::string path) {
  while (path.size() > 1 && path.back() == '/') path.pop_back();
  return path;
}

/// What is wrong with a path, for the user.
std::string NoFolder(const char* role, const std::string& path, const std::error_code& error) {
  const std::string reason = error ? ": " + error.message() : "";
  return std::string(role) + " is no folder: " + Quote(path) + reason;
}

bool ResolveSource(std::string& source, std::string& why) {
  std::error_code error;
  const fs::path resolved = fs::canonical(source, error);
  if (error || !fs::is_directory(resolved, error)) {
    why = NoFolder("SOURCE", source, error);
    return false;
  }
  source = resolved.string();
  return true;
}

/// DESTINATION need not be there yet.
bool ResolveDestination(std::string& destination, std::string& why) {
  std::error_code error;
  const fs::path resolved = fs::weakly_canonical(fs::absolute(destination, error), error);
  const bool isTaken = !error && fs::exists(resolved, error) && !fs::is_directory(resolved, error);
  if (error || destination.empty() || isTaken) {
    why = NoFolder("DESTINATION", destination, error);
    return false;
  }
  destination = WithoutSlash(resolved.string());
  return true;
}

/// Makes both paths absolute, without links and dots, so that they can be told apart. False when
/// they cannot be used; `why` then says so.
bool ResolvePaths(Options& options, std::string& why) {
  if (!ResolveSource(options.source, why) || !ResolveDestination(options.destination, why))
    return false;
  if (options.source == options.destination) {
    why = "SOURCE and DESTINATION are the same folder";
  } else if (!IsUtf8(options.source) || !IsUtf8(options.destination)) {
    why = "the paths of SOURCE and DESTINATION must be UTF-8";
  }
  return why.empty();
}

/// So that the photos are on the device, and not only in memory, when the tool says so.
bool FlushToDevice(const std::string& folder) {
  const int descriptor = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (descriptor < 0) return false;
  const bool flushed = ::syncfs(descriptor) == 0;
  ::close(descriptor);
  return flushed;
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
    const int exitCode = options_.dryRun ? ShowPlan() : Import();
    if (exitCode != kDone) return exitCode;
    const int signal = InterruptingSignal();
    report_.Close(signal != 0);
    if (!flushed_) return Complain(kSomeFailed, "the destination's device reports an error");
    if (!std::cout) return Complain(kSomeFailed, "cannot write to the standard output");
    if (signal != 0) return kSignalBase + signal;
    return report_.HasFailures() ? kSomeFailed : kDone;
  }

 private:
  std::vector<ShotPlan> PlanAll(Planner& planner) {
    std::vector<ShotPlan> plans;
    for (std::size_t i = 0; i < shots_.size() && InterruptingSignal() == 0; ++i) {
      plans.push_back(planner.Plan(shots_[i], i));
    }
    return plans;
  }

  int ShowPlan() {
    const auto promises = Journal::Read(options_.destination);
    FolderView view(options_.source, options_.destination, promises);
    shots_ = MakeShots(scan_.items);
    Planner planner(scan_.items, options_.layout, view);
    for (const ShotPlan& plan : PlanAll(planner)) {
      for (const Step& step : plan.steps) {
        const Status status = step.action == Action::kLeave ? Status::kPresent : Status::kPlanned;
        report_.Add(status, scan_.items[step.item], plan.PathOf(step), kOrbNoErr);
      }
    }
    return kDone;
  }

  /// kDone when it could be tried at all.
  int Import() {
    if (scan_.items.empty() || InterruptingSignal() != 0) return kDone;
    if (!journal_.Open(options_.destination)) {
      return Complain(kSomeFailed,
                      "another import into " + Quote(options_.destination) + " is at work");
    }
    FolderView view(options_.source, options_.destination, journal_.Old());
    shots_ = MakeShots(scan_.items);
    Planner planner(scan_.items, options_.layout, view);
    CarryOut(planner, view, PlanAll(planner));
    return kDone;
  }

  void CarryOut(Planner& planner, FolderView& view, std::vector<ShotPlan> plans) {
    progress_.Begin(TotalsOf(plans, scan_.items));
    const Work work{options_.source,
                    options_.destination,
                    scan_.items,
                    shots_,
                    planner,
                    view,
                    journal_,
                    progress_,
                    report_};
    Importer importer(work);
    importer.Run(std::move(plans));
    const bool interrupted = InterruptingSignal() != 0;
    if (report_.Copied() > 0 && !interrupted) {
      progress_.Say("Writing to the device...");
      flushed_ = FlushToDevice(options_.destination);
    }
    progress_.Hide();
    std::vector<std::string> unfinished = view.Unfinished();
    unfinished.insert(unfinished.end(), importer.Left().begin(), importer.Left().end());
    for (const std::string& path : unfinished) report_.AddUnfinished(path);
    if (unfinished.empty() && flushed_) journal_.Remove();
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

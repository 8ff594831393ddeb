// SPDX-License-Identifier: MIT
#include "fileops/path_workers.h"

#include <utility>

#include "fileops/error_mapping.h"
#include "platform/copier.h"
#include "platform/mover.h"

namespace orb {

PathWorker::PathWorker(std::string source, std::string destination)
    : source_(std::move(source)), destination_(std::move(destination)) {}

void PathWorker::SetProgress(OrbProgressProc progress, void* data) {
  progress_ = progress;
  progressData_ = data;
}

Outcome PathWorker::OutcomeOf(const platform::Status& status) {
  const bool explained = status || status.Reason().domain != platform::ErrorDomain::kNone;
  return {FileOperationResult(status), explained};
}

Outcome OrbCopyPath::Perform() const {
  if (!Call()) return {kOrbErrCanceled};
  const Outcome outcome = OutcomeOf(platform::CopyItem(source_, destination_));
  (void)Call();
  return outcome;
}

Outcome OrbMovePath::Perform() const {
  if (!Call()) return {kOrbErrCanceled};
  const platform::Status moved = platform::MoveItem(source_, destination_);
  const Outcome outcome = OutcomeOf(moved);
  if (moved || !outcome.explained) (void)Call();
  return outcome;
}

}  // namespace orb

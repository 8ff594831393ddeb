// SPDX-License-Identifier: MIT
#pragma once

#include <orb/fileops/progress.h>
#include <orb/result.h>

#include <string>

#include "platform/error.h"

namespace orb {

/// What came of a copy or a move.
struct Outcome {
  OrbResult code = kOrbNoErr;
  /// Whether the platform told why it failed. If it did not, the code is kOrbErrAccessDenied.
  bool explained = true;
};

/// One copy or move of an item, with a call to the progress callback before it, which can cancel,
/// and one after it, whose answer counts no more.
class PathWorker {
 public:
  PathWorker(std::string source, std::string destination);

  void SetProgress(OrbProgressProc progress, void* data);

 protected:
  /// False cancels.
  bool Call() const { return progress_ == nullptr || progress_(progressData_); }
  static Outcome OutcomeOf(const platform::Status& status);

  const std::string source_;
  const std::string destination_;

 private:
  OrbProgressProc progress_ = nullptr;
  void* progressData_ = nullptr;
};

/// The closing call comes in every case.
class OrbCopyPath : public PathWorker {
 public:
  using PathWorker::PathWorker;
  Outcome Perform() const;
};

/// The closing call comes unless the platform told why the move failed.
class OrbMovePath : public PathWorker {
 public:
  using PathWorker::PathWorker;
  Outcome Perform() const;
};

}  // namespace orb

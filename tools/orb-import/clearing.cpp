// SPDX-License-Identifier: MIT
#include "clearing.h"

#include "interrupt.h"
#include "paths.h"
#include "text.h"

namespace orbimport {
namespace {

OrbResult CheckFile(const Work& work, const ShotPlan& shot, const Step& step) {
  const std::string source = work.SourceOf(step);
  const std::string copy = work.CopyOf(shot, step);
  const OrbResult unchanged = CheckUnchanged(source, work.items[step.item], copy);
  if (unchanged >= kOrbErrFirst) return unchanged;
  return IsSameFile(source, copy) ? kOrbErrSamePath : kOrbNoErr;
}

OrbResult CheckShot(const Work& work, const ShotPlan& shot) {
  for (const Step& step : shot.steps) {
    if (const OrbResult code = CheckFile(work, shot, step); code >= kOrbErrFirst) return code;
  }
  return kOrbNoErr;
}

OrbResult ClearFile(const std::string& source) {
  const OrbResult trashed = OrbMoveToTrashEx(OrbPath(source), nullptr, nullptr);
  return trashed < kOrbErrFirst ? kOrbNoErr : OrbResult{kImportErrNotTrashed};
}

void ClearShot(const Work& work, const ShotPlan& shot) {
  OrbResult code = CheckShot(work, shot);
  // The main file last: as long as it is there, the next import knows where the others belong.
  for (auto step = shot.steps.rbegin(); step != shot.steps.rend(); ++step) {
    if (code < kOrbErrFirst) code = ClearFile(work.SourceOf(*step));
    const Status status = code < kOrbErrFirst ? Status::kTrashed : Status::kKept;
    work.report.Add(status, work.items[step->item], shot.PathOf(*step), code);
    if (code >= kOrbErrFirst) code = kImportErrShotIncomplete;
  }
}

}  // namespace

void ClearSource(const Work& work, const std::vector<ShotPlan>& shots) {
  for (const ShotPlan& shot : shots) {
    if (InterruptingSignal() != 0) return;
    ClearShot(work, shot);
  }
}

}  // namespace orbimport

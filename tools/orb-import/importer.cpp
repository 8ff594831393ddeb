// SPDX-License-Identifier: MIT
#include "importer.h"

#include <algorithm>

#include "interrupt.h"
#include "paths.h"
#include "text.h"

namespace orbimport {
namespace {

/// Other programs may take the names that were planned; one that does so this often is at war.
constexpr int kMostPlans = 100;
/// The stream copy's own.
constexpr std::uint64_t kPiece = 65536;

struct Filling {
  Progress& progress;
  std::uint64_t left;
};

bool OnPiece(void* data) {
  auto& filling = *static_cast<Filling*>(data);
  const std::uint64_t piece = std::min(filling.left, kPiece);
  filling.left -= piece;
  filling.progress.Advance(piece);
  return InterruptingSignal() == 0;
}

bool NeedsWork(const ShotPlan& plan) {
  return std::any_of(plan.steps.begin(), plan.steps.end(), [](const Step& step) {
    return step.action != Action::kLeave;
  });
}

std::vector<Promise> PromisesOf(const ShotPlan& plan, const std::vector<Item>& items) {
  std::vector<Promise> promises;
  for (const Step& step : plan.steps) {
    if (step.action == Action::kLeave) continue;
    const Item& item = items[step.item];
    promises.push_back({plan.PathOf(step), item.size, WholeSeconds(item.modified)});
  }
  return promises;
}

}  // namespace

/// A source that vanished meanwhile copies as nothing, and one that grew or shrank is no photo yet.
OrbResult CheckUnchanged(const std::string& source, const Item& item, const std::string& copy) {
  const COrbFileHandle now(OrbPath(source));
  COrbTime modified;
  const OrbResult read = now.GetUpdateTime(&modified);
  if (read >= kOrbErrFirst) return read;
  const bool isSame = now.GetFileSize() == item.size && modified == item.modified &&
                      COrbFileHandle(OrbPath(copy)).GetFileSize() == item.size;
  return isSame ? kOrbNoErr : OrbResult{kImportErrSourceChanged};
}

Totals TotalsOf(const std::vector<ShotPlan>& plans, const std::vector<Item>& items) {
  Totals totals;
  for (const ShotPlan& plan : plans) {
    for (const Step& step : plan.steps) {
      if (!step.Copies()) continue;
      ++totals.files;
      totals.bytes += items[step.item].size;
    }
  }
  return totals;
}

void Importer::Run(std::vector<ShotPlan> plans) {
  const OrbResult promised = Promise(plans);
  for (ShotPlan& plan : plans) {
    if (InterruptingSignal() != 0) return;
    ImportShot(plan, promised);
  }
}

/// All in one go: the promises are then on the device for the price of one.
OrbResult Importer::Promise(const std::vector<ShotPlan>& plans) {
  std::vector<orbimport::Promise> promises;
  for (const ShotPlan& plan : plans) {
    const auto more = PromisesOf(plan, work_.items);
    promises.insert(promises.end(), more.begin(), more.end());
  }
  return promises.empty() ? kOrbNoErr : work_.journal.Add(promises);
}

void Importer::ImportShot(ShotPlan& plan, OrbResult promised) {
  OrbResult prepared = promised;
  if (promised < kOrbErrFirst && NeedsWork(plan)) prepared = Prepare(plan);
  std::vector<Step> whole;
  for (const Step& step : plan.steps) {
    if (InterruptingSignal() != 0) break;
    const bool isReady = step.action == Action::kLeave || prepared < kOrbErrFirst;
    const OrbResult code = isReady ? CarryOut(plan, step) : prepared;
    if (code == kOrbErrCanceled) break;
    Finish(plan, step, code);
    if (code < kOrbErrFirst) whole.push_back(step);
  }
  ReleaseAll();
  NoteShot(plan, whole);
}

void Importer::NoteShot(const ShotPlan& plan, const std::vector<Step>& whole) {
  if (!whole.empty()) folders_.insert(work_.options.destination + "/" + plan.folder);
  if (!work_.options.move || InterruptingSignal() != 0) return;
  if (whole.size() == plan.steps.size()) {
    safe_.push_back(plan);
    return;
  }
  for (const Step& step : whole) {
    const Item& item = work_.items[step.item];
    work_.report.Add(Status::kKept, item, plan.PathOf(step), kImportErrShotIncomplete);
  }
}

/// Reserves the names of a shot. When another program was quicker, all names of the shot are
/// planned anew, so that they stay together.
OrbResult Importer::Prepare(ShotPlan& plan) {
  for (int tries = 0; tries < kMostPlans; ++tries) {
    const std::string folder = plan.folder.empty() ? "" : "/" + plan.folder;
    OrbResult code = MakeFolder(work_.options.destination + folder);
    if (code >= kOrbErrFirst) return code;
    const Reserved reserved = ReserveAll(plan, code);
    if (reserved == Reserved::kYes) return kOrbNoErr;
    ReleaseAll();
    if (reserved == Reserved::kFailed) return code;
    work_.planner.Forget(plan);
    work_.view.Refresh();
    plan = work_.planner.Plan(work_.shots[plan.shot], plan.shot);
    code = work_.journal.Add(PromisesOf(plan, work_.items));
    if (code >= kOrbErrFirst) return code;
  }
  return kOrbErrFileExists;
}

Importer::Reserved Importer::ReserveAll(const ShotPlan& plan, OrbResult& code) {
  for (const Step& step : plan.steps) {
    if (!step.Copies()) continue;
    const Reserved reserved = Reserve(plan, step, code);
    if (reserved != Reserved::kYes) return reserved;
  }
  return Reserved::kYes;
}

Importer::Reserved Importer::Reserve(const ShotPlan& plan, const Step& step, OrbResult& code) {
  const std::string wanted = work_.CopyOf(plan, step);
  if (step.action == Action::kReplaceUnfinished) {
    const Found found = work_.view.LookNow(plan.PathOf(step), work_.items[step.item]);
    if (found != Found::kUnfinished) return Reserved::kTaken;
    code = OrbDeleteFile(OrbPath(wanted));
    if (code >= kOrbErrFirst) return Reserved::kFailed;
  }
  COrbFilePath made;
  const std::string folder = wanted.substr(0, wanted.rfind('/'));
  code = OrbCreateUniqueFile(OrbPath(folder), OrbText(step.name), &made);
  if (code >= kOrbErrFirst) return Reserved::kFailed;
  reserved_.push_back(made.GetFullPath().GetPtrUtf8());
  return reserved_.back() == wanted ? Reserved::kYes : Reserved::kTaken;
}

OrbResult Importer::CarryOut(const ShotPlan& plan, const Step& step) {
  if (step.action == Action::kLeave) return CheckPresent(plan, step);
  if (step.Copies()) return Fill(plan, step);
  const OrbResult verified = Verify(plan, step);
  if (verified >= kOrbErrFirst) return verified;
  return SetTimes(work_.CopyOf(plan, step), work_.items[step.item]);
}

/// Size and time say that a file is there already. Before the card's goes away its bytes have to.
OrbResult Importer::CheckPresent(const ShotPlan& plan, const Step& step) {
  if (!work_.options.move || IsSameFile(work_.SourceOf(step), work_.CopyOf(plan, step)))
    return kOrbNoErr;
  const OrbResult code = Verify(plan, step);
  return code == kImportErrCopyDiffers ? OrbResult{kImportErrPresentDiffers} : code;
}

OrbResult Importer::Fill(const ShotPlan& plan, const Step& step) {
  const Item& item = work_.items[step.item];
  // What did not fit once is not tried again; smaller photos may still find room.
  if (item.size >= tooLarge_) return kOrbErrDiskFull;
  const std::string path = work_.CopyOf(plan, step);
  OrbResult code = Copy(plan, step);
  if (code < kOrbErrFirst) code = CheckUnchanged(work_.SourceOf(step), item, path);
  if (code < kOrbErrFirst) code = Verify(plan, step);
  if (code < kOrbErrFirst) code = SetTimes(path, item);
  if (code < kOrbErrFirst) std::erase(reserved_, path);
  if (code == kOrbErrDiskFull) tooLarge_ = item.size;
  return code;
}

OrbResult Importer::Copy(const ShotPlan& plan, const Step& step) {
  const std::string path = work_.CopyOf(plan, step);
  Filling filling{work_.progress, work_.items[step.item].size};
  return OrbCopyFileEx(OrbPath(work_.SourceOf(step)),
                       OrbPath(path.substr(0, path.rfind('/'))),
                       OrbText(step.name),
                       OnPiece,
                       &filling);
}

OrbResult Importer::Verify(const ShotPlan& plan, const Step& step) {
  if (!work_.options.verify) return kOrbNoErr;
  const OrbResult code = work_.compare(work_.SourceOf(step), work_.CopyOf(plan, step), [&] {
    work_.progress.Advance(0);
    return InterruptingSignal() == 0;
  });
  if (code < kOrbErrFirst) work_.report.AddVerified();
  return code;
}

/// The modification time last: it says that the file is whole.
OrbResult Importer::SetTimes(const std::string& path, const Item& item) {
  COrbFileHandle file(OrbPath(path));
  file.SetCreateTime(item.created);  // Not every volume keeps it.
  return file.SetUpdateTime(item.modified);
}

void Importer::ReleaseAll() {
  for (const std::string& path : reserved_) Release(path);
  reserved_.clear();
}

void Importer::Release(const std::string& path) {
  if (OrbDeleteFile(OrbPath(path)) < kOrbErrFirst || !COrbFileHandle(OrbPath(path)).IsExist())
    return;
  left_.push_back(path.substr(work_.options.destination.size() + 1));
}

void Importer::Finish(const ShotPlan& plan, const Step& step, OrbResult code) {
  const Item& item = work_.items[step.item];
  const std::string path = plan.PathOf(step);
  const bool isPresent = step.action == Action::kLeave;
  const bool failed = code >= kOrbErrFirst;
  if (work_.report.PrintsItems()) work_.progress.Hide();
  const Status status = failed ? Status::kFailed : isPresent ? Status::kPresent : Status::kCopied;
  work_.report.Add(status, item, failed && !isPresent ? "" : path, code);
  if (!step.Copies()) return;
  work_.progress.EndFile(item.size, Quote(path) + (failed ? " failed: " + CodeName(code) : ""));
}

}  // namespace orbimport

// SPDX-License-Identifier: MIT
#include "fileops/copy_worker.h"

#include <utility>

#include "fileops/error_mapping.h"
#include "platform/copier.h"

namespace orb {
OrbCopyPath::OrbCopyPath(std::string source, std::string destination)
    : source_(std::move(source)), destination_(std::move(destination)) {}

void OrbCopyPath::SetProgress(OrbProgressProc progress, void* data) {
  copyProgress_ = progress;
  progressData_ = data;
}

OrbResult OrbCopyPath::Perform() const {
  if (copyProgress_ != nullptr && !copyProgress_(progressData_)) return kOrbErrCanceled;
  const OrbResult result = FileOperationResult(platform::CopyItem(source_, destination_));
  if (copyProgress_ != nullptr) (void)copyProgress_(progressData_);
  return result;
}

}  // namespace orb

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/fileops/progress.h>
#include <orb/result.h>

#include <string>

namespace orb {

/// One copy of an item with a call to the progress callback before it, which can cancel, and one
/// after it in every case, whose answer counts no more.
class OrbCopyPath {
 public:
  OrbCopyPath(std::string source, std::string destination);

  void SetProgress(OrbProgressProc progress, void* data);
  OrbResult Perform() const;

 private:
  std::string source_;
  std::string destination_;
  OrbProgressProc copyProgress_ = nullptr;
  void* progressData_ = nullptr;
};

}  // namespace orb

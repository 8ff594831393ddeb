// SPDX-License-Identifier: MIT
#include "fileops/creation_result.h"

#include <optional>

#include "fileops/error_mapping.h"
#include "fileops/failure_diagnosis.h"
#include "strings/string_access.h"

namespace orb {

OrbResult Deliver(const std::string& path, COrbFilePath* result) {
  const COrbStringData text = StringAccess::FromUtf8(path);
  (void)result->Initialize(&text);
  return kOrbNoErr;
}

OrbResult DiagnoseCreation(const platform::Status& failed, const std::string& path) {
  const COrbStringData text = StringAccess::FromUtf8(path);
  const OrbResult code = OrbDiagnoseFailure(std::nullopt, text, nullptr, kOrbOpCreateFile);
  return code == kOrbErrUnknown ? OrbMapError(failed.Reason()) : code;
}

}  // namespace orb

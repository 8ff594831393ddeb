// SPDX-License-Identifier: MIT
#include "fileops/error_mapping.h"

#include <gtest/gtest.h>

#include <tuple>

namespace orb {
namespace {

using platform::Error;
using enum platform::ErrorDomain;

TEST(MapError, ReadsTheTablesByDomainAndCode) {
  const std::tuple<Error, OrbResult, OrbResult> kCases[] = {
      // The Cocoa codes are where the two differ.
      {{kCocoa, 4}, kOrbErrNotFound, kOrbErrUnknown},
      {{kCocoa, 260}, kOrbErrNotFound, kOrbErrNotFound},
      {{kCocoa, 513}, kOrbErrAccessDenied, kOrbErrAccessDenied},
      {{kCocoa, 514}, kOrbErrInvalidName, kOrbErrUnknown},
      {{kCocoa, 516}, kOrbErrFileExists, kOrbErrUnknown},
      {{kCocoa, 640}, kOrbErrDiskFull, kOrbErrDiskFull},
      {{kCocoa, 642}, kOrbErrAccessDenied, kOrbErrUnknown},
      {{kCocoa, 28}, kOrbErrUnknown, kOrbErrUnknown},
      {{kOSStatus, -34}, kOrbErrDiskFull, kOrbErrDiskFull},
      {{kOSStatus, -46}, kOrbErrAccessDenied, kOrbErrAccessDenied},
      {{kOSStatus, -35}, kOrbErrNotFound, kOrbErrNotFound},
      {{kOSStatus, -1301}, kOrbErrAlreadyExists, kOrbErrAlreadyExists},
      {{kOSStatus, -43}, kOrbErrUnknown, kOrbErrUnknown},
      {{kUrl, -1000}, kOrbErrNotFound, kOrbErrNotFound},
      {{kUrl, -1102}, kOrbErrAccessDenied, kOrbErrAccessDenied},
      {{kMach, 2}, kOrbErrUnknown, kOrbErrUnknown},
      {{kPosix, 2}, kOrbErrNotFound, kOrbErrNotFound},
      {{kPosix, 3}, kOrbErrUnknown, kOrbErrUnknown},
      {{kPosix, 12}, kOrbErrOutOfMemory, kOrbErrOutOfMemory},
      {{kPosix, 17}, kOrbErrAlreadyExists, kOrbErrAlreadyExists},
      {{kPosix, 27}, kOrbErrDiskFull, kOrbErrDiskFull},
      {{kPosix, 28}, kOrbErrDiskFull, kOrbErrDiskFull},
      {{kPosix, 30}, kOrbErrAccessDenied, kOrbErrAccessDenied},
      {platform::kBusy, kOrbNoErr, kOrbNoErr},  // There is no error object.
  };
  for (const auto& [error, general, fileOperation] : kCases) {
    EXPECT_EQ(OrbMapError(error), general) << error.code;
    EXPECT_EQ(OrbMapErrorForFileOperation(error), fileOperation) << error.code;
  }
  EXPECT_EQ(OrbMapError({}) + OrbMapErrorForFileOperation({}), kOrbNoErr);
}

}  // namespace
}  // namespace orb

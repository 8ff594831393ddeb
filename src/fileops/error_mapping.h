// SPDX-License-Identifier: MIT
#pragma once

#include <orb/result.h>

#include <optional>

#include "platform/error.h"

namespace orb {

/// The error object of a call, if there is one: not where the call succeeded. An error of the
/// domain kNone counts as none as well.
using ErrorObject = std::optional<platform::Error>;

/// The code of a failure of file information, file times and diagnosis; kOrbNoErr without an error
/// object. What is in no table is kOrbErrUnknown.
OrbResult OrbMapError(const ErrorObject& error);
/// The same for copy, move and removal, which know fewer codes.
OrbResult OrbMapErrorForFileOperation(const ErrorObject& error);

/// The result of a copy, move or removal. One that failed without an error object was denied.
OrbResult FileOperationResult(const platform::Status& status);

}  // namespace orb

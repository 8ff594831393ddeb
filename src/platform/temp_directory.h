// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/error.h"

namespace orb::platform {

/// The folder for scratch files: what $TMPDIR names, if that is an absolute folder. Otherwise one
/// of the effective user's own in the folder that all users share, made with mode 0700 and refused
/// when it is a link, somebody else's or open to others: kNoSuchItem, kNotPermitted.
Result<std::string> TemporaryDirectory(const std::string& shared = "/tmp");

}  // namespace orb::platform

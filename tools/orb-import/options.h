// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "layout.h"

namespace orbimport {

struct Options {
  std::string source;
  std::string destination;
  Layout layout;
  bool dryRun = false;
  bool verify = false;
  bool move = false;  // Then `verify` as well.
  bool fill = false;
  bool json = false;
  bool quiet = false;
  bool verbose = false;
};

enum class Request { kImport, kHelp, kVersion, kBad };

/// Reads the command line. For kBad, `why` says what is wrong with it.
Request ParseOptions(int argc, char** argv, Options& options, std::string& why);

/// What is wrong with an option that getopt_long() did not take, for the user: `found` is ':' or
/// '?' as it said, which it does when its short options begin with ':'.
std::string ComplaintOf(int found, char** argv);

extern const char kHelpText[];

}  // namespace orbimport

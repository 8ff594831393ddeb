// SPDX-License-Identifier: MIT
#include "options.h"

#include <getopt.h>

#include "text.h"

namespace orbimport {

const char kHelpText[] =
    R"(Usage: orb-import [options] SOURCE DESTINATION

Brings the photos, movies and sidecars below the folder SOURCE into folders by
date below the folder DESTINATION. Nothing in SOURCE is changed unless --move is
given, and nothing in DESTINATION is ever overwritten: what is there with the same
size and time is left alone, another file of the same name makes the new one
photo_1.jpg. The RAW, the JPEG and the sidecar of one shot always get the same
number. When it can be told that there is no room for all, nothing is copied.

Options:
      --layout=PATTERN  folders below DESTINATION, by the time of modification:
                        %Y %y year, %m month, %d day, %j day of the year,
                        %H %M %S time, %% a percent sign
                        (default: %Y/%Y-%m-%d)
      --verify          read each copy back from the device and compare it with its
                        source; a copy that differs is taken away again
      --move            --verify, and then put the files that came through into the
                        trash of their volume, shot by shot; those that DESTINATION
                        had before only when all bytes are the same
      --fill            where there is no room for all, copy what fits
  -n, --dry-run         print what would be done and do nothing
      --json            print one JSON object a line and item
  -q, --quiet           no progress and no summary; failures are still listed
  -v, --verbose         print a line for every item
  -h, --help            print this text
  -V, --version         print the version

Examples:
  orb-import /media/card ~/Pictures
      imports a card into ~/Pictures/2026/2026-11-22 and the like
  orb-import --dry-run /media/card ~/Pictures
      shows where everything would go
  orb-import --layout=%Y/%m /media/card ~/Pictures
      a folder a month
  orb-import --json /media/card ~/Pictures | jq -r 'select(.status == "copied").destination'
      the new files, for a script
  orb-import --move /media/card ~/Pictures
      imports a card and clears it; the trash gives back what was cleared

Ctrl-C stops at once and leaves no half file. The same command run again goes on
where it stopped.

Exit status: 0 all done, 1 something failed, 2 wrong usage, 130 stopped by Ctrl-C.
)";

namespace {

enum : int { kLayout = 256, kJson, kVerify, kMove, kFill };

constexpr option kLongOptions[] = {
    {"layout", required_argument, nullptr, kLayout},
    {"verify", no_argument, nullptr, kVerify},
    {"move", no_argument, nullptr, kMove},
    {"fill", no_argument, nullptr, kFill},
    {"dry-run", no_argument, nullptr, 'n'},
    {"json", no_argument, nullptr, kJson},
    {"quiet", no_argument, nullptr, 'q'},
    {"verbose", no_argument, nullptr, 'v'},
    {"help", no_argument, nullptr, 'h'},
    {"version", no_argument, nullptr, 'V'},
    {nullptr, 0, nullptr, 0},
};

Request SetLayout(Options& options, std::string& why) {
  std::string reason;
  if (options.layout.Set(optarg, reason)) return Request::kImport;
  why = "--layout " + Quote(optarg) + ": " + reason;
  return Request::kBad;
}

/// The switch that an option turns on; null for one that is no switch.
bool* SwitchOf(int found, Options& options) {
  switch (found) {
    case kVerify:
      return &options.verify;
    case kMove:
      return &options.move;
    case kFill:
      return &options.fill;
    case kJson:
      return &options.json;
    case 'n':
      return &options.dryRun;
    case 'q':
      return &options.quiet;
    case 'v':
      return &options.verbose;
    default:
      return nullptr;
  }
}

Request ApplyOption(int found, char** argv, Options& options, std::string& why) {
  if (bool* const turnedOn = SwitchOf(found, options)) {
    *turnedOn = true;
    return Request::kImport;
  }
  switch (found) {
    case kLayout:
      return SetLayout(options, why);
    case 'h':
      return Request::kHelp;
    case 'V':
      return Request::kVersion;
    default:
      why = ComplaintOf(found, argv);
      return Request::kBad;
  }
}

}  // namespace

std::string ComplaintOf(int found, char** argv) {
  const std::string given = argv[optind - 1];
  if (found == ':') return Quote(given) + " needs a value";
  if (given.starts_with("--")) return "unknown option or needless value: " + Quote(given);
  return "unknown option " + Quote(std::string("-") + static_cast<char>(optopt));
}

Request ParseOptions(int argc, char** argv, Options& options, std::string& why) {
  optind = 0;  // Starts afresh, also when called twice.
  for (int found; (found = getopt_long(argc, argv, ":nqvhV", kLongOptions, nullptr)) != -1;) {
    const Request request = ApplyOption(found, argv, options, why);
    if (request != Request::kImport) return request;
  }
  if (argc - optind != 2) {
    why = argc - optind < 2 ? "SOURCE and DESTINATION are needed" : "too many arguments";
    return Request::kBad;
  }
  options.verify = options.verify || options.move;
  options.source = argv[optind];
  options.destination = argv[optind + 1];
  return Request::kImport;
}

}  // namespace orbimport

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <cstdint>
#include <iosfwd>
#include <map>
#include <string>
#include <vector>

#include "options.h"
#include "room.h"
#include "scan.h"

namespace orbimport {

enum class Status {
  kCopied,
  kPresent,
  kPlanned,
  kFailed,
  kTrashed,  // After it was copied or found present.
  kKept,     // It was to go to the trash and stays in SOURCE.
};

/// Keeps count of what became of every item, and prints: a line an item on `out` where that was
/// asked for, the failures and the summary at the end. Paths are full in JSON and in the list of
/// failures, and otherwise below SOURCE and DESTINATION.
class Report {
 public:
  Report(const Options& options, std::ostream& out, std::ostream& err)
      : options_(options), out_(out), err_(err) {}

  bool PrintsItems() const { return options_.json || options_.dryRun || options_.verbose; }

  /// `destination` is below DESTINATION; empty when the item never got a place.
  void Add(Status status, const Item& item, const std::string& destination, OrbResult code);
  void AddFailure(const Failure& failure);
  void AddSkip(const Skip& skip);
  /// A file that is not whole and stays, named by the journal.
  void AddUnfinished(const std::string& destination);
  /// One more file whose copy was read back and is as it should be.
  void AddVerified() { ++verified_; }
  /// Tells at once that the destination has no room for all.
  void AddShortage(const Shortage& shortage);

  bool HasFailures() const { return isShort_ || !failures_.empty(); }
  std::uint64_t Copied() const;

  /// The failures, and the summary by type unless that is not wanted.
  void Close(bool interrupted);

 private:
  struct Tally {
    std::uint64_t copied = 0, copiedBytes = 0, present = 0, failed = 0;
  };
  struct Failed {
    std::string path;
    OrbResult code;
  };

  void PrintItem(const char* status,
                 const Item& item,
                 const std::string& destination,
                 OrbResult code);
  void PrintOther(const char* status, const std::string& path, const char* reason, OrbResult code);
  void PrintProblems();
  void PrintPlaces(std::ostream& to) const;
  void PrintTable(std::ostream& to) const;
  void PrintSkips(std::ostream& to) const;
  void PrintSafety(std::ostream& to) const;

  const Options& options_;
  std::ostream& out_;
  std::ostream& err_;
  std::map<eOrbFileType, Tally> tallies_;
  std::map<SkipReason, std::uint64_t> skips_;
  std::vector<std::string> links_;
  std::vector<Failed> failures_;
  std::vector<std::string> unfinished_;
  std::uint64_t verified_ = 0, trashed_ = 0, trashedBytes_ = 0, kept_ = 0;
  bool isShort_ = false;
};

}  // namespace orbimport

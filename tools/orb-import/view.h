// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "journal.h"
#include "plan.h"

namespace orbimport {

/// DESTINATION on disk. Listings and looks are kept until Refresh().
class FolderView : public View {
 public:
  using Promises = std::map<std::string, Promise>;

  /// `source` and `destination` are absolute. `promises` are those of earlier imports.
  FolderView(std::string source, std::string destination, const Promises& promises)
      : source_(std::move(source)), destination_(std::move(destination)), promises_(promises) {}

  std::vector<unsigned> Numbers(const std::string& folder,
                                const std::string& stem,
                                const std::string& tail) override;
  Found Look(const std::string& path, const Item& item) override;
  Found LookNow(const std::string& path, const Item& item);
  void Refresh();

  /// The promised files that stand there unfinished and that no item of this run could finish.
  std::vector<std::string> Unfinished() const;

 private:
  const std::set<std::string>& Names(const std::string& folder);
  bool IsPromised(const std::string& path, const Item& item) const;

  std::string source_;
  std::string destination_;
  const Promises& promises_;
  std::set<std::string> strangers_;  // Promised, but what is there was not written by an import.
  std::map<std::string, std::set<std::string>> names_;
  std::map<std::pair<std::string, std::string>, Found> looks_;
};

/// Whether a file kept the time that it was given, as its volume writes it: a card's keeps even
/// seconds alone.
bool KeptTime(std::uint64_t given, std::uint64_t there);

}  // namespace orbimport

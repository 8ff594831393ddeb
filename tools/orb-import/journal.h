// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace orbimport {

/// What a file of an import will be once it is whole.
struct Promise {
  std::string path;  // Below DESTINATION.
  std::uint64_t size = 0;
  std::uint64_t seconds = 0;  // Of the modification time, since 1904.

  bool operator==(const Promise&) const = default;
};

/// The file .orb-import.journal in DESTINATION. It names every file that an import is about to
/// make, before that file is made, and is removed when all are whole. A journal that is found
/// therefore tells which files a killed import may have left short. While it is open it also keeps
/// a second import away from the same DESTINATION.
class Journal {
 public:
  Journal() = default;
  Journal(const Journal&) = delete;
  Journal& operator=(const Journal&) = delete;
  ~Journal();

  /// Makes DESTINATION and the journal where they are missing. False while another import has the
  /// journal open. One that cannot be opened at all is told by Add(), if anything needs it.
  bool Open(const std::string& destination);
  /// What earlier imports promised, by path.
  const std::map<std::string, Promise>& Old() const { return old_; }

  /// On return the promises are on the device. When it fails nothing may be made.
  OrbResult Add(const std::vector<Promise>& promises);

  /// Removes the file, which only its holder may do.
  void Remove();

  /// What stands in the journal of a DESTINATION, without opening it for oneself.
  static std::map<std::string, Promise> Read(const std::string& destination);

 private:
  enum class Locking { kHeld, kBusy, kAgain };

  OrbResult OpenFile();
  Locking LockFile() const;
  void Close();

  std::string path_;
  int descriptor_ = -1;
  OrbResult opened_ = kOrbErrNotFound;
  std::map<std::string, Promise> old_;
};

std::string FormatPromise(const Promise& promise);
/// The promises of a journal's text. Lines that are none, such as a last one that was cut short,
/// are passed over.
std::map<std::string, Promise> ParsePromises(const std::string& text);

}  // namespace orbimport

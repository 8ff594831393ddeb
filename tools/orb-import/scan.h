// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace orbimport {

/// A file that the type table knows.
struct Item {
  std::string path;  // Below SOURCE.
  eOrbFileType type = eOrbFileType_Unknown;
  std::uint64_t size = 0;
  COrbTime modified;
  COrbTime created;
};

/// Items' times are kept and compared in whole seconds: those are what the library writes.
std::uint64_t WholeSeconds(const COrbTime& time);

enum class SkipReason { kHidden, kLink, kSpecial, kUnknownType, kDestination };

struct Skip {
  std::string path;  // Below SOURCE.
  SkipReason reason;
};

struct Failure {
  std::string path;  // Below SOURCE.
  OrbResult code;
};

struct ScanResult {
  std::vector<Item> items;
  std::vector<Skip> skips;
  std::vector<Failure> failures;
};

/// The type of a name by its extension, also when the rest of the name is no UTF-8.
eOrbFileType TypeOfName(const std::string& name);

/// Walks the folder `root`, an absolute path, in the order of the names' bytes: first the files of
/// a folder, then its folders. Links are not followed, what is hidden is passed over, and so is the
/// folder `destination`. Stops early when `stop` says so.
ScanResult Scan(const std::string& root,
                const std::string& destination,
                const std::function<bool()>& stop);

}  // namespace orbimport

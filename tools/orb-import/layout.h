// SPDX-License-Identifier: MIT
#pragma once

#include <orb/orb.h>

#include <string>

namespace orbimport {

/// The folders below DESTINATION into which a photo of a certain time goes, as a pattern such as
/// %Y/%Y-%m-%d. Knows %Y %y %m %d %j %H %M %S, in local time, and %%.
class Layout {
 public:
  /// False for a pattern that could lead out of DESTINATION or that holds an unknown conversion;
  /// `why` then says which. An empty pattern puts everything into DESTINATION itself.
  bool Set(const std::string& pattern, std::string& why);

  /// 2024/2024-05-01, without a "/" at either end.
  std::string Expand(const COrbTime& time) const;

 private:
  std::string pattern_ = "%Y/%Y-%m-%d";
};

}  // namespace orbimport

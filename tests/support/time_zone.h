// SPDX-License-Identifier: MIT
#pragma once

#include <ctime>
#include <string>

#include "support/environment.h"

namespace orb::test {

/// Sets TZ for one scope.
class TimeZone {
 public:
  explicit TimeZone(const std::string& name) : variable_(std::in_place, "TZ", name) { ::tzset(); }
  ~TimeZone() {
    variable_.reset();
    ::tzset();
  }
  TimeZone(const TimeZone&) = delete;
  TimeZone& operator=(const TimeZone&) = delete;

 private:
  std::optional<ScopedVariable> variable_;
};

}  // namespace orb::test

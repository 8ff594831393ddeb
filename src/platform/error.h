// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <utility>
#include <variant>

namespace orb::platform {

/// Where an error code comes from. The result-code tables are read by domain and code.
enum class ErrorDomain {
  /// The call failed and there is no error to tell why: the item is busy.
  kNone,
  kOSStatus,
  kCocoa,
  kUrl,
  kMach,
  kPosix,
};

struct Error {
  ErrorDomain domain = ErrorDomain::kNone;
  int code = 0;

  bool operator==(const Error&) const = default;
};

/// Failed without an error object.
constexpr Error kBusy{};
constexpr Error kNoSuchItem{ErrorDomain::kCocoa, 260};
constexpr Error kInvalidName{ErrorDomain::kCocoa, 514};
constexpr Error kNotPermitted{ErrorDomain::kCocoa, 513};
constexpr Error kItemExists{ErrorDomain::kCocoa, 516};
constexpr Error kVolumeFull{ErrorDomain::kCocoa, 640};

/// A value or the reason why there is none.
template <typename T>
class [[nodiscard]] Result {
 public:
  Result(const T& value) : state_(std::in_place_index<0>, value) {}
  Result(T&& value) : state_(std::in_place_index<0>, std::move(value)) {}
  Result(Error error) : state_(std::in_place_index<1>, error) {}

  bool Ok() const { return state_.index() == 0; }
  explicit operator bool() const { return Ok(); }
  const T& Value() const& { return std::get<0>(state_); }
  T& Value() & { return std::get<0>(state_); }
  T&& Value() && { return std::get<0>(std::move(state_)); }
  Error Reason() const { return std::get<1>(state_); }

 private:
  std::variant<T, Error> state_;
};

/// Success or the reason why not.
template <>
class [[nodiscard]] Result<void> {
 public:
  Result() = default;
  Result(Error error) : error_(error) {}

  bool Ok() const { return !error_; }
  explicit operator bool() const { return Ok(); }
  Error Reason() const { return *error_; }

 private:
  std::optional<Error> error_;
};

using Status = Result<void>;

}  // namespace orb::platform

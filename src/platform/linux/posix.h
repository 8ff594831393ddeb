// SPDX-License-Identifier: MIT
#pragma once

#include <unistd.h>

#include <cerrno>
#include <utility>

#include "platform/errno_keeper.h"
#include "platform/error.h"

namespace orb::platform {

/// The error that an errno value stands for. Only this function knows how.
Error ErrorFromErrno(int number);
/// The error of the call that failed last. Call it before anything can overwrite errno.
Error LastError();
/// The same for a removal, where a busy item is a failure without an error object.
Error LastRemovalError();

/// Repeats a call that a signal cut short.
template <typename Call>
auto Retry(Call call) {
  auto result = call();
  while (result == -1 && errno == EINTR) result = call();
  return result;
}

/// Owns a descriptor and closes it once.
class UniqueFd {
 public:
  UniqueFd() = default;
  explicit UniqueFd(int fd) : fd_(fd) {}
  UniqueFd(UniqueFd&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
  UniqueFd& operator=(UniqueFd&& other) noexcept {
    if (this != &other) Reset(std::exchange(other.fd_, -1));
    return *this;
  }
  UniqueFd(const UniqueFd&) = delete;
  UniqueFd& operator=(const UniqueFd&) = delete;
  ~UniqueFd() { Reset(); }

  int Get() const { return fd_; }
  explicit operator bool() const { return fd_ >= 0; }
  int Release() { return std::exchange(fd_, -1); }
  /// Closes what it holds, keeping errno.
  void Reset(int fd = -1);
  /// Closes and says whether that failed: a late write error shows here.
  bool Close();

 private:
  int fd_ = -1;
};

}  // namespace orb::platform

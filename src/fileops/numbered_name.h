// SPDX-License-Identifier: MIT
#pragma once

#include <orb/strings/string_data.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orb {

/// The names that a wanted name gives way to: photo.jpg, then photo_1.jpg, photo_2.jpg and so on.
class NumberedName {
 public:
  explicit NumberedName(const COrbStringData& name);

  /// Number 0 is the name itself.
  std::string With(std::uint32_t number) const;
  /// The number from 1 up that gives a name; nothing for any other name.
  std::optional<std::uint32_t> NumberOf(std::string_view name) const;
  /// What all the names begin with.
  std::string Stem() const { return stem_.substr(0, stem_.size() - 1); }
  /// Whether all of them can be names of entries. One with a "/" leads into another folder.
  bool AreOfEntries() const;

 private:
  std::string name_;
  std::string stem_;       // Up to and with the "_".
  std::string extension_;  // With its dot.
};

/// Which numbers are taken, as far as the lowest free one can lie.
class TakenNumbers {
 public:
  explicit TakenNumbers(const std::vector<std::uint32_t>& numbers);

  /// The lowest number from `start` up that is free.
  std::uint32_t NextFree(std::uint32_t start) const;

 private:
  std::vector<bool> taken_;
};

}  // namespace orb

// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "strings/string_access.h"

/// \file
/// Cutting, replacing, splitting and trimming of UTF-8 texts. What counts UTF-16 units and cuts a
/// surrogate pair leaves U+FFFD for each half.

namespace orb {

/// The bytes with their scan.
Utf8Text Scanned(std::string_view bytes);

/// The first match of `find` by canonical equivalence, or kNotFound.
std::size_t FindEquivalent(const Utf8Text& text, const Utf8Text& find);
/// The same without regard to case.
std::size_t FindFolded(const Utf8Text& text, const Utf8Text& find);

/// The `count` units from unit `start` of a valid text.
std::string Middle(std::string_view text, std::size_t start, std::size_t count);

/// From each match as many units are replaced as `find` has, whatever the match's own length; what
/// follows them is searched like a text of its own.
class Replaced {
 public:
  Replaced(const Utf8Text& text, const Utf8Text& find, std::string_view with);

  std::string_view View() const { return view_; }

 private:
  void ReplaceInSteps(const Utf8Text& text, const Utf8Text& find, std::string_view with);
  void ReplaceLiterally(std::string_view text, std::string_view find, std::string_view with);

  std::string_view view_;  // Of one of these, or of the text itself where nothing is replaced.
  std::string inSteps_;
  std::unique_ptr<char[]> literally_;
};

/// The pieces of a text between separators, without the empty ones; none when there is no
/// separator. They lie in the text or in this object.
class Pieces {
 public:
  Pieces(const Utf8Text& text, const Utf8Text& separator);
  Pieces(const Pieces&) = delete;
  Pieces& operator=(const Pieces&) = delete;
  ~Pieces() = default;

  const std::vector<std::string_view>& Views() const { return views_; }

 private:
  void Add(std::string_view piece);
  void SplitLiterally(std::string_view text, std::string_view separator);
  void SplitInSteps(const Utf8Text& text, const Utf8Text& separator);

  std::vector<std::string_view> views_;
  std::string repaired_;
};

enum class Trimming {
  kNothing,     ///< The text holds no character of the set.
  kEverything,  ///< Nothing remains.
  kSome,
};
struct Trimmed {
  Trimming extent = Trimming::kNothing;
  std::optional<std::string> text;  ///< For kSome; without value where nothing can be cut out.
};
/// Takes the characters of `set`, which must not be empty, from the ends of a text.
Trimmed Trim(const Utf8Text& text, const Utf8Text& set, bool left, bool right);

}  // namespace orb

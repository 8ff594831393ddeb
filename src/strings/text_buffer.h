// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdlib>
#include <cstring>

namespace orb {

/// Memory for one copy of a text, with the length of the text in front of it.
struct TextBuffer {
  /// The text begins where a block may begin.
  static constexpr std::size_t kBefore = alignof(std::max_align_t);

  /// Null without memory.
  static void* Make(std::size_t size) { return Behind(std::malloc(kBefore + size)); }
  /// The buffer in another size, moved if need be; as it is without memory.
  static void* Resized(void* text, std::size_t size) {
    void* block = std::realloc(Block(text), kBefore + size);
    return block == nullptr ? text : Behind(block);
  }
  static void Free(void* text) {
    if (text != nullptr) std::free(Block(text));
  }

  static std::size_t Length(const void* text) {
    std::size_t length = 0;
    std::memcpy(&length, static_cast<const char*>(text) - sizeof length, sizeof length);
    return length;
  }
  static void SetLength(void* text, std::size_t length) {
    std::memcpy(static_cast<char*>(text) - sizeof length, &length, sizeof length);
  }

 private:
  static void* Behind(void* block) {
    return block == nullptr ? nullptr : static_cast<char*>(block) + kBefore;
  }
  static void* Block(void* text) { return static_cast<char*>(text) - kBefore; }
};

}  // namespace orb

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>

#include <cstdint>

/// \file
/// Sizes, positions and rectangles in pixels, and a block of bytes that has one owner. Views lay
/// out thumbnails and bitmaps with them, output settings carry an image size, a colour profile its
/// bytes.
///
/// Like all records they are plain values without locks: each object belongs to one thread at a
/// time, copies are independent of each other.

/// How wide and how high something is.
class ORB_EXPORT COrbSize {
 public:
  COrbSize() = default;
  COrbSize(std::int32_t w, std::int32_t h) : width(w), height(h) {}
  COrbSize(const COrbSize&) = default;
  COrbSize(COrbSize&&) noexcept = default;
  COrbSize& operator=(const COrbSize&) = default;
  COrbSize& operator=(COrbSize&&) noexcept = default;
  virtual ~COrbSize();

  std::int32_t width = 0;
  std::int32_t height = 0;
};

/// Where something is.
class ORB_EXPORT COrbPoint {
 public:
  COrbPoint() = default;
  COrbPoint(std::int32_t xPosition, std::int32_t yPosition) : x(xPosition), y(yPosition) {}
  COrbPoint(const COrbPoint&) = default;
  COrbPoint(COrbPoint&&) noexcept = default;
  COrbPoint& operator=(const COrbPoint&) = default;
  COrbPoint& operator=(COrbPoint&&) noexcept = default;
  virtual ~COrbPoint();

  std::int32_t x = 0;
  std::int32_t y = 0;
};

/// Two corners in no particular order: right may lie left of left.
class ORB_EXPORT COrbRect {
 public:
  COrbRect() = default;
  COrbRect(std::int32_t l, std::int32_t t, std::int32_t r, std::int32_t b)
      : left(l), top(t), right(r), bottom(b) {}
  COrbRect(const COrbRect&) = default;
  COrbRect(COrbRect&&) noexcept = default;
  COrbRect& operator=(const COrbRect&) = default;
  COrbRect& operator=(COrbRect&&) noexcept = default;
  virtual ~COrbRect();

  bool operator==(const COrbRect&) const = default;
  bool operator!=(const COrbRect&) const = default;

  /// right - left: 0 to 10 is 10 wide, 10 to 0 is -10. A difference beyond 32 bits wraps around.
  std::int32_t Width() const;
  /// bottom - top, in the same way.
  std::int32_t Height() const;

  std::int32_t left = 0;
  std::int32_t top = 0;
  std::int32_t right = 0;
  std::int32_t bottom = 0;
};

/// A block of bytes from malloc that belongs to this object alone. There is never a size without a
/// block: where memory runs out, the buffer is left empty.
class ORB_EXPORT COrbBuffer {
 public:
  COrbBuffer() = default;
  /// Copies the bytes; no moves, so that every transfer does.
  COrbBuffer(const COrbBuffer& other);
  COrbBuffer& operator=(const COrbBuffer& other);
  virtual ~COrbBuffer();

  /// Puts a new block in the place of the old one, whose content is lost; its bytes are not
  /// cleared. Returns the block, null when there is no memory for it.
  void* Allocate(unsigned int byteCount);
  /// Leaves the buffer empty: no block, size 0.
  void Free();
  /// The block, to read and to fill. It stays the buffer's own.
  void* GetBuffer() const { return data; }
  unsigned int GetSize() const { return size; }

  void* data = nullptr;    ///< From malloc: whoever sets it by hand hands the block over.
  std::uint32_t size = 0;  ///< In bytes.
};

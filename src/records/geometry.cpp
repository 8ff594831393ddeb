// SPDX-License-Identifier: MIT
#include <orb/records/geometry.h>

#include <cstdlib>
#include <cstring>

namespace {

/// Without the undefined overflow of signed numbers.
std::int32_t Difference(std::int32_t a, std::int32_t b) {
  return static_cast<std::int32_t>(static_cast<std::uint32_t>(a) - static_cast<std::uint32_t>(b));
}

}  // namespace

COrbSize::~COrbSize() = default;

COrbPoint::~COrbPoint() = default;

COrbRect::~COrbRect() = default;

std::int32_t COrbRect::Width() const { return Difference(right, left); }

std::int32_t COrbRect::Height() const { return Difference(bottom, top); }

COrbBuffer::COrbBuffer(const COrbBuffer& other) { *this = other; }

COrbBuffer& COrbBuffer::operator=(const COrbBuffer& other) {
  if (this == &other) return *this;
  Free();
  if (other.size == 0 || other.data == nullptr) return *this;
  if (Allocate(other.size) != nullptr) std::memcpy(data, other.data, other.size);
  return *this;
}

COrbBuffer::~COrbBuffer() { Free(); }

void* COrbBuffer::Allocate(unsigned int byteCount) {
  std::free(data);
  data = std::malloc(byteCount);
  size = data != nullptr ? byteCount : 0;
  return data;
}

void COrbBuffer::Free() {
  std::free(data);
  data = nullptr;
  size = 0;
}

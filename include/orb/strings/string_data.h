// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/platform/core_foundation.h>
#include <orb/result.h>
#include <orb/strings/char_types.h>
#include <orb/thread/critical_section.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <new>
#include <string_view>

namespace orb {
struct StringAccess;
}

/// One text in up to three encodings at once: the system encoding (Mac OS Roman), UTF-8 and UTF-16.
/// The encoding in which it was set is the master; the other two are made on the first request and
/// kept. Lengths and positions in characters are UTF-16 units.
///
/// A string has no value (as it is made), a value without text (after an initialiser was given a
/// null pointer), or a value with a text, possibly the empty text. IsEmpty() is true for the first
/// two and for the empty text.
///
/// Copies share one immutable value and copy no text; setting a text always makes a new value, so
/// other copies keep the old one. Distinct strings may be used on different threads even when they
/// share a value. One string must not be used by two threads at once while one of them changes it;
/// the first pointer accessor on a string without value does change it.
class ORB_EXPORT COrbStringData {
 public:
  class COrbStringValue;

  /// No value.
  COrbStringData() = default;
  /// Shares the other string's value.
  COrbStringData(const COrbStringData& other);
  /// Takes the other string's place; it is left without value.
  COrbStringData(COrbStringData&& other) noexcept;
  COrbStringData(const OrbCharSystem& text);
  COrbStringData(const OrbCharUtf8& text);
  COrbStringData(const OrbCharUnicode& text);
  COrbStringData(const OrbCharPlatform& text);
  COrbStringData& operator=(const COrbStringData& other);
  COrbStringData& operator=(COrbStringData&& other) noexcept;
  virtual ~COrbStringData();

  /// Lets go of the value. Afterwards the string has none.
  void Clear();

  /// The initialisers copy the text up to its terminating zero into a new value; they do not check
  /// that it is valid in its encoding. The text may be one that this string handed out.
  /// A null pointer gives kOrbErrUnknown and a value without text. std::bad_alloc, and the string
  /// as it was, when there is no memory for a value.
  OrbResult InitWithSystemEncoding(const char* text);
  OrbResult InitWithUtf8(const char* text);
  OrbResult InitWithUnicode(const unsigned short* text);
  OrbResult InitWithChar(const OrbCharSystem& text);
  OrbResult InitWithChar(const OrbCharUtf8& text);
  OrbResult InitWithChar(const OrbCharUnicode& text);
  OrbResult InitWithChar(const OrbCharPlatform& text);
  /// Takes the text as UTF-8. A null string gives kOrbErrUnknown and leaves no value.
  OrbResult InitWithCFString(const __CFString* text);

  /// The text in one encoding, zero-terminated. It stays valid until the last of the strings that
  /// share the value lets go of it. A string without value gets one without text first and yields
  /// "". A text that cannot be read in its own encoding yields "" in the others. Null only when
  /// there is no memory for the copy.
  const char* GetPtrSystemEncoding() const;
  const char* GetPtrUtf8() const;
  const unsigned short* GetPtrUnicode() const;
  /// The UTF-8 text.
  const char* GetPtrPlatform() const;
  OrbCharPlatform GetCharPlatform() const;
  OrbCharUnicode GetCharUnicode() const;

  /// Lengths without the terminating zero; 0 for a string without value, which stays without.
  unsigned long GetLengthByteSystemEncoding() const;
  unsigned long GetLengthByteUtf8() const;
  unsigned long GetLengthByteUnicode() const;
  unsigned long GetLengthBytePlatform() const;
  /// The length in UTF-16 units; 0 for a text that cannot be read in its encoding.
  unsigned long GetLengthChar() const;

  /// Whether the copy in that encoding is there already. They make nothing.
  bool HasValueSystemEncoding() const;
  bool HasValueUtf8() const;
  bool HasValueUnicode() const;

  /// True without value, without text and for the empty text, and for a system text that cannot be
  /// read. A UTF-8 text that is not valid is not empty.
  bool IsEmpty() const;

  /// A new CFString that the caller releases; empty for a text that is not UTF-8. Never null:
  /// std::bad_alloc when there is no memory for it.
  CFStringRef CreateCopyCFString() const;

  /// The `count` characters from `start`, fewer where the text ends. No value when `start` is not
  /// below the length; a count of 0 gives the empty text.
  COrbStringData Mid(unsigned long start, unsigned long count) const;
  /// This text followed by the other's. Always has a value.
  COrbStringData operator+(const COrbStringData& other) const;
  COrbStringData& operator+=(const COrbStringData& other);

 private:
  friend struct orb::StringAccess;

  void Share(const COrbStringData& other);
  void TakePlaceOf(COrbStringData& other) noexcept;
  void TakeNeighboursOf(COrbStringData& other) noexcept;
  /// Whether this was the last owner.
  ORB_LOCAL bool LeaveChain(const COrbStringValue& left);
  ORB_LOCAL OrbResult Init(std::uint8_t encoding, const void* text, std::size_t size);
  ORB_LOCAL COrbStringValue* EnsureValue() const;

  // Every owner of one value stands in a chain, changed under the value's lock alone. An owner
  // reads its own two places without it: null is what its last neighbour leaves there at the end.
  mutable std::atomic<COrbStringData*> prev{nullptr};
  mutable std::atomic<COrbStringData*> next{nullptr};
  mutable COrbStringValue* value = nullptr;
};

/// The text that copies of a string share. A copy once stored never changes until Clear(), so its
/// pointer is published with release, behind its length, and read without the lock. The accessors
/// are const and make what they need all the same: the text does not change by it.
class ORB_EXPORT COrbStringData::COrbStringValue {
 public:
  COrbStringValue() = default;
  COrbStringValue(const COrbStringValue&) = delete;
  COrbStringValue& operator=(const COrbStringValue&) = delete;
  virtual ~COrbStringValue();
  // A value may share its block with its text, so the block's size is not the class's.
  static void operator delete(void* block) { ::operator delete(block); }

  /// Drops all copies; the next initialiser counts again. No other thread may use the value.
  void Clear();

  /// The first one to be given a text wins; later calls are ignored and give 0. A null pointer
  /// gives kOrbErrUnknown.
  OrbResult InitWithSystemEncoding(const char* text);
  OrbResult InitWithUtf8(const char* text);
  OrbResult InitWithUnicode(const unsigned short* text);

  const char* GetPtrSystemEncoding() const;
  const char* GetPtrUtf8() const;
  const unsigned short* GetPtrUnicode() const;
  unsigned long GetLengthByteSystemEncoding() const;
  unsigned long GetLengthByteUtf8() const;
  unsigned long GetLengthByteUnicode() const;
  unsigned long GetLengthChar() const;
  bool HasValueSystemEncoding() const;
  bool HasValueUtf8() const;
  bool HasValueUnicode() const;
  bool IsEmpty() const;

 private:
  friend class COrbStringData;
  friend struct orb::StringAccess;

  ORB_LOCAL static COrbStringValue* Make(std::uint8_t encoding,
                                         std::string_view bytes,
                                         std::string_view more);
  class Hold;
  const COrbCriticalSection& Lock() const noexcept;
  [[gnu::cold, gnu::noinline]] const COrbCriticalSection& MakeLock() const noexcept;
  template <typename Store>
  ORB_LOCAL OrbResult InitOnce(const void* text, std::uint8_t encoding, Store store);
  ORB_LOCAL const char* DeriveSystem() const;
  ORB_LOCAL const char* DeriveUtf8() const;
  ORB_LOCAL const unsigned short* DeriveUnicode() const;

  // Most values have one owner and one encoding for all their life and never need the lock, which
  // is as large as all the rest: it is made when it is first asked for.
  mutable std::atomic<const COrbCriticalSection*> lock{nullptr};
  // The length of each copy, in its units, stands in front of it.
  mutable std::atomic<char*> systemText{nullptr};
  mutable std::atomic<unsigned short*> unicodeText{nullptr};
  mutable std::atomic<std::uint8_t> master{0};
  // Whether the value ever had a second owner; false means that the one who asks is alone. Relaxed
  // is enough: an owner that a copy made has set it itself, and one that was copied from is neither
  // moved nor cleared before its caller knows that the copying is done.
  std::atomic<bool> shared{false};
  std::uint8_t inBlock = 0;  // The encoding whose copy lies behind the value; 0 for none.
  // What a scan of the UTF-8 text found: its kind, 0 before the scan, and its length in units.
  mutable std::atomic<std::uint8_t> scannedKind{0};
  mutable std::atomic<std::uint32_t> scannedLength{0};
  // Stands last, next to a text that lies behind the value.
  mutable std::atomic<char*> utf8Text{nullptr};
};

// Strings are passed by value everywhere: what happens then stands here, so that no call is spent
// on it beyond those of the lock.

inline COrbStringData::COrbStringData(const COrbStringData& other) { Share(other); }

inline COrbStringData::COrbStringData(COrbStringData&& other) noexcept { TakePlaceOf(other); }

inline const COrbCriticalSection& COrbStringData::COrbStringValue::Lock() const noexcept {
  const COrbCriticalSection* made = lock.load(std::memory_order_acquire);
  return made != nullptr ? *made : MakeLock();
}

/// Keeps every other thread out of a value. Where there is none, there is no need for the lock.
class COrbStringData::COrbStringValue::Hold {
 public:
  explicit Hold(const COrbStringValue& held) : lock_(orb::IsOnlyThread() ? nullptr : &held.Lock()) {
    if (lock_ != nullptr) lock_->Enter();
  }
  ~Hold() {
    if (lock_ != nullptr) lock_->Leave();
  }
  Hold(const Hold&) = delete;
  Hold& operator=(const Hold&) = delete;

 private:
  const COrbCriticalSection* lock_;
};

// Nobody may change `other` meanwhile, so its value stays the same and alive.
inline void COrbStringData::Share(const COrbStringData& other) {
  COrbStringValue* const theirs = other.value;
  if (theirs == nullptr) return;
  const COrbStringValue::Hold hold(*theirs);
  // Written once, so that the owners on other processors keep the value in their caches.
  if (!theirs->shared.load(std::memory_order_relaxed)) {
    theirs->shared.store(true, std::memory_order_relaxed);
  }
  COrbStringData* const behind = other.next.load(std::memory_order_relaxed);
  value = theirs;
  // Nobody else reads these yet: made anew and not stored to, for which the compiler would warn a
  // caller that fills a vector.
  ::new (&prev) std::atomic<COrbStringData*>(const_cast<COrbStringData*>(&other));
  ::new (&next) std::atomic<COrbStringData*>(behind);
  if (behind != nullptr) behind->prev.store(this, std::memory_order_relaxed);
  other.next.store(this, std::memory_order_relaxed);
}

// Without neighbours there is nobody to tell. None can come either: that would need a copy of
// `other`, which nobody may use meanwhile. A neighbour that is just leaving has done with `other`.
inline void COrbStringData::TakePlaceOf(COrbStringData& other) noexcept {
  value = other.value;
  other.value = nullptr;
  if (other.prev.load(std::memory_order_acquire) != nullptr ||
      other.next.load(std::memory_order_acquire) != nullptr) {
    TakeNeighboursOf(other);
  }
}

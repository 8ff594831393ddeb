// SPDX-License-Identifier: MIT
#include <orb/strings/string_data.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <new>
#include <optional>
#include <string>
#include <string_view>

#include "platform/transcode.h"
#include "strings/string_access.h"
#include "strings/text_buffer.h"

namespace {

using orb::TextBuffer;
using orb::platform::AsciiFromUtf16;
using orb::platform::IsAscii;
using orb::platform::kNotUtf8;
using orb::platform::kSlack;
using orb::platform::MacRomanFromUtf16;
using orb::platform::Utf16FromAscii;
using orb::platform::Utf16FromUtf8;
using orb::platform::Utf16Length;
using orb::platform::Utf16LengthOfValid;
using orb::platform::Utf8FromMacRoman;
using orb::platform::Utf8FromUtf16;

enum Master : std::uint8_t { kNone = 0, kSystem = 1, kUtf8 = 2, kUnicode = 3 };

/// Up to here a text is converted on the stack and then copied at its size.
constexpr std::size_t kShort = 256;
constexpr std::size_t kMostOnStack = 3072;
/// How much of a text is looked at before it is taken for ASCII.
constexpr std::size_t kFirstLook = 32;

/// Null without memory.
void* BlockFor(std::size_t size) noexcept try {
  return ::operator new(size);
} catch (const std::bad_alloc&) {
  return nullptr;
}

/// A text on its way to being stored; `text` is null when there was no memory.
template <typename Unit>
struct Copy {
  Unit* text;
  std::size_t length;
};

template <typename Unit>
Unit* Buffer(std::size_t size) {
  return static_cast<Unit*>(TextBuffer::Make(size));
}

Copy<char> Duplicate(std::string_view text) {
  auto* copy = Buffer<char>(text.size() + 1);
  if (copy == nullptr) return {nullptr, 0};
  if (!text.empty()) std::memcpy(copy, text.data(), text.size());
  copy[text.size()] = '\0';
  return {copy, text.size()};
}

Copy<unsigned short> Duplicate(const unsigned short* text, std::size_t length) {
  const std::size_t size = (length + 1) * sizeof(unsigned short);
  auto* copy = Buffer<unsigned short>(size);
  if (copy != nullptr) std::memcpy(copy, text, size);
  return {copy, length};
}

/// Gives back what a buffer has too much. A large one is copied: an allocator that maps such sizes
/// learns to keep them only when they are freed as large as they were asked for, and would map the
/// next one anew.
char* Shrunk(char* buffer, std::size_t size, std::size_t before) {
  constexpr std::size_t kLarge = std::size_t{64} * 1024;
  if (before < kLarge) return static_cast<char*>(TextBuffer::Resized(buffer, size));
  char* exact = Buffer<char>(size);
  if (exact == nullptr) return buffer;
  std::memcpy(exact, buffer, size);
  TextBuffer::Free(buffer);
  return exact;
}

/// `most` bounds what `write` writes, without its slack; it returns the length.
template <typename Write>
Copy<char> Written(std::size_t most, Write write) {
  if (most <= kMostOnStack) {
    std::array<char, kMostOnStack + kSlack> buffer;
    return Duplicate({buffer.data(), write(buffer.data())});
  }
  auto* made = Buffer<char>(most + kSlack);
  if (made == nullptr) return {nullptr, 0};
  const std::size_t length = write(made);
  made[length] = '\0';
  return {Shrunk(made, length + 1, most + kSlack), length};
}

/// The UTF-16 copy has room for twice its units, all zero behind the text.
constexpr std::size_t UnicodeSize(std::size_t length) { return (length + 1) * 4; }

Copy<unsigned short> Terminated(unsigned short* text, std::size_t length) {
  std::memset(text + length, 0, UnicodeSize(length) - length * sizeof *text);
  return {text, length};
}

/// Nothing where the text is not ASCII alone. Most texts that are not show it where they begin, and
/// what others have cost by then is little.
std::optional<Copy<unsigned short>> UnicodeFromAscii(std::string_view utf8) {
  if (!IsAscii(utf8.substr(0, kFirstLook))) return std::nullopt;
  auto* made = Buffer<unsigned short>(UnicodeSize(utf8.size()));
  if (made == nullptr) return std::nullopt;
  const std::size_t length = Utf16FromAscii(utf8, reinterpret_cast<char16_t*>(made));
  if (length == utf8.size()) return Terminated(made, length);
  TextBuffer::Free(made);
  return std::nullopt;
}

std::optional<Copy<char>> Utf8FromAscii(std::u16string_view units) {
  if (!IsAscii(units.substr(0, kFirstLook))) return std::nullopt;
  auto* made = Buffer<char>(units.size() + 1);
  if (made == nullptr) return std::nullopt;
  made[units.size()] = '\0';
  if (AsciiFromUtf16(units, made) == units.size()) return Copy<char>{made, units.size()};
  TextBuffer::Free(made);
  return std::nullopt;
}

Copy<char> Utf8From(std::u16string_view units) {
  if (const auto ascii = Utf8FromAscii(units)) return *ascii;
  return Written(3 * units.size(), [&](char* out) { return Utf8FromUtf16(units, out); });
}

Copy<unsigned short> ShortUnicode(std::string_view utf8) {
  std::array<char16_t, kShort + kSlack> units;
  std::size_t length = Utf16FromUtf8(utf8, units.data());
  if (length == kNotUtf8) length = 0;
  auto* made = Buffer<unsigned short>(UnicodeSize(length));
  if (made == nullptr) return {nullptr, 0};
  std::memcpy(made, units.data(), length * sizeof *made);
  return Terminated(made, length);
}

/// The second half of the room takes what the conversion overwrites. A text with fewer units than a
/// third of its bytes is no UTF-8, and one with more has that much room.
Copy<unsigned short> UnicodeFrom(std::string_view utf8) {
  if (utf8.size() <= kShort) return ShortUnicode(utf8);
  if (const auto ascii = UnicodeFromAscii(utf8)) return *ascii;
  static_assert(kShort / 3 > kSlack);
  const std::size_t most = Utf16LengthOfValid(utf8);
  if (most < utf8.size() / 3) return ShortUnicode({});
  auto* made = Buffer<unsigned short>(UnicodeSize(most));
  if (made == nullptr) return {nullptr, 0};
  const std::size_t length = Utf16FromUtf8(utf8, reinterpret_cast<char16_t*>(made));
  if (length == most) return Terminated(made, length);
  TextBuffer::Free(made);
  return ShortUnicode({});
}

Copy<char> SystemFrom(std::string_view utf8) try {
  const std::optional<std::u16string> units = Utf16FromUtf8(utf8);
  return Duplicate(units ? MacRomanFromUtf16(*units).bytes : std::string());
} catch (const std::bad_alloc&) {
  return {nullptr, 0};
}

/// Publishes a copy behind its length.
template <typename Unit>
Unit* Stored(std::atomic<Unit*>& place, Copy<Unit> copy) {
  if (copy.text != nullptr) TextBuffer::SetLength(copy.text, copy.length);
  place.store(copy.text, std::memory_order_release);
  return copy.text;
}

/// Of a copy that may be missing.
std::size_t LengthOf(const void* text) { return text == nullptr ? 0 : TextBuffer::Length(text); }

/// Stands in where there is no memory for a lock: it may be that of many values, for no thread
/// holds those of two. It is there as long as there are strings, to the very end.
union Reserve {
  constexpr Reserve() : lock() {}
  ~Reserve() {}  // NOLINT(modernize-use-equals-default): leaves the lock alone.
  Reserve(const Reserve&) = delete;
  Reserve& operator=(const Reserve&) = delete;
  COrbCriticalSection lock;
};
constinit Reserve reserve;

}  // namespace

// A value behind which its text lies: one allocation. Where there is no memory for both, the value
// stands alone, its text missing.
COrbStringData::COrbStringValue* COrbStringData::COrbStringValue::Make(std::uint8_t encoding,
                                                                       std::string_view bytes,
                                                                       std::string_view more) {
  const std::size_t unit = encoding == kUnicode ? sizeof(unsigned short) : 1;
  const std::size_t size = bytes.size() + more.size();
  void* block = BlockFor(sizeof(COrbStringValue) + sizeof(std::size_t) + size + unit);
  auto* made = block == nullptr ? new COrbStringValue : ::new (block) COrbStringValue;
  made->master.store(encoding, std::memory_order_relaxed);
  if (block == nullptr) return made;
  made->inBlock = encoding;
  auto* copy = reinterpret_cast<char*>(made + 1) + sizeof(std::size_t);
  bytes.copy(copy, bytes.size());
  more.copy(copy + bytes.size(), more.size());
  std::memset(copy + size, 0, unit);
  if (encoding == kSystem) Stored(made->systemText, {copy, size});
  if (encoding == kUtf8) Stored(made->utf8Text, {copy, size});
  if (encoding == kUnicode) {
    Stored(made->unicodeText, {reinterpret_cast<unsigned short*>(copy), size / unit});
  }
  return made;
}

COrbStringData::COrbStringValue::~COrbStringValue() {
  const auto drop = [this](const auto& copy, std::uint32_t encoding) {
    if (inBlock != encoding) TextBuffer::Free(copy.load(std::memory_order_relaxed));
  };
  drop(systemText, kSystem);
  drop(utf8Text, kUtf8);
  drop(unicodeText, kUnicode);
  const COrbCriticalSection* made = lock.load(std::memory_order_relaxed);
  if (made != &reserve.lock) delete made;
}

void COrbStringData::COrbStringValue::Clear() {
  // Only strings make values that share a block, and they never clear them.
  TextBuffer::Free(systemText.exchange(nullptr));
  TextBuffer::Free(utf8Text.exchange(nullptr));
  TextBuffer::Free(unicodeText.exchange(nullptr));
  master = kNone;
  scannedKind = 0;
}

const COrbCriticalSection& COrbStringData::COrbStringValue::MakeLock() const noexcept {
  const auto* made = new (std::nothrow) COrbCriticalSection;
  const COrbCriticalSection* there = nullptr;
  const COrbCriticalSection* const ours = made != nullptr ? made : &reserve.lock;
  if (lock.compare_exchange_strong(there, ours, std::memory_order_acq_rel)) return *ours;
  delete made;
  return *there;
}

/// Stores the first text that a value is given; later ones are ignored.
template <typename Store>
OrbResult COrbStringData::COrbStringValue::InitOnce(const void* text,
                                                    std::uint8_t encoding,
                                                    Store store) {
  if (text == nullptr) return kOrbErrUnknown;
  if (master != kNone) return kOrbNoErr;
  const Hold hold(*this);
  if (master != kNone) return kOrbNoErr;
  store();
  master = encoding;
  return kOrbNoErr;
}

OrbResult COrbStringData::COrbStringValue::InitWithSystemEncoding(const char* text) {
  return InitOnce(text, kSystem, [&] { Stored(systemText, Duplicate(text)); });
}

OrbResult COrbStringData::COrbStringValue::InitWithUtf8(const char* text) {
  return InitOnce(text, kUtf8, [&] { Stored(utf8Text, Duplicate(text)); });
}

OrbResult COrbStringData::COrbStringValue::InitWithUnicode(const unsigned short* text) {
  return InitOnce(text, kUnicode, [&] { Stored(unicodeText, Duplicate(text, Utf16Length(text))); });
}

const char* COrbStringData::COrbStringValue::GetPtrSystemEncoding() const {
  const char* made = systemText.load(std::memory_order_acquire);
  return made != nullptr ? made : DeriveSystem();
}

const char* COrbStringData::COrbStringValue::GetPtrUtf8() const {
  const char* made = utf8Text.load(std::memory_order_acquire);
  return made != nullptr ? made : DeriveUtf8();
}

const unsigned short* COrbStringData::COrbStringValue::GetPtrUnicode() const {
  const unsigned short* made = unicodeText.load(std::memory_order_acquire);
  return made != nullptr ? made : DeriveUnicode();
}

const char* COrbStringData::COrbStringValue::DeriveUtf8() const {
  const Hold hold(*this);
  if (const char* made = utf8Text.load(std::memory_order_acquire)) return made;
  Copy<char> copy{};
  const auto* unicode = reinterpret_cast<const char16_t*>(unicodeText.load());
  const char* system = systemText.load();
  if (master == kUnicode && unicode != nullptr) {
    copy = Utf8From({unicode, TextBuffer::Length(unicode)});
  } else if (master == kSystem && system != nullptr) {
    const std::size_t length = TextBuffer::Length(system);
    copy = Written(3 * length, [&](char* out) { return Utf8FromMacRoman({system, length}, out); });
  } else {
    copy = Duplicate(std::string_view());
    master = kUtf8;
  }
  return Stored(utf8Text, copy);
}

const char* COrbStringData::COrbStringValue::DeriveSystem() const {
  const Hold hold(*this);
  if (const char* made = systemText.load(std::memory_order_acquire)) return made;
  Copy<char> copy{};
  if (master == kNone || master == kSystem) {
    copy = Duplicate(std::string_view());
    master = kSystem;
  } else {
    const char* utf8 = GetPtrUtf8();
    if (utf8 == nullptr) return nullptr;
    copy = SystemFrom({utf8, TextBuffer::Length(utf8)});
  }
  return Stored(systemText, copy);
}

const unsigned short* COrbStringData::COrbStringValue::DeriveUnicode() const {
  const Hold hold(*this);
  if (const unsigned short* made = unicodeText.load(std::memory_order_acquire)) return made;
  Copy<unsigned short> copy{};
  if (master == kNone || master == kUnicode) {
    constexpr unsigned short kEmpty = 0;
    copy = Duplicate(&kEmpty, 0);
    master = kUnicode;
  } else {
    const char* utf8 = GetPtrUtf8();
    if (utf8 == nullptr) return nullptr;
    copy = UnicodeFrom({utf8, TextBuffer::Length(utf8)});
  }
  return Stored(unicodeText, copy);
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteSystemEncoding() const {
  return LengthOf(GetPtrSystemEncoding());
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteUtf8() const {
  return LengthOf(GetPtrUtf8());
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteUnicode() const {
  return 2 * LengthOf(GetPtrUnicode());
}

unsigned long COrbStringData::COrbStringValue::GetLengthChar() const {
  switch (master.load(std::memory_order_acquire)) {
    case kUnicode:
      return LengthOf(unicodeText.load(std::memory_order_acquire));
    case kUtf8:
      return HasValueUtf8() ? orb::StringAccess::Read(*this).scan.charLength : 0;
    case kSystem:
      return LengthOf(systemText.load(std::memory_order_acquire));  // A byte is one unit.
    default:
      return 0;
  }
}

bool COrbStringData::COrbStringValue::HasValueSystemEncoding() const {
  return systemText.load(std::memory_order_acquire) != nullptr;
}

bool COrbStringData::COrbStringValue::HasValueUtf8() const {
  return utf8Text.load(std::memory_order_acquire) != nullptr;
}

bool COrbStringData::COrbStringValue::HasValueUnicode() const {
  return unicodeText.load(std::memory_order_acquire) != nullptr;
}

bool COrbStringData::COrbStringValue::IsEmpty() const {
  switch (master.load(std::memory_order_acquire)) {
    case kUnicode:
      return LengthOf(unicodeText.load(std::memory_order_acquire)) == 0;
    case kUtf8:
      return LengthOf(utf8Text.load(std::memory_order_acquire)) == 0;  // Valid or not.
    case kSystem:
      return LengthOf(systemText.load(std::memory_order_acquire)) == 0;
    default:
      return true;
  }
}

namespace orb {

void StringAccess::GiveValue(const COrbStringData& s) { s.EnsureValue(); }

Utf8Text StringAccess::Scan(const COrbStringData::COrbStringValue& value) {
  const char* bytes = value.GetPtrUtf8();
  if (bytes == nullptr) return {};
  const std::string_view text(bytes, TextBuffer::Length(bytes));
  const TextScan scan = ScanUtf8(text);
  const auto kept = std::min<std::size_t>(scan.charLength, kTooLong);
  value.scannedLength.store(static_cast<std::uint32_t>(kept), std::memory_order_relaxed);
  value.scannedKind.store(static_cast<std::uint8_t>(static_cast<unsigned>(scan.kind) + 1),
                          std::memory_order_release);
  return {text, scan};
}

COrbStringData StringAccess::FromUtf8(std::string_view text, std::string_view more) {
  COrbStringData made;
  made.value = COrbStringData::COrbStringValue::Make(kUtf8, text, more);
  return made;
}

}  // namespace orb

COrbStringData::COrbStringData(const OrbCharSystem& text) { InitWithSystemEncoding(text); }

COrbStringData::COrbStringData(const OrbCharUtf8& text) { InitWithUtf8(text); }

COrbStringData::COrbStringData(const OrbCharUnicode& text) { InitWithUnicode(text); }

COrbStringData::COrbStringData(const OrbCharPlatform& text) { InitWithUtf8(text); }

COrbStringData& COrbStringData::operator=(const COrbStringData& other) {
  if (this == &other) return *this;
  Clear();
  Share(other);
  return *this;
}

COrbStringData& COrbStringData::operator=(COrbStringData&& other) noexcept {
  if (this == &other) return *this;
  Clear();
  TakePlaceOf(other);
  return *this;
}

COrbStringData::~COrbStringData() { Clear(); }

void COrbStringData::Clear() {
  COrbStringValue* const left = value;
  if (left == nullptr) return;
  value = nullptr;
  // While others remain they may end the value: then it is no longer ours to touch.
  if (left->shared.load(std::memory_order_relaxed) && !LeaveChain(*left)) return;
  delete left;
}

bool COrbStringData::LeaveChain(const COrbStringValue& left) {
  const COrbStringValue::Hold hold(left);
  COrbStringData* const before = prev.load(std::memory_order_relaxed);
  COrbStringData* const behind = next.load(std::memory_order_relaxed);
  if (before != nullptr) before->next.store(behind, std::memory_order_release);
  if (behind != nullptr) behind->prev.store(before, std::memory_order_release);
  prev.store(nullptr, std::memory_order_relaxed);
  next.store(nullptr, std::memory_order_relaxed);
  return before == nullptr && behind == nullptr;
}

void COrbStringData::TakeNeighboursOf(COrbStringData& other) noexcept {
  const COrbStringValue::Hold hold(*value);
  COrbStringData* const before = other.prev.exchange(nullptr, std::memory_order_relaxed);
  COrbStringData* const behind = other.next.exchange(nullptr, std::memory_order_relaxed);
  prev.store(before, std::memory_order_relaxed);
  next.store(behind, std::memory_order_relaxed);
  if (before != nullptr) before->next.store(this, std::memory_order_relaxed);
  if (behind != nullptr) behind->prev.store(this, std::memory_order_relaxed);
}

// The new value is complete before the old one goes, so its text may come from there.
OrbResult COrbStringData::Init(std::uint8_t encoding, const void* text, std::size_t size) {
  const bool isText = text != nullptr;
  auto* made = isText ? COrbStringValue::Make(encoding, {static_cast<const char*>(text), size}, {})
                      : new COrbStringValue;
  Clear();
  value = made;
  return isText ? kOrbNoErr : kOrbErrUnknown;
}

COrbStringData::COrbStringValue* COrbStringData::EnsureValue() const {
  if (value == nullptr) value = new COrbStringValue;
  return value;
}

OrbResult COrbStringData::InitWithSystemEncoding(const char* text) {
  return Init(kSystem, text, text == nullptr ? 0 : std::strlen(text));
}

OrbResult COrbStringData::InitWithUtf8(const char* text) {
  return Init(kUtf8, text, text == nullptr ? 0 : std::strlen(text));
}

OrbResult COrbStringData::InitWithUnicode(const unsigned short* text) {
  return Init(kUnicode, text, text == nullptr ? 0 : sizeof *text * Utf16Length(text));
}

OrbResult COrbStringData::InitWithChar(const OrbCharSystem& text) {
  return InitWithSystemEncoding(text);
}

OrbResult COrbStringData::InitWithChar(const OrbCharUtf8& text) { return InitWithUtf8(text); }

OrbResult COrbStringData::InitWithChar(const OrbCharUnicode& text) { return InitWithUnicode(text); }

OrbResult COrbStringData::InitWithChar(const OrbCharPlatform& text) { return InitWithUtf8(text); }

OrbResult COrbStringData::InitWithCFString(const __CFString* text) {
  if (text == nullptr) {
    Clear();
    return kOrbErrUnknown;
  }
  const CFIndex size =
      CFStringGetMaximumSizeForEncoding(CFStringGetLength(text) + 1, kCFStringEncodingUTF8);
  const std::unique_ptr<char[]> buffer(new char[static_cast<std::size_t>(size)]);
  buffer[0] = '\0';
  CFStringGetCString(text, buffer.get(), size, kCFStringEncodingUTF8);
  return InitWithUtf8(buffer.get());
}

const char* COrbStringData::GetPtrSystemEncoding() const {
  return EnsureValue()->GetPtrSystemEncoding();
}

const char* COrbStringData::GetPtrUtf8() const { return EnsureValue()->GetPtrUtf8(); }

const unsigned short* COrbStringData::GetPtrUnicode() const {
  return EnsureValue()->GetPtrUnicode();
}

const char* COrbStringData::GetPtrPlatform() const { return GetPtrUtf8(); }

OrbCharPlatform COrbStringData::GetCharPlatform() const { return OrbCharPlatform(GetPtrUtf8()); }

OrbCharUnicode COrbStringData::GetCharUnicode() const { return OrbCharUnicode(GetPtrUnicode()); }

unsigned long COrbStringData::GetLengthByteSystemEncoding() const {
  return value == nullptr ? 0 : value->GetLengthByteSystemEncoding();
}

unsigned long COrbStringData::GetLengthByteUtf8() const {
  return value == nullptr ? 0 : value->GetLengthByteUtf8();
}

unsigned long COrbStringData::GetLengthByteUnicode() const {
  return value == nullptr ? 0 : value->GetLengthByteUnicode();
}

unsigned long COrbStringData::GetLengthBytePlatform() const { return GetLengthByteUtf8(); }

unsigned long COrbStringData::GetLengthChar() const {
  return value == nullptr ? 0 : value->GetLengthChar();
}

bool COrbStringData::HasValueSystemEncoding() const {
  return value != nullptr && value->HasValueSystemEncoding();
}

bool COrbStringData::HasValueUtf8() const { return value != nullptr && value->HasValueUtf8(); }

bool COrbStringData::HasValueUnicode() const {
  return value != nullptr && value->HasValueUnicode();
}

bool COrbStringData::IsEmpty() const { return value == nullptr || value->IsEmpty(); }

CFStringRef COrbStringData::CreateCopyCFString() const {
  const char* text = GetPtrUtf8();
  CFStringRef made = CFStringCreateWithCString(
      kCFAllocatorDefault, text == nullptr ? "" : text, kCFStringEncodingUTF8);
  if (made == nullptr) {
    made = CFStringCreateWithCString(kCFAllocatorDefault, "", kCFStringEncodingUTF8);
  }
  if (made == nullptr) throw std::bad_alloc();
  return made;
}

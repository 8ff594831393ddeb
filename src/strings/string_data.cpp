// SPDX-License-Identifier: MIT
#include <orb/strings/string_data.h>

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

namespace {

using orb::platform::kNotUtf8;
using orb::platform::kSlack;
using orb::platform::MacRomanFromUtf16;
using orb::platform::Utf16FromUtf8;
using orb::platform::Utf16Length;
using orb::platform::Utf16LengthOfValid;
using orb::platform::Utf8FromMacRoman;
using orb::platform::Utf8FromUtf16;

enum Master : std::uint32_t { kNone = 0, kSystem = 1, kUtf8 = 2, kUnicode = 3 };

/// Up to here a text is converted on the stack and then copied at its size.
constexpr std::size_t kShort = 256;
constexpr std::size_t kMostOnStack = 3072;

/// Null without memory.
void* BlockFor(std::size_t size) noexcept try {
  return ::operator new(size);
} catch (const std::bad_alloc&) {
  return nullptr;
}

class Held {
 public:
  explicit Held(const COrbCriticalSection& lock) : lock_(lock) { lock_.Enter(); }
  ~Held() { lock_.Leave(); }
  Held(const Held&) = delete;
  Held& operator=(const Held&) = delete;

 private:
  const COrbCriticalSection& lock_;
};

/// Stores the first text that a value is given; later ones are ignored.
template <typename Store>
OrbResult InitOnce(const void* text,
                   const COrbCriticalSection& lock,
                   std::atomic<std::uint32_t>& master,
                   Master encoding,
                   Store store) {
  if (text == nullptr) return kOrbErrUnknown;
  if (master != kNone) return kOrbNoErr;
  const Held held(lock);
  if (master != kNone) return kOrbNoErr;
  store();
  master = encoding;
  return kOrbNoErr;
}

/// A text on its way to being stored; `text` is null when there was no memory.
template <typename Unit>
struct Copy {
  Unit* text;
  std::size_t length;
};

Copy<char> Duplicate(std::string_view text) {
  auto* copy = static_cast<char*>(std::malloc(text.size() + 1));
  if (copy == nullptr) return {nullptr, 0};
  if (!text.empty()) std::memcpy(copy, text.data(), text.size());
  copy[text.size()] = '\0';
  return {copy, text.size()};
}

Copy<unsigned short> Duplicate(const unsigned short* text, std::size_t length) {
  const std::size_t size = (length + 1) * sizeof(unsigned short);
  auto* copy = static_cast<unsigned short*>(std::malloc(size));
  if (copy != nullptr) std::memcpy(copy, text, size);
  return {copy, length};
}

/// Gives back what a buffer has too much. A large one is copied: an allocator that maps such sizes
/// learns to keep them only when they are freed as large as they were asked for, and would map the
/// next one anew.
char* Shrunk(char* buffer, std::size_t size, std::size_t before) {
  constexpr std::size_t kLarge = std::size_t{64} * 1024;
  void* exact = before < kLarge ? std::realloc(buffer, size) : std::malloc(size);
  if (exact == nullptr) return buffer;
  if (before >= kLarge) {
    std::memcpy(exact, buffer, size);
    std::free(buffer);
  }
  return static_cast<char*>(exact);
}

/// `most` bounds what `write` writes, without its slack; it returns the length.
template <typename Write>
Copy<char> Written(std::size_t most, Write write) {
  if (most <= kMostOnStack) {
    std::array<char, kMostOnStack + kSlack> buffer;
    return Duplicate({buffer.data(), write(buffer.data())});
  }
  auto* made = static_cast<char*>(std::malloc(most + kSlack));
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

Copy<unsigned short> ShortUnicode(std::string_view utf8) {
  std::array<char16_t, kShort + kSlack> units;
  std::size_t length = Utf16FromUtf8(utf8, units.data());
  if (length == kNotUtf8) length = 0;
  auto* made = static_cast<unsigned short*>(std::malloc(UnicodeSize(length)));
  if (made == nullptr) return {nullptr, 0};
  std::memcpy(made, units.data(), length * sizeof *made);
  return Terminated(made, length);
}

/// The second half of the room takes what the conversion overwrites. A text with fewer units than a
/// third of its bytes is no UTF-8, and one with more has that much room.
Copy<unsigned short> UnicodeFrom(std::string_view utf8) {
  if (utf8.size() <= kShort) return ShortUnicode(utf8);
  static_assert(kShort / 3 > kSlack);
  const std::size_t most = Utf16LengthOfValid(utf8);
  if (most < utf8.size() / 3) return ShortUnicode({});
  auto* made = static_cast<unsigned short*>(std::malloc(UnicodeSize(most)));
  if (made == nullptr) return {nullptr, 0};
  const std::size_t length = Utf16FromUtf8(utf8, reinterpret_cast<char16_t*>(made));
  if (length == most) return Terminated(made, length);
  std::free(made);
  return ShortUnicode({});
}

Copy<char> SystemFrom(std::string_view utf8) try {
  const std::optional<std::u16string> units = Utf16FromUtf8(utf8);
  return Duplicate(units ? MacRomanFromUtf16(*units).bytes : std::string());
} catch (const std::bad_alloc&) {
  return {nullptr, 0};
}

}  // namespace

// A value behind which its text lies: one allocation. Where there is no memory for both, the value
// stands alone, its text missing.
COrbStringData::COrbStringValue* COrbStringData::COrbStringValue::Make(std::uint32_t encoding,
                                                                       const void* text,
                                                                       std::size_t length) {
  const std::size_t size = encoding == kUnicode ? length * sizeof(unsigned short) : length;
  void* block = BlockFor(sizeof(COrbStringValue) + size + sizeof(unsigned short));
  auto* made = block == nullptr ? new COrbStringValue : ::new (block) COrbStringValue;
  made->master.store(encoding, std::memory_order_relaxed);
  if (block == nullptr) return made;
  made->inBlock = static_cast<std::uint8_t>(encoding);
  auto* copy = reinterpret_cast<char*>(made + 1);
  if (size != 0) std::memcpy(copy, text, size);
  copy[size] = '\0';
  copy[size + 1] = '\0';
  if (encoding == kSystem) made->StoreSystem(copy, length);
  if (encoding == kUtf8) made->StoreUtf8(copy, length);
  if (encoding == kUnicode) made->StoreUnicode(reinterpret_cast<unsigned short*>(copy), length);
  return made;
}

COrbStringData::COrbStringValue::~COrbStringValue() {
  const auto drop = [this](const auto& copy, std::uint32_t encoding) {
    void* text = copy.load(std::memory_order_relaxed);
    if (text != nullptr && inBlock != encoding) std::free(text);
  };
  drop(systemText, kSystem);
  drop(utf8Text, kUtf8);
  drop(unicodeText, kUnicode);
}

void COrbStringData::COrbStringValue::Clear() {
  // Only strings make values that share a block, and they never clear them.
  std::free(systemText.exchange(nullptr));
  std::free(utf8Text.exchange(nullptr));
  std::free(unicodeText.exchange(nullptr));
  master = kNone;
  scan = 0;
}

const char* COrbStringData::COrbStringValue::StoreSystem(char* text, std::size_t length) const {
  systemLength = length;
  systemText.store(text, std::memory_order_release);
  return text;
}

const char* COrbStringData::COrbStringValue::StoreUtf8(char* text, std::size_t length) const {
  utf8Length = length;
  utf8Text.store(text, std::memory_order_release);
  return text;
}

const unsigned short* COrbStringData::COrbStringValue::StoreUnicode(unsigned short* text,
                                                                    std::size_t length) const {
  unicodeLength = length;
  unicodeText.store(text, std::memory_order_release);
  return text;
}

OrbResult COrbStringData::COrbStringValue::InitWithSystemEncoding(const char* text) {
  return InitOnce(text, lock, master, kSystem, [&] {
    const Copy<char> copy = Duplicate(text);
    StoreSystem(copy.text, copy.length);
  });
}

OrbResult COrbStringData::COrbStringValue::InitWithUtf8(const char* text) {
  return InitOnce(text, lock, master, kUtf8, [&] {
    const Copy<char> copy = Duplicate(text);
    StoreUtf8(copy.text, copy.length);
  });
}

OrbResult COrbStringData::COrbStringValue::InitWithUnicode(const unsigned short* text) {
  return InitOnce(text, lock, master, kUnicode, [&] {
    const Copy<unsigned short> copy = Duplicate(text, Utf16Length(text));
    StoreUnicode(copy.text, copy.length);
  });
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
  const Held held(lock);
  if (const char* made = utf8Text.load(std::memory_order_acquire)) return made;
  Copy<char> copy{};
  const auto* unicode = reinterpret_cast<const char16_t*>(unicodeText.load());
  const char* system = systemText.load();
  if (master == kUnicode && unicode != nullptr) {
    copy = Written(3 * unicodeLength, [&](char* out) {
      return Utf8FromUtf16({unicode, unicodeLength}, out);
    });
  } else if (master == kSystem && system != nullptr) {
    copy = Written(3 * systemLength, [&](char* out) {
      return Utf8FromMacRoman({system, systemLength}, out);
    });
  } else {
    copy = Duplicate(std::string_view());
    master = kUtf8;
  }
  return StoreUtf8(copy.text, copy.length);
}

const char* COrbStringData::COrbStringValue::DeriveSystem() const {
  const Held held(lock);
  if (const char* made = systemText.load(std::memory_order_acquire)) return made;
  Copy<char> copy{};
  if (master == kNone || master == kSystem) {
    copy = Duplicate(std::string_view());
    master = kSystem;
  } else {
    const char* utf8 = GetPtrUtf8();
    if (utf8 == nullptr) return nullptr;
    copy = SystemFrom({utf8, utf8Length});
  }
  return StoreSystem(copy.text, copy.length);
}

const unsigned short* COrbStringData::COrbStringValue::DeriveUnicode() const {
  const Held held(lock);
  if (const unsigned short* made = unicodeText.load(std::memory_order_acquire)) return made;
  Copy<unsigned short> copy{};
  if (master == kNone || master == kUnicode) {
    constexpr unsigned short kEmpty = 0;
    copy = Duplicate(&kEmpty, 0);
    master = kUnicode;
  } else {
    const char* utf8 = GetPtrUtf8();
    if (utf8 == nullptr) return nullptr;
    copy = UnicodeFrom({utf8, utf8Length});
  }
  return StoreUnicode(copy.text, copy.length);
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteSystemEncoding() const {
  return GetPtrSystemEncoding() == nullptr ? 0 : systemLength;
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteUtf8() const {
  return GetPtrUtf8() == nullptr ? 0 : utf8Length;
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteUnicode() const {
  return GetPtrUnicode() == nullptr ? 0 : 2 * unicodeLength;
}

unsigned long COrbStringData::COrbStringValue::GetLengthChar() const {
  switch (master.load(std::memory_order_acquire)) {
    case kUnicode:
      return HasValueUnicode() ? unicodeLength : 0;
    case kUtf8:
      return HasValueUtf8() ? orb::StringAccess::Read(*this).scan.charLength : 0;
    case kSystem:
      return HasValueSystemEncoding() ? systemLength : 0;  // Each of its bytes is one unit.
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
      return !HasValueUnicode() || unicodeLength == 0;
    case kUtf8:
      return !HasValueUtf8() || utf8Length == 0;  // Valid or not.
    case kSystem:
      return !HasValueSystemEncoding() || systemLength == 0;
    default:
      return true;
  }
}

namespace orb {

void StringAccess::GiveValue(const COrbStringData& s) { s.EnsureValue(); }

void StringAccess::Scan(const COrbStringData::COrbStringValue& value) {
  const char* bytes = value.GetPtrUtf8();
  if (bytes == nullptr) return;
  value.scan.store(ScanUtf8({bytes, value.utf8Length}).Pack(), std::memory_order_release);
}

COrbStringData StringAccess::FromUtf8(std::string_view text) {
  COrbStringData made;
  made.value = COrbStringData::COrbStringValue::Make(kUtf8, text.data(), text.size());
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
  if (left->shared.load(std::memory_order_relaxed)) {
    left->lock.Enter();
    const bool last = prev == nullptr && next == nullptr;
    if (prev != nullptr) prev->next = next;
    if (next != nullptr) next->prev = prev;
    left->lock.Leave();
    prev = nullptr;
    next = nullptr;
    // From here on the others may end the value: it is ours to touch only if there are none.
    if (!last) return;
  }
  delete left;
}

// The new value is complete before the old one goes, so its text may come from there.
OrbResult COrbStringData::Init(std::uint32_t encoding, const void* text, std::size_t length) {
  const bool isText = text != nullptr;
  auto* made = isText ? COrbStringValue::Make(encoding, text, length) : new COrbStringValue;
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
  return Init(kUnicode, text, text == nullptr ? 0 : Utf16Length(text));
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

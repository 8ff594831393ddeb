// SPDX-License-Identifier: MIT
#include <orb/strings/string_data.h>

#include <cstdlib>
#include <cstring>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "platform/transcode.h"
#include "strings/string_access.h"

namespace {

using orb::platform::MacRomanFromUtf16;
using orb::platform::Utf16FromUtf8;
using orb::platform::Utf16LengthOfUtf8;
using orb::platform::Utf8FromMacRoman;
using orb::platform::Utf8FromUtf16;

enum Master : std::uint32_t { kNone = 0, kSystem = 1, kUtf8 = 2, kUnicode = 3 };

class Held {
 public:
  explicit Held(const COrbCriticalSection& lock) : lock_(lock) { lock_.Enter(); }
  ~Held() { lock_.Leave(); }
  Held(const Held&) = delete;
  Held& operator=(const Held&) = delete;

 private:
  const COrbCriticalSection& lock_;
};

char* Duplicate(std::string_view text) {
  auto* copy = static_cast<char*>(std::malloc(text.size() + 1));
  if (copy == nullptr) return nullptr;
  if (!text.empty()) std::memcpy(copy, text.data(), text.size());
  copy[text.size()] = '\0';
  return copy;
}

std::size_t Length(const unsigned short* text) {
  std::size_t length = 0;
  while (text[length] != 0) ++length;
  return length;
}

std::u16string_view View(const unsigned short* text) {
  return {reinterpret_cast<const char16_t*>(text), Length(text)};
}

unsigned short* Duplicate(std::u16string_view text, std::size_t bytes) {
  auto* copy = static_cast<unsigned short*>(std::calloc(bytes, 1));
  if (copy != nullptr && !text.empty()) std::memcpy(copy, text.data(), text.size() * 2);
  return copy;
}

}  // namespace

COrbStringData::COrbStringValue::~COrbStringValue() { Clear(); }

void COrbStringData::COrbStringValue::Clear() {
  master = kNone;
  std::free(systemText.exchange(nullptr));
  std::free(utf8Text.exchange(nullptr));
  std::free(unicodeText.exchange(nullptr));
  scan = 0;
}

OrbResult COrbStringData::COrbStringValue::InitWithSystemEncoding(const char* text) {
  if (text == nullptr) return kOrbErrUnknown;
  if (master != kNone) return kOrbNoErr;
  const Held held(lock);
  if (master != kNone) return kOrbNoErr;
  systemText.store(Duplicate(text), std::memory_order_release);
  master = kSystem;
  return kOrbNoErr;
}

OrbResult COrbStringData::COrbStringValue::InitWithUtf8(const char* text) {
  if (text == nullptr) return kOrbErrUnknown;
  if (master != kNone) return kOrbNoErr;
  const Held held(lock);
  if (master != kNone) return kOrbNoErr;
  utf8Text.store(Duplicate(text), std::memory_order_release);
  master = kUtf8;
  return kOrbNoErr;
}

OrbResult COrbStringData::COrbStringValue::InitWithUnicode(const unsigned short* text) {
  if (text == nullptr) return kOrbErrUnknown;
  if (master != kNone) return kOrbNoErr;
  const Held held(lock);
  if (master != kNone) return kOrbNoErr;
  const std::u16string_view view = View(text);
  unicodeText.store(Duplicate(view, (view.size() + 1) * 2), std::memory_order_release);
  master = kUnicode;
  return kOrbNoErr;
}

const char* COrbStringData::COrbStringValue::GetPtrUtf8() {
  if (const char* made = utf8Text.load(std::memory_order_acquire)) return made;
  const Held held(lock);
  if (const char* made = utf8Text.load(std::memory_order_acquire)) return made;
  char* made = nullptr;
  const unsigned short* unicode = unicodeText.load();
  const char* system = systemText.load();
  if (master == kUnicode && unicode != nullptr) {
    made = Duplicate(Utf8FromUtf16(View(unicode)));
  } else if (master == kSystem && system != nullptr) {
    made = Duplicate(Utf8FromMacRoman(system));
  } else {
    made = Duplicate(std::string_view());
    master = kUtf8;
  }
  utf8Text.store(made, std::memory_order_release);
  return made;
}

const char* COrbStringData::COrbStringValue::GetPtrSystemEncoding() {
  if (const char* made = systemText.load(std::memory_order_acquire)) return made;
  const Held held(lock);
  if (const char* made = systemText.load(std::memory_order_acquire)) return made;
  char* made = nullptr;
  if (master == kNone || master == kSystem) {
    made = Duplicate(std::string_view());
    master = kSystem;
  } else {
    const char* utf8 = GetPtrUtf8();
    if (utf8 == nullptr) return nullptr;
    const std::optional<std::u16string> text = Utf16FromUtf8(utf8);
    made = Duplicate(text ? MacRomanFromUtf16(*text).bytes : std::string());
  }
  systemText.store(made, std::memory_order_release);
  return made;
}

const unsigned short* COrbStringData::COrbStringValue::GetPtrUnicode() {
  if (const unsigned short* made = unicodeText.load(std::memory_order_acquire)) return made;
  const Held held(lock);
  if (const unsigned short* made = unicodeText.load(std::memory_order_acquire)) return made;
  unsigned short* made = nullptr;
  if (master == kNone || master == kUnicode) {
    made = Duplicate(std::u16string_view(), 2);
    master = kUnicode;
  } else {
    const char* utf8 = GetPtrUtf8();
    if (utf8 == nullptr) return nullptr;
    const std::u16string text = Utf16FromUtf8(utf8).value_or(std::u16string());
    made = Duplicate(text, (text.size() + 1) * 4);
  }
  unicodeText.store(made, std::memory_order_release);
  return made;
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteSystemEncoding() {
  const char* text = GetPtrSystemEncoding();
  return text == nullptr ? 0 : std::strlen(text);
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteUtf8() {
  const char* text = GetPtrUtf8();
  return text == nullptr ? 0 : std::strlen(text);
}

unsigned long COrbStringData::COrbStringValue::GetLengthByteUnicode() {
  const unsigned short* text = GetPtrUnicode();
  return text == nullptr ? 0 : 2 * Length(text);
}

unsigned long COrbStringData::COrbStringValue::GetLengthChar() {
  switch (master.load()) {
    case kUnicode:
      return GetLengthByteUnicode() / 2;
    case kUtf8:
      return GetPtrUtf8() == nullptr ? 0 : Utf16LengthOfUtf8(GetPtrUtf8()).value_or(0);
    case kSystem:
      return GetLengthByteSystemEncoding();
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

bool COrbStringData::COrbStringValue::IsEmpty() {
  switch (master.load()) {
    case kUnicode: {
      const unsigned short* text = unicodeText.load(std::memory_order_acquire);
      return text == nullptr || text[0] == 0;
    }
    case kUtf8: {
      const char* text = utf8Text.load(std::memory_order_acquire);
      return text == nullptr || text[0] == 0;
    }
    case kSystem: {
      const char* text = systemText.load(std::memory_order_acquire);
      return text == nullptr || text[0] == 0;
    }
    default:
      return true;
  }
}

namespace orb {

Utf8Text StringAccess::Read(const COrbStringData& s) {
  COrbStringData::COrbStringValue* value = s.EnsureValue();
  const char* bytes = value->GetPtrUtf8();
  if (bytes == nullptr) return {};
  std::uint64_t packed = value->scan.load(std::memory_order_relaxed);
  const std::string_view text(bytes);
  if (packed == 0) {
    packed = ScanUtf8(text).Pack();
    value->scan.store(packed, std::memory_order_relaxed);
  }
  return {text, TextScan::Unpack(packed)};
}

COrbStringData StringAccess::FromUtf8(std::string_view text) {
  COrbStringData made;
  made.InitWithUtf8(std::string(text).c_str());
  return made;
}

}  // namespace orb

COrbStringData::COrbStringData(const COrbStringData& other) { Share(other); }

COrbStringData::COrbStringData(COrbStringData&& other) noexcept { TakePlaceOf(other); }

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

void COrbStringData::Share(const COrbStringData& other) {
  if (other.value == nullptr) return;
  const Held held(other.value->lock);
  value = other.value;
  prev = const_cast<COrbStringData*>(&other);
  next = other.next;
  if (next != nullptr) next->prev = this;
  other.next = this;
}

void COrbStringData::TakePlaceOf(COrbStringData& other) noexcept {
  if (other.value == nullptr) return;
  const Held held(other.value->lock);
  value = std::exchange(other.value, nullptr);
  prev = std::exchange(other.prev, nullptr);
  next = std::exchange(other.next, nullptr);
  if (prev != nullptr) prev->next = this;
  if (next != nullptr) next->prev = this;
}

void COrbStringData::Clear() {
  COrbStringValue* old = value;
  if (old == nullptr) return;
  bool last = false;
  {
    const Held held(old->lock);
    last = prev == nullptr && next == nullptr;
    if (prev != nullptr) prev->next = next;
    if (next != nullptr) next->prev = prev;
    prev = nullptr;
    next = nullptr;
    value = nullptr;
  }
  if (last) delete old;
}

COrbStringData::COrbStringValue* COrbStringData::EnsureValue() const {
  if (value == nullptr) value = new COrbStringValue;
  return value;
}

OrbResult COrbStringData::InitWithSystemEncoding(const char* text) {
  auto* made = new COrbStringValue;
  const OrbResult result = made->InitWithSystemEncoding(text);
  Clear();
  value = made;
  return result;
}

OrbResult COrbStringData::InitWithUtf8(const char* text) {
  auto* made = new COrbStringValue;
  const OrbResult result = made->InitWithUtf8(text);
  Clear();
  value = made;
  return result;
}

OrbResult COrbStringData::InitWithUnicode(const unsigned short* text) {
  auto* made = new COrbStringValue;
  const OrbResult result = made->InitWithUnicode(text);
  Clear();
  value = made;
  return result;
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
  std::string buffer(static_cast<std::size_t>(size), '\0');
  CFStringGetCString(text, buffer.data(), size, kCFStringEncodingUTF8);
  return InitWithUtf8(buffer.c_str());
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
  if (made != nullptr) return made;
  return CFStringCreateWithCString(kCFAllocatorDefault, "", kCFStringEncodingUTF8);
}

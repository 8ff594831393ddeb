// SPDX-License-Identifier: MIT
#include <orb/platform/core_foundation.h>

#include <atomic>
#include <cstring>
#include <exception>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "platform/transcode.h"

namespace {

using orb::platform::MacRomanFromUtf16;
using orb::platform::Utf16FromUtf8;
using orb::platform::Utf8FromMacRoman;
using orb::platform::Utf8FromUtf16;

/// What `make` gives, or null when memory runs out: no exception may leave a C function.
template <typename Make>
auto NullWithoutMemory(Make make) noexcept -> decltype(make()) try {
  return make();
} catch (const std::exception&) {
  return nullptr;
}

/// What every object begins with, so that CFRetain and CFRelease need not know which it is.
struct CFObject {
  CFObject() = default;
  CFObject(const CFObject&) = delete;
  CFObject& operator=(const CFObject&) = delete;
  virtual ~CFObject() = default;

  mutable std::atomic<CFIndex> owners{1};
};

}  // namespace

struct __CFString final : CFObject {
  explicit __CFString(std::u16string content) : text(std::move(content)) {}

  const std::u16string text;
};

struct __CFURL final : CFObject {
  explicit __CFURL(std::u16string fullPath) : path(std::move(fullPath)) {}

  const std::u16string path;
};

CFTypeRef CFRetain(CFTypeRef object) {
  if (object != nullptr) static_cast<const CFObject*>(object)->owners.fetch_add(1);
  return object;
}

void CFRelease(CFTypeRef object) {
  if (object == nullptr) return;
  const auto* counted = static_cast<const CFObject*>(object);
  if (counted->owners.fetch_sub(1) == 1) delete counted;
}

CFIndex CFGetRetainCount(CFTypeRef object) {
  return object == nullptr ? 0 : static_cast<const CFObject*>(object)->owners.load();
}

CFStringRef CFStringCreateWithCString(CFAllocatorRef, const char* text, CFStringEncoding encoding) {
  if (text == nullptr) return nullptr;
  return NullWithoutMemory([=]() -> CFStringRef {
    std::optional<std::u16string> units;
    if (encoding == kCFStringEncodingUTF8) units = Utf16FromUtf8(text);
    if (encoding == kCFStringEncodingMacRoman) units = Utf16FromUtf8(Utf8FromMacRoman(text));
    return units ? new __CFString(*std::move(units)) : nullptr;
  });
}

CFStringRef CFStringCreateWithCharacters(CFAllocatorRef, const UniChar* characters, CFIndex count) {
  if ((characters == nullptr && count != 0) || count < 0) return nullptr;
  return NullWithoutMemory([=]() -> CFStringRef {
    std::u16string units(static_cast<std::size_t>(count), u'\0');
    if (count != 0) std::memcpy(units.data(), characters, units.size() * sizeof(UniChar));
    return new __CFString(std::move(units));
  });
}

CFStringRef CFStringCreateCopy(CFAllocatorRef, CFStringRef text) {
  return static_cast<CFStringRef>(CFRetain(text));  // Immutable, so one object serves both.
}

CFIndex CFStringGetLength(CFStringRef text) {
  return text == nullptr ? 0 : static_cast<CFIndex>(text->text.size());
}

namespace {

struct Encoded {
  std::string bytes;
  bool isExact;
};

/// Nothing for an encoding that is not known, and without memory.
std::optional<Encoded> Encode(std::u16string_view text, CFStringEncoding encoding) noexcept try {
  if (encoding == kCFStringEncodingUTF8) return Encoded{Utf8FromUtf16(text), true};
  if (encoding != kCFStringEncodingMacRoman) return std::nullopt;
  orb::platform::MacRomanText made = MacRomanFromUtf16(text);
  return Encoded{std::move(made.bytes), made.isExact};
} catch (const std::exception&) {
  return std::nullopt;
}

}  // namespace

Boolean CFStringGetCString(CFStringRef text,
                           char* buffer,
                           CFIndex size,
                           CFStringEncoding encoding) {
  if (text == nullptr || buffer == nullptr || size <= 0) return 0;
  const std::optional<Encoded> encoded = Encode(text->text, encoding);
  if (!encoded || encoded->bytes.size() >= static_cast<std::size_t>(size)) return 0;
  std::memcpy(buffer, encoded->bytes.c_str(), encoded->bytes.size() + 1);
  return encoded->isExact ? 1 : 0;
}

void CFStringGetCharacters(CFStringRef text, CFRange range, UniChar* buffer) {
  if (text == nullptr || buffer == nullptr || range.location < 0 || range.length <= 0) return;
  if (range.location > CFStringGetLength(text) - range.length) return;
  std::memcpy(buffer,
              text->text.data() + range.location,
              static_cast<std::size_t>(range.length) * sizeof(UniChar));
}

CFIndex CFStringGetMaximumSizeForEncoding(CFIndex length, CFStringEncoding encoding) {
  if (length < 0) return -1;
  if (encoding == kCFStringEncodingMacRoman) return length;
  const bool fits = length <= std::numeric_limits<CFIndex>::max() / 3;
  return encoding == kCFStringEncodingUTF8 && fits ? length * 3 : -1;
}

CFStringEncoding CFStringGetSystemEncoding() { return kCFStringEncodingMacRoman; }

CFURLRef CFURLCreateWithFileSystemPath(CFAllocatorRef,
                                       CFStringRef path,
                                       CFURLPathStyle style,
                                       Boolean) {
  if (path == nullptr || style != kCFURLPOSIXPathStyle) return nullptr;
  return NullWithoutMemory([=]() -> CFURLRef { return new __CFURL(path->text); });
}

CFStringRef CFURLCopyFileSystemPath(CFURLRef url, CFURLPathStyle style) {
  if (url == nullptr || style != kCFURLPOSIXPathStyle) return nullptr;
  return NullWithoutMemory([=]() -> CFStringRef {
    std::u16string path = url->path;
    while (path.size() > 1 && path.back() == u'/') path.pop_back();
    return new __CFString(std::move(path));
  });
}

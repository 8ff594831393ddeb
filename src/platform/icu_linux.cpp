// SPDX-License-Identifier: MIT
#include "platform/icu.h"

#include <dlfcn.h>
#include <unicode/uvernum.h>

#include <array>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <mutex>

// Two steps, so that a name is spelled out after ICU's headers have added its version.
#define ORB_SPELLED(name) #name
#define ORB_SPELL(name) ORB_SPELLED(name)

#define ORB_ICU_LIBRARY "libicuuc.so." ORB_SPELL(U_ICU_VERSION_MAJOR_NUM)

namespace orb::platform {
namespace {

/// Tells packaging tools of the library that is loaded by name, which no ELF entry shows.
/// https://uapi-group.org/specifications/specs/elf_dlopen_metadata/
constexpr char kNeeds[] =
    R"([{"feature":"unicode","description":"Unicode data","priority":"required","soname":[")" ORB_ICU_LIBRARY
    R"("]}])";
struct Note {
  std::uint32_t nameSize = 4;
  std::uint32_t contentSize = sizeof(kNeeds);
  std::uint32_t type = 0x407c0c0a;
  std::array<char, 4> name{'F', 'D', 'O', '\0'};
  alignas(4) std::array<char, sizeof(kNeeds)> content = std::to_array(kNeeds);
};
[[gnu::used, gnu::section(".note.dlopen")]] alignas(4) constexpr Note kNote;

template <typename Function>
bool Find(void* library, const char* name, Function& function) {
  function = reinterpret_cast<Function>(::dlsym(library, name));
  return function != nullptr;
}

const IcuFunctions* Load() {
  static constinit IcuFunctions found{};
  void* library = ::dlopen(ORB_ICU_LIBRARY, RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr) return nullptr;  // Otherwise it stays until the process ends.
  bool all = true;
#define ORB_ICU_FIND(name) all = Find(library, ORB_SPELL(name), found.name) && all;
  ORB_ICU_FUNCTIONS(ORB_ICU_FIND)
#undef ORB_ICU_FIND
  return all ? &found : nullptr;
}

constinit std::atomic<const IcuFunctions*> loaded{nullptr};

/// Null where it cannot be had. A failed attempt costs much, so the next one waits.
const IcuFunctions* TryToLoad() {
  using Clock = std::chrono::steady_clock;
  static constinit std::mutex lock;
  static constinit Clock::time_point next{};
  const std::lock_guard held(lock);
  if (const IcuFunctions* there = loaded.load(std::memory_order_acquire)) return there;
  if (Clock::now() < next) return nullptr;
  const IcuFunctions* found = Load();
  if (found == nullptr) next = Clock::now() + std::chrono::seconds(1);
  loaded.store(found, std::memory_order_release);
  return found;
}

const IcuFunctions* Loaded() {
  const IcuFunctions* there = loaded.load(std::memory_order_acquire);
  return there != nullptr ? there : TryToLoad();
}

/// Copies a text as long as its room, with the case of the letters from `first` on changed.
std::int32_t MapAscii(char16_t first, const char16_t* text, std::int32_t length, char16_t* out) {
  for (std::int32_t i = 0; i < length; ++i) {
    const bool isLetter = text[i] >= first && text[i] < first + 26;
    out[i] = static_cast<char16_t>(isLetter ? text[i] ^ 0x20 : text[i]);
  }
  return length;
}

/// Every character stands alone, in its only form.
constexpr IcuFunctions MakeStandIn() {
  IcuFunctions made{};
  made.u_charType = [](UChar32) -> std::int8_t { return U_UNASSIGNED; };
  made.u_getCombiningClass = [](UChar32) -> std::uint8_t { return 0; };
  made.u_getIntPropertyValue = [](UChar32, UProperty which) -> std::int32_t {
    return which == UCHAR_NFC_QUICK_CHECK ? UNORM_YES : 0;
  };
  made.u_strFoldCase = [](char16_t* out,
                          std::int32_t,
                          const char16_t* text,
                          std::int32_t length,
                          std::uint32_t,
                          UErrorCode*) { return MapAscii(u'A', text, length, out); };
  made.u_strToLower = [](char16_t* out,
                         std::int32_t,
                         const char16_t* text,
                         std::int32_t length,
                         const char*,
                         UErrorCode*) { return MapAscii(u'A', text, length, out); };
  made.u_strToUpper = [](char16_t* out,
                         std::int32_t,
                         const char16_t* text,
                         std::int32_t length,
                         const char*,
                         UErrorCode*) { return MapAscii(u'a', text, length, out); };
  made.unorm2_getDecomposition =
      [](const UNormalizer2*, UChar32, char16_t*, std::int32_t, UErrorCode*) -> std::int32_t {
    return -1;
  };
  made.unorm2_getNFCInstance = [](UErrorCode*) -> const UNormalizer2* { return nullptr; };
  made.unorm2_getNFDInstance = made.unorm2_getNFCInstance;
  made.unorm2_hasBoundaryBefore = [](const UNormalizer2*, UChar32) -> UBool { return true; };
  made.unorm2_normalize = [](const UNormalizer2*,
                             const char16_t*,
                             std::int32_t,
                             char16_t*,
                             std::int32_t,
                             UErrorCode* status) -> std::int32_t {
    *status = U_UNSUPPORTED_ERROR;
    return 0;
  };
  return made;
}

constexpr IcuFunctions kStandIn = MakeStandIn();

}  // namespace

const IcuFunctions& Icu() {
  const IcuFunctions* there = Loaded();
  return there != nullptr ? *there : kStandIn;
}

bool IsIcuLoaded() { return Loaded() != nullptr; }

}  // namespace orb::platform

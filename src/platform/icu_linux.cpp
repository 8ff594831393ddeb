// SPDX-License-Identifier: MIT
#include "platform/icu.h"

#include <dlfcn.h>
#include <unicode/uvernum.h>

#include <array>
#include <cstdint>
#include <cstdlib>

#include "platform/errno_keeper.h"

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
void Find(void* library, const char* name, Function& function) {
  function = reinterpret_cast<Function>(::dlsym(library, name));
  if (function == nullptr) std::abort();
}

IcuFunctions Load() {
  const ErrnoKeeper errnoKeeper;
  void* library =
      ::dlopen(ORB_ICU_LIBRARY, RTLD_NOW | RTLD_LOCAL);  // Stays until the process ends.
  if (library == nullptr) std::abort();
  IcuFunctions found{};
#define ORB_ICU_FIND(name) Find(library, ORB_SPELL(name), found.name);
  ORB_ICU_FUNCTIONS(ORB_ICU_FIND)
#undef ORB_ICU_FIND
  return found;
}

}  // namespace

const IcuFunctions& Icu() {
  static const IcuFunctions functions = Load();
  return functions;
}

}  // namespace orb::platform

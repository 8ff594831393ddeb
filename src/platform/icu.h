// SPDX-License-Identifier: MIT
#pragma once

#include <unicode/uchar.h>
#include <unicode/unorm2.h>
#include <unicode/ustring.h>

namespace orb::platform {

#define ORB_ICU_FUNCTIONS(X)  \
  X(u_charType)               \
  X(u_getCombiningClass)      \
  X(u_getIntPropertyValue)    \
  X(u_strFoldCase)            \
  X(u_strToLower)             \
  X(u_strToUpper)             \
  X(unorm2_getDecomposition)  \
  X(unorm2_getNFCInstance)    \
  X(unorm2_getNFDInstance)    \
  X(unorm2_hasBoundaryBefore) \
  X(unorm2_normalize)

/// The functions of ICU that the library uses, under ICU's names.
struct IcuFunctions {
#define ORB_ICU_MEMBER(name) decltype(&::name) name;  // NOLINT(bugprone-macro-parentheses): a name
  ORB_ICU_FUNCTIONS(ORB_ICU_MEMBER)
#undef ORB_ICU_MEMBER
};

/// Loads libicuuc on the first call, from any thread. Linked in the ordinary way it would cost
/// every program a third of its start, and most never meet a text that needs it.
///
/// Where it cannot be loaded, as in a process that has no descriptor free, functions that know
/// ASCII alone stand in, and a call a second later or more tries again.
const IcuFunctions& Icu();

/// Whether Icu() gives the real functions, so that what they say may be kept.
bool IsIcuLoaded();

}  // namespace orb::platform

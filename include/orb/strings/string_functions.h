// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/strings/char_types.h>
#include <orb/strings/string_data.h>

#include <vector>

/// \file
/// Operations on strings. Each leaves its inputs' texts as they are and returns a new string; none
/// fails with a code. Positions and counts are UTF-16 units. A text that is not valid UTF-8 counts
/// as the empty text, and a comparison with it gives 0. "No value" is a string as it is
/// default-made. All may be called from any thread.

/// a followed by b. Always has a value.
ORB_EXPORT COrbStringData OrbStringDataCat(const COrbStringData& a, const COrbStringData& b);

/// The text from character `m` to the end: the empty text at the end, no value beyond it.
ORB_EXPORT COrbStringData OrbStringDataInc(const COrbStringData& s, unsigned long m);

/// The tail of s from the first match of `find`; no value when there is none or `find` is empty.
/// Composed and decomposed forms match each other. A match never ends between a character and a
/// combining mark that belongs to it.
ORB_EXPORT COrbStringData OrbStringDataStr(const COrbStringData& s, const COrbStringData& find);
/// The same without regard to case (full case folding).
ORB_EXPORT COrbStringData OrbStringDataStrNoCase(const COrbStringData& s,
                                                 const COrbStringData& find);
/// The tail of s from the last match of `find`, unit for unit.
ORB_EXPORT COrbStringData OrbStringDataStrReverse(const COrbStringData& s,
                                                  const COrbStringData& find);

/// -1, 0 or 1 in the order of the UTF-16 units.
ORB_EXPORT int OrbStringDataCmp(const COrbStringData& a, const COrbStringData& b);
/// -1, 0 or 1 without regard to case; composed and decomposed forms are equal.
ORB_EXPORT int OrbStringDataCmpi(const COrbStringData& a, const COrbStringData& b);
/// The same over the first n characters; a shorter text takes part whole.
ORB_EXPORT int OrbStringDataCmpn(const COrbStringData& a, const COrbStringData& b, unsigned long n);
/// Unlike OrbStringDataCmpi, composed and decomposed forms differ here.
ORB_EXPORT int OrbStringDataCmpni(const COrbStringData& a,
                                  const COrbStringData& b,
                                  unsigned long n);

/// s with every match of `find` replaced, left to right and without overlap. Matches are those of
/// OrbStringDataStr; as many characters as `find` has are replaced from where each begins. Always
/// has a value.
ORB_EXPORT COrbStringData OrbStringDataReplace(const COrbStringData& s,
                                               const COrbStringData& find,
                                               const COrbStringData& with);

/// Replaces the content of `out` by the pieces of s that are not empty. A text in which `sep` does
/// not occur gives no piece at all. A null `out` does nothing.
ORB_EXPORT void OrbStringDataSplit(const COrbStringData& s,
                                   const COrbStringData& sep,
                                   std::vector<COrbStringData>* out);

namespace OrbString {
/// s without the leading and trailing characters that occur in `set`, which is a set of UTF-16
/// units. No value when nothing remains; a copy of s when `set` is empty or both sides are false.
ORB_EXPORT COrbStringData Trim(const COrbStringData& s,
                               const COrbStringData& set,
                               bool left,
                               bool right);
}  // namespace OrbString

ORB_EXPORT COrbStringData OrbStringDataTrim(const COrbStringData& s, const COrbStringData& set);
ORB_EXPORT COrbStringData OrbStringDataTrimLeft(const COrbStringData& s, const COrbStringData& set);
ORB_EXPORT COrbStringData OrbStringDataTrimRight(const COrbStringData& s,
                                                 const COrbStringData& set);

/// Locale-independent case mapping. Always has a value.
ORB_EXPORT COrbStringData OrbStringDataLower(const COrbStringData& s);
ORB_EXPORT COrbStringData OrbStringDataUpper(const COrbStringData& s);

/// As atoi and atof read it: 0 for a text that begins with no number, and for a null pointer.
ORB_EXPORT int OrbStringDataToNumber(const OrbCharPlatform& text);
ORB_EXPORT double OrbStringDataToFloat(const OrbCharPlatform& text);

/// printf-style formatting of UTF-8. The format is the caller's own code: never pass a name, a path
/// or anything else that came from outside. No value for a null format and when formatting fails.
ORB_EXPORT COrbStringData OrbStringDataFormat(const COrbStringData* format, ...);
ORB_EXPORT COrbStringData OrbStringDataFormat(const OrbCharPlatform* format, ...);
/// The format is wide text (wchar_t) as wprintf reads it. No value for a null format, an output of
/// more than 2047 wide characters, or a character that cannot be converted.
ORB_EXPORT COrbStringData OrbStringDataFormatW(const OrbCharUnicode* format, ...);

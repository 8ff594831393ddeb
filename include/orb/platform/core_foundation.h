// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>

#include <cstdint>

/// \file
/// The few platform types and C functions that callers need to hand texts, URLs and file references
/// over, with the platform's own names and meaning. Objects are immutable and reference-counted:
/// what a function with Create or Copy in its name returns belongs to the caller, who ends it with
/// CFRelease. All functions may be called from any thread. A null object argument gives null, 0 or
/// false, never a crash.

using UInt8 = std::uint8_t;
using UInt16 = std::uint16_t;
using UInt32 = std::uint32_t;
using OSStatus = std::int32_t;
using Boolean = unsigned char;
using UniChar = unsigned short;

using CFTypeRef = const void*;
using CFStringRef = const struct __CFString*;
using CFURLRef = const struct __CFURL*;
using CFAllocatorRef = const struct __CFAllocator*;
using CFIndex = long;
using CFStringEncoding = std::uint32_t;
using CFURLPathStyle = CFIndex;

/// A stretch of UTF-16 units.
struct CFRange {
  CFIndex location;
  CFIndex length;
};

/// Seconds since 1904-01-01 00:00:00 GMT: whole seconds in 48 bits and a fraction in 1/65536 s.
#pragma pack(push, 2)
struct UTCDateTime {
  UInt16 highSeconds;
  UInt32 lowSeconds;
  UInt16 fraction;
};
#pragma pack(pop)
static_assert(sizeof(UTCDateTime) == 8);

/// A reference to an item that existed when the reference was made. It holds the item's absolute
/// path, so it does not follow an item that is moved. Callers treat the bytes as opaque.
struct FSRef {
  UInt8 hidden[4096];
};

/// The only allocator there is; the argument is accepted and not looked at.
constexpr CFAllocatorRef kCFAllocatorDefault = nullptr;
constexpr CFStringEncoding kCFStringEncodingMacRoman = 0;
constexpr CFStringEncoding kCFStringEncodingUTF8 = 0x08000100;
constexpr CFURLPathStyle kCFURLPOSIXPathStyle = 0;

extern "C" {

/// Adds one owner and returns the object.
ORB_EXPORT CFTypeRef CFRetain(CFTypeRef object);
/// Gives one owner's share up; the last one ends the object.
ORB_EXPORT void CFRelease(CFTypeRef object);
ORB_EXPORT CFIndex CFGetRetainCount(CFTypeRef object);

/// Null when the bytes are not valid in the encoding (UTF-8 is read strictly), when the encoding is
/// neither UTF-8 nor Mac OS Roman, and when memory runs out.
ORB_EXPORT CFStringRef CFStringCreateWithCString(CFAllocatorRef allocator,
                                                 const char* text,
                                                 CFStringEncoding encoding);
/// Copies `count` UTF-16 units, unpaired surrogates included.
ORB_EXPORT CFStringRef CFStringCreateWithCharacters(CFAllocatorRef allocator,
                                                    const UniChar* characters,
                                                    CFIndex count);
ORB_EXPORT CFStringRef CFStringCreateCopy(CFAllocatorRef allocator, CFStringRef text);
/// The length in UTF-16 units.
ORB_EXPORT CFIndex CFStringGetLength(CFStringRef text);
/// Writes the text and a terminating zero into `buffer` of `size` bytes; an unpaired surrogate
/// becomes U+FFFD. False when it does not fit or the encoding is unknown, with the buffer's content
/// open, and when Mac OS Roman cannot express a character, which then stands as "?".
ORB_EXPORT Boolean CFStringGetCString(CFStringRef text,
                                      char* buffer,
                                      CFIndex size,
                                      CFStringEncoding encoding);
/// Copies the units of `range`, which must lie within the text.
ORB_EXPORT void CFStringGetCharacters(CFStringRef text, CFRange range, UniChar* buffer);
/// The most bytes that `length` UTF-16 units can take, without a terminating zero; -1 for an
/// unknown encoding.
ORB_EXPORT CFIndex CFStringGetMaximumSizeForEncoding(CFIndex length, CFStringEncoding encoding);
/// Always kCFStringEncodingMacRoman.
ORB_EXPORT CFStringEncoding CFStringGetSystemEncoding();

/// Null for a null path and for a path style other than kCFURLPOSIXPathStyle. Nothing is looked up.
ORB_EXPORT CFURLRef CFURLCreateWithFileSystemPath(CFAllocatorRef allocator,
                                                  CFStringRef path,
                                                  CFURLPathStyle style,
                                                  Boolean isDirectory);
/// The path as text, without a trailing "/" (the root keeps its own).
ORB_EXPORT CFStringRef CFURLCopyFileSystemPath(CFURLRef url, CFURLPathStyle style);

/// Makes a reference to the existing item at a UTF-8 path; `isDirectory` may be null. Not 0 when
/// nothing exists there (a link that leads nowhere does not exist) or the path cannot be held;
/// `ref` is then untouched.
ORB_EXPORT OSStatus FSPathMakeRef(const UInt8* path, FSRef* ref, Boolean* isDirectory);
/// Writes the item's path as zero-terminated UTF-8. Not 0 when it does not fit into `maxPathSize`
/// bytes; `path` is then untouched.
ORB_EXPORT OSStatus FSRefMakePath(const FSRef* ref, UInt8* path, UInt32 maxPathSize);

}  // extern "C"

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>

/// \file
/// Tags that say in the type which encoding a raw, zero-terminated text carries. Each is one
/// pointer wide, owns nothing and copies nothing: the text must outlive it.

/// Text in the system encoding, Mac OS Roman.
class ORB_EXPORT OrbCharSystem {
 public:
  OrbCharSystem(const char* systemText) : text_(systemText) {}
  operator const char*() const { return text_; }

 private:
  const char* text_;
};

/// Text in UTF-8.
class ORB_EXPORT OrbCharUtf8 {
 public:
  OrbCharUtf8(const char* utf8Text) : text_(utf8Text) {}
  operator const char*() const { return text_; }

 private:
  const char* text_;
};

/// Text in UTF-16. The wchar_t forms hand the very same pointer on: what it points to must already
/// be 16-bit units, which text in wchar_t is not on Linux.
class ORB_EXPORT OrbCharUnicode {
 public:
  OrbCharUnicode(const unsigned short* utf16Text) : text_(utf16Text) {}
  OrbCharUnicode(const wchar_t* wideText)
      : text_(reinterpret_cast<const unsigned short*>(wideText)) {}
  operator const unsigned short*() const { return text_; }
  operator const wchar_t*() const { return reinterpret_cast<const wchar_t*>(text_); }

 private:
  const unsigned short* text_;
};

/// Text in the encoding of the interface, which is UTF-8.
class ORB_EXPORT OrbCharPlatform {
 public:
  OrbCharPlatform(const char* platformText) : text_(platformText) {}
  OrbCharPlatform(const OrbCharUtf8& utf8Text) : text_(utf8Text) {}
  operator const char*() const { return text_; }
  operator OrbCharUtf8() const { return OrbCharUtf8(text_); }

 private:
  const char* text_;
};

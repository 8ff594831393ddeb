// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/strings/string_data.h>

#include <cstdint>

/// \file
/// Where a photo was taken. The map and the properties panel pass COrbGeotagData, with the angles
/// in degrees, minutes and seconds as an image file records them; COrbSimpleGeotagData is the
/// compact form, four numbers and a word of validity bits.
///
/// Doubles are compared exactly: 0.0 equals -0.0, and a NaN equals nothing, so that a record which
/// holds one differs from itself. The numbered fields mean what the applications agree on.

class ORB_EXPORT COrbGeotagData {
 public:
  /// One angle.
  class ORB_EXPORT COrbGeotagDMS {
   public:
    COrbGeotagDMS() = default;
    COrbGeotagDMS(double d, double m, double s) : degrees(d), minutes(m), seconds(s) {}
    COrbGeotagDMS(const COrbGeotagDMS&) = default;
    COrbGeotagDMS(COrbGeotagDMS&&) noexcept = default;
    COrbGeotagDMS& operator=(const COrbGeotagDMS&) = default;
    COrbGeotagDMS& operator=(COrbGeotagDMS&&) noexcept = default;
    virtual ~COrbGeotagDMS();

    bool operator==(const COrbGeotagDMS&) const = default;
    bool operator!=(const COrbGeotagDMS&) const = default;

    double degrees = 0.0;
    double minutes = 0.0;
    double seconds = 0.0;
  };

  COrbGeotagData() = default;
  COrbGeotagData(const COrbGeotagData&) = default;
  COrbGeotagData(COrbGeotagData&&) noexcept = default;
  COrbGeotagData& operator=(const COrbGeotagData&) = default;
  COrbGeotagData& operator=(COrbGeotagData&&) noexcept = default;
  virtual ~COrbGeotagData();

  /// Neither flag is set, whatever the other fields hold.
  bool IsEmpty() const;

  /// Both flags, both angles, byteValue3 and realValue. The other fields are carried, not compared.
  bool operator==(const COrbGeotagData& other) const;
  bool operator!=(const COrbGeotagData& other) const;

  bool validFlag1 = false;
  bool validFlag2 = false;
  COrbGeotagDMS latitude;
  COrbGeotagDMS longitude;
  std::int8_t byteValue1 = 4;
  std::uint64_t wideValue = 0;
  std::int8_t byteValue2 = 0;
  double realValue = 0.0;
  std::int8_t byteValue3 = 0;
  COrbStringData geoText1;
  COrbStringData geoText2;
  std::int16_t shortValue1 = 0;
  std::int16_t shortValue2 = 0;
  COrbStringData geoText3;
  std::int32_t intValue = 0;
};

/// Four numbers and the bits that say which of them hold.
class ORB_EXPORT COrbSimpleGeotagData {
 public:
  COrbSimpleGeotagData() = default;
  COrbSimpleGeotagData(const COrbSimpleGeotagData&) = default;
  COrbSimpleGeotagData(COrbSimpleGeotagData&&) noexcept = default;
  COrbSimpleGeotagData& operator=(const COrbSimpleGeotagData&) = default;
  COrbSimpleGeotagData& operator=(COrbSimpleGeotagData&&) noexcept = default;
  virtual ~COrbSimpleGeotagData();

  /// Neither bit 0 nor bit 1 of validBits is set.
  bool IsEmpty() const;

  bool operator==(const COrbSimpleGeotagData&) const = default;
  bool operator!=(const COrbSimpleGeotagData&) const = default;

  double geoValue1 = 0.0;
  double geoValue2 = 0.0;
  double geoValue3 = 0.0;
  double geoValue4 = 0.0;
  std::int32_t validBits = 0;  ///< Bits above 1 are carried and compared, never interpreted.
};

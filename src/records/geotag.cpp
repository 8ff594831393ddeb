// SPDX-License-Identifier: MIT
#include <orb/records/geotag.h>

COrbGeotagData::COrbGeotagDMS::~COrbGeotagDMS() = default;

COrbGeotagData::~COrbGeotagData() = default;

bool COrbGeotagData::IsEmpty() const { return !validFlag1 && !validFlag2; }

// Without a short-cut for the object itself: with a NaN it is not its own equal.
bool COrbGeotagData::operator==(const COrbGeotagData& other) const {
  return validFlag1 == other.validFlag1 && validFlag2 == other.validFlag2 &&
         latitude == other.latitude && longitude == other.longitude &&
         byteValue3 == other.byteValue3 && realValue == other.realValue;
}

bool COrbGeotagData::operator!=(const COrbGeotagData& other) const { return !(*this == other); }

COrbSimpleGeotagData::~COrbSimpleGeotagData() = default;

bool COrbSimpleGeotagData::IsEmpty() const { return (validBits & 3) == 0; }

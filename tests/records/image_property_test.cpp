// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/records/image_property.h>

#include <limits>
#include <string>

#include "support/texts.h"

namespace {

using Record = COrbImagePropertyData;

constexpr double kNan = std::numeric_limits<double>::quiet_NaN();

// clang-format off
#define FLAG(name) {#name, &Record::Is##name, &Record::Set##name}
const struct {
  const char* name;
  bool (Record::*get)() const;
  void (Record::*set)(bool);
} kFlags[] = {
    FLAG(SupportAWB0), FLAG(SupportAWB1), FLAG(SupportAWB2), FLAG(SupportNaturalAWB),
    FLAG(SupportWBWater), FLAG(Slanted), FLAG(InscribedStraighten),
    {"CanApplyChrAbr", &Record::CanApplyChrAbr, &Record::SetCanApplyChrAbr},
    FLAG(UnsupportQX7Mode), FLAG(SupportLookAuto), FLAG(SupportedV2Look), FLAG(V1RawApplyV2Look),
    FLAG(SupportedFlareCorrection), FLAG(SupportedLatestLookColorProcess),
    FLAG(SupportedDiffraction), FLAG(SupportedVignette), FLAG(SupportedMoire),
    FLAG(SupportedFisheye), FLAG(SupportedDistortion), FLAG(SupportedUnderWater),
    FLAG(SupportedDustOff), FLAG(SupportedSkinSoftening), FLAG(SupportedEdgeNoiseReduction),
    FLAG(SupportedAstroNoiseReduction)};
// clang-format on

TEST(ImageProperties, KeepEachFlagApart) {
  for (const auto& flag : kFlags) {
    SCOPED_TRACE(flag.name);
    Record record, assigned;
    (record.*flag.set)(true);
    for (const auto& other : kFlags) EXPECT_EQ((record.*other.get)(), other.name == flag.name);
    assigned = record;
    EXPECT_TRUE((Record(record).*flag.get)() && (assigned.*flag.get)());
    EXPECT_TRUE(record == assigned && record != Record());
    (assigned.*flag.set)(false);
    EXPECT_TRUE(assigned == Record());
  }
}

TEST(ImageProperties, CarryAndCompareTheNeutralValues) {
  COrbNeutralNoiseReductionData neutral;
  neutral.nrValue5 = 6;
  Record number, vignette, skin, noise;
  number.SetSupportedNRMethod(0x80000001U);
  vignette.SetNeutralVignetteIntensity(-3);
  skin.SetNeutralSkinSofteningType(static_cast<eOrbSkinSofteningType>(-2));
  noise.SetNeutralNoiseReductionData(neutral);
  for (const Record& record : {number, vignette, skin, noise}) {
    EXPECT_TRUE(record != Record() && record == Record(record));
  }
  EXPECT_EQ(number.GetSupportedNRMethod(), 0x80000001U);
  EXPECT_EQ(vignette.GetNeutralVignetteIntensity(), -3);
  EXPECT_EQ(skin.GetNeutralSkinSofteningType(), -2);
  EXPECT_EQ(noise.GetNeutralNoiseReductionData().nrValue5, 6);
}

TEST(ImageProperties, CompareFocusAreasExactlyAndInOrder) {
  using Area = COrbFocusArea;
  Record record, other;
  record.focusAreas.resize(2);
  record.focusAreas[1].areaKind = 1;
  other = record;
  other.focusAreas[0].areaValue1 = -0.0F;
  EXPECT_TRUE(record == other);
  std::swap(other.focusAreas[0], other.focusAreas[1]);
  EXPECT_TRUE(record != other);
  for (const auto value :
       {&Area::areaValue1, &Area::areaValue2, &Area::areaValue3, &Area::areaValue4}) {
    other = record;
    other.focusAreas[1].*value = std::numeric_limits<float>::quiet_NaN();
    EXPECT_TRUE(other != Record(other) && other == other && record != other);
  }
}

TEST(ImageProperties, CompareTextsAsTextAndThePlaceByItsOwnRule) {
  Record record, other;
  record.text3 = S("Café");
  other.text3 = S("café");
  EXPECT_TRUE(record != other);
  other = record;
  other.geotag.geoText1 = S("Nara");
  EXPECT_TRUE(record == other);
}

TEST(Geotag, HasNoShortCutForItself) {
  COrbGeotagData place;
  place.latitude = COrbGeotagData::COrbGeotagDMS(1, 2, kNan);
  EXPECT_TRUE(place != place && !(place == place));
  EXPECT_TRUE(place.latitude != place.latitude);
  COrbSimpleGeotagData simple;
  simple.geoValue4 = kNan;
  EXPECT_TRUE(simple != simple);
  Record record;
  record.geotag = place;
  EXPECT_TRUE(record == record && record != Record(record));
  place.latitude.seconds = -0.0;
  EXPECT_TRUE(place.latitude == COrbGeotagData::COrbGeotagDMS(1, 2, 0));
}

TEST(Geotag, IsEmptyByItsFlagsAlone) {
  COrbGeotagData place;
  place.latitude.degrees = 34;
  EXPECT_TRUE(place.IsEmpty());
  place.validFlag2 = true;
  EXPECT_FALSE(place.IsEmpty());
  COrbSimpleGeotagData simple;
  for (simple.validBits = 0; simple.validBits < 8; ++simple.validBits)
    EXPECT_EQ(simple.IsEmpty(), simple.validBits % 4 == 0) << simple.validBits;
}

}  // namespace

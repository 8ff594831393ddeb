// SPDX-License-Identifier: MIT
#include <orb/records/image_property.h>
#include <orb/strings/string_functions.h>

#include <algorithm>
#include <array>
#include <tuple>

namespace {

// By value: a NaN equals nothing, and 0.0 equals -0.0.
bool AreSameAreas(const COrbFocusArea& a, const COrbFocusArea& b) {
  return a.areaValue1 == b.areaValue1 && a.areaValue3 == b.areaValue3 &&
         a.areaValue2 == b.areaValue2 && a.areaValue4 == b.areaValue4 && a.areaKind == b.areaKind;
}

bool AreSameTexts(const COrbStringData* a, const COrbStringData* b) {
  return OrbStringDataCmp(*a, *b) == 0;
}

}  // namespace

COrbFocusArea::~COrbFocusArea() = default;

COrbNeutralNoiseReductionData::~COrbNeutralNoiseReductionData() = default;

COrbImagePropertyData::~COrbImagePropertyData() = default;

/// What is compared, in the order of comparison; intValue11 to intValue13 take no part.
struct COrbImagePropertyData::Compared {
  // A line a group is easier to check than a line a name.
  // clang-format off
  static auto Values(const COrbImagePropertyData& r) {
    return std::tie(
        r.intValue1, r.intValue2, r.intValue3, r.intValue4, r.intValue5, r.dateTime1, r.intValue6,
        r.intValue7, r.intValue8, r.intValue9, r.intValue10, r.geotag, r.dateTime2, r.intValue14,
        r.intValue15, r.longValue);
  }

  static auto Flags(const COrbImagePropertyData& r) {
    return std::tie(
        r.supportAWB0, r.supportAWB1, r.supportAWB2, r.supportNaturalAWB, r.supportWBWater,
        r.slanted, r.inscribedStraighten, r.canApplyChrAbr, r.unsupportQX7Mode, r.supportLookAuto,
        r.supportedV2Look, r.v1RawApplyV2Look, r.supportedFlareCorrection,
        r.supportedLatestLookColorProcess, r.supportedDiffraction, r.supportedVignette,
        r.extraFlag1, r.extraFlag2, r.extraFlag3, r.extraFlag4, r.supportedMoire,
        r.supportedFisheye, r.supportedDistortion, r.supportedUnderWater, r.supportedDustOff,
        r.supportedSkinSoftening, r.supportedNRMethod, r.supportedEdgeNoiseReduction,
        r.supportedAstroNoiseReduction, r.neutralVignetteIntensity, r.neutralSkinSofteningType,
        r.neutralNoiseReduction);
  }
  // clang-format on

  static auto Texts(const COrbImagePropertyData& r) {
    return std::array{&r.text1, &r.text2, &r.text3, &r.text4, &r.text5, &r.text6, &r.text7};
  }
};

bool COrbImagePropertyData::operator==(const COrbImagePropertyData& other) const {
  if (this == &other) return true;
  return Compared::Values(*this) == Compared::Values(other) &&
         Compared::Flags(*this) == Compared::Flags(other) &&
         std::ranges::equal(Compared::Texts(*this), Compared::Texts(other), AreSameTexts) &&
         std::ranges::equal(focusAreas, other.focusAreas, AreSameAreas);
}

bool COrbImagePropertyData::operator!=(const COrbImagePropertyData& other) const {
  return !(*this == other);
}

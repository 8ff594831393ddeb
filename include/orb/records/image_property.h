// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/records/geotag.h>
#include <orb/strings/string_data.h>
#include <orb/time/time.h>

#include <cstdint>
#include <vector>

/// \file
/// What is known of one opened image. The module that opens it fills in its numbers, times, place,
/// texts and focus areas, and which adjustments its camera and format support; the editing panels
/// read from it which controls to offer and to which neutral values a reset returns. The library
/// only carries and compares the record.

/// How skin softening is done. The applications define the values.
enum eOrbSkinSofteningType : std::int32_t {};

/// One of the areas on which the camera focused.
class ORB_EXPORT COrbFocusArea {
 public:
  COrbFocusArea() = default;
  COrbFocusArea(const COrbFocusArea&) = default;
  COrbFocusArea(COrbFocusArea&&) noexcept = default;
  COrbFocusArea& operator=(const COrbFocusArea&) = default;
  COrbFocusArea& operator=(COrbFocusArea&&) noexcept = default;
  virtual ~COrbFocusArea();

  float areaValue1 = 0.0F;
  float areaValue2 = 0.0F;
  float areaValue3 = 0.0F;
  float areaValue4 = 0.0F;
  std::int32_t areaKind = 0;
};

/// The noise reduction to which a reset returns.
class ORB_EXPORT COrbNeutralNoiseReductionData {
 public:
  COrbNeutralNoiseReductionData() = default;
  COrbNeutralNoiseReductionData(const COrbNeutralNoiseReductionData&) = default;
  COrbNeutralNoiseReductionData(COrbNeutralNoiseReductionData&&) noexcept = default;
  COrbNeutralNoiseReductionData& operator=(const COrbNeutralNoiseReductionData&) = default;
  COrbNeutralNoiseReductionData& operator=(COrbNeutralNoiseReductionData&&) noexcept = default;
  virtual ~COrbNeutralNoiseReductionData();

  bool operator==(const COrbNeutralNoiseReductionData&) const = default;
  bool operator!=(const COrbNeutralNoiseReductionData&) const = default;

  std::int32_t nrValue1 = 1;
  std::int32_t nrValue2 = 0;
  std::int32_t nrValue3 = 0;
  std::int32_t nrValue4 = 5;
  std::int32_t nrValue5 = 5;
};

/// The properties of one image.
class ORB_EXPORT COrbImagePropertyData {
 public:
  COrbImagePropertyData() = default;
  COrbImagePropertyData(const COrbImagePropertyData&) = default;
  COrbImagePropertyData(COrbImagePropertyData&&) noexcept = default;
  COrbImagePropertyData& operator=(const COrbImagePropertyData&) = default;
  COrbImagePropertyData& operator=(COrbImagePropertyData&&) noexcept = default;
  virtual ~COrbImagePropertyData();

  /// True for the object itself. Otherwise everything counts but intValue11 to intValue13 and what
  /// the geotag's own comparison leaves out. Texts are compared by OrbStringDataCmp; focus areas
  /// exactly and in order, so that a NaN coordinate makes a record differ from its copy.
  bool operator==(const COrbImagePropertyData& other) const;
  bool operator!=(const COrbImagePropertyData& other) const;

  /// What the image supports, or already is. All false at first.
  bool IsSupportAWB0() const { return supportAWB0; }
  void SetSupportAWB0(bool yes) { supportAWB0 = yes; }
  bool IsSupportAWB1() const { return supportAWB1; }
  void SetSupportAWB1(bool yes) { supportAWB1 = yes; }
  bool IsSupportAWB2() const { return supportAWB2; }
  void SetSupportAWB2(bool yes) { supportAWB2 = yes; }
  bool IsSupportNaturalAWB() const { return supportNaturalAWB; }
  void SetSupportNaturalAWB(bool yes) { supportNaturalAWB = yes; }
  bool IsSupportWBWater() const { return supportWBWater; }
  void SetSupportWBWater(bool yes) { supportWBWater = yes; }
  bool IsSlanted() const { return slanted; }
  void SetSlanted(bool yes) { slanted = yes; }
  bool IsInscribedStraighten() const { return inscribedStraighten; }
  void SetInscribedStraighten(bool yes) { inscribedStraighten = yes; }
  bool CanApplyChrAbr() const { return canApplyChrAbr; }
  void SetCanApplyChrAbr(bool yes) { canApplyChrAbr = yes; }
  bool IsUnsupportQX7Mode() const { return unsupportQX7Mode; }
  void SetUnsupportQX7Mode(bool yes) { unsupportQX7Mode = yes; }
  bool IsSupportLookAuto() const { return supportLookAuto; }
  void SetSupportLookAuto(bool yes) { supportLookAuto = yes; }
  bool IsSupportedV2Look() const { return supportedV2Look; }
  void SetSupportedV2Look(bool yes) { supportedV2Look = yes; }
  bool IsV1RawApplyV2Look() const { return v1RawApplyV2Look; }
  void SetV1RawApplyV2Look(bool yes) { v1RawApplyV2Look = yes; }
  bool IsSupportedFlareCorrection() const { return supportedFlareCorrection; }
  void SetSupportedFlareCorrection(bool yes) { supportedFlareCorrection = yes; }
  bool IsSupportedLatestLookColorProcess() const { return supportedLatestLookColorProcess; }
  void SetSupportedLatestLookColorProcess(bool yes) { supportedLatestLookColorProcess = yes; }
  bool IsSupportedDiffraction() const { return supportedDiffraction; }
  void SetSupportedDiffraction(bool yes) { supportedDiffraction = yes; }
  bool IsSupportedVignette() const { return supportedVignette; }
  void SetSupportedVignette(bool yes) { supportedVignette = yes; }
  bool IsSupportedMoire() const { return supportedMoire; }
  void SetSupportedMoire(bool yes) { supportedMoire = yes; }
  bool IsSupportedFisheye() const { return supportedFisheye; }
  void SetSupportedFisheye(bool yes) { supportedFisheye = yes; }
  bool IsSupportedDistortion() const { return supportedDistortion; }
  void SetSupportedDistortion(bool yes) { supportedDistortion = yes; }
  bool IsSupportedUnderWater() const { return supportedUnderWater; }
  void SetSupportedUnderWater(bool yes) { supportedUnderWater = yes; }
  bool IsSupportedDustOff() const { return supportedDustOff; }
  void SetSupportedDustOff(bool yes) { supportedDustOff = yes; }
  bool IsSupportedSkinSoftening() const { return supportedSkinSoftening; }
  void SetSupportedSkinSoftening(bool yes) { supportedSkinSoftening = yes; }
  bool IsSupportedEdgeNoiseReduction() const { return supportedEdgeNoiseReduction; }
  void SetSupportedEdgeNoiseReduction(bool yes) { supportedEdgeNoiseReduction = yes; }
  bool IsSupportedAstroNoiseReduction() const { return supportedAstroNoiseReduction; }
  void SetSupportedAstroNoiseReduction(bool yes) { supportedAstroNoiseReduction = yes; }

  /// A word of noise reduction methods, which the applications define.
  unsigned int GetSupportedNRMethod() const { return supportedNRMethod; }
  void SetSupportedNRMethod(unsigned int method) { supportedNRMethod = method; }

  /// The neutral values: where a reset of the adjustment returns to.
  const COrbNeutralNoiseReductionData& GetNeutralNoiseReductionData() const {
    return neutralNoiseReduction;
  }
  void SetNeutralNoiseReductionData(const COrbNeutralNoiseReductionData& neutral) {
    neutralNoiseReduction = neutral;
  }
  short GetNeutralVignetteIntensity() const { return neutralVignetteIntensity; }
  void SetNeutralVignetteIntensity(short intensity) { neutralVignetteIntensity = intensity; }
  eOrbSkinSofteningType GetNeutralSkinSofteningType() const { return neutralSkinSofteningType; }
  void SetNeutralSkinSofteningType(eOrbSkinSofteningType type) { neutralSkinSofteningType = type; }

  std::int32_t intValue1 = 0;
  std::int32_t intValue2 = 0;
  std::int32_t intValue3 = 0;
  std::int32_t intValue4 = 0;
  std::int32_t intValue5 = 0;
  std::int32_t intValue6 = 0;
  std::int32_t intValue7 = 0;
  std::int32_t intValue8 = 0;
  std::int32_t intValue9 = 0;
  std::int32_t intValue10 = 0;
  std::uint32_t intValue11 = 0;  ///< Carried, not compared, like the next two.
  std::uint32_t intValue12 = 0;
  std::uint32_t intValue13 = 0;
  COrbTime dateTime1;
  COrbGeotagData geotag;
  COrbTime dateTime2;
  COrbStringData text1;
  std::int32_t intValue14 = 0;
  std::int32_t intValue15 = 0;
  std::int64_t longValue = 0;
  std::vector<COrbFocusArea> focusAreas;
  COrbStringData text2;
  COrbStringData text3;
  COrbStringData text4;
  COrbStringData text5;
  COrbStringData text6;
  COrbStringData text7;

 private:
  bool supportAWB0 = false;
  bool supportAWB1 = false;
  bool supportAWB2 = false;
  bool supportNaturalAWB = false;
  bool supportWBWater = false;
  bool slanted = false;
  bool inscribedStraighten = false;
  bool canApplyChrAbr = false;
  bool unsupportQX7Mode = false;
  bool supportLookAuto = false;
  bool supportedV2Look = false;
  bool v1RawApplyV2Look = false;
  bool supportedFlareCorrection = false;
  bool supportedLatestLookColorProcess = false;
  bool supportedDiffraction = false;
  bool supportedVignette = false;

 public:
  bool extraFlag1 = false;
  bool extraFlag2 = false;
  bool extraFlag3 = false;
  bool extraFlag4 = false;

 private:
  struct Compared;

  bool supportedMoire = false;
  bool supportedFisheye = false;
  bool supportedDistortion = false;
  bool supportedUnderWater = false;
  bool supportedDustOff = false;
  bool supportedSkinSoftening = false;
  std::uint32_t supportedNRMethod = 0;
  bool supportedEdgeNoiseReduction = false;
  bool supportedAstroNoiseReduction = false;
  std::int16_t neutralVignetteIntensity = 0;
  eOrbSkinSofteningType neutralSkinSofteningType = {};
  COrbNeutralNoiseReductionData neutralNoiseReduction;
};

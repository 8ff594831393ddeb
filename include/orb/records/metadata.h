// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/strings/string_data.h>

#include <cstdint>
#include <map>
#include <set>

/// \file
/// The texts that describe a photo: caption, author, rights and the like. The metadata editor
/// passes the IPTC records, one photo's texts, a preset to be applied, or what several photos have
/// in common; the browser's database hands its texts over in COrbDBMetaData. The applications fill
/// the tables; IPTC item codes and database keys are theirs.

/// Which text of the database. The applications define the values; the table orders them as signed
/// numbers.
enum eOrbDBMetaData : std::int32_t {};

/// One photo's IPTC texts.
class ORB_EXPORT COrbIPTCData {
 public:
  COrbIPTCData() = default;
  COrbIPTCData(const COrbIPTCData&) = default;
  COrbIPTCData(COrbIPTCData&&) noexcept = default;
  COrbIPTCData& operator=(const COrbIPTCData&) = default;
  COrbIPTCData& operator=(COrbIPTCData&&) noexcept = default;
  virtual ~COrbIPTCData();

  std::map<std::uint32_t, COrbStringData> items;  ///< By item code.
};

/// IPTC texts kept under a name to be applied to other photos.
class ORB_EXPORT COrbIPTCPresetData : public COrbIPTCData {
 public:
  COrbIPTCPresetData() = default;
  COrbIPTCPresetData(const COrbIPTCPresetData&) = default;
  COrbIPTCPresetData(COrbIPTCPresetData&&) noexcept = default;
  COrbIPTCPresetData& operator=(const COrbIPTCPresetData&) = default;
  COrbIPTCPresetData& operator=(COrbIPTCPresetData&&) noexcept = default;
  ~COrbIPTCPresetData() override;

  std::int32_t presetValue = 0;
  COrbStringData presetText;
  std::set<std::uint32_t> selectedCodes;  ///< The item codes that the preset is about.
};

/// IPTC texts for editing several photos at once, with three sets of item codes.
class ORB_EXPORT COrbMultiIPTCData : public COrbIPTCData {
 public:
  COrbMultiIPTCData() = default;
  COrbMultiIPTCData(const COrbMultiIPTCData&) = default;
  COrbMultiIPTCData(COrbMultiIPTCData&&) noexcept = default;
  COrbMultiIPTCData& operator=(const COrbMultiIPTCData&) = default;
  COrbMultiIPTCData& operator=(COrbMultiIPTCData&&) noexcept = default;
  ~COrbMultiIPTCData() override;

  std::set<std::uint32_t> codeSet1;
  std::set<std::uint32_t> codeSet2;
  std::set<std::uint32_t> codeSet3;
};

/// One photo's texts in the browser's database.
class ORB_EXPORT COrbDBMetaData {
 public:
  COrbDBMetaData() = default;
  COrbDBMetaData(const COrbDBMetaData&) = default;
  COrbDBMetaData(COrbDBMetaData&&) noexcept = default;
  COrbDBMetaData& operator=(const COrbDBMetaData&) = default;
  COrbDBMetaData& operator=(COrbDBMetaData&&) noexcept = default;
  virtual ~COrbDBMetaData();

  /// The text under `key`; a string without value when there is none. Nothing is added.
  COrbStringData GetStringData(eOrbDBMetaData key) const;

  std::map<eOrbDBMetaData, COrbStringData> entries;
};

// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/strings/string_data.h>
#include <orb/strings/string_functions.h>
#include <orb/time/time.h>

#include <cstdint>
#include <map>
#include <vector>

/// \file
/// What is exchanged with an online sharing service. The upload panel keeps the photos to be shared
/// in a COrbSNSDataList, under their texts and with the tree of albums in which they go, and asks
/// for items back with COrbSNSDownloadData. The library talks to no service.
///
/// Mind how items and nodes are assigned: what every entry has (COrbSNSCommonData) says which entry
/// of the service it is, and stays; only what the item or node adds is taken over. A new copy is a
/// full copy. Items, nodes and lists have no moves, so that a growing container copies in full too.
/// But std::swap, sorting, and inserting or erasing before the end of a vector assign: they shift
/// items and nodes and leave the common members where they were. Build a new vector from copies.

/// What every entry of the service has.
class ORB_EXPORT COrbSNSCommonData {
 public:
  COrbSNSCommonData() = default;
  COrbSNSCommonData(const COrbSNSCommonData&) = default;
  COrbSNSCommonData(COrbSNSCommonData&&) noexcept = default;
  COrbSNSCommonData& operator=(const COrbSNSCommonData&) = default;
  COrbSNSCommonData& operator=(COrbSNSCommonData&&) noexcept = default;
  virtual ~COrbSNSCommonData();

  std::uint64_t commonValue = 0;
  COrbStringData commonText1;
  std::int32_t commonInt = 0;
  COrbStringData commonText2;
  COrbTime commonTime1;
  COrbTime commonTime2;
};

/// One photo or movie to be shared.
class ORB_EXPORT COrbSNSItemData : public COrbSNSCommonData {
 public:
  COrbSNSItemData() = default;
  COrbSNSItemData(const COrbSNSItemData&) = default;
  /// Leaves the members of COrbSNSCommonData as they are.
  COrbSNSItemData& operator=(const COrbSNSItemData& other);
  ~COrbSNSItemData() override;

  COrbStringData itemText1;
  COrbStringData itemText2;
  COrbStringData itemText3;
  std::int32_t itemInt1 = 0;
  std::int32_t itemInt2 = 0;
  std::int32_t itemInt3 = 0;
};

/// An album with the albums in it, to any depth.
class ORB_EXPORT COrbSNSNodeData : public COrbSNSCommonData {
 public:
  COrbSNSNodeData() = default;
  COrbSNSNodeData(const COrbSNSNodeData&) = default;
  /// Leaves the members of COrbSNSCommonData as they are, also in each child that was there
  /// already: the n-th child is assigned from the n-th, those beyond are added as full copies or
  /// removed. A node may be assigned from a node of its own tree.
  COrbSNSNodeData& operator=(const COrbSNSNodeData& other);
  ~COrbSNSNodeData() override;

  std::vector<COrbSNSNodeData> children;
  std::vector<COrbStringData> nodeTexts;
  bool nodeFlag = false;
};

/// The items to be shared, and the albums.
class ORB_EXPORT COrbSNSDataList {
 public:
  /// OrbStringDataCmp: by UTF-16 units; keys that it finds equal are one key.
  struct KeyOrder {
    bool operator()(const COrbStringData& a, const COrbStringData& b) const {
      return OrbStringDataCmp(a, b) < 0;
    }
  };

  COrbSNSDataList() = default;
  COrbSNSDataList(const COrbSNSDataList&) = default;
  /// Ends with the other list's keys. As many items as there were before are assigned and so keep
  /// the COrbSNSCommonData of an old item, whichever that is; the rest are full copies. rootNode is
  /// assigned as a node.
  COrbSNSDataList& operator=(const COrbSNSDataList& other);
  virtual ~COrbSNSDataList();

  std::int32_t listInt = 0;
  std::map<COrbStringData, COrbSNSItemData, KeyOrder> items;
  COrbSNSNodeData rootNode;
};

/// A request to fetch items from the service into a folder.
class ORB_EXPORT COrbSNSDownloadData {
 public:
  COrbSNSDownloadData() = default;
  COrbSNSDownloadData(const COrbSNSDownloadData&) = default;
  COrbSNSDownloadData(COrbSNSDownloadData&&) noexcept = default;
  COrbSNSDownloadData& operator=(const COrbSNSDownloadData&) = default;
  COrbSNSDownloadData& operator=(COrbSNSDownloadData&&) noexcept = default;
  virtual ~COrbSNSDownloadData();

  std::int32_t downloadInt = 0;
  COrbFilePath downloadPath;
  std::vector<std::uint64_t> downloadValues;
};

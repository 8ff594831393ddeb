// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/records/geometry.h>
#include <orb/strings/string_data.h>
#include <orb/time/time.h>

#include <array>
#include <cstdint>
#include <map>
#include <utility>
#include <vector>

/// \file
/// What the browser and the workspace show and remember. The browser passes images with their
/// relations (COrbSourceData), folders, nodes and names; the workspace its modules, windows, views,
/// fonts, order, functions with their icons, colour profiles and histograms, the files behind undo
/// and redo, and which edits are kept in step.
///
/// A 64-bit value is copied bit for bit: where the applications keep a handle in it, a copy shares
/// the handle. Blocks and numbered fields mean what the applications agree on.

/// How an image belongs together with others.
class ORB_EXPORT COrbRelationData {
 public:
  COrbRelationData() = default;
  COrbRelationData(const COrbRelationData&) = default;
  COrbRelationData(COrbRelationData&&) noexcept = default;
  COrbRelationData& operator=(const COrbRelationData&) = default;
  COrbRelationData& operator=(COrbRelationData&&) noexcept = default;
  virtual ~COrbRelationData();

  std::array<std::uint8_t, 16> relationBlock = {};
  std::vector<std::uint64_t> relationValues1;
  std::vector<std::uint64_t> relationValues2;
};

/// One image in the browser: its file, times and relations.
class ORB_EXPORT COrbSourceData {
 public:
  COrbSourceData() = default;
  COrbSourceData(const COrbSourceData&) = default;
  COrbSourceData(COrbSourceData&&) noexcept = default;
  COrbSourceData& operator=(const COrbSourceData&) = default;
  COrbSourceData& operator=(COrbSourceData&&) noexcept = default;
  virtual ~COrbSourceData();

  std::uint64_t sourceValue1 = 0;
  COrbFilePath sourcePath;
  COrbStringData sourceText;
  std::uint64_t sourceValue2 = 0;
  std::int32_t sourceInt = 0;
  COrbTime sourceTime1;
  COrbTime sourceTime2;
  std::uint64_t sourceValue3 = 0;
  COrbRelationData relation;
  COrbTime sourceTime3;
};

/// A module of the workspace.
class ORB_EXPORT COrbModuleData {
 public:
  COrbModuleData() = default;
  COrbModuleData(const COrbModuleData&) = default;
  COrbModuleData(COrbModuleData&&) noexcept = default;
  COrbModuleData& operator=(const COrbModuleData&) = default;
  COrbModuleData& operator=(COrbModuleData&&) noexcept = default;
  virtual ~COrbModuleData();

  std::int32_t moduleInt1 = 0;
  std::int32_t moduleInt2 = 0;
  std::int32_t moduleInt3 = 0;
  COrbStringData moduleText;
};

/// How a window stands.
class ORB_EXPORT COrbWindowData {
 public:
  COrbWindowData() = default;
  COrbWindowData(const COrbWindowData&) = default;
  COrbWindowData(COrbWindowData&&) noexcept = default;
  COrbWindowData& operator=(const COrbWindowData&) = default;
  COrbWindowData& operator=(COrbWindowData&&) noexcept = default;
  virtual ~COrbWindowData();

  std::array<std::uint8_t, 24> windowBlock = {};
};

/// A view.
class ORB_EXPORT COrbViewData {
 public:
  COrbViewData() = default;
  COrbViewData(const COrbViewData&) = default;
  COrbViewData(COrbViewData&&) noexcept = default;
  COrbViewData& operator=(const COrbViewData&) = default;
  COrbViewData& operator=(COrbViewData&&) noexcept = default;
  virtual ~COrbViewData();

  std::uint64_t viewValue = 0;
};

/// A font.
class ORB_EXPORT COrbFontData {
 public:
  COrbFontData() = default;
  COrbFontData(const COrbFontData&) = default;
  COrbFontData(COrbFontData&&) noexcept = default;
  COrbFontData& operator=(const COrbFontData&) = default;
  COrbFontData& operator=(COrbFontData&&) noexcept = default;
  virtual ~COrbFontData();

  std::uint64_t fontValue = 0;
};

/// How images are organised in the browser.
class ORB_EXPORT COrbOrganizeData {
 public:
  COrbOrganizeData() = default;
  COrbOrganizeData(const COrbOrganizeData&) = default;
  COrbOrganizeData(COrbOrganizeData&&) noexcept = default;
  COrbOrganizeData& operator=(const COrbOrganizeData&) = default;
  COrbOrganizeData& operator=(COrbOrganizeData&&) noexcept = default;
  virtual ~COrbOrganizeData();

  std::uint64_t organizeValue = 0;
  std::int32_t organizeInt1 = 0;
  std::int32_t organizeInt2 = 0;
  bool organizeFlag = true;
};

/// A colour profile: its file and its bytes.
class ORB_EXPORT COrbProfileData {
 public:
  COrbProfileData() = default;
  COrbProfileData(const COrbProfileData&) = default;
  COrbProfileData(COrbProfileData&&) noexcept = default;
  COrbProfileData& operator=(const COrbProfileData&) = default;
  COrbProfileData& operator=(COrbProfileData&&) noexcept = default;
  virtual ~COrbProfileData();

  std::int32_t profileInt1 = 0;
  std::int32_t profileInt2 = 0;
  COrbFilePath profilePath;
  COrbBuffer profileBuffer;  ///< Copied when the record is moved, too.
};

/// An image with its colour profile.
class ORB_EXPORT COrbProfileImage {
 public:
  COrbProfileImage() = default;
  COrbProfileImage(const COrbProfileImage&) = default;
  COrbProfileImage(COrbProfileImage&&) noexcept = default;
  COrbProfileImage& operator=(const COrbProfileImage&) = default;
  COrbProfileImage& operator=(COrbProfileImage&&) noexcept = default;
  virtual ~COrbProfileImage();

  COrbProfileData profile;
  std::uint64_t imageValue = 0;
};

/// A bitmap, its size and where it is drawn.
class ORB_EXPORT COrbBitmapData {
 public:
  COrbBitmapData() = default;
  COrbBitmapData(const COrbBitmapData&) = default;
  COrbBitmapData(COrbBitmapData&&) noexcept = default;
  COrbBitmapData& operator=(const COrbBitmapData&) = default;
  COrbBitmapData& operator=(COrbBitmapData&&) noexcept = default;
  virtual ~COrbBitmapData();

  std::uint64_t bitmapValue = 0;
  COrbSize bitmapSize;
  COrbPoint bitmapPoint;
};

/// The bitmaps of one icon.
class ORB_EXPORT COrbIconData {
 public:
  COrbIconData() = default;
  COrbIconData(const COrbIconData&) = default;
  COrbIconData(COrbIconData&&) noexcept = default;
  COrbIconData& operator=(const COrbIconData&) = default;
  COrbIconData& operator=(COrbIconData&&) noexcept = default;
  virtual ~COrbIconData();

  std::map<std::uint32_t, COrbBitmapData> bitmaps;  ///< By the code of the variant.
};

/// A function that the workspace offers, with its icons.
class ORB_EXPORT COrbFunctionData {
 public:
  COrbFunctionData() = default;
  COrbFunctionData(const COrbFunctionData&) = default;
  /// Leaves icons and functionInt5 as they are, so also where std::swap, sorting, or erasing before
  /// the end of a vector assigns. A new copy has them; no moves, so that every transfer keeps to
  /// these two rules.
  COrbFunctionData& operator=(const COrbFunctionData& other);
  virtual ~COrbFunctionData();

  std::int32_t functionInt1 = 0;
  std::int32_t functionInt2 = 0;
  COrbStringData functionText;
  std::int32_t functionInt3 = 0;
  std::int32_t functionInt4 = 0;
  COrbIconData icons;
  std::uint32_t functionInt5 = 0;
  std::int32_t functionInt6 = 0;
  std::int32_t functionInt7 = 0;
  std::int32_t functionInt8 = 0;
};

/// A folder in the browser.
class ORB_EXPORT COrbFolderData {
 public:
  COrbFolderData() = default;
  COrbFolderData(const COrbFolderData&) = default;
  COrbFolderData(COrbFolderData&&) noexcept = default;
  COrbFolderData& operator=(const COrbFolderData&) = default;
  COrbFolderData& operator=(COrbFolderData&&) noexcept = default;
  virtual ~COrbFolderData();

  std::array<std::uint8_t, 16> folderBlock = {};
  COrbFilePath folderPath;
  std::vector<std::uint64_t> folderValues;
};

/// A node of the browser's tree.
class ORB_EXPORT COrbNodeData {
 public:
  COrbNodeData() = default;
  COrbNodeData(const COrbNodeData&) = default;
  COrbNodeData(COrbNodeData&&) noexcept = default;
  COrbNodeData& operator=(const COrbNodeData&) = default;
  COrbNodeData& operator=(COrbNodeData&&) noexcept = default;
  virtual ~COrbNodeData();

  std::uint64_t nodeValue1 = 0;
  COrbStringData nodeText;
  std::int32_t nodeInt1 = 0;
  std::int32_t nodeInt2 = 0;
  std::uint64_t nodeValue2 = 0;
  std::vector<std::uint64_t> nodeValues1;
  std::vector<std::uint64_t> nodeValues2;
  std::vector<std::uint64_t> nodeValues3;
};

/// A name and what it stands for.
class ORB_EXPORT COrbNameData {
 public:
  COrbNameData() = default;
  COrbNameData(const COrbNameData&) = default;
  COrbNameData(COrbNameData&&) noexcept = default;
  COrbNameData& operator=(const COrbNameData&) = default;
  COrbNameData& operator=(COrbNameData&&) noexcept = default;
  virtual ~COrbNameData();

  std::uint64_t nameValue = 0;
  COrbStringData nameText;
};

/// How often each brightness occurs, one inner list per histogram.
class ORB_EXPORT COrbHistogramData {
 public:
  COrbHistogramData() = default;
  COrbHistogramData(const COrbHistogramData&) = default;
  COrbHistogramData(COrbHistogramData&&) noexcept = default;
  COrbHistogramData& operator=(const COrbHistogramData&) = default;
  COrbHistogramData& operator=(COrbHistogramData&&) noexcept = default;
  virtual ~COrbHistogramData();

  std::vector<std::vector<std::int32_t>> histograms;
};

/// The pairs of files behind a step of undo or redo.
class ORB_EXPORT COrbUndoRedoDataList {
 public:
  COrbUndoRedoDataList() = default;
  COrbUndoRedoDataList(const COrbUndoRedoDataList&) = default;
  COrbUndoRedoDataList(COrbUndoRedoDataList&&) noexcept = default;
  COrbUndoRedoDataList& operator=(const COrbUndoRedoDataList&) = default;
  COrbUndoRedoDataList& operator=(COrbUndoRedoDataList&&) noexcept = default;
  virtual ~COrbUndoRedoDataList();

  std::int32_t undoInt = 0;
  std::vector<std::pair<COrbFilePath, COrbFilePath>> pathPairs;
};

/// Which edits are kept in step between images. Not polymorphic.
class COrbEditSyncData {
 public:
  ORB_EXPORT COrbEditSyncData();

  std::array<std::uint8_t, 24> syncBlock = {};
  bool syncFlag = false;
};

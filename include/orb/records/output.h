// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/records/geometry.h>
#include <orb/records/geotag.h>
#include <orb/records/metadata.h>
#include <orb/strings/string_data.h>

#include <array>
#include <cstdint>
#include <vector>

/// \file
/// Work that a user asked for and that leaves files behind. The export, batch and rename dialogs
/// fill these records, the module that does the work reads them: where and how images are written
/// (COrbOutput...), a batch job, how its files are renamed, a file to be copied, the part of a
/// movie to be kept, and COrbTaskPropertyData, the settings of one whole task.
///
/// The library acts on none of them. Blocks and numbered fields mean what the applications agree
/// on; a block is copied byte for byte.

/// Where one image is written, and how large.
class ORB_EXPORT COrbOutputData {
 public:
  COrbOutputData() = default;
  COrbOutputData(const COrbOutputData&) = default;
  COrbOutputData(COrbOutputData&&) noexcept = default;
  COrbOutputData& operator=(const COrbOutputData&) = default;
  COrbOutputData& operator=(COrbOutputData&&) noexcept = default;
  virtual ~COrbOutputData();

  COrbFilePath outputPath;
  COrbStringData outputText;
  double outputReal = 1.0;
  COrbSize outputSize;
  std::array<std::uint8_t, 32> outputBlock = {};
};

/// One batch job: the images and how they are processed.
class ORB_EXPORT COrbBatchData {
 public:
  COrbBatchData() = default;
  /// A copy starts with batchFlag false, also in a vector that grows; no moves, so that every
  /// transfer keeps to that.
  COrbBatchData(const COrbBatchData& other);
  COrbBatchData& operator=(const COrbBatchData&) = default;
  virtual ~COrbBatchData();

  std::vector<std::uint64_t> batchValues;
  std::vector<COrbFilePath> batchPaths;
  COrbFilePath batchPath;
  std::vector<COrbStringData> batchTexts;
  double batchReal1 = 1.0;
  double batchReal2 = 300.0;
  COrbSize batchSize;
  std::array<std::uint8_t, 8> batchBlock = {};
  std::int32_t batchValue = 0;
  bool batchFlag = false;  ///< Assigned, but false in every new copy.
};

/// How the files of a job are named: texts, running numbers and where they start.
class ORB_EXPORT COrbRenameData {
 public:
  COrbRenameData() = default;
  COrbRenameData(const COrbRenameData&) = default;
  COrbRenameData(COrbRenameData&&) noexcept = default;
  COrbRenameData& operator=(const COrbRenameData&) = default;
  COrbRenameData& operator=(COrbRenameData&&) noexcept = default;
  virtual ~COrbRenameData();

  /// Lets the files keep their original names: renameValue3, 4 and 5 become 3, 3 and 4, the rest
  /// stays.
  void SetToOriginal();

  std::int32_t renameValue1 = 0;
  std::int32_t renameValue2 = 1;
  COrbStringData renameText1;
  COrbStringData renameText2;
  std::int32_t renameValue3 = 0;
  std::int32_t renameValue4 = 0;
  std::int32_t renameValue5 = 0;
  std::int32_t renameValue6 = 1;
  std::int32_t renameValue7 = 3;
  std::int32_t renameValue8 = 1;
  std::int32_t renameValue9 = 3;
  std::uint8_t renameFlag1 = 0;
  std::int32_t renameValue10 = 10;
  std::int32_t renameValue11 = 0;
  std::int32_t renameValue12 = 0;
  std::int32_t renameValue13 = 0;
  std::int32_t renameValue14 = 0;
  std::int32_t renameValue15 = 10;
  std::int32_t renameValue16 = 0;
  std::int32_t renameValue17 = 1;
  std::int32_t renameValue18 = 3;
  std::uint8_t renameFlag2 = 0;
  std::uint8_t renameFlag3 = 0;
};

/// A file to be copied.
class ORB_EXPORT COrbFileCopyData {
 public:
  COrbFileCopyData() = default;
  COrbFileCopyData(const COrbFileCopyData&) = default;
  COrbFileCopyData(COrbFileCopyData&&) noexcept = default;
  COrbFileCopyData& operator=(const COrbFileCopyData&) = default;
  COrbFileCopyData& operator=(COrbFileCopyData&&) noexcept = default;
  virtual ~COrbFileCopyData();

  COrbFilePath copyPath;
  COrbStringData copyText;
};

/// The file of an MSS output.
class ORB_EXPORT COrbOutputMSSData {
 public:
  COrbOutputMSSData() = default;
  COrbOutputMSSData(const COrbOutputMSSData&) = default;
  COrbOutputMSSData(COrbOutputMSSData&&) noexcept = default;
  COrbOutputMSSData& operator=(const COrbOutputMSSData&) = default;
  COrbOutputMSSData& operator=(COrbOutputMSSData&&) noexcept = default;
  virtual ~COrbOutputMSSData();

  std::uint64_t leadingSlot = 0;  ///< Reserved; copied with the rest.
  COrbFilePath filePath;
  COrbStringData fileText;
};

/// The file of an AFNR output.
class ORB_EXPORT COrbOutputAFNRFileData {
 public:
  COrbOutputAFNRFileData() = default;
  COrbOutputAFNRFileData(const COrbOutputAFNRFileData&) = default;
  COrbOutputAFNRFileData(COrbOutputAFNRFileData&&) noexcept = default;
  COrbOutputAFNRFileData& operator=(const COrbOutputAFNRFileData&) = default;
  COrbOutputAFNRFileData& operator=(COrbOutputAFNRFileData&&) noexcept = default;
  virtual ~COrbOutputAFNRFileData();

  std::uint64_t leadingSlot = 0;  ///< Reserved; copied with the rest.
  COrbFilePath filePath;
  COrbStringData fileText;
};

/// An image taken out of a movie.
class ORB_EXPORT COrbOutputMovieImageData {
 public:
  COrbOutputMovieImageData() = default;
  COrbOutputMovieImageData(const COrbOutputMovieImageData&) = default;
  COrbOutputMovieImageData(COrbOutputMovieImageData&&) noexcept = default;
  COrbOutputMovieImageData& operator=(const COrbOutputMovieImageData&) = default;
  COrbOutputMovieImageData& operator=(COrbOutputMovieImageData&&) noexcept = default;
  virtual ~COrbOutputMovieImageData();

  COrbStringData movieText;
  std::int64_t movieValue = 0;
  std::int32_t movieInt1 = 0;
  std::int32_t movieInt2 = 0;
};

/// The part of a movie to be kept.
class ORB_EXPORT COrbMovieTrimData {
 public:
  COrbMovieTrimData() = default;
  COrbMovieTrimData(const COrbMovieTrimData&) = default;
  COrbMovieTrimData(COrbMovieTrimData&&) noexcept = default;
  COrbMovieTrimData& operator=(const COrbMovieTrimData&) = default;
  COrbMovieTrimData& operator=(COrbMovieTrimData&&) noexcept = default;
  virtual ~COrbMovieTrimData();

  std::array<std::uint8_t, 16> trimRange = {};
};

/// The part of a movie to be saved.
class ORB_EXPORT COrbMovieTrimSaveData : public COrbMovieTrimData {
 public:
  COrbMovieTrimSaveData() = default;
  /// A copy starts with trimRange zero, also in a vector that grows; no moves, so that every
  /// transfer keeps to that. Assignment copies it.
  COrbMovieTrimSaveData(const COrbMovieTrimSaveData& other);
  COrbMovieTrimSaveData& operator=(const COrbMovieTrimSaveData&) = default;
  ~COrbMovieTrimSaveData() override;

  std::uint64_t trimSaveValue = 0;
};

/// Everything that one processing task was set to. Not polymorphic; it is copied member by member,
/// so that taskTrim follows the rule of its own class.
class COrbTaskPropertyData {
 public:
  ORB_EXPORT COrbTaskPropertyData();

  std::vector<std::uint64_t> taskValues;
  std::int32_t taskInt1 = 0;
  COrbMultiIPTCData taskIPTC;
  std::int32_t taskInt2 = 0;
  std::int32_t taskInt3 = 0;
  std::int32_t taskInt4 = 0;
  std::vector<COrbGeotagData> taskGeotags;
  COrbMovieTrimSaveData taskTrim;
  bool taskFlag1 = false;
  bool taskFlag2 = false;
  std::int32_t taskInt5 = 0;
  COrbFilePath taskPath;
  COrbStringData taskText;
  COrbRenameData taskRename;
  bool taskFlag3 = false;
};

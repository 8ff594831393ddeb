// SPDX-License-Identifier: MIT
#include <orb/records/output.h>

COrbOutputData::~COrbOutputData() = default;

COrbBatchData::COrbBatchData(const COrbBatchData& other) : COrbBatchData() {
  *this = other;
  batchFlag = false;
}

COrbBatchData::~COrbBatchData() = default;

COrbRenameData::~COrbRenameData() = default;

void COrbRenameData::SetToOriginal() {
  renameValue3 = 3;
  renameValue4 = 3;
  renameValue5 = 4;
}

COrbFileCopyData::~COrbFileCopyData() = default;

COrbOutputMSSData::~COrbOutputMSSData() = default;

COrbOutputAFNRFileData::~COrbOutputAFNRFileData() = default;

COrbOutputMovieImageData::~COrbOutputMovieImageData() = default;

COrbMovieTrimData::~COrbMovieTrimData() = default;

COrbMovieTrimSaveData::COrbMovieTrimSaveData(const COrbMovieTrimSaveData& other)
    : COrbMovieTrimSaveData() {
  trimSaveValue = other.trimSaveValue;
}

COrbMovieTrimSaveData::~COrbMovieTrimSaveData() = default;

COrbTaskPropertyData::COrbTaskPropertyData() = default;

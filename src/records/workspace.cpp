// SPDX-License-Identifier: MIT
#include <orb/records/workspace.h>

COrbRelationData::~COrbRelationData() = default;

COrbSourceData::~COrbSourceData() = default;

COrbModuleData::~COrbModuleData() = default;

COrbWindowData::~COrbWindowData() = default;

COrbViewData::~COrbViewData() = default;

COrbFontData::~COrbFontData() = default;

COrbOrganizeData::~COrbOrganizeData() = default;

COrbProfileData::~COrbProfileData() = default;

COrbProfileImage::~COrbProfileImage() = default;

COrbBitmapData::~COrbBitmapData() = default;

COrbIconData::~COrbIconData() = default;

COrbFunctionData& COrbFunctionData::operator=(const COrbFunctionData& other) {
  functionInt1 = other.functionInt1;
  functionInt2 = other.functionInt2;
  functionText = other.functionText;
  functionInt3 = other.functionInt3;
  functionInt4 = other.functionInt4;
  functionInt6 = other.functionInt6;
  functionInt7 = other.functionInt7;
  functionInt8 = other.functionInt8;
  return *this;
}

COrbFunctionData::~COrbFunctionData() = default;

COrbFolderData::~COrbFolderData() = default;

COrbNodeData::~COrbNodeData() = default;

COrbNameData::~COrbNameData() = default;

COrbHistogramData::~COrbHistogramData() = default;

COrbUndoRedoDataList::~COrbUndoRedoDataList() = default;

COrbEditSyncData::COrbEditSyncData() = default;

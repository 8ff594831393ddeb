// SPDX-License-Identifier: MIT
#include <orb/records/metadata.h>

COrbIPTCData::~COrbIPTCData() = default;

COrbIPTCPresetData::~COrbIPTCPresetData() = default;

COrbMultiIPTCData::~COrbMultiIPTCData() = default;

COrbDBMetaData::~COrbDBMetaData() = default;

COrbStringData COrbDBMetaData::GetStringData(eOrbDBMetaData key) const {
  const auto entry = entries.find(key);
  return entry != entries.end() ? entry->second : COrbStringData();
}

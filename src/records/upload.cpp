// SPDX-License-Identifier: MIT
#include <orb/records/upload.h>

#include <algorithm>
#include <iterator>
#include <utility>

namespace {

using Nodes = decltype(COrbSNSNodeData::children);
using Items = decltype(COrbSNSDataList::items);

bool IsInTree(const COrbSNSNodeData& root, const COrbSNSNodeData& node) {
  return &root == &node || std::ranges::any_of(root.children, [&](const COrbSNSNodeData& child) {
    return IsInTree(child, node);
  });
}

void AssignNode(COrbSNSNodeData& target, const COrbSNSNodeData& source);

// Not the vector's own assignment: where it must grow it copies every element, and those that were
// there would lose their common members.
void AssignNodes(Nodes& targets, const Nodes& sources) {
  const auto kept = static_cast<Nodes::difference_type>(std::min(targets.size(), sources.size()));
  for (Nodes::difference_type i = 0; i < kept; ++i) {
    AssignNode(*(targets.begin() + i), *(sources.begin() + i));
  }
  targets.erase(targets.begin() + kept, targets.end());
  targets.insert(targets.end(), sources.begin() + kept, sources.end());
}

void AssignNode(COrbSNSNodeData& target, const COrbSNSNodeData& source) {
  AssignNodes(target.children, source.children);
  target.nodeTexts = source.nodeTexts;
  target.nodeFlag = source.nodeFlag;
}

// Not the map's own assignment: it makes every item anew, and none would keep its common members.
void AssignItems(Items& targets, const Items& sources) {
  Items old;
  old.swap(targets);
  for (const auto& [key, item] : sources) {
    if (old.empty()) {
      targets.emplace_hint(targets.end(), key, item);
      continue;
    }
    auto reused = old.extract(old.begin());
    reused.key() = key;
    reused.mapped() = item;
    targets.insert(targets.end(), std::move(reused));
  }
}

}  // namespace

COrbSNSCommonData::~COrbSNSCommonData() = default;

COrbSNSItemData& COrbSNSItemData::operator=(const COrbSNSItemData& other) {
  itemText1 = other.itemText1;
  itemText2 = other.itemText2;
  itemText3 = other.itemText3;
  itemInt1 = other.itemInt1;
  itemInt2 = other.itemInt2;
  itemInt3 = other.itemInt3;
  return *this;
}

COrbSNSItemData::~COrbSNSItemData() = default;

COrbSNSNodeData& COrbSNSNodeData::operator=(const COrbSNSNodeData& other) {
  if (this == &other) return *this;
  if (IsInTree(*this, other) || IsInTree(other, *this)) {
    AssignNode(*this, COrbSNSNodeData(other));  // The source would change while it is read.
  } else {
    AssignNode(*this, other);
  }
  return *this;
}

COrbSNSNodeData::~COrbSNSNodeData() = default;

COrbSNSDataList& COrbSNSDataList::operator=(const COrbSNSDataList& other) {
  if (this == &other) return *this;
  listInt = other.listInt;
  AssignItems(items, other.items);
  rootNode = other.rootNode;
  return *this;
}

COrbSNSDataList::~COrbSNSDataList() = default;

COrbSNSDownloadData::~COrbSNSDownloadData() = default;

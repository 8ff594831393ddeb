// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/records/upload.h>

#include <string>
#include <tuple>
#include <vector>

#include "support/texts.h"

namespace {

COrbSNSNodeData Node(const std::string& common,
                     const std::string& text,
                     std::vector<COrbSNSNodeData> children = {}) {
  COrbSNSNodeData node;
  node.commonText1 = S(common);
  node.nodeTexts = {S(text)};
  node.children = children;
  return node;
}

/// "common:text(children)", which shows where each half of a node came from.
std::string Shown(const COrbSNSNodeData& node) {
  std::string shown = Text(node.commonText1) + ":" + Text(node.nodeTexts[0]) + "(";
  for (const COrbSNSNodeData& child : node.children) shown += Shown(child);
  return shown + ")";
}

const COrbSNSNodeData kTree =
    Node("A", "a", {Node("B", "b", {Node("C", "c")}), Node("D", "d"), Node("E", "e")});

TEST(UploadNode, KeepsTheCommonMembersWhereItIsAssigned) {
  const std::tuple<COrbSNSNodeData, COrbSNSNodeData, const char*> kCases[] = {
      {Node("X", "x", {Node("Y", "y")}), kTree, "X:a(Y:b(C:c())D:d()E:e())"},
      {Node("X", "x", {Node("Y", "y", {Node("Z", "z")})}), kTree, "X:a(Y:b(Z:c())D:d()E:e())"},
      {kTree, Node("X", "x", {Node("Y", "y")}), "A:x(B:y())"},
      {kTree, Node("X", "x"), "A:x()"},
  };
  for (const auto& [before, source, result] : kCases) {
    COrbSNSNodeData target(before);
    target = source;
    EXPECT_EQ(Shown(target), result);
  }
}

TEST(UploadNode, MayBeAssignedWithinItsTree) {
  COrbSNSNodeData up(kTree), down(kTree);
  up = up.children[0];
  EXPECT_EQ(Shown(up), "A:b(B:c())");
  down.children[1].children = {Node("F", "f")};
  down.children[1] = down;
  EXPECT_EQ(Shown(down), "A:a(B:b(C:c())D:a(F:b(C:c())D:d(F:f())E:e())E:e())");
}

TEST(UploadNode, IsCopiedInFullByAGrowingContainer) {
  std::vector<COrbSNSNodeData> nodes(1, kTree);
  nodes.reserve(nodes.capacity() + 1);
  EXPECT_EQ(Shown(nodes[0]), Shown(kTree));
}

COrbSNSDataList List(const std::vector<std::string>& keys, const std::string& common) {
  COrbSNSDataList list;
  for (const std::string& key : keys) {
    list.items[S(key)].itemText1 = S("item " + key);
    list.items[S(key)].commonText1 = S(common);
  }
  return list;
}

TEST(UploadList, ReusesItsItemsWhenAssigned) {
  const std::tuple<COrbSNSDataList, COrbSNSDataList, const char*> kCases[] = {
      {List({"b"}, "old"), List({"c", "a", "b"}, "new"), "a:old b:new c:new "},
      {List({"x", "y", "z"}, "old"), List({"b", "a"}, "new"), "a:old b:old "},
      {List({}, "old"), List({"a"}, "new"), "a:new "},
      {List({"a"}, "old"), List({}, "new"), ""},
  };
  for (const auto& [before, source, expected] : kCases) {
    COrbSNSDataList target(before);
    target = source;
    std::string shown;
    for (const auto& [key, item] : target.items) {
      EXPECT_EQ(Text(item.itemText1), "item " + Text(key));
      shown += Text(key) + ":" + Text(item.commonText1) + " ";
    }
    EXPECT_EQ(shown, expected);
  }
}

TEST(UploadList, AssignsItsRootAsANode) {
  COrbSNSDataList list, other;
  list.listInt = 7;
  list.rootNode = kTree;
  list.rootNode.commonText1 = S("A");  // Assignment does not take it along.
  other.rootNode = Node("", "x");
  EXPECT_EQ(Shown(COrbSNSDataList(list).rootNode), Shown(kTree));
  other = list;
  EXPECT_EQ(other.listInt, 7);
  EXPECT_EQ(Shown(other.rootNode), ":a(B:b(C:c())D:d()E:e())");
}

}  // namespace

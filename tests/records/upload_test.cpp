// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/records/upload.h>

#include <string>
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
  const struct {
    COrbSNSNodeData target, source;
    const char* result;
  } kCases[] = {
      {Node("X", "x", {Node("Y", "y")}), kTree, "X:a(Y:b(C:c())D:d()E:e())"},
      {Node("X", "x", {Node("Y", "y", {Node("Z", "z")})}), kTree, "X:a(Y:b(Z:c())D:d()E:e())"},
      {kTree, Node("X", "x", {Node("Y", "y")}), "A:x(B:y())"},
      {kTree, Node("X", "x"), "A:x()"},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.result);
    COrbSNSNodeData target(c.target);
    target = c.source;
    EXPECT_EQ(Shown(target), c.result);
    target.children.clear();
    EXPECT_EQ(Shown(COrbSNSNodeData(c.source)), Shown(c.source));
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
  const struct {
    std::vector<std::string> target, source;
    std::size_t reused;
  } kCases[] = {{{"b"}, {"c", "a", "b"}, 1},
                {{"x", "y", "z"}, {"b", "a"}, 2},
                {{}, {"a"}, 0},
                {{"a"}, {}, 0}};
  for (const auto& c : kCases) {
    COrbSNSDataList target = List(c.target, "old");
    const COrbSNSDataList source = List(c.source, "new");
    target = source;
    std::size_t reused = 0;
    ASSERT_EQ(target.items.size(), c.source.size());
    auto expected = source.items.begin();
    for (const auto& [key, item] : target.items) {
      EXPECT_EQ(Text(key), Text(expected->first));
      EXPECT_EQ(Text(item.itemText1), Text((expected++)->second.itemText1));
      if (Text(item.commonText1) == "old") ++reused;
    }
    EXPECT_EQ(reused, c.reused);
  }
}

TEST(UploadList, IsOrderedByTextAndAssignsItsRootAsANode) {
  COrbSNSDataList list = List({"b", "a", "b"}, "");
  EXPECT_EQ(list.items.size(), 2U);
  EXPECT_EQ(Text(list.items.begin()->first), "a");
  COrbSNSDataList other;
  other.rootNode = Node("", "x");
  list.listInt = 7;
  list.rootNode = kTree;
  list.rootNode.commonText1 = S("A");
  EXPECT_EQ(Shown(COrbSNSDataList(list).rootNode), Shown(kTree));
  other = list;
  EXPECT_EQ(other.listInt, 7);
  EXPECT_EQ(Shown(other.rootNode), ":a(B:b(C:c())D:d()E:e())");
}

}  // namespace

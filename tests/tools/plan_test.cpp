// SPDX-License-Identifier: MIT
#include "plan.h"

#include <gtest/gtest.h>

#include <map>

#include "journal.h"

namespace orbimport {
namespace {

/// A DESTINATION that exists in the test only: what stands under each path.
class FakeView : public View {
 public:
  std::map<std::string, Found> there;

  std::vector<unsigned> Numbers(const std::string& folder,
                                const std::string& stem,
                                const std::string& tail) override {
    std::set<std::string> names;
    for (const auto& [path, found] : there) {
      if (path.starts_with(folder + "/")) names.insert(path.substr(folder.size() + 1));
    }
    return NumbersAmong(names, stem, tail);
  }
  Found Look(const std::string& path, const Item&) override {
    const auto found = there.find(path);
    return found == there.end() ? Found::kFree : found->second;
  }
};

std::vector<Item> Items(const std::vector<std::string>& paths) {
  std::vector<Item> items;
  COrbTime time;
  time.Initialize(2024, 5, 1, 10, 0, 0, 0, 0, 0);
  for (const std::string& path : paths) items.push_back({path, TypeOfName(path), 10, time, time});
  return items;
}

/// One line a step: what is done, from where, to where.
std::vector<std::string> PlanOf(const std::vector<std::string>& paths, FakeView& view) {
  Layout layout;
  std::string why;
  layout.Set("D", why);
  const std::vector<Item> items = Items(paths);
  Planner planner(items, layout, view);
  std::vector<std::string> lines;
  const std::vector<Shot> shots = MakeShots(items);
  for (std::size_t i = 0; i < shots.size(); ++i) {
    const ShotPlan plan = planner.Plan(shots[i], i);
    for (const Step& step : plan.steps) {
      constexpr const char* kActions[] = {"copy ", "redo ", "date ", "leave "};
      lines.push_back(kActions[static_cast<int>(step.action)] + items[step.item].path + " " +
                      plan.PathOf(step));
    }
  }
  return lines;
}

using Lines = std::vector<std::string>;

TEST(SplitName, TakesAPhotosExtensionBeforeASidecars) {
  const struct {
    const char *name, *stem, *tail;
  } kCases[] = {
      {"IMG_1.CR2", "IMG_1", ".CR2"},
      {"IMG_1.CR2.xmp", "IMG_1", ".CR2.xmp"},
      {"a.b.jpg", "a.b", ".jpg"},
      {"a.jpg.jpg", "a.jpg", ".jpg"},  // Only a sidecar names its photo.
      {"notes", "notes", ""},
  };
  for (const auto& c : kCases) {
    const Member member = SplitName(c.name);
    EXPECT_EQ(member.stem + "|" + member.tail, std::string(c.stem) + "|" + c.tail);
  }
}

TEST(Planner, KeepsAShotTogetherUnderOneNumber) {
  FakeView view;
  view.there["D/I.xmp"] = Found::kOther;
  view.there["D/I_1.JPG"] = Found::kOther;
  EXPECT_EQ(PlanOf({"a/I.CR2", "a/I.JPG", "a/I.xmp", "a/i.wav"}, view),
            (Lines{"copy a/I.CR2 D/I_2.CR2",
                   "copy a/I.JPG D/I_2.JPG",
                   "copy a/I.xmp D/I_2.xmp",
                   "copy a/i.wav D/i_2.wav"}));
}

TEST(Planner, GivesTwoFoldersWithTheSameNamesTwoNumbers) {
  FakeView view;
  const Lines paths = {"a/I.CR2", "a/I.JPG", "b/I.JPG", "b/I.xmp"};
  EXPECT_EQ(PlanOf(paths, view),
            (Lines{"copy a/I.CR2 D/I.CR2",
                   "copy a/I.JPG D/I.JPG",
                   "copy b/I.JPG D/I_1.JPG",
                   "copy b/I.xmp D/I_1.xmp"}));
  // All there, and even equal in size and time: each item has its own.
  for (const char* const path : {"D/I.CR2", "D/I.JPG", "D/I_1.JPG", "D/I_1.xmp"}) {
    view.there[path] = Found::kSame;
  }
  EXPECT_EQ(PlanOf(paths, view),
            (Lines{"leave a/I.CR2 D/I.CR2",
                   "leave a/I.JPG D/I.JPG",
                   "leave b/I.JPG D/I_1.JPG",
                   "leave b/I.xmp D/I_1.xmp"}));
}

TEST(Planner, AddsWhatIsMissingToAShotThatIsThere) {
  FakeView view;
  view.there = {{"D/I.CR2", Found::kOther}, {"D/I_1.CR2", Found::kSame}};
  EXPECT_EQ(PlanOf({"I.CR2", "I.JPG"}, view),
            (Lines{"leave I.CR2 D/I_1.CR2", "copy I.JPG D/I_1.JPG"}));
  // A sidecar that was edited since stays; the card's goes beside it, and only once.
  view.there = {{"D/I.CR2", Found::kSame}, {"D/I.xmp", Found::kOther}};
  EXPECT_EQ(PlanOf({"I.CR2", "I.xmp"}, view),
            (Lines{"leave I.CR2 D/I.CR2", "copy I.xmp D/I_1.xmp"}));
  view.there["D/I_1.xmp"] = Found::kSame;
  EXPECT_EQ(PlanOf({"I.CR2", "I.xmp"}, view),
            (Lines{"leave I.CR2 D/I.CR2", "leave I.xmp D/I_1.xmp"}));
}

TEST(Planner, FindsAShotBehindAGap) {
  FakeView view;
  view.there = {{"D/I_7.JPG", Found::kSame}};
  EXPECT_EQ(PlanOf({"I.JPG"}, view), Lines{"leave I.JPG D/I_7.JPG"});
}

TEST(Planner, FinishesWhatAKilledImportLeft) {
  FakeView view;
  view.there = {{"D/I.CR2", Found::kUnfinished}, {"D/J.CR2", Found::kUndated}};
  EXPECT_EQ(PlanOf({"I.CR2", "I.JPG", "J.CR2"}, view),
            (Lines{"redo I.CR2 D/I.CR2", "copy I.JPG D/I.JPG", "date J.CR2 D/J.CR2"}));
}

TEST(MakeShots, PartsNamesThatOneVolumeMayNotTellApart) {
  FakeView view;
  // Without regard to case, and composed or not; yet what differs in extension is one shot.
  EXPECT_EQ(MakeShots(Items({"I.JPG", "i.jpg", "i.CR2"})).size(), 2u);
  EXPECT_EQ(MakeShots(Items({"Caf\u00e9.jpg", "Cafe\u0301.jpg"})).size(), 2u);
  EXPECT_EQ(MakeShots(Items({"Caf\u00e9.jpg", "CAFE\u0301.xmp"})).size(), 1u);
  EXPECT_EQ(MakeShots(Items({"a/I.JPG", "b/I.xmp"})).size(), 2u);
}

TEST(NumbersAmong, ReadsOnlyNumbersAsTheyAreWritten) {
  const std::set<std::string> names = {"I.JPG",
                                       "I_1.JPG",
                                       "I_12.JPG",
                                       "I_2.JPG",
                                       "I_02.JPG",
                                       "I_x.JPG",
                                       "I_.JPG",
                                       "I_3.CR2",
                                       "I_0.JPG",
                                       "I_4_1.JPG",
                                       "I_99999999999.JPG",
                                       "IJ_5.JPG"};
  EXPECT_EQ(NumbersAmong(names, "I", ".JPG"), (std::vector<unsigned>{0, 1, 2, 12}));
  EXPECT_EQ(NumbersAmong(names, "I_4", ".JPG"), (std::vector<unsigned>{1}));
}

TEST(Journal, PassesOverWhatWasCutShort) {
  const Promise a{"2024/two\nlines \xff.jpg", 10, 3'800'000'000};
  const std::string text = "\n" + FormatPromise(a) + "garbage\n5 6\n5 6 %zz\n5 6 a b\n12 34 cut.jp";
  const auto promises = ParsePromises(text);
  ASSERT_EQ(promises.size(), 1u);
  EXPECT_EQ(promises.at(a.path), a);
}

}  // namespace
}  // namespace orbimport

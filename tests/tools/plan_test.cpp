// SPDX-License-Identifier: MIT
#include "plan.h"

#include <gtest/gtest.h>

#include <map>
#include <sstream>

#include "journal.h"

namespace orbimport {
namespace {

using enum Found;

/// A DESTINATION that exists in the test only: what stands under each path.
class FakeView : public View {
 public:
  explicit FakeView(const std::map<std::string, Found>& there) : there_(there) {}

  std::vector<unsigned> Numbers(const std::string& folder,
                                const std::string& stem,
                                const std::string& tail) override {
    std::set<std::string> names;
    for (const auto& [path, found] : there_) {
      if (path.starts_with(folder + "/")) names.insert(path.substr(folder.size() + 1));
    }
    return NumbersAmong(names, stem, tail);
  }
  Found Look(const std::string& path, const Item&) override {
    return there_.contains(path) ? there_.at(path) : kFree;
  }

 private:
  std::map<std::string, Found> there_;
};

std::vector<Item> Items(const std::string& paths) {
  std::vector<Item> items;
  COrbTime time;
  time.Initialize(2024, 5, 1, 10, 0, 0, 0, 0, 0);
  std::istringstream words(paths);
  for (std::string path; words >> path;) items.push_back({path, TypeOfName(path), 10, time, time});
  return items;
}

/// What is done with each item, shot by shot, and under which path.
std::string PlanOf(const std::string& paths, const std::map<std::string, Found>& there) {
  Layout layout;
  std::string why, said;
  layout.Set("D", why);
  const std::vector<Item> items = Items(paths);
  FakeView view(there);
  Planner planner(items, layout, view);
  const std::vector<Shot> shots = MakeShots(items);
  for (std::size_t i = 0; i < shots.size(); ++i) {
    const ShotPlan plan = planner.Plan(shots[i], i);
    for (const Step& step : plan.steps) {
      constexpr const char* kActions[] = {"copy ", "redo ", "date ", "leave "};
      said += (said.empty() ? "" : ", ") + std::string(kActions[static_cast<int>(step.action)]);
      said += plan.PathOf(step);
    }
  }
  return said;
}

TEST(Planner, FindsAPlaceForEachShot) {
  const struct {
    const char* paths;
    std::map<std::string, Found> there;
    const char* plan;
  } kCases[] = {
      // A shot stays together under one number, and two folders with the same names get two.
      {"a/I.CR2 a/I.JPG a/I.xmp a/i.wav",
       {{"D/I.xmp", kOther}, {"D/I_1.JPG", kOther}},
       "copy D/I_2.CR2, copy D/I_2.JPG, copy D/I_2.xmp, copy D/i_2.wav"},
      {"a/I.CR2 a/I.JPG b/I.JPG b/I.xmp",
       {},
       "copy D/I.CR2, copy D/I.JPG, copy D/I_1.JPG, copy D/I_1.xmp"},
      // All there, and even equal in size and time: each item has its own.
      {"a/I.CR2 a/I.JPG b/I.JPG b/I.xmp",
       {{"D/I.CR2", kSame}, {"D/I.JPG", kSame}, {"D/I_1.JPG", kSame}, {"D/I_1.xmp", kSame}},
       "leave D/I.CR2, leave D/I.JPG, leave D/I_1.JPG, leave D/I_1.xmp"},
      // What is missing is added to a shot that is there.
      {"I.CR2 I.JPG",
       {{"D/I.CR2", kOther}, {"D/I_1.CR2", kSame}},
       "leave D/I_1.CR2, copy D/I_1.JPG"},
      {"I.JPG", {{"D/I_7.JPG", kSame}}, "leave D/I_7.JPG"},
      // A sidecar that was edited since stays; the card's goes beside it, and only once.
      {"I.CR2 I.xmp", {{"D/I.CR2", kSame}, {"D/I.xmp", kOther}}, "leave D/I.CR2, copy D/I_1.xmp"},
      {"I.CR2 I.xmp",
       {{"D/I.CR2", kSame}, {"D/I.xmp", kOther}, {"D/I_1.xmp", kSame}},
       "leave D/I.CR2, leave D/I_1.xmp"},
      // What a killed import left is finished.
      {"I.CR2 I.JPG J.CR2",
       {{"D/I.CR2", kUnfinished}, {"D/J.CR2", kUndated}},
       "redo D/I.CR2, copy D/I.JPG, date D/J.CR2"},
  };
  for (const auto& c : kCases) EXPECT_EQ(PlanOf(c.paths, c.there), c.plan);
}

TEST(SplitName, TakesAPhotosExtensionBeforeASidecars) {
  const std::pair<std::string, std::string> kNames[] = {
      {"IMG_1", ".CR2"},
      {"IMG_1", ".CR2.xmp"},
      {"a.b", ".jpg"},
      {"a.jpg", ".jpg"},  // Only a sidecar names its photo.
      {"notes", ""},
  };
  for (const auto& [stem, tail] : kNames) {
    EXPECT_EQ(SplitName(stem + tail).stem, stem);
    EXPECT_EQ(SplitName(stem + tail).tail, tail);
  }
}

TEST(MakeShots, PartsNamesThatOneVolumeMayNotTellApart) {
  // Without regard to case, and composed or not; yet what differs in extension is one shot.
  EXPECT_EQ(MakeShots(Items("I.JPG i.jpg i.CR2")).size(), 2u);
  EXPECT_EQ(MakeShots(Items("Caf\u00e9.jpg Cafe\u0301.jpg")).size(), 2u);
  EXPECT_EQ(MakeShots(Items("Caf\u00e9.jpg CAFE\u0301.xmp")).size(), 1u);
  EXPECT_EQ(MakeShots(Items("a/I.JPG b/I.xmp")).size(), 2u);
}

TEST(NumbersAmong, ReadsOnlyNumbersAsTheyAreWritten) {
  std::set<std::string> names = {"I.JPG", "I_1.JPG", "I_12.JPG", "I_2.JPG"};
  names.insert({"I_02.JPG", "I_x.JPG", "I_.JPG", "I_3.CR2", "I_0.JPG"});
  names.insert({"I_4_1.JPG", "I_99999999999.JPG", "IJ_5.JPG"});
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

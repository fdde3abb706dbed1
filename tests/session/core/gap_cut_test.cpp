// SPDX-License-Identifier: Apache-2.0
#include "session/core/gap_cut.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

namespace vexa {
namespace {

constexpr std::int64_t kPicture = 40000;  // microseconds between two pictures

/// A recording of a picture every 40 ms, a key picture every 10, each of content of its own.
class Cut {
 public:
  Cut(const CutPlan& plan, std::vector<SeenPicture> before = {}, std::vector<SeenPicture> after = {})
      : cut_(plan, std::move(before), std::move(after)) {}

  void play(std::int64_t first_time, std::size_t pictures) {
    for (std::size_t i = 0; i < pictures && !over_; ++i) {
      take(cut_.add(100 + i, i % 10 == 0, first_time + static_cast<std::int64_t>(i) * kPicture));
    }
    if (!over_) take(cut_.end());
  }
  [[nodiscard]] const std::vector<std::size_t>& lead() const { return lead_; }
  [[nodiscard]] const std::vector<std::size_t>& taken() const { return taken_; }
  [[nodiscard]] std::size_t most_held() const { return most_held_; }

 private:
  void take(const GapCut::Verdict& verdict) {
    for (const std::size_t number : verdict.lead) lead_.push_back(number);
    for (const std::size_t number : verdict.take) taken_.push_back(number);
    over_ = verdict.over;
    ++given_;
    most_held_ = std::max(most_held_, given_ - std::min(given_, verdict.forget));
  }

  GapCut cut_;
  std::vector<std::size_t> lead_;
  std::vector<std::size_t> taken_;
  std::size_t given_ = 0;
  std::size_t most_held_ = 0;
  bool over_ = false;
};

std::vector<std::size_t> from_to(std::size_t first, std::size_t last) {
  std::vector<std::size_t> numbers;
  for (std::size_t i = first; i <= last; ++i) numbers.push_back(i);
  return numbers;
}

CutPlan plan_of(std::int64_t begin, std::int64_t end) {
  CutPlan plan;
  plan.begin = begin;
  plan.end = end;
  return plan;
}

/// Live pictures that are those from `first` to `last` of the recording, `late` after they were taken.
std::vector<SeenPicture> live(std::size_t first, std::size_t last, std::int64_t first_time, std::int64_t late) {
  std::vector<SeenPicture> pictures;
  for (std::size_t i = first; i <= last; ++i) {
    pictures.push_back({100 + i, first_time + static_cast<std::int64_t>(i) * kPicture + late});
  }
  return pictures;
}

TEST(GapCut, AKnownClockCutsBothEdgesToThePicture) {
  // Pictures 25 and 75 came live.
  Cut cut(plan_of(25 * kPicture, 75 * kPicture));
  cut.play(0, 100);
  EXPECT_EQ(cut.taken(), from_to(26, 74));
}

TEST(GapCut, ThePicturesFromTheLatestKeyPictureLeadIn) {
  Cut cut(plan_of(25 * kPicture, 75 * kPicture));
  cut.play(0, 100);
  EXPECT_EQ(cut.lead(), from_to(20, 25));
  EXPECT_LE(cut.most_held(), 50U) << "earlier key pictures are let go";
}

TEST(GapCut, ARecordingThatLiesWithinTheGapIsTakenWhole) {
  Cut cut(plan_of(-kPicture, 1000 * kPicture));
  cut.play(0, 30);
  EXPECT_EQ(cut.taken(), from_to(0, 29));
  EXPECT_TRUE(cut.lead().empty());
}

TEST(GapCut, NoneOfARecordingOutsideTheGapIsTaken) {
  for (const std::int64_t first : {-200 * kPicture, 200 * kPicture}) {
    Cut cut(plan_of(0, 100 * kPicture));
    cut.play(first, 50);
    EXPECT_TRUE(cut.taken().empty()) << first;
    EXPECT_TRUE(cut.lead().empty()) << first;
  }
}

TEST(GapCut, TheCamerasClockMayBeFarOff) {
  constexpr std::int64_t kNow = 1706745599000000;
  CutPlan plan = plan_of(kNow + 10 * kPicture, kNow + 20 * kPicture);
  plan.offset = -kNow;  // in 1970
  Cut cut(plan);
  cut.play(0, 30);
  EXPECT_EQ(cut.taken(), from_to(11, 19));
}

TEST(GapCut, ABrokenPlaybackGoesOnAfterItsLastPicture) {
  CutPlan plan = plan_of(0, 1000 * kPicture);
  plan.resume_after = 33 * kPicture;
  Cut cut(plan);
  cut.play(0, 50);
  EXPECT_EQ(cut.taken(), from_to(34, 49));
  EXPECT_EQ(cut.lead(), from_to(30, 33));
}

TEST(GapCut, AResumedRecordingThatWasDeliveredWholeGivesNone) {
  CutPlan plan = plan_of(0, 1000 * kPicture);
  plan.resume_after = 49 * kPicture;
  Cut cut(plan);
  cut.play(0, 50);
  EXPECT_TRUE(cut.taken().empty());
}

TEST(GapCut, WhereTheClockIsUncertainTheLivePicturesCut) {
  // The camera is 300 ms ahead, which is not known; 25 was the last live picture, 75 is the first.
  constexpr std::int64_t kAhead = 300000;
  CutPlan plan = plan_of(25 * kPicture - kAhead, 75 * kPicture - kAhead);
  plan.uncertainty = 2000000;
  Cut cut(plan, live(5, 25, 0, -kAhead), live(75, 90, 0, -kAhead));
  cut.play(0, 140);
  EXPECT_EQ(cut.taken(), from_to(26, 74));
}

TEST(GapCut, WithoutTheSamePicturesTimeCuts) {
  CutPlan plan = plan_of(25 * kPicture, 75 * kPicture);
  plan.uncertainty = 200000;
  std::vector<SeenPicture> others = live(5, 25, 0, 0);
  for (SeenPicture& picture : others) picture.hash += 5000;
  Cut cut(plan, others, {});
  cut.play(0, 100);
  EXPECT_EQ(cut.taken(), from_to(26, 74));
}

TEST(GapCut, TheSamePicturesAtAnotherTimeProveNothing) {
  CutPlan plan = plan_of(25 * kPicture, 75 * kPicture);
  plan.uncertainty = 200000;
  Cut cut(plan, live(40, 60, -100 * kPicture, 0), {});
  cut.play(0, 100);
  EXPECT_EQ(cut.taken(), from_to(26, 74));
}

TEST(GapCut, PicturesThatAreAllAlikeProveNothing) {
  CutPlan plan = plan_of(5 * kPicture, 15 * kPicture);
  plan.uncertainty = 200000;
  std::vector<SeenPicture> still;
  for (int i = 0; i <= 8; ++i) still.push_back({1, i * kPicture});
  GapCut cut(plan, still, {});
  std::vector<std::size_t> taken;
  for (int i = 0; i < 20; ++i) {
    const GapCut::Verdict verdict = cut.add(1, true, i * kPicture);
    taken.insert(taken.end(), verdict.take.begin(), verdict.take.end());
    if (verdict.over) break;
  }
  EXPECT_EQ(taken, from_to(6, 14));
}

TEST(GapCut, ARecordingThatEndsWithinTheHeadIsTakenByTime) {
  CutPlan plan = plan_of(10 * kPicture, 1000 * kPicture);
  plan.uncertainty = 1000000;
  Cut cut(plan);
  cut.play(0, 14);
  EXPECT_EQ(cut.taken(), from_to(11, 13));
  EXPECT_EQ(cut.lead(), from_to(10, 10));
}

TEST(GapCut, HeldPicturesHaveABound) {
  CutPlan plan = plan_of(1000000 * kPicture, 1000001 * kPicture);
  Cut cut(plan);
  cut.play(0, 9000);
  EXPECT_LE(cut.most_held(), 4100U);
}

TEST(GapCut, TheHashIsFnv1a) {
  const std::string text = "foobar";
  EXPECT_EQ(hash_of(reinterpret_cast<const unsigned char*>(text.data()), text.size()), 0x85944171f73967e8ULL);
  EXPECT_EQ(hash_of(nullptr, 0), 0xcbf29ce484222325ULL);
}

}  // namespace
}  // namespace vexa

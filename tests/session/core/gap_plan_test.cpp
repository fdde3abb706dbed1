// SPDX-License-Identifier: Apache-2.0
#include "session/core/gap_plan.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

namespace vexa {
namespace {

constexpr std::int64_t kSecond = 1000000;
constexpr std::int64_t kNow = 1706745600;  // seconds
constexpr std::int64_t kListed = (kNow - 86400) * kSecond;

/// From 10 s to 70 s after kNow.
Gap gap_of(std::int64_t camera_begin, std::int64_t camera_end) {
  Gap gap;
  gap.state = GapState::kDue;
  gap.number = 1;
  gap.begin = (kNow + 10) * kSecond;
  gap.end = (kNow + 70) * kSecond;
  gap.cameraBegin = camera_begin * kSecond;
  gap.cameraEnd = camera_end * kSecond;
  return gap;
}

SLibDEdgeStorageRecord record_of(const std::string& name, std::int64_t start, std::int64_t end) {
  SLibDEdgeStorageRecord record;
  record.streamName = name;
  record.start = start;
  record.end = end;
  return record;
}

std::vector<std::string> names_of(const std::vector<PlannedRecording>& planned) {
  std::vector<std::string> names;
  for (const PlannedRecording& recording : planned) names.push_back(recording.record.streamName);
  return names;
}

using Names = std::vector<std::string>;

TEST(GapPlan, RecordingsThatTouchTheGapAreTakenInTheirOrder) {
  const CardView card{{record_of("later", kNow + 60, kNow + 90), record_of("before", kNow, kNow + 8),
                       record_of("last second", kNow + 5, kNow + 10), record_of("within", kNow + 20, kNow + 30),
                       record_of("after", kNow + 70, kNow + 80)},
                      {},
                      kListed};
  const Gap gap = gap_of(kNow + 10, kNow + 70);
  EXPECT_EQ(names_of(plan_recordings(gap, card, {}, {})), (Names{"last second", "within", "later"}));
}

TEST(GapPlan, AnUnknownClockAsksWider) {
  const CardView card{{record_of("before", kNow, kNow + 7), record_of("just", kNow, kNow + 8),
                       record_of("late", kNow + 71, kNow + 80), record_of("after", kNow + 72, kNow + 80)},
                      {},
                      kListed};
  const std::vector<PlannedRecording> planned = plan_recordings(gap_of(0, 0), card, {}, {});
  EXPECT_EQ(names_of(planned), (Names{"just", "late"}));
  for (const PlannedRecording& recording : planned) {
    EXPECT_TRUE(recording.by_content);
    EXPECT_EQ(recording.plan.uncertainty, 2 * kSecond);
  }
}

TEST(GapPlan, TheOffsetOfACameraWithoutReportsIsAnOption) {
  BackfillOptions options;
  options.clockOffsetMilliseconds = -3600000;
  const CardView card{
      {record_of("hour ago", kNow - 3600 + 20, kNow - 3600 + 30), record_of("now", kNow + 20, kNow + 30)}, {}, kListed};
  EXPECT_EQ(names_of(plan_recordings(gap_of(0, 0), card, {}, options)), Names{"hour ago"});
}

TEST(GapPlan, AKnownClockPlacesTheEdges) {
  const CardView card{{record_of("a", kNow + 120, kNow + 130)}, {}, kListed};
  const std::vector<PlannedRecording> planned = plan_recordings(gap_of(kNow + 110, kNow + 170), card, {}, {});
  ASSERT_EQ(planned.size(), 1U);
  EXPECT_FALSE(planned[0].by_content);
  EXPECT_EQ(planned[0].plan.offset, 100 * kSecond);
  EXPECT_EQ(planned[0].plan.uncertainty, 0);
  EXPECT_NEAR(static_cast<double>(planned[0].plan.begin - (kNow + 10) * kSecond), 0, 5000);
  EXPECT_NEAR(static_cast<double>(planned[0].plan.end - (kNow + 70) * kSecond), 0, 5000);
}

TEST(GapPlan, AClockThatHasJumpedPlacesByBoth) {
  // Right before, and 30 s after its start in 1970 at the end.
  const Gap gap = gap_of(kNow + 10, 30);
  const CardView card{{record_of("1970", 5, 30), record_of("before the failure", kNow + 10, kNow + 20)},
                      {"1970", "before the failure"},
                      kListed};
  const std::vector<PlannedRecording> planned = plan_recordings(gap, card, {}, {});
  ASSERT_EQ(names_of(planned), (Names{"before the failure", "1970"}));
  EXPECT_EQ(planned[0].plan.offset, 0);
  EXPECT_EQ(planned[1].plan.offset, (30 - kNow - 70) * kSecond);
}

TEST(GapPlan, TheRecordingsOfAnEarlierPowerFailureAreNotTakenAgain) {
  const CardView card{{record_of("earlier", 5, 30), record_of("now", 5, 30)}, {"now"}, kListed};
  EXPECT_EQ(names_of(plan_recordings(gap_of(kNow + 10, 30), card, {}, {})), Names{"now"});
}

TEST(GapPlan, NewRecordingsThatLieInNoGapFollowTheOthers) {
  // The clock was set right again before pictures came: neither clock shows 1970.
  const CardView card{{record_of("1970", 5, 25), record_of("old", 100, 120), record_of("before", kNow + 5, kNow + 20)},
                      {"1970", "before"},
                      kListed};
  const std::vector<PlannedRecording> planned = plan_recordings(gap_of(kNow + 10, kNow + 70), card, {}, {});
  ASSERT_EQ(names_of(planned), (Names{"before", "1970"}));
  EXPECT_EQ(5 * kSecond - planned[1].plan.offset, (kNow + 21) * kSecond + 1);
}

TEST(GapPlan, NewRecordingsFromBeforeTheGapAreNotOfIt) {
  const CardView card{{record_of("of an alarm", kNow - 3600, kNow - 3500)}, {"of an alarm"}, kListed};
  EXPECT_TRUE(plan_recordings(gap_of(kNow + 10, kNow + 70), card, {}, {}).empty());
}

TEST(GapPlan, OfACardNeverListedBeforeEachRecordingOfAJumpedClockIsAskedFor) {
  const CardView card{{record_of("1970", 5, 30)}, {}, 0};
  EXPECT_EQ(names_of(plan_recordings(gap_of(kNow + 10, 30), card, {}, {})), Names{"1970"});
}

TEST(GapPlan, ARecordingWithoutAClockIsPlacedWithinTheGap) {
  const CardView card{
      {record_of("1970", 5, 44), record_of("before", kNow + 5, kNow + 60)}, {"1970", "before"}, kListed};
  const std::vector<PlannedRecording> planned = plan_recordings(gap_of(kNow + 10, kNow + 70), card, {}, {});
  ASSERT_EQ(planned.size(), 2U);
  EXPECT_EQ(5 * kSecond - planned[1].plan.offset, (kNow + 30) * kSecond + 1) << "so that it ends with the gap";
}

TEST(GapPlan, WhatLiesInAnotherGapIsLeftToIt) {
  Gap other = gap_of(kNow + 10, kNow + 70);
  other.number = 2;
  other.begin += 1000 * kSecond;
  other.end += 1000 * kSecond;
  other.cameraBegin = other.begin;
  other.cameraEnd = other.end;
  const CardView card{{record_of("other", kNow + 1020, kNow + 1030)}, {"other"}, kListed};
  EXPECT_TRUE(plan_recordings(gap_of(kNow + 10, kNow + 70), card, {other}, {}).empty());
}

TEST(GapPlan, TimesThatNoRecordingHasArePassedOver) {
  const CardView card{{record_of("back", kNow + 30, kNow + 20), record_of("never", INT64_MAX, INT64_MAX),
                       record_of("ever", INT64_MIN, INT64_MAX)},
                      {"back", "never", "ever"},
                      kListed};
  EXPECT_TRUE(plan_recordings(gap_of(0, 0), card, {}, {}).empty());
}

}  // namespace
}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
// Degrees and magnifications in the driver's scales.
#include "host/words/ptz_scale.h"

#include <gtest/gtest.h>

#include <limits>

namespace vexa::host {
namespace {

// 160 units a degree; the driver's scale covers half the span.
constexpr PtzAxis kFullCircle{115200, 720, -28800, 0};
constexpr PtzAxis kRaisedTilt{33600, 210, -2400, 800};

TEST(PtzScale, DegreesBecomeTheNearestPosition) {
  const struct {
    PtzAxis axis;
    double degrees;
    std::optional<int> position;
  } cases[] = {{kFullCircle, -180, 0},
               {kFullCircle, 180, 10000},
               {kFullCircle, 0, 5000},
               {kFullCircle, -45, 3750},
               {kFullCircle, 0.017, 5000},
               {kFullCircle, 0.019, 5001},
               {kFullCircle, 180.01, 10000},
               {kFullCircle, 180.03, std::nullopt},
               {kFullCircle, -180.03, std::nullopt},
               {kFullCircle, std::numeric_limits<double>::quiet_NaN(), std::nullopt},
               {kFullCircle, std::numeric_limits<double>::infinity(), std::nullopt},
               {kRaisedTilt, -20, 0},
               {kRaisedTilt, 85, 10000},
               {{0, 360, 0, 0}, 0, std::nullopt},
               {{57600, 0, 0, 0}, 0, std::nullopt}};
  for (const auto& one : cases) EXPECT_EQ(one.axis.position_at(one.degrees), one.position) << one.degrees;
}

TEST(PtzScale, EveryPositionComesBackFromItsDegrees) {
  for (const PtzAxis& axis : {kFullCircle, kRaisedTilt}) {
    for (int position = 0; position <= kLargestPosition; ++position) {
      ASSERT_EQ(axis.position_at(axis.degrees_at(position)), position);
    }
  }
}

TEST(PtzScale, RangesAreReportedInDegrees) {
  EXPECT_EQ(kFullCircle.range_text(), "-180 to 180");
  EXPECT_EQ(kRaisedTilt.range_text(), "-20 to 85");
}

Profile zooming_profile() {
  Profile profile;
  profile.control.zoom.minPosition = 1000;
  profile.control.zoom.maxPosition = 11000;
  profile.control.panTilt.horizontalWideAngle = 60;
  profile.zoomRatios = {{1, 1000}, {2, 5000}, {4, 8000}, {10, 11000}};
  return profile;
}

TEST(PtzScale, MagnificationsLieBetweenTheTablesSteps) {
  const Profile profile = zooming_profile();
  const struct {
    double magnification;
    std::optional<int> position;
  } cases[] = {{1, 0},
               {1.5, 2000},
               {2, 4000},
               {3, 5500},
               {4, 7000},
               {7, 8500},
               {10, 10000},
               {0.99, std::nullopt},
               {10.01, std::nullopt},
               {0, std::nullopt}};
  for (const auto& one : cases) EXPECT_EQ(zoom_position_at(one.magnification, profile), one.position);
  EXPECT_EQ(zoom_range_text(profile), "1 to 10");
}

TEST(PtzScale, ALensWithoutATableReachesNoMagnification) {
  EXPECT_EQ(zoom_position_at(1, Profile()), std::nullopt);
  EXPECT_EQ(zoom_range_text(Profile()), "not known");
}

TEST(PtzScale, AStatusIsReportedInDegrees) {
  SLibDPTZStatus status;
  status.panPosition = -12345;
  status.tiltPosition = 90000;
  status.horizontalAngle = 300000;
  status.verticalAngle = 170000;
  status.moving = true;
  EXPECT_EQ(view_of(status, zooming_profile()), (PtzView{-12.345, 90, 30, 17, 2, true}));
  EXPECT_EQ(view_of(SLibDPTZStatus(), zooming_profile()), PtzView());
}

}  // namespace
}  // namespace vexa::host

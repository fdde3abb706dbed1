// SPDX-License-Identifier: Apache-2.0
// One motor on a clock that the test counts.
#include "virtual_camera/ptz/ptz_axis.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>

namespace vexa::camera {
namespace {

// 10 units a second after one second, and 5 units on the way there.
constexpr PtzAxis::Mechanics kPlain = {-100, 100, 10, 10};

TEST(PtzAxis, SpeedsUpRunsAndBrakes) {
  PtzAxis axis(kPlain, 0);
  axis.go_to(0, 40, 1);
  EXPECT_DOUBLE_EQ(axis.position(0), 0);
  EXPECT_DOUBLE_EQ(axis.position(0.5), 1.25);
  EXPECT_DOUBLE_EQ(axis.position(1), 5);
  EXPECT_DOUBLE_EQ(axis.position(3), 25);
  EXPECT_DOUBLE_EQ(axis.position(4), 35);
  EXPECT_DOUBLE_EQ(axis.position(4.5), 38.75);
  EXPECT_DOUBLE_EQ(axis.position(5), 40);
  EXPECT_DOUBLE_EQ(axis.rests_from(), 5);
  EXPECT_TRUE(axis.moves(4.999));
  EXPECT_FALSE(axis.moves(5));
}

TEST(PtzAxis, AShortWayNeverReachesFullSpeed) {
  PtzAxis axis(kPlain, 0);
  axis.go_to(0, -2.5, 1);
  EXPECT_DOUBLE_EQ(axis.position(0.5), -1.25);
  EXPECT_DOUBLE_EQ(axis.rests_from(), 1);
  EXPECT_DOUBLE_EQ(axis.position(7), -2.5);
}

TEST(PtzAxis, AStoppedRunRestsWhereItHasBraked) {
  PtzAxis axis(kPlain, 0);
  axis.run(0, -0.5);
  EXPECT_DOUBLE_EQ(axis.position(2.5), -11.25);
  axis.run(2.5, 0);
  EXPECT_TRUE(axis.moves(2.9));
  EXPECT_DOUBLE_EQ(axis.position(100), -12.5);
  EXPECT_DOUBLE_EQ(axis.rests_from(), 3);
}

TEST(PtzAxis, ARunEndsAtTheEndOfTheRange) {
  PtzAxis axis(kPlain, 0);
  axis.run(0, 1);
  EXPECT_DOUBLE_EQ(axis.rests_from(), 11);
  EXPECT_DOUBLE_EQ(axis.position(10), 95);
  EXPECT_DOUBLE_EQ(axis.position(50), 100);
  axis.run(50, 1);
  EXPECT_FALSE(axis.moves(50)) << "there is no way left";
}

TEST(PtzAxis, TurnsRoundByBrakingFirst) {
  PtzAxis axis(kPlain, 0);
  axis.run(0, 1);
  axis.go_to(2, 15, 1);  // it is there, at full speed
  EXPECT_DOUBLE_EQ(axis.position(3), 20);
  EXPECT_DOUBLE_EQ(axis.position(axis.rests_from()), 15);
  EXPECT_NEAR(axis.rests_from(), 3 + 2 * std::sqrt(0.5), 1e-9);
}

TEST(PtzAxis, SlowsDownToALowerSpeedWhileItRuns) {
  PtzAxis axis(kPlain, 0);
  axis.run(0, 1);
  axis.go_to(2, 90, 0.5);
  EXPECT_DOUBLE_EQ(axis.position(2.5), 18.75);
  EXPECT_DOUBLE_EQ(axis.position(3.5), 23.75);
  EXPECT_DOUBLE_EQ(axis.position(axis.rests_from()), 90);
}

TEST(PtzAxis, PlacesBeyondTheEndsAreTheEnds) {
  PtzAxis axis(kPlain, 300);
  EXPECT_DOUBLE_EQ(axis.position(0), 100);
  axis.go_to(0, -1e9, 1);
  EXPECT_DOUBLE_EQ(axis.position(1000), -100);
}

TEST(PtzAxis, ATimeBeforeTheLastOrderIsThatOfTheOrder) {
  PtzAxis axis(kPlain, 0);
  axis.run(5, 1);
  EXPECT_DOUBLE_EQ(axis.position(1), 0);
}

// Whatever the orders: no jump, no speed or pull above the greatest, nothing beyond the ends, and rest at the target.
TEST(PtzAxis, ObeysMechanicsUnderAnyOrders) {
  std::mt19937 random(7);
  const auto draw = [&random](double from, double to) { return std::uniform_real_distribution<>(from, to)(random); };
  PtzAxis axis(kPlain, 0);
  double now = 0;
  double before = 0;
  double speed_before = 0;
  constexpr double kStep = 0.01;
  for (int order = 0; order < 300; ++order) {
    const double target = draw(-120, 120);
    if (order % 3 == 0) axis.run(now, draw(-1, 1));
    if (order % 3 == 1) axis.run(now, 0);
    if (order % 3 == 2) axis.go_to(now, target, draw(0.05, 1));
    for (const double end = now + draw(0, 4); now < end;) {
      now += kStep;
      const double place = axis.position(now);
      const double speed = (place - before) / kStep;
      ASSERT_LE(std::abs(speed), 10 + 1e-6) << order;
      ASSERT_LE(std::abs(speed - speed_before), 10 * kStep + 1e-6) << order;
      ASSERT_LE(std::abs(place), 100) << order;
      before = place;
      speed_before = speed;
    }
    if (order % 3 == 2) {
      ASSERT_EQ(axis.position(axis.rests_from()), std::clamp(target, -100.0, 100.0)) << order;
    }
  }
}

}  // namespace
}  // namespace vexa::camera

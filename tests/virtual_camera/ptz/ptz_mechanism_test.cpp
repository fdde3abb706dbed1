// SPDX-License-Identifier: Apache-2.0
// Four motors in a camera's units, on a clock that the test counts.
#include "virtual_camera/ptz/ptz_mechanism.h"

#include <gtest/gtest.h>

#include "tests/virtual_camera/ptz/ptz_models.h"

namespace vexa::camera {
namespace {

constexpr double kLongAfter = 1000;

PtzPlace after(const PtzOrder& order, const PtzProfile& profile = dome()) {
  PtzMechanism mechanism(profile);
  mechanism.obey(order, 0);
  return mechanism.place(kLongAfter);
}

PtzOrder area_of(double right, double down, double size) {
  PtzOrder order;
  order.area = PictureArea{right, down, size};
  return order;
}

TEST(PtzMechanism, BeginsStraightAheadAtTheWideEnd) {
  const PtzMechanism mechanism(dome());
  EXPECT_EQ(mechanism.place(0), (PtzPlace{0, 0, 0, 32768}));
  EXPECT_FALSE(mechanism.looks_elsewhere(0));
  EXPECT_DOUBLE_EQ(mechanism.horizontal_angle(0), 58);
}

TEST(PtzMechanism, BeginsAtTheHorizonOrTheEndNearestToIt) {
  PtzProfile profile = dome();
  profile.tilt.offset = 1600;
  EXPECT_EQ(PtzMechanism(profile).place(0)[1], 1600);
  EXPECT_DOUBLE_EQ(PtzMechanism(profile).tilt_degrees(0), 0);
  profile.tilt.offset = -20000;
  EXPECT_EQ(PtzMechanism(profile).place(0)[1], -2400);
}

TEST(PtzMechanism, ReportsItsPlaceInDegrees) {
  PtzMechanism mechanism(dome());
  mechanism.obey(order_to({14400, -1600, 4000, 5000}, 20, dome()), 0);
  EXPECT_TRUE(mechanism.looks_elsewhere(1));
  EXPECT_DOUBLE_EQ(mechanism.pan_degrees(kLongAfter), 90);
  EXPECT_DOUBLE_EQ(mechanism.tilt_degrees(kLongAfter), -10);
  EXPECT_DOUBLE_EQ(mechanism.horizontal_angle(kLongAfter), 29);
  EXPECT_EQ(mechanism.place(kLongAfter), (PtzPlace{14400, -1600, 4000, 5000}));
}

TEST(PtzMechanism, GoesAtTheGivenSpeed) {
  PtzMechanism mechanism(dome());
  mechanism.obey(order_to({28800, 0, 0, 32768}, 12, dome()), 0);
  // 5760 units a second at speed 24: half of that here, with half a second to reach it and to brake.
  EXPECT_DOUBLE_EQ(mechanism.rests_from(), 10.5);
  EXPECT_EQ(mechanism.place(0.5)[0], 720);
  EXPECT_EQ(mechanism.place(1.5)[0], 3600);
}

TEST(PtzMechanism, FocusAloneDoesNotTurnTheCamera) {
  PtzMechanism mechanism(dome());
  PtzOrder order;
  order[PtzMotor::kFocus] = MotorOrder{MotorOrder::Kind::kRun, 1, 0};
  mechanism.obey(order, 0);
  EXPECT_FALSE(mechanism.looks_elsewhere(1));
  EXPECT_GT(mechanism.rests_from(), 1);
}

TEST(PtzMechanism, CentresTheAreaPointedAt) {
  EXPECT_EQ(after(area_of(0.5, 0, 0)), (PtzPlace{4640, 0, 0, 32768})) << "half a picture of 58 degrees";
  EXPECT_EQ(after(area_of(0, -0.5, 0)), (PtzPlace{0, 2720, 0, 32768})) << "half a picture of 34 degrees";
  EXPECT_EQ(after(area_of(0, 0.5, 0))[1], -2400) << "the low end";
}

TEST(PtzMechanism, ZoomsTheAreaToThePicture) {
  EXPECT_EQ(after(area_of(0, 0, 0.5)), (PtzPlace{0, 0, 4000, 32768})) << "twice as large";
  EXPECT_EQ(after(area_of(0, 0, 0.25))[2], 7000) << "a quarter of the way from twice to ten times";
  EXPECT_EQ(after(area_of(0, 0, 0.001))[2], 16000) << "no further than the tele end";
  EXPECT_EQ(after(area_of(0, 0, 1))[2], 0);
}

TEST(PtzMechanism, AnAreaCountsInThePictureAsItIsZoomed) {
  PtzMechanism mechanism(dome());
  mechanism.obey(order_to({0, 0, 16000, 32768}, 20, dome()), 0);
  mechanism.obey(area_of(0.5, 0, 0), 100);
  EXPECT_EQ(mechanism.place(kLongAfter)[0], 464);
}

TEST(PtzMechanism, ZoomsByAShareOfItsRange) {
  PtzOrder order;
  order.zoom_by = 0.25;
  PtzMechanism mechanism(dome());
  mechanism.obey(order, 0);
  mechanism.obey(order, 100);
  EXPECT_EQ(mechanism.place(200)[2], 8000);
  order.zoom_by = -1;
  mechanism.obey(order, 200);
  EXPECT_EQ(mechanism.place(kLongAfter)[2], 0);
}

TEST(PtzMechanism, AModelThatCountsBackwardsTurnsInTheSameDirection) {
  PtzProfile profile = dome();
  profile.pan.span = -115200;
  profile.pan.origin = 28800;
  PtzMechanism mechanism(profile);
  mechanism.obey(area_of(0.5, 0, 0), 0);
  EXPECT_EQ(mechanism.place(kLongAfter)[0], -4640);
  EXPECT_DOUBLE_EQ(mechanism.pan_degrees(kLongAfter), 29);
}

TEST(PtzMechanism, MagnificationAndPositionAreEachOthersInverse) {
  const PtzProfile profile = dome();
  for (int position = 0; position <= 16000; position += 250) {
    EXPECT_NEAR(position_of_magnification(profile, magnification_at(profile, position)), position, 1e-6);
  }
  EXPECT_EQ(magnification_at(profile, -1), 1);
  EXPECT_EQ(magnification_at(profile, 16001), 10);
  EXPECT_EQ(position_of_magnification(profile, 0.5), 0);
  EXPECT_EQ(position_of_magnification(profile, 11), 16000);
}

}  // namespace
}  // namespace vexa::camera

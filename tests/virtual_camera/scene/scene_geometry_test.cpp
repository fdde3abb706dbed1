// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/scene_geometry.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace vexa::camera {
namespace {

View wide_view() { return {{30, -10, 60, ""}, {1200, 600}, false}; }

TEST(Projection, PutsDirectionsWhereTheySpanThePictureEvenly) {
  const struct {
    double bearing;
    double column;
  } columns[] = {{0, 0}, {30, 600}, {60, 1200}, {45, 900}, {90, 1800}, {-60, -1200}, {405, 900}};
  const Projection projection(wide_view());
  EXPECT_EQ(projection.pixels_per_degree(), 20);
  for (const auto& c : columns) EXPECT_NEAR(projection.column(c.bearing), c.column, 1e-9) << c.bearing;
  const struct {
    double elevation;
    double row;
  } rows[] = {{-10, 300}, {0, 100}, {5, 0}, {-25, 600}};
  for (const auto& c : rows) EXPECT_NEAR(projection.row(c.elevation), c.row, 1e-9) << c.elevation;
}

TEST(Projection, TurnsWithTheRotatedPicture) {
  View view = wide_view();
  const Projection upright(view);
  view.rotated = true;
  const Projection rotated(view);
  for (const double degrees : {-20.0, 0.0, 13.5, 55.0}) {
    EXPECT_NEAR(rotated.column(degrees), 1200 - upright.column(degrees), 1e-9);
    EXPECT_NEAR(rotated.row(degrees), 600 - upright.row(degrees), 1e-9);
  }
  EXPECT_EQ(rotated.pixels_per_degree(), 20);
}

TEST(Projection, FindsTheDirectionOfEveryPixel) {
  for (const bool rotated : {false, true}) {
    for (const double pan : {0.0, 179.9, 359.0, -725.0}) {
      View view = wide_view();
      view.pose.pan = pan;
      view.rotated = rotated;
      const Projection projection(view);
      for (double column = 0.5; column < 1200; column += 97) {
        const double bearing = projection.bearing(column);
        EXPECT_GE(bearing, 0);
        EXPECT_LT(bearing, 360);
        EXPECT_NEAR(projection.column(bearing), column, 1e-6);
      }
      EXPECT_NEAR(projection.row(projection.elevation(77)), 77, 1e-9);
    }
  }
}

TEST(Projection, ZoomMagnifiesAroundTheMiddle) {
  View view = wide_view();
  view.pose.horizontal_angle = 6;
  const Projection projection(view);
  EXPECT_EQ(projection.pixels_per_degree(), 200);
  EXPECT_NEAR(projection.column(31), 800, 1e-9);
  EXPECT_NEAR(projection.row(-9), 100, 1e-9);
}

TEST(Projection, HoldsOutAgainstPosesThatNoCameraHas) {
  const double wrong[] = {std::numeric_limits<double>::quiet_NaN(),
                          std::numeric_limits<double>::infinity(),
                          -std::numeric_limits<double>::infinity(),
                          1e300,
                          -1e300,
                          0};
  for (const double value : wrong) {
    const Projection projection({{value, value, value, ""}, {1200, 600}, false});
    EXPECT_TRUE(std::isfinite(projection.pixels_per_degree())) << value;
    EXPECT_GE(projection.pixels_per_degree(), 1200 / 360.0) << value;
    EXPECT_LE(projection.pixels_per_degree(), 12000) << value;
    EXPECT_GE(projection.bearing(0), 0) << value;
    EXPECT_LT(projection.bearing(0), 360) << value;
  }
}

TEST(TurnBetween, TakesTheShorterTurn) {
  const struct {
    double from;
    double to;
    double turn;
  } cases[] = {{0, 0, 0}, {350, 10, 20}, {10, 350, -20}, {0, 180, -180}, {0, 179.5, 179.5}, {720, -1, -1}};
  for (const auto& c : cases) EXPECT_NEAR(turn_between(c.from, c.to), c.turn, 1e-9) << c.from << " " << c.to;
}

TEST(BoxOf, IsTheFigureInTenThousandthsOfThePicture) {
  const Intruder intruder{30, -20, 10, 0};  // in the middle of the picture, 4 degrees wide
  const PictureBox box = box_of(intruder, wide_view());
  EXPECT_NEAR(box.left, 5000 - 2 * 10000 / 60.0, 1e-6);
  EXPECT_NEAR(box.right, 5000 + 2 * 10000 / 60.0, 1e-6);
  EXPECT_NEAR(box.top, 5000, 1e-6);
  EXPECT_NEAR(box.bottom, 5000 + 10 * 10000 / 30.0, 1e-6);
}

TEST(BoxOf, IsUpsideDownInARotatedPicture) {
  View view = wide_view();
  const Intruder intruder{40, -20, 8, 0};
  const PictureBox upright = box_of(intruder, view);
  view.rotated = true;
  const PictureBox rotated = box_of(intruder, view);
  EXPECT_NEAR(rotated.left, 10000 - upright.right, 1e-6);
  EXPECT_NEAR(rotated.right, 10000 - upright.left, 1e-6);
  EXPECT_NEAR(rotated.top, 10000 - upright.bottom, 1e-6);
  EXPECT_NEAR(rotated.bottom, 10000 - upright.top, 1e-6);
}

TEST(WalkThrough, CrossesThePictureFromLeftToRightAtAnyPose) {
  using std::chrono::milliseconds;
  for (const bool rotated : {false, true}) {
    for (const double angle : {0.5, 60.0, 180.0}) {
      const View view{{350, -85, angle, ""}, {1920, 1080}, rotated};
      const Walk walk = walk_through(view, milliseconds(1000));
      const PictureBox first = box_of(*walker(walk, milliseconds(1)), view);
      const PictureBox middle = box_of(*walker(walk, milliseconds(500)), view);
      const PictureBox last = box_of(*walker(walk, milliseconds(999)), view);
      EXPECT_LT(first.left, 0);
      EXPECT_NEAR((middle.left + middle.right) / 2, 5000, 1e-3);
      EXPECT_GT(last.right, 10000);
      EXPECT_GT(middle.top, 0);
      EXPECT_LT(middle.bottom, 10000);
      EXPECT_NEAR(middle.bottom - middle.top, 4000, 1e-3);
    }
  }
}

TEST(Walker, IsThereFromTheBeginningToTheEndAlone) {
  using std::chrono::milliseconds;
  const Walk walk{350, 20, -5, 2, milliseconds(1000)};
  EXPECT_FALSE(walker(walk, milliseconds(-1)));
  EXPECT_EQ(walker(walk, milliseconds(0))->bearing, 350);
  EXPECT_NEAR(walker(walk, milliseconds(750))->bearing, 5, 1e-9);
  EXPECT_NEAR(walker(walk, milliseconds(1000))->bearing, 10, 1e-9);
  EXPECT_EQ(walker(walk, milliseconds(1000))->feet, -5);
  EXPECT_FALSE(walker(walk, milliseconds(1001)));
  EXPECT_FALSE(walker({}, milliseconds(0)));
}

}  // namespace
}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
// Positions as angles and viewing angles, against exact arithmetic.
#include "device/cgi/position_text.h"

#include <gtest/gtest.h>

#include <climits>
#include <cstdint>
#include <vector>

namespace {

using vexa::axis_angle;
using vexa::viewing_angles;

using Ratios = std::vector<SLibDZoomRatioInt>;

SLibDFixedPanTiltInfo wide_angles(int horizontal, int vertical) {
  SLibDFixedPanTiltInfo camera;
  camera.horizontalWideAngle = horizontal;
  camera.verticalWideAngle = vertical;
  return camera;
}

const Ratios kTwelveTimes = {{1, 0}, {2, 5638}, {4, 9770}, {8, 13115}, {12, 14585}, {18, 16384}};
const Ratios kThirtyTimes = {{1, 0}, {2, 7000}, {4, 13000}, {8, 18500}, {16, 24500}, {20, 27000}, {30, 31424}};

// The exact horizontal angle in ten-thousandths is wide * 10000 / ratio, ratio the straight line between neighbours.
// With ratio = numerator / denominator, an integer h is right when cutting off 10000ths of the ratio and of the angle
// explains the difference: wide * 10000 / (ratio + 1/10000) - 1 < h <= wide * 10000 / (ratio - 1/10000), by products.
void expect_exact(const Ratios& ratios, int zoom, int wide, int tall) {
  std::size_t high = 0;
  while (high + 1 < ratios.size() && ratios[high].position < zoom) ++high;
  const SLibDZoomRatioInt& above = ratios[high];
  const SLibDZoomRatioInt& below = high == 0 ? above : ratios[high - 1];
  const std::int64_t span = above.position == below.position ? 1 : above.position - below.position;
  const std::int64_t way = zoom >= above.position ? span : zoom <= below.position ? 0 : zoom - below.position;
  const std::int64_t numerator = (below.ratio * span + (above.ratio - below.ratio) * way) * 10000;
  const auto angles = viewing_angles(ratios, wide_angles(wide, tall), zoom);
  ASSERT_TRUE(angles) << zoom;
  const std::int64_t scaled = wide * INT64_C(100000000) * span;
  EXPECT_LE(angles->horizontal * (numerator - span), scaled) << zoom;
  EXPECT_GT((angles->horizontal + INT64_C(1)) * (numerator + span), scaled) << zoom;
  const std::int64_t vertical = static_cast<std::int64_t>(angles->horizontal) * tall;
  EXPECT_LE(static_cast<std::int64_t>(angles->vertical) * wide, vertical) << zoom;
  EXPECT_GT((angles->vertical + INT64_C(1)) * wide, vertical) << zoom;
}

TEST(ViewingAngles, AgreeWithExactArithmeticAtEveryZoom) {
  for (int zoom = -10; zoom <= 32767; ++zoom) {
    expect_exact(kTwelveTimes, zoom, 58, 34);
    expect_exact(kThirtyTimes, zoom, 58, 34);
    expect_exact({{3, 100}, {1, 20000}}, zoom, 60, 1);
  }
}

TEST(ViewingAngles, AreCutOffAtEachStep) {
  const struct {
    int zoom, horizontal, vertical;
  } rows[] = {{INT_MIN, 580000, 340000}, {0, 580000, 340000},    {1, 579942, 339966},   {5637, 290029, 170017},
              {5638, 290000, 170000},    {5639, 289942, 169966}, {16383, 32228, 18892}, {16384, 32222, 18888},
              {16385, 32222, 18888},     {INT_MAX, 32222, 18888}};
  for (const auto& row : rows) {
    const auto angles = viewing_angles(kTwelveTimes, wide_angles(58, 34), row.zoom);
    ASSERT_TRUE(angles);
    EXPECT_EQ(angles->horizontal, row.horizontal) << row.zoom;
    EXPECT_EQ(angles->vertical, row.vertical) << row.zoom;
  }
}

TEST(ViewingAngles, OfOneRatioAreTheSameEverywhere) {
  for (const int zoom : {INT_MIN, -1, 99, 100, 101, INT_MAX}) {
    const auto angles = viewing_angles({{2, 100}}, wide_angles(50, 25), zoom);
    ASSERT_TRUE(angles);
    EXPECT_EQ(angles->horizontal, 250000);
    EXPECT_EQ(angles->vertical, 125000);
  }
}

TEST(ViewingAngles, AreNoneWithoutRatiosOrWithAZero) {
  const SLibDFixedPanTiltInfo camera = wide_angles(58, 34);
  EXPECT_FALSE(viewing_angles({}, camera, 0));
  EXPECT_FALSE(viewing_angles({{0, 0}}, camera, 0));
  EXPECT_FALSE(viewing_angles({{0, 0}, {2, 10}}, camera, 0));
  EXPECT_FALSE(viewing_angles({{0, 0}, {2, 10}}, camera, 5));
  EXPECT_FALSE(viewing_angles({{1, 0}, {0, 10}}, camera, 5));
  EXPECT_FALSE(viewing_angles({{1, 0}, {0, 10}}, camera, 11));
  EXPECT_FALSE(viewing_angles({{-1, 0}, {1, 10}}, camera, 5)) << "the line crosses 0 there";
  EXPECT_FALSE(viewing_angles({{1, 0}}, wide_angles(0, 34), 0));
  EXPECT_FALSE(viewing_angles({{1, 0}}, wide_angles(58, 0), 0));
}

TEST(ViewingAngles, TakeTheFirstNeighboursOfATableThatIsNotSorted) {
  EXPECT_EQ(viewing_angles({{1, 0}, {2, 20}, {4, 5}, {8, 5}, {16, 30}}, wide_angles(100, 100), 5)->horizontal, 800000);
  EXPECT_EQ(viewing_angles({{1, 0}, {2, 5}, {4, 5}, {8, 10}}, wide_angles(100, 100), 5)->horizontal, 500000);
}

TEST(ViewingAngles, AreThoseOfTheLastRatioAtAndAboveItsPositionWhateverComesBefore) {
  EXPECT_EQ(viewing_angles({{1, 0}, {2, 5}, {4, 5}}, wide_angles(100, 100), 5)->horizontal, 250000);
  EXPECT_EQ(viewing_angles({{1, 0}, {16, 30}, {2, 20}}, wide_angles(100, 100), 25)->horizontal, 500000);
  EXPECT_EQ(viewing_angles({{4, 30}, {1, 10}}, wide_angles(100, 100), 20)->horizontal, 250000)
      << "the first comes before the last";
}

TEST(ViewingAngles, StayWithinAnIntForEveryProfile) {
  const int extremes[] = {INT_MIN, -1, 1, INT_MAX};
  for (const int wide : extremes) {
    for (const int tall : extremes) {
      for (const int ratio : extremes) {
        for (const int zoom : {INT_MIN, 0, 1, INT_MAX}) {
          const Ratios table = {{ratio, INT_MIN}, {INT_MAX, 0}, {ratio, INT_MAX}};
          EXPECT_TRUE(viewing_angles(table, wide_angles(wide, tall), zoom)) << ratio << " at " << zoom;
        }
      }
    }
  }
  EXPECT_EQ(viewing_angles({{1, 0}}, wide_angles(INT_MAX, INT_MIN), 0)->horizontal, INT_MAX);
  EXPECT_EQ(viewing_angles({{1, 0}}, wide_angles(INT_MAX, INT_MIN), 0)->vertical, INT_MIN);
}

TEST(AxisAngle, IsInThousandthsWithoutItsFraction) {
  const struct {
    int position, span, range;
    std::int64_t offset;
    int angle;
  } rows[] = {{100, 57600, 360, 0, 625},
              {-100, 57600, 360, 0, -625},
              {1, 57600, 360, 0, 6},
              {-1, 57600, 360, 0, -6},
              {32767, 57600, 360, 0, 204793},
              {-32768, 57600, 360, 0, -204800},
              {5, 0, 360, 7, 5},
              {5, 1, 1, 7, -2000},
              {5, -2, 1, 7, 1000},
              {-32768, 1, INT_MAX, 0, -INT_MAX},
              {-32768, -1, INT_MAX, 0, INT_MAX},
              {32767, 1, INT_MAX, -(INT64_C(1) << 31), INT_MAX},
              {-32768, -1, INT_MIN, INT64_C(1) << 31, -INT_MAX}};
  for (const auto& row : rows) {
    EXPECT_EQ(axis_angle(row.position, row.span, row.range, row.offset), row.angle) << row.position << "/" << row.span;
  }
}

}  // namespace

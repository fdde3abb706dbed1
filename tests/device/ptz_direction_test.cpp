// SPDX-License-Identifier: Apache-2.0
// Directions of motion: by the signs of speeds, and their words.
#include <gtest/gtest.h>

#include <climits>
#include <string>

#include "tests/device/ptz_reach.h"

namespace vexa_test {
namespace {

TEST(Directions, FollowTheSignsAndStayWithoutAMotion) {
  const struct {
    int pan, tilt, direction;
  } rows[] = {{-1, 1, 0},           {0, 1, 1},  {1, 1, 2},
              {-1, 0, 3},           {1, 0, 5},  {-1, -1, 6},
              {0, -1, 7},           {1, -1, 8}, {INT_MIN, INT_MAX, 0},
              {INT_MAX, INT_MIN, 8}};
  PtzDriver driver;
  for (const auto& row : rows) {
    auto direction = LIBD_DIRECTION_STOP;
    driver.GetDirectionFromPanTiltSpeed(row.pan, row.tilt, direction);
    EXPECT_EQ(direction, row.direction) << row.pan << ", " << row.tilt;
  }
  auto direction = LIBD_DIRECTION_DOWN;
  driver.GetDirectionFromPanTiltSpeed(0, 0, direction);
  EXPECT_EQ(direction, LIBD_DIRECTION_DOWN);
}

TEST(Directions, AreSentByTheirWords) {
  const char* const words[] = {"up-left", "up", "up-right", "left", "stop", "right", "down-left", "down", "down-right"};
  for (int direction = 0; direction < 9; ++direction) {
    PtzPlay play({command("/command/ptzf.cgi?Move=" + std::string(words[direction]) + ",2147483647")});
    EXPECT_EQ(play.driver.SendPTZCommands(INT_MIN, 3, static_cast<ELibDPanTiltDirection>(direction)), 0);
  }
}

TEST(Directions, WithoutAWordAreNotSent) {
  for (const int direction : {9, 15}) {
    PtzPlay play({});
    EXPECT_EQ(play.driver.SendPTZCommands(1, 1, static_cast<ELibDPanTiltDirection>(direction)), 1) << direction;
  }
}

}  // namespace
}  // namespace vexa_test

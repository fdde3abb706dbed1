// SPDX-License-Identifier: Apache-2.0
// Requests that move a camera, as texts and what the motors make of them.
#include "virtual_camera/ptz/ptz_command.h"

#include <gtest/gtest.h>

#include <cmath>
#include <string>

#include "tests/virtual_camera/ptz/ptz_models.h"

namespace vexa::camera {
namespace {

constexpr PtzPicture kUpright = {{640, 480}, false};
constexpr PtzPicture kTurned = {{640, 480}, true};

// "pan>-12.5%" runs, "zoom=4000" goes there; what is not ordered is not written.
std::string told(const std::string& key, const std::string& value, const PtzPicture& picture = kUpright,
                 const PtzProfile& profile = dome()) {
  const std::optional<PtzOrder> order = ptz_order(key, value, profile, picture);
  if (!order) return "refused";
  const auto percent = [](double share) { return std::to_string(std::lround(share * 1000)); };
  std::string text;
  const char* names[] = {"pan", "tilt", "zoom", "focus"};
  for (std::size_t i = 0; i < kPtzMotors; ++i) {
    if (!order->motors[i]) continue;
    const MotorOrder& motor = *order->motors[i];
    const bool runs = motor.kind == MotorOrder::Kind::kRun;
    text += std::string(text.empty() ? "" : " ") + names[i];
    text += runs ? ">" + percent(motor.speed) : "=" + std::to_string(motor.place) + "@" + percent(motor.speed);
  }
  if (order->zoom_by) text += "by " + percent(*order->zoom_by);
  if (order->area) {
    text += "area " + percent(order->area->right) + " " + percent(order->area->down) + " " + percent(order->area->size);
  }
  return text;
}

TEST(PtzCommand, MovesByWordAndSpeed) {
  const struct {
    const char* value;
    const char* told;
  } cases[] = {{"up-left,12", "pan>-500 tilt>600"},
               {"up,20", "pan>0 tilt>1000"},
               {"up-right,24", "pan>1000 tilt>1000"},
               {"left,24", "pan>-1000 tilt>0"},
               {"right,1", "pan>42 tilt>0"},
               {"down-left,6", "pan>-250 tilt>-300"},
               {"down,10", "pan>0 tilt>-500"},
               {"down-right,6", "pan>250 tilt>-300"},
               {"right,0", "pan>500 tilt>0"},
               {"tele,4", "zoom>500"},
               {"wide,8", "zoom>-1000"},
               {"near,2", "focus>250"},
               {"far,8", "focus>-1000"},
               {"stop,motor", "pan>0 tilt>0"},
               {"stop,zoom", "zoom>0"},
               {"stop,focus", "focus>0"}};
  for (const auto& c : cases) EXPECT_EQ(told("Move", c.value), c.told) << c.value;
}

TEST(PtzCommand, MovesBySignedSpeeds) {
  EXPECT_EQ(told("ContinuousPanTiltZoom", "-50,2,"), "pan>-500 tilt>20");
  EXPECT_EQ(told("ContinuousPanTiltZoom", "0,0,"), "pan>0 tilt>0");
  EXPECT_EQ(told("ContinuousPanTiltZoom", ",,100"), "zoom>1000");
  EXPECT_EQ(told("ContinuousPanTiltZoom", ",,0"), "zoom>0");
  EXPECT_EQ(told("ContinuousPanTiltZoom", "100,-100,-1"), "pan>1000 tilt>-1000 zoom>-10");
}

TEST(PtzCommand, GoesToPositions) {
  EXPECT_EQ(told("AbsolutePanTilt", "7080,3840,20"), "pan=28800@833 tilt=14400@1000");
  EXPECT_EQ(told("AbsolutePanTilt", "FFFF8F80,FFFFF6A0,1"), "pan=-28800@42 tilt=-2400@50");
  EXPECT_EQ(told("AbsolutePanTilt", "8F80,F6A0,1"), "pan=-28800@42 tilt=-2400@50") << "four digits have a sign too";
  EXPECT_EQ(told("AbsoluteZoom", "3E80"), "zoom=16000@1000");
  EXPECT_EQ(told("AbsoluteFocus", "F000"), "focus=61440@1000") << "a lens has none";
  EXPECT_EQ(told("RelativeZoom", "1000"), "by 1000");
  EXPECT_EQ(told("RelativeZoom", "FFFFF000"), "by -1000");
  EXPECT_EQ(told("AreaZoom", "319,-240,0,0,image1"), "area 498 -500 0");
  EXPECT_EQ(told("AreaZoom", "-64,48,320,120,image1"), "area -100 100 500") << "the larger share";
}

TEST(PtzCommand, DirectionsAreThePicturesAndPositionsTheMotors) {
  EXPECT_EQ(told("Move", "up-left,12", kTurned), "pan>500 tilt>-600");
  EXPECT_EQ(told("ContinuousPanTiltZoom", "-50,2,30", kTurned), "pan>500 tilt>-20 zoom>300");
  EXPECT_EQ(told("AreaZoom", "-64,48,0,0,image1", kTurned), "area 100 -100 0");
  EXPECT_EQ(told("AbsolutePanTilt", "0010,0020,20", kTurned), "pan=16@833 tilt=32@1000");
}

TEST(PtzCommand, AModelThatCountsBackwardsRunsBackwards) {
  PtzProfile profile = dome();
  profile.pan.span = -115200;
  profile.pan.origin = 28800;
  EXPECT_EQ(told("Move", "right,24", kUpright, profile), "pan>-1000 tilt>0");
  EXPECT_EQ(told("Move", "right,24", kTurned, profile), "pan>1000 tilt>0");
  EXPECT_EQ(told("ContinuousPanTiltZoom", "10,10,", kUpright, profile), "pan>-100 tilt>100");
  EXPECT_EQ(told("AbsolutePanTilt", "7080,0000,1", kUpright, profile), "pan=28800@42 tilt=0@50");
}

TEST(PtzCommand, WhatIsOutOfRangeOrMisspeltIsRefused) {
  const struct {
    const char* key;
    const char* value;
  } cases[] = {{"Move", "right,25"},
               {"Move", "right,-1"},
               {"Move", "right"},
               {"Move", "right,"},
               {"Move", "right,1,1"},
               {"Move", "right,1x"},
               {"Move", "Right,1"},
               {"Move", "tele,0"},
               {"Move", "tele,9"},
               {"Move", "near,1"},
               {"Move", "stop,all"},
               {"Move", "stop"},
               {"Move", ""},
               {"ContinuousPanTiltZoom", "101,0,"},
               {"ContinuousPanTiltZoom", "0,-101,"},
               {"ContinuousPanTiltZoom", ",,101"},
               {"ContinuousPanTiltZoom", ",,"},
               {"ContinuousPanTiltZoom", "0,0"},
               {"ContinuousPanTiltZoom", "0,0,0,0"},
               {"ContinuousPanTiltZoom", "+1,0,"},
               {"AbsolutePanTilt", "7081,0000,20"},
               {"AbsolutePanTilt", "8F7F,0000,20"},
               {"AbsolutePanTilt", "0000,3841,20"},
               {"AbsolutePanTilt", "0000,F69F,20"},
               {"AbsolutePanTilt", "0000,0000,0"},
               {"AbsolutePanTilt", "0000,0000,21"},
               {"AbsolutePanTilt", "0000,0000"},
               {"AbsolutePanTilt", "000,0000,20"},
               {"AbsolutePanTilt", "00000,0000,20"},
               {"AbsolutePanTilt", "00000000,0000,20"},
               {"AbsolutePanTilt", "FFFF7FFF,0000,20"},
               {"AbsolutePanTilt", "-001,0000,20"},
               {"AbsolutePanTilt", "0x01,0000,20"},
               {"AbsoluteZoom", "3E81"},
               {"AbsoluteZoom", "FFFFFFFF"},
               {"AbsoluteZoom", ""},
               {"AbsoluteFocus", "0FFF"},
               {"AbsoluteFocus", "F001"},
               {"RelativeZoom", "1001"},
               {"RelativeZoom", "FFFFEFFF"},
               {"AreaZoom", "321,0,0,0,image1"},
               {"AreaZoom", "-321,0,0,0,image1"},
               {"AreaZoom", "0,241,0,0,image1"},
               {"AreaZoom", "0,0,641,0,image1"},
               {"AreaZoom", "0,0,0,481,image1"},
               {"AreaZoom", "0,0,-1,0,image1"},
               {"AreaZoom", "0,0,0,0,image2"},
               {"AreaZoom", "0,0,0,0"},
               {"Jump", "1"},
               {"", ""}};
  for (const auto& c : cases) EXPECT_EQ(told(c.key, c.value), "refused") << c.key << "=" << c.value;
}

TEST(PtzCommand, WhatTheModelLacksIsRefused) {
  PtzProfile profile = dome();
  profile.focus.reset();
  profile.continuous = false;
  EXPECT_EQ(told("Move", "near,2", kUpright, profile), "refused");
  EXPECT_EQ(told("Move", "stop,focus", kUpright, profile), "refused");
  EXPECT_EQ(told("AbsoluteFocus", "2000", kUpright, profile), "refused");
  EXPECT_EQ(told("ContinuousPanTiltZoom", "0,0,", kUpright, profile), "refused");
  EXPECT_EQ(told("Move", "left,3", kUpright, profile), "pan>-125 tilt>0");
  EXPECT_EQ(told("AreaZoom", "0,0,0,0,image1", {{0, 0}, false}, profile), "refused") << "there is no picture";
}

}  // namespace
}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/alarm_text.h"

#include <gtest/gtest.h>

#include <vector>

#include "device/cgi/input_part.h"
#include "tests/device/alarm_driver.h"

namespace vexa {
namespace {

using vexa_test::PinRow;
using vexa_test::rows_of;

std::vector<SLibDPinInfo> status_pins(PinMasks masks, const SLibDFixedIoBoxInfo& fixed) {
  std::vector<SLibDPinInfo> pins(3);
  take_status_pins(masks, fixed, pins);
  return pins;
}

SLibDFixedIoBoxInfo box_of(int inputs, int outputs) {
  SLibDFixedIoBoxInfo fixed;
  fixed.inputCount = inputs;
  fixed.outputCount = outputs;
  return fixed;
}

TEST(BoxPins, AreTheInputsThenTheOutputsEachFrom1) {
  std::vector<SLibDPinInfo> pins;
  append_pins(box_of(2, 1), pins);
  EXPECT_EQ(rows_of(pins), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}, {1, 1, 1, 0}}));
  EXPECT_EQ(first_detector_number(box_of(2, 1)), 3);
}

TEST(BoxPins, AreNoneForCountsOfNoneOrLess) {
  for (const int count : {0, -1, INT_MIN}) {
    std::vector<SLibDPinInfo> pins;
    append_pins(box_of(count, count), pins);
    EXPECT_TRUE(pins.empty());
    EXPECT_EQ(first_detector_number(box_of(count, 3)), 1);
  }
}

TEST(DetectorEnabled, IsOnUnlessTheCameraReportsOff) {
  const struct {
    const char* answer;
    bool enabled;
  } rows[] = {{"TamperingFunc=on", true},       {"a=1&TamperingFunc=off&b=2", false},
              {"TamperingFunc=off", false},     {"TamperingFunc=OFF", true},
              {"TamperingFunc=", true},         {"TamperingFunc=off ", true},
              {"TamperingLevel=low", true},     {"", true},
              {"TamperingFunc=on&x=off", true}, {"XTamperingFunc=off&b", false},
              {"TamperingFunc", true}};
  for (const auto& row : rows) EXPECT_EQ(detector_enabled(row.answer, "TamperingFunc="), row.enabled) << row.answer;
}

TEST(TamperLevel, IsTheWordsOrZeroForAnyOther) {
  const struct {
    const char* answer;
    std::optional<std::int32_t> level;
  } rows[] = {
      {"TamperingLevel=low&x", 1}, {"x&TamperingLevel=middle", 2}, {"TamperingLevel=high", 3}, {"TamperingLevel=", 0},
      {"TamperingLevel=HIGH", 0},  {"TamperingLevel=highest", 0},  {"TamperingFunc=on", {}},   {"", {}}};
  for (const auto& row : rows) EXPECT_EQ(tamper_level_of(row.answer), row.level) << row.answer;
}

TEST(SensorPins, AreReadInTheAnswersOrder) {
  const struct {
    const char* answer;
    std::vector<PinRow> pins;
  } rows[] = {{"Sensor1=1&Sensor2=0", {{1, 0, 1, 1}, {2, 0, 1, 0}}},
              {"Sensor2=0&Sensor1=1", {{2, 0, 1, 0}, {1, 0, 1, 1}}},
              {"Sensor1=1Sensor2=0", {{1, 0, 1, 1}, {2, 0, 1, 0}}},
              {"Sensor1=7&Sensor-1=-2", {{1, 0, 1, 7}, {-1, 0, 1, -2}}},
              {"Sensor 3= 1", {{3, 0, 1, 1}}},
              {"SensorSensor4=1", {{4, 0, 1, 1}}},
              {"Sensor99=99999999999&Sensor99999999999=1", {{99, 0, 1, INT_MAX}, {INT_MAX, 0, 1, 1}}},
              {"Sensor1&Sensor2=&Sensor=1&Sensor3:1&sensor4=1&Sensor5 =1", {}},
              {"", {}}};
  for (const auto& row : rows) EXPECT_EQ(rows_of(sensor_pins(row.answer)), row.pins) << row.answer;
}

TEST(StatusPins, AfterTheInputsAreTheDetectorsInTheirOrder) {
  SLibDFixedIoBoxInfo fixed = box_of(2, 0);
  fixed.videoDetection = fixed.tamperingDetection = true;
  EXPECT_EQ(rows_of(status_pins({0b1111, 0b1010}, fixed)),
            (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 1}, {3, 2, 1, 0}, {4, 4, 1, 1}}));
}

TEST(StatusPins, FurtherPinsAreAudioOrInputsWithoutIt) {
  SLibDFixedIoBoxInfo fixed = box_of(0, 0);
  EXPECT_EQ(rows_of(status_pins({0b11, 0}, fixed)), (std::vector<PinRow>{{1, 0, 1, 0}, {2, 0, 1, 0}}));
  fixed.audioDetection = true;
  EXPECT_EQ(rows_of(status_pins({0b11, 0}, fixed)), (std::vector<PinRow>{{1, 5, 1, 0}, {2, 5, 1, 0}}));
  fixed.videoDetection = true;
  EXPECT_EQ(rows_of(status_pins({0b111, 0}, fixed)), (std::vector<PinRow>{{1, 2, 1, 0}, {2, 5, 1, 0}, {3, 5, 1, 0}}));
}

TEST(StatusPins, TakeTheirTypeByTheirOrderInThePart) {
  SLibDFixedIoBoxInfo fixed = box_of(1, 0);
  fixed.videoDetection = fixed.tamperingDetection = true;
  EXPECT_EQ(rows_of(status_pins({0b1000, 0b1000}, fixed)), (std::vector<PinRow>{{4, 2, 1, 1}}));
}

TEST(StatusPins, HaveEveryOneOf32Bits) {
  EXPECT_TRUE(status_pins({0, 0xffffffffU}, box_of(32, 0)).empty());
  const auto pins = rows_of(status_pins({0xffffffffU, 0x80000001U}, box_of(32, 0)));
  ASSERT_EQ(pins.size(), 32U);
  EXPECT_EQ(pins.front(), (PinRow{1, 0, 1, 1}));
  EXPECT_EQ(pins[30], (PinRow{31, 0, 1, 0}));
  EXPECT_EQ(pins.back(), (PinRow{32, 0, 1, 1}));
}

TEST(Tampering, IsDueWhenItHasBeenActiveForMoreThan59Seconds) {
  std::time_t since = 0;
  EXPECT_FALSE(tampering_is_due(1, 1000, since));
  EXPECT_EQ(since, 1000);
  EXPECT_FALSE(tampering_is_due(1, 1059, since));
  EXPECT_TRUE(tampering_is_due(1, 1060, since));
  EXPECT_EQ(since, 1000);
}

TEST(Tampering, StartsAnewWhenItWasInactive) {
  std::time_t since = 1000;
  EXPECT_FALSE(tampering_is_due(0, 2000, since));
  EXPECT_EQ(since, 0);
  EXPECT_FALSE(tampering_is_due(0, 2000, since));
  EXPECT_FALSE(tampering_is_due(1, 2000, since));
  EXPECT_EQ(since, 2000);
}

TEST(Tampering, IsNotDueAfterAClockThatWentBack) {
  std::time_t since = 5000;
  EXPECT_FALSE(tampering_is_due(1, 1, since));
  EXPECT_EQ(since, 5000);
}

}  // namespace
}  // namespace vexa

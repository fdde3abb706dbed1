// SPDX-License-Identifier: Apache-2.0
// Brightness on the wire: levels and steps along the camera's exposure lists.
#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

using Driver = Played<CVexaCommon>;

using Items = std::vector<SLibDCommonParameterInt>;

SLibDBrightModeInfo entry(const char* name, Items shutter, Items iris) {
  SLibDBrightModeInfo mode;
  mode.name = name;
  mode.shutterSpeeds = std::move(shutter);
  mode.irisPositions = std::move(iris);
  return mode;
}

/// The lists of a camera with three shutter and three iris steps.
void give_lists(SettingsDriver& driver, const char* mode) {
  driver.m_FixedPTZControlInfo.brightModes = {
      entry("Full auto", {}, {}),
      entry("Shutter Priority", {{"1/50", 4}, {"1/100", 20}, {"1/250", 33}}, {{"wrong", 9999}}),
      entry("Iris Priority", {{"wrong", 9999}}, {{"F11", 1}, {"F8", 2}, {"F4", 5}})};
  driver.m_PTZControlInfo.brightMode = mode;
}

struct BrightRow {
  const char* mode;
  int level;
  const char* sent;
};

class BrightLevel : public testing::TestWithParam<BrightRow> {};

TEST_P(BrightLevel, IsSentAsItsShareOfTheListsLastValue) {
  Driver play({command(std::string("/command/camera.cgi?") + GetParam().sent)});
  give_lists(play.driver, GetParam().mode);
  EXPECT_EQ(play.driver.BrightAbsolute(GetParam().level), LIBD_OK);
}

INSTANTIATE_TEST_SUITE_P(
    Rows, BrightLevel,
    testing::Values(BrightRow{"Shutter Priority", 5000, "Shutter=17"}, BrightRow{"Shutter Priority", 0, "Shutter=0"},
                    BrightRow{"Shutter Priority", 10000, "Shutter=33"}, BrightRow{"Iris Priority", 5000, "Iris=3"},
                    BrightRow{"Iris Priority", 0, "Iris=0"}, BrightRow{"Iris Priority", 4999, "Iris=2"},
                    BrightRow{"Iris Priority", 10000, "Iris=5"}));

TEST(BrightAbsolute, ReportsTheLatestErrorWhenItsRequestIsRefused) {
  Driver play({refusal("/command/camera.cgi?Iris=5")});
  give_lists(play.driver, "Iris Priority");
  EXPECT_EQ(play.driver.BrightAbsolute(10000), LIBD_UNAUTHORIZED);
}

using BrightUnsent = Unsent<SettingsDriver>;

TEST_F(BrightUnsent, BecauseTheLevelIsOutOfRange) {
  give_lists(driver_, "Shutter Priority");
  for (const int level : {-1, 10001, INT_MAX, INT_MIN}) {
    EXPECT_EQ(driver_.BrightAbsolute(level), LIBD_INVALID_ARGUMENT) << level;
  }
}

TEST_F(BrightUnsent, BecauseTheStepIsOutOfRange) {
  give_lists(driver_, "Full auto");
  for (const int step : {0, 10001, -10001, INT_MAX, INT_MIN}) {
    EXPECT_EQ(driver_.Bright(step), LIBD_INVALID_ARGUMENT) << step;
    EXPECT_EQ(driver_.CheckAmountOfBrightness(step), LIBD_INVALID_ARGUMENT);
  }
  for (const int step : {-10000, -1, 1, 10000}) EXPECT_EQ(driver_.CheckAmountOfBrightness(step), LIBD_OK) << step;
}

TEST_F(BrightUnsent, BecauseTheModeLeavesNothingToTheHost) {
  for (const char* mode : {"Full auto", "", "Manual", "shutter priority"}) {
    give_lists(driver_, mode);
    EXPECT_EQ(driver_.BrightAbsolute(5000), LIBD_INVALID_MODE) << mode;
    EXPECT_EQ(driver_.Bright(1), LIBD_INVALID_MODE) << mode;
    EXPECT_EQ(driver_.CheckCurrentBrightMode(), LIBD_INVALID_MODE);
  }
  for (const char* mode : {"Shutter Priority", "Iris Priority"}) {
    give_lists(driver_, mode);
    EXPECT_EQ(driver_.CheckCurrentBrightMode(), LIBD_OK);
  }
}

TEST_F(BrightUnsent, BecauseTheCameraListsNoSuchMode) {
  driver_.m_PTZControlInfo.brightMode = "Iris Priority";
  EXPECT_EQ(driver_.BrightAbsolute(5000), LIBD_OK);
  driver_.m_FixedPTZControlInfo.brightModes = {entry("Shutter Priority", {{"a", 1}}, {{"b", 2}})};
  EXPECT_EQ(driver_.BrightAbsolute(5000), LIBD_OK);
}

TEST_F(BrightUnsent, BecauseTheModesListIsEmpty) {
  driver_.m_FixedPTZControlInfo.brightModes = {entry("Shutter Priority", {}, {{"b", 2}}),
                                               entry("Iris Priority", {{"a", 1}}, {})};
  for (const char* mode : {"Shutter Priority", "Iris Priority"}) {
    driver_.m_PTZControlInfo.brightMode = mode;
    EXPECT_EQ(driver_.BrightAbsolute(5000), LIBD_OK);
  }
}

struct StepRow {
  const char* mode;
  int step;
  const char* answer;
  const char* sent;  // null: nothing
};

class BrightStep : public testing::TestWithParam<StepRow> {};

TEST_P(BrightStep, MovesToTheNeighbourInTheModesList) {
  Script script{inquiry("camera", GetParam().answer)};
  if (GetParam().sent != nullptr) script.push_back(command(std::string("/command/camera.cgi?") + GetParam().sent));
  Driver play(script);
  give_lists(play.driver, GetParam().mode);
  play.driver.cache_inquiry("A=1&Shutter=33&Iris=5");
  EXPECT_EQ(play.driver.Bright(GetParam().step), LIBD_OK);
  EXPECT_EQ(play.driver.cached_inquiry(), "A=1&Shutter=33&Iris=5");
  EXPECT_EQ(play.driver.LatestErrorCode(), LIBD_FAILED);
  EXPECT_EQ(play.driver.LatestErrorText(), "");
}

constexpr StepRow kSteps[] = {{"Shutter Priority", 1, "A=1&Shutter=4&Iris=2", "Shutter=20"},
                              {"Shutter Priority", 10000, "A=1&Iris=2&Shutter=20", "Shutter=33"},
                              {"Shutter Priority", -1, "A=1&Shutter=33", "Shutter=20"},
                              {"Shutter Priority", -10000, "A=1&Shutter=20", "Shutter=4"},
                              {"Shutter Priority", 1, "A=1&Shutter=4&Shutter=20", "Shutter=20"},
                              {"Shutter Priority", 1, "A=1&Shutter= +4x", "Shutter=20"},
                              {"Iris Priority", 3, "A=1&Shutter=4&Iris=1", "Iris=2"},
                              {"Iris Priority", -3, "A=1&Iris=5", "Iris=2"},
                              {"Iris Priority", -3, "A=1&Iris=1", nullptr},
                              {"Iris Priority", 3, "A=1&Iris=5", nullptr},
                              {"Shutter Priority", 1, "A=1&Shutter=33", nullptr},
                              {"Shutter Priority", -1, "A=1&Shutter=4", nullptr},
                              {"Shutter Priority", 1, "A=1&Shutter=5", nullptr},
                              {"Shutter Priority", -1, "A=1&Shutter=5", nullptr},
                              {"Shutter Priority", 1, "A=1&Shutter=", nullptr},
                              {"Shutter Priority", 1, "A=1&Iris=1", nullptr},
                              {"Shutter Priority", 1, "Shutter=4", nullptr},
                              {"Iris Priority", 10000, "A=1&Iris=2", "Iris=5"},
                              {"Iris Priority", -10000, "A=1&Iris=2", "Iris=1"},
                              {"Iris Priority", 1, "A=1&Iris=1&Iris=2", "Iris=2"},
                              {"Iris Priority", 1, "A=1&Iris= +1x", "Iris=2"},
                              {"Iris Priority", 1, "A=1&Iris=3", nullptr},
                              {"Iris Priority", -1, "A=1&Iris=3", nullptr},
                              {"Iris Priority", 1, "A=1&Iris=", nullptr},
                              {"Iris Priority", 1, "Iris=1", nullptr},
                              {"Iris Priority", 1, "A=1&Shutter=4", nullptr},
                              {"Iris Priority", 1, "", nullptr}};
INSTANTIATE_TEST_SUITE_P(Rows, BrightStep, testing::ValuesIn(kSteps));

TEST(Bright, SendsNothingWithoutAnEntryOfTheMode) {
  for (const char* mode : {"Shutter Priority", "Iris Priority"}) {
    Driver play({inquiry("camera", "A=1&Shutter=4&Iris=1")});
    play.driver.m_FixedPTZControlInfo.brightModes = {entry("Full auto", {{"a", 4}, {"b", 5}}, {{"a", 1}, {"b", 2}})};
    play.driver.m_PTZControlInfo.brightMode = mode;
    EXPECT_EQ(play.driver.Bright(1), LIBD_OK) << mode;
  }
}

TEST(Bright, AsksAfreshAndLeavesTheCacheAlone) {
  Driver play({inquiry("camera", "A=1&Iris=1"), command("/command/camera.cgi?Iris=2"), inquiry("camera", "A=1&Iris=2"),
               command("/command/camera.cgi?Iris=5")});
  give_lists(play.driver, "Iris Priority");
  EXPECT_EQ(play.driver.Bright(1), LIBD_OK);
  EXPECT_EQ(play.driver.Bright(1), LIBD_OK);
  EXPECT_EQ(play.driver.cached_inquiry(), "");
}

TEST(Bright, ReportsTheLatestErrorWhenTheCameraRefuses) {
  Driver asked({refusal("/command/inquiry.cgi?inq=camera")});
  give_lists(asked.driver, "Iris Priority");
  EXPECT_EQ(asked.driver.Bright(1), LIBD_UNAUTHORIZED);
  EXPECT_EQ(asked.complaints(), "");
  Driver told({inquiry("camera", "A=1&Shutter=4"), refusal("/command/camera.cgi?Shutter=20")});
  give_lists(told.driver, "Shutter Priority");
  EXPECT_EQ(told.driver.Bright(1), LIBD_UNAUTHORIZED);
  EXPECT_EQ(told.complaints(), "");
}

/// Another thread's change of the mode while the camera answers Bright.
struct ModeChange {
  const char* before;
  const char* after;
  ELibDReturnCode result;
  const char* sent;  // null: nothing
};

class BrightMeanwhile : public testing::TestWithParam<ModeChange> {};

TEST_P(BrightMeanwhile, GoesByTheModeThatIsStoredWhenTheCameraHasAnswered) {
  SettingsDriver* driver = nullptr;
  ScriptStep asked = inquiry("camera", "A=1&Shutter=4&Iris=1");
  asked.meanwhile = [&driver] {
    SLibDPTZControlInfo info;
    info.brightMode = GetParam().after;
    EXPECT_EQ(driver->SetPTZControlInfo(info), LIBD_OK);
  };
  Script script{asked};
  if (GetParam().sent != nullptr) script.push_back(command(std::string("/command/camera.cgi?") + GetParam().sent));
  Driver play(script);
  driver = &play.driver;
  give_lists(play.driver, GetParam().before);
  EXPECT_EQ(play.driver.Bright(1), GetParam().result);
}

INSTANTIATE_TEST_SUITE_P(Modes, BrightMeanwhile,
                         testing::Values(ModeChange{"Shutter Priority", "Iris Priority", LIBD_OK, "Iris=2"},
                                         ModeChange{"Iris Priority", "Shutter Priority", LIBD_OK, "Shutter=20"},
                                         ModeChange{"Iris Priority", "Full auto", LIBD_INVALID_MODE, nullptr},
                                         ModeChange{"Shutter Priority", "", LIBD_INVALID_MODE, nullptr}));

TEST_F(BrightUnsent, BecauseTheEntryIsNotThere) {
  give_lists(driver_, "Iris Priority");
  for (const unsigned place : {3u, 4u, UINT_MAX}) {
    int value = 4;
    EXPECT_FALSE(driver_.GetShutterSpeedFromShutterSpeedList(1, value, place));
    EXPECT_FALSE(driver_.GetIrisPositionFromIrisList(1, value, place));
    EXPECT_EQ(value, 4);
  }
}

TEST(ExposureEntries, AreFoundByTheirNames) {
  SettingsDriver driver;
  int shutter = 9;
  int iris = 9;
  driver.GetShutterAndIrisMode(shutter, iris);
  EXPECT_EQ(shutter, -1);
  EXPECT_EQ(iris, -1);
  give_lists(driver, "");
  driver.GetShutterAndIrisMode(shutter, iris);
  EXPECT_EQ(shutter, 1);
  EXPECT_EQ(iris, 2);
}

}  // namespace
}  // namespace vexa_test

// Settings and image controls when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "tests/support/test_driver.h"
#include "vexa/vexa_variants.h"

namespace vexa_test {
namespace {

// Values longer than what a text holds without memory.
const char* const kLongAnswer =
    "A=1&VideoStd=ntsc&VidCapSize=1280,960,and,so,on,and,on&SolidPTZ=on&ImageMaxSize=1024,768,and,so,on&"
    "ImageCodec1=jpeg-mpeg4-and-more&ImageSize1=1280,720,and,so,on&FrameRate1=0000000000000000025&"
    "Quality1=0000000000000000000006&RTSPPort=00000000000000000554&DayNightMode=auto&XDNR=mid&ViewDR=off&"
    "VisibilityEnhancer=mid&IRLed=off&IRLedMaxStrength=0000000000000000000010";

using Reading = ELibDReturnCode (*)(SettingsDriver&, SLibDCameraInfo&);

struct ReadingRow {
  const char* name;
  Reading read;
};

const ReadingRow kReadings[] = {
    {"CameraInfo", [](SettingsDriver& d, SLibDCameraInfo& info) { return d.GetCameraInfo(info); }},
    {"DayNight",
     [](SettingsDriver& d, SLibDCameraInfo&) {
       auto mode = LIBD_DAYNIGHT_UNKNOWN;
       return d.GetDayNightMode(mode);
     }},
    {"Xdnr",
     [](SettingsDriver& d, SLibDCameraInfo&) {
       auto mode = LIBD_XDNR_OFF;
       return d.GetXdnrMode(mode);
     }},
    {"ViewDR",
     [](SettingsDriver& d, SLibDCameraInfo&) {
       auto mode = LIBD_VIEWDR_OFF;
       return d.GetViewDR(mode);
     }},
    {"Visibility",
     [](SettingsDriver& d, SLibDCameraInfo&) {
       auto mode = LIBD_VISIBILITY_OFF;
       return d.GetVisibilityEnhancerMode(mode);
     }},
    {"Illuminator", [](SettingsDriver& d, SLibDCameraInfo&) {
       auto mode = LIB_IR_OFF;
       int strength = 0;
       return d.GetIRIlluminator(mode, strength);
     }}};

void expect_failed_readings(const ReadingRow& row, const std::string& cached, int few) {
  SCOPED_TRACE(row.name);
  fails_at_every_allocation(
      [&](Shortage& shortage) {
        Played<CVexaCommon> play({inquiry("camera", kLongAnswer)}, Ends::kAnywhere);
        play.driver.cache_inquiry(cached);
        SLibDCameraInfo info;
        expect_failure_told(shortage, play.driver, [&] { return row.read(play.driver, info); });
      },
      few);
}

TEST(ShortMemory, FailsAReadingThatAsksTheCamera) {
  for (const ReadingRow& row : kReadings) expect_failed_readings(row, "", 3);
}

TEST(ShortMemory, FailsAReadingOutOfTheCache) {
  for (const ReadingRow& row : kReadings) {
    if (std::string(row.name) != "CameraInfo") expect_failed_readings(row, kLongAnswer, 0);
  }
}

using Call = ELibDReturnCode (*)(SettingsDriver&);

struct CallRow {
  const char* name;
  Call call;
};

const CallRow kCalls[] = {
    {"VidCapSize", [](SettingsDriver& d) { return d.SetVidCapSize(1280, 720); }},
    {"SolidPTZ", [](SettingsDriver& d) { return d.SetSolidPTZState(true); }},
    {"ImageMaxSize", [](SettingsDriver& d) { return d.SetImageMaxSize(640, 480, LIBD_VIDEO_PAL); }},
    {"FixedCameraInfo",
     [](SettingsDriver& d) {
       SLibDFixedCameraInfo info;
       return d.GetFixedCameraInfo(info);
     }},
    // A mode of which the camera lists no steps: nothing is sent.
    {"BrightAbsolute", [](SettingsDriver& d) { return d.BrightAbsolute(5000); }}};

TEST(ShortMemory, FailsACallThatNeedsNoCamera) {
  for (const CallRow& row : kCalls) {
    SCOPED_TRACE(row.name);
    fails_at_every_allocation([&](Shortage& shortage) {
      SettingsDriver driver;
      driver.m_FixedCameraInfoAvailable = true;
      driver.m_PTZControlInfo.brightMode = "Shutter Priority";
      ASSERT_EQ(driver.SetSolidPTZState(false), LIBD_OK);
      expect_failure_told(shortage, driver, [&] { return row.call(driver); });
    });
  }
}

TEST(ShortMemory, LeavesTheRecordOfASettingThatFails) {
  const std::string path = "/command/camera.cgi?ImageCodec1=jpeg&ImageSize1=1,2&FrameRate1=3&Quality1=4";
  SLibDCameraInfo set;
  set.codecName = set.imageSizeText = std::string(500, 'x');
  set.imageWidth = 1;
  set.imageHeight = 2;
  set.frameRate = 3;
  set.quality = 4;
  fails_at_every_allocation([&](Shortage& shortage) {
    Played<CVexaCommon> play({command(path)}, Ends::kAnywhere);
    expect_failure_told(shortage, play.driver, [&] { return play.driver.SetCameraInfo(set); });
    EXPECT_EQ(play.driver.m_CameraInfo.frameRate, shortage.failed() ? 0 : 3);
    EXPECT_EQ(play.driver.m_CameraInfo.codecName, shortage.failed() ? "" : set.codecName);
  });
}

template <typename Driver>
void fail_system_info(const Script& script) {
  fails_at_every_allocation([&](Shortage& shortage) {
    Played<Driver> play(script, Ends::kAnywhere);
    SLibDSystemInfo info;
    CLibraryDevice& device = play.driver;
    expect_failure_told(shortage, device, [&] { return device.GetCurrentSystemInfo(info); });
  });
}

TEST(ShortMemory, FailsReadingWhatTheCameraIs) {
  const std::string name(600, 'N');
  const auto system = inquiry("system", "ModelName=" + name + "&SoftVersion=" + name + "&VideoOutMode=pal");
  const auto network = inquiry("network", "MacAddress=" + name);
  const auto output = command("/command/system.cgi?VideoOutMode=ip");
  fail_system_info<CVexaCommon>({system, network});
  fail_system_info<CVexaHeronCommon>({system, network, output});
  fail_system_info<CVexaSimplePTZCommon>({system, output, network});
}

TEST(ShortMemory, FailsACommandBeforeTheCameraIsAsked) {
  TestDriver driver;
  driver.use("127.0.0.1", 1, 50);
  const std::string name(500, 'x');
  driver.soil_latest_error();
  Shortage shortage(0);
  expect_failure_told(shortage, driver, [&] { return driver.camera().send("/command/%s", name.c_str()); });
  EXPECT_TRUE(shortage.failed());
  EXPECT_EQ(driver.latest_error(), "0 Cannot allocate memory");
}

TEST(ShortMemory, FailsAStepOfBrightness) {
  fails_at_every_allocation([](Shortage& shortage) {
    Played<CVexaCommon> play({inquiry("camera", "A=1&Shutter=0000000000000000000000033")}, Ends::kAnywhere);
    SLibDBrightModeInfo mode;
    mode.name = "Shutter Priority";
    mode.shutterSpeeds = {{"1/50", 4}, {"1/100", 33}};
    play.driver.m_FixedPTZControlInfo.brightModes = {mode};
    play.driver.m_PTZControlInfo.brightMode = mode.name;
    EXPECT_EQ(shortage.run([&] { return play.driver.Bright(1); }), shortage.failed() ? LIBD_FAILED : LIBD_OK);
  });
}

}  // namespace
}  // namespace vexa_test

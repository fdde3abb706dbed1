// Settings and image controls when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "tests/support/test_driver.h"
#include "vexa/vexa_variants.h"

namespace {

using vexa_test::AllocationFailure;
using vexa_test::inquiry;
using vexa_test::Played;
using vexa_test::SettingsDriver;

// Values longer than what a text holds without memory.
const char* const kLongAnswer =
    "A=1&VideoStd=ntsc&VidCapSize=1280,960,and,so,on,and,on&SolidPTZ=on&ImageMaxSize=1024,768,and,so,on&"
    "ImageCodec1=jpeg-mpeg4-and-more&ImageSize1=1280,720,and,so,on&FrameRate1=0000000000000000025&"
    "Quality1=0000000000000000000006&RTSPPort=00000000000000000554&DayNightMode=auto&XDNR=mid&ViewDR=off&"
    "VisibilityEnhancer=mid&IRLed=off&IRLedMaxStrength=0000000000000000000010";

using ShortReading = ELibDReturnCode (*)(SettingsDriver&, SLibDCameraInfo&);

struct ShortReadingRow {
  const char* name;
  ShortReading read;
};

const ShortReadingRow kShortReadings[] = {
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

/// What reading returns when the thread's allocation number `nth` fails; LIBD_OK, and `happened` false, when none did.
ELibDReturnCode read_short_of_memory(const ShortReading read, int nth, const std::string& cached, bool& happened) {
  Played<CVexaCommon> play({inquiry("camera", kLongAnswer)});
  play.driver.cache_inquiry(cached);
  SLibDCameraInfo info;
  ELibDReturnCode result = LIBD_OK;
  {
    AllocationFailure failure(nth);
    result = read(play.driver, info);
    happened = failure.happened();
  }
  if (happened) {
    EXPECT_EQ(vexa_test::text_of_latest_error(play.driver), "Cannot allocate memory") << nth;
  }
  return result;
}

/// How many allocations of a reading there are; each that fails is a failure.
int failed_readings(const ShortReadingRow& row, const std::string& cached) {
  for (int nth = 0; nth < 1000; ++nth) {
    bool happened = false;
    const ELibDReturnCode result = read_short_of_memory(row.read, nth, cached, happened);
    EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << row.name << nth;
    if (!happened) return nth;
  }
  return 1000;
}

TEST(ShortMemory, FailsAReadingThatAsksTheCamera) {
  for (const ShortReadingRow& row : kShortReadings) {
    const int failed = failed_readings(row, "");
    EXPECT_GT(failed, 3) << row.name;
    EXPECT_LT(failed, 1000) << row.name;
  }
}

TEST(ShortMemory, FailsAReadingOutOfTheCache) {
  for (const ShortReadingRow& row : kShortReadings) {
    if (std::string(row.name) == "CameraInfo") continue;
    EXPECT_GT(failed_readings(row, kLongAnswer), 0) << row.name;
  }
}

// ---- Calls that need no camera ----

using ShortCall = ELibDReturnCode (*)(SettingsDriver&);

struct ShortCallRow {
  const char* name;
  ShortCall call;
};

const ShortCallRow kShortCalls[] = {
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
  for (const ShortCallRow& row : kShortCalls) {
    for (int nth = 0;; ++nth) {
      ASSERT_LT(nth, 1000) << row.name;
      SettingsDriver driver;
      driver.m_FixedCameraInfoAvailable = true;
      driver.m_PTZControlInfo.brightMode = "Shutter Priority";
      ASSERT_EQ(driver.SetSolidPTZState(false), LIBD_OK);
      ELibDReturnCode result = LIBD_OK;
      bool happened = false;
      {
        AllocationFailure failure(nth);
        result = row.call(driver);
        happened = failure.happened();
      }
      EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << row.name << nth;
      if (!happened) {
        EXPECT_GT(nth, 0) << row.name;
        break;
      }
      EXPECT_EQ(vexa_test::text_of_latest_error(driver), "Cannot allocate memory") << row.name << nth;
    }
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
  for (int nth = 0;; ++nth) {
    ASSERT_LT(nth, 1000);
    Played<CVexaCommon> play({vexa_test::command(path)});
    ELibDReturnCode result = LIBD_OK;
    bool happened = false;
    {
      AllocationFailure failure(nth);
      result = play.driver.SetCameraInfo(set);
      happened = failure.happened();
    }
    EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << nth;
    EXPECT_EQ(play.driver.m_CameraInfo.frameRate, happened ? 0 : 3) << nth;
    EXPECT_EQ(play.driver.m_CameraInfo.codecName, happened ? "" : set.codecName) << nth;
    if (!happened) break;
  }
}

template <typename Driver>
void fail_system_info(const vexa_test::Script& script) {
  for (int nth = 0;; ++nth) {
    ASSERT_LT(nth, 1000);
    Played<Driver> play(script);
    SLibDSystemInfo info;
    ELibDReturnCode result = LIBD_OK;
    bool happened = false;
    {
      AllocationFailure failure(nth);
      result = static_cast<CLibraryDevice&>(play.driver).GetCurrentSystemInfo(info);
      happened = failure.happened();
    }
    EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << nth;
    if (!happened) break;
    EXPECT_EQ(vexa_test::text_of_latest_error(play.driver), "Cannot allocate memory") << nth;
  }
}

TEST(ShortMemory, FailsReadingWhatTheCameraIs) {
  const std::string name(600, 'N');
  const auto system = inquiry("system", "ModelName=" + name + "&SoftVersion=" + name + "&VideoOutMode=pal");
  const auto network = inquiry("network", "MacAddress=" + name);
  const auto output = vexa_test::command("/command/system.cgi?VideoOutMode=ip");
  fail_system_info<CVexaCommon>({system, network});
  fail_system_info<CVexaHeronCommon>({system, network, output});
  fail_system_info<CVexaSimplePTZCommon>({system, output, network});
}

TEST(ShortMemory, FailsACommandBeforeTheCameraIsAsked) {
  vexa_test::TestDriver driver;
  driver.use("127.0.0.1", 1, 50);
  const std::string name(500, 'x');
  driver.soil_latest_error();
  ELibDReturnCode result = LIBD_OK;
  {
    AllocationFailure failure(0);
    result = driver.camera().send("/command/%s", name.c_str());
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(result, LIBD_FAILED);
  EXPECT_EQ(driver.latest_error(), "0 Cannot allocate memory");
}

TEST(ShortMemory, FailsAStepOfBrightness) {
  for (int nth = 0;; ++nth) {
    ASSERT_LT(nth, 1000);
    Played<CVexaCommon> play({inquiry("camera", "A=1&Shutter=0000000000000000000000033")});
    SLibDBrightModeInfo mode;
    mode.name = "Shutter Priority";
    mode.shutterSpeeds = {{"1/50", 4}, {"1/100", 33}};
    play.driver.m_FixedPTZControlInfo.brightModes = {mode};
    play.driver.m_PTZControlInfo.brightMode = mode.name;
    bool happened = false;
    ELibDReturnCode result = LIBD_OK;
    {
      AllocationFailure failure(nth);
      result = play.driver.Bright(1);
      happened = failure.happened();
    }
    EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << nth;
    if (!happened) break;
  }
}

}  // namespace

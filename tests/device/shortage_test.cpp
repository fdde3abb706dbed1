// Settings, image controls, records, motion, presets and tours when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/ptz_reach.h"
#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "tests/support/temporary_folder.h"
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

/// A text of more than a text holds by itself.
std::string long_text() { return std::string(40, 't'); }

/// The host's records, made before memory runs short.
struct HostRecords {
  SLibDFixedSystemInfo fixed_system;
  SLibDFixedConnectionInfo fixed_connection;
  SLibDSystemInfo system;
  SLibDConnectionInfo connection;
};

struct Row {
  const char* name;
  ELibDReturnCode (*call)(TestDriver& driver, HostRecords& host);
};

const Row kRows[] = {
    {"GetFixedSystemInfo", [](TestDriver& d, HostRecords& host) { return d.GetFixedSystemInfo(host.fixed_system); }},
    {"GetFixedConnectionInfo",
     [](TestDriver& d, HostRecords& host) { return d.GetFixedConnectionInfo(host.fixed_connection); }},
    {"GetCurrentSystemInfo", [](TestDriver& d, HostRecords& host) { return d.GetCurrentSystemInfo(host.system); }},
    {"GetCurrentConnectionInfo",
     [](TestDriver& d, HostRecords& host) { return d.GetCurrentConnectionInfo(host.connection); }}};

TEST(RecordsShortOfMemory, AreAFailure) {
  const std::string text = long_text();
  for (const Row& row : kRows) {
    SCOPED_TRACE(row.name);
    fails_at_every_allocation([&](Shortage& shortage) {
      ScriptedCamera camera(
          {inquiry("system", "ModelName=" + text + "&Serial=" + text), inquiry("network", "MacAddress=" + text)});
      TestDriver driver;
      driver.use(camera.host(), camera.port(), kPatientTimeout);
      driver.m_FixedSystemInfo.modelName = driver.m_FixedConnectionInfo.text = text;
      driver.m_ConnectionInfo.proxyHost = text;
      HostRecords host;
      expect_failure_told(shortage, driver, [&] { return row.call(driver, host); });
    });
  }
}

TEST(GetLatestErrorText, ShortOfMemoryFailsAndKeepsTheText) {
  TestDriver driver;
  driver.Fail({LIBD_FAILED, "a text of more than a text holds by itself"});
  std::string text = "before";
  {
    const AllocationFailure failure(0);
    EXPECT_EQ(driver.GetLatestErrorText(text), LIBD_FAILED);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(text, "before");
  EXPECT_EQ(driver.GetLatestErrorText(text), LIBD_OK);
  EXPECT_EQ(text, "a text of more than a text holds by itself");
}

TEST(SetCurrentConnectionInfo, ShortOfMemoryKeepsTheConnectionWholeAndThrowsNothing) {
  const TemporaryFolder folder;
  SLibDConnectionInfo given;
  given.host = given.proxyHost = long_text();
  given.timeout = 1234;
  fails_at_every_allocation(
      [&](Shortage& shortage) {
        TestDriver driver;
        driver.SetCGILogPath((folder / "cgi.log").c_str());
        const SLibDConnectionInfo before = driver.m_ConnectionInfo;
        const bool copied = shortage.nth() >= 2;  // both long texts
        const ELibDReturnCode result = shortage.run([&] { return driver.SetCurrentConnectionInfo(given); });
        EXPECT_TRUE(result == LIBD_FAILED || (copied && result == LIBD_OK));
        EXPECT_EQ(driver.m_ConnectionInfo.host, copied ? given.host : before.host);
        EXPECT_EQ(driver.m_ConnectionInfo.timeout, copied ? 1234 : before.timeout);
        EXPECT_EQ(driver.m_SavedTimeout, copied ? 1234 : before.timeout);
      },
      2);
}

// Longer than what a text holds without memory, as are the texts below.
const std::string kLongText(40, 'n');

const char* const kLongPresetAnswer =
    "PresetName=1,A name that is longer than a text holds by itself&Tour=on&TourResume=on&TourRsmTime=30&"
    "TourASequence=1,2,0000000000000000000003&STour=on&STourResume=on&STourMaxRecordTime=00000000000000000120";

/// Reads into a record of the host's.
template <typename Record, ELibDReturnCode (CVexaCommon::*kRead)(Record&)>
ELibDReturnCode read_into(PtzDriver& driver) {
  Record record;
  return (driver.*kRead)(record);
}

using PtzCall = ELibDReturnCode (*)(PtzDriver& driver);

/// A driver of a camera with two of each kind.
void give_two_of_each(PtzDriver& driver) {
  SLibDFixedPTZControlInfo& info = driver.m_FixedPTZControlInfo;
  info.presetCount = info.tourCount = info.shadowTourCount = 2;
  info.zoomSteps.resize(2);
  driver.m_FixedPTZControlInfoAvailable = true;
  driver.m_PTZControlInfo.brightMode = kLongText;
  driver.m_SavedTimeout = kPatientTimeout;
}

/// Lets each allocation of the call fail in turn; every failure is told. The camera says `step` when it is asked.
void expect_each_failure_told(PtzCall call, const ScriptStep& step, int few = 0) {
  fails_at_every_allocation(
      [&](Shortage& shortage) {
        PtzPlay play({step}, Ends::kAnywhere);
        give_two_of_each(play.driver);
        expect_failure_told(shortage, play.driver, [&] { return call(play.driver); });
      },
      few);
}

TEST(PtzReading, FailsWhenAnyOneAllocationDoes) {
  const PtzCall calls[] = {read_into<std::vector<SLibDPresetInfo>, &CVexaCommon::GetPresets>,
                           read_into<SLibDCameraTourInfo, &CVexaCommon::GetCameraTourInfo>,
                           read_into<SLibDShadowTourInfo, &CVexaCommon::GetShadowTourInfo>};
  for (const PtzCall call : calls) {
    expect_each_failure_told(call, inquiry("presetposition", kLongPresetAnswer), 5);
  }
}

TEST(PtzReading, OfTheDriversRecordsFailsWhenAnyOneAllocationDoes) {
  const PtzCall calls[] = {read_into<SLibDPTZControlInfo, &CVexaCommon::GetPTZControlInfo>,
                           read_into<SLibDFixedPTZControlInfo, &CVexaCommon::GetFixedPTZControlInfo>};
  for (const PtzCall call : calls) expect_each_failure_told(call, {});
}

// What is set is made before memory runs short.
SLibDPresetInfo long_preset;
SLibDCameraTourInfo two_tours;
SLibDShadowTourInfo two_shadow_tours;
SLibDPTZControlInfo long_control;

TEST(PtzSetting, FailsWhenAnyOneAllocationDoes) {
  long_preset.name = kLongText;
  two_tours.tours[1].sequence = two_tours.tours[2].sequence = {1, 2};
  two_shadow_tours.tours[1] = two_shadow_tours.tours[2] = {};
  long_control.brightMode = kLongText;
  const std::string path = "/command/presetposition.cgi?";
  const std::string tour = "&TourB=off&TourBSequence=1,2&TourBStaytime=10&TourBPeriod=always&TourBSpeed=24";
  const struct {
    PtzCall set;
    std::string rest;
  } rows[] = {
      {[](PtzDriver& d) { return d.SetPreset(long_preset); }, "PresetSet=1," + kLongText + ",on"},
      {[](PtzDriver& d) { return d.SetCameraTourInfo(two_tours); },
       "Tour=off&TourResume=off&TourA=off&TourASequence=1,2&TourAStaytime=10&TourAPeriod=always&TourASpeed=24" + tour},
      {[](PtzDriver& d) { return d.SetShadowTourInfo(two_shadow_tours); },
       "STour=off&STourResume=off&STourA=off&STourAPeriod=always&STourB=off&STourBPeriod=always"},
      {[](PtzDriver& d) { return d.StartShadowTour(1); }, "STour=on&STourA=on&STourB=off"}};
  for (const auto& row : rows) {
    SCOPED_TRACE(row.rest);
    expect_each_failure_told(row.set, command(path + row.rest), 5);
  }
  expect_each_failure_told([](PtzDriver& d) { return d.SetPTZControlInfo(long_control); }, {});
}

TEST(PtzReading, OfThePositionNeedsNoMemory) {
  PtzDriver driver;
  driver.m_ZoomRatios = {{1, 0}};
  driver.m_FixedPTZControlInfo.panTilt.horizontalWideAngle = driver.m_FixedPTZControlInfo.panTilt.verticalWideAngle = 1;
  driver.tell_position("CamPos: 111006400C81000M");
  SLibDPTZStatus status;
  const AllocationFailure failure(0);
  EXPECT_EQ(driver.GetCurrentPosition(status), LIBD_OK);
  EXPECT_FALSE(failure.happened());
}

}  // namespace
}  // namespace vexa_test

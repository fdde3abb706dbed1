// SPDX-License-Identifier: Apache-2.0
// A camera that follows a profile: what it reads of the file, and which settings it has and takes.
#include "virtual_camera/model/camera_profile.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "tests/models/profile_text.h"
#include "virtual_camera/model/setting_rules.h"
#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

const std::string kProfileFolder = VEXA_SOURCE_DIR "/models/profiles/";

std::string mistake_in(const std::string& profile) {
  const auto parsed = parse_camera_profile(profile, "p.json");
  const auto* error = std::get_if<std::string>(&parsed);
  return error == nullptr ? "taken" : *error;
}

TEST(CameraProfile, NamesFileAndKeyOfWhatItCannotRead) {
  EXPECT_EQ(mistake_in(vexa_test::kSmallProfile), "taken");
  EXPECT_EQ(mistake_in(vexa_test::changed_profile("\"inputs\": 1", "\"inputs\": 17")),
            "p.json:18: io.inputs: must be from 0 to 16");
  EXPECT_EQ(mistake_in("[]"), "p.json:1: must be an object");
  EXPECT_EQ(std::get<std::string>(load_camera_profile("/nowhere.json")),
            "/nowhere.json: cannot be read: No such file or directory");
}

TEST(CameraProfile, ReadsEveryProfileThatIsShipped) {
  std::size_t read = 0;
  for (const auto& file : std::filesystem::directory_iterator(kProfileFolder)) {
    const auto loaded = load_camera_profile(file.path());
    ASSERT_TRUE(std::holds_alternative<CameraProfile>(loaded)) << std::get<std::string>(loaded);
    EXPECT_EQ(std::get<CameraProfile>(loaded).model, file.path().stem());
    ++read;
  }
  EXPECT_GE(read, 5U);
}

TEST(CameraProfile, IsFoundByTheNameOfAnInstalledProfile) {
  const auto named = load_camera_profile("LMX-P200");
  ASSERT_TRUE(std::holds_alternative<CameraProfile>(named)) << std::get<std::string>(named);
  EXPECT_EQ(std::get<CameraProfile>(named).model, "LMX-P200");
  EXPECT_TRUE(std::holds_alternative<std::string>(load_camera_profile("no-such-model")));
}

SettingsStore& of_model(SettingsStore& settings, const std::string& model) {
  auto loaded = load_camera_profile(kProfileFolder + model + ".json");
  settings.obey(std::make_shared<const SettingRules>(std::get<CameraProfile>(std::move(loaded))));
  return settings;
}

TEST(ProfiledCamera, AnswersWithTheSettingsOfItsModelOnly) {
  SettingsStore settings;
  of_model(settings, "LMX-A100");
  EXPECT_EQ(settings.answer("camera"),
            "VideoStd=pal&VidCapSize=1280,1024&ImageCodec1=h264&ImageSize1=1280,1024&FrameRate1=15&BitRate1=2000&"
            "Quality1=1&UcVideoPort=50000&UcVideoPort1=50002&UcVideoPort2=50004&RTSPPort=554&RTSPTimeout=60&"
            "RTPUserData=off&DayNightMode=auto&DayNight=off&VisibilityEnhancer=off&BLComp=off");
  EXPECT_EQ(settings.answer("system"),
            "ModelName=LMX-A100&SoftVersion=1.02.00&Serial=100001&ChannelId=1&VideoOutMode=ip&TamperingFunc=off&"
            "TamperingLevel=middle&TamperingStatusClear=off&AlarmData=off");
  EXPECT_EQ(settings.answer("edgestorage"), "EsRTSPRec1Timeout=60");
  EXPECT_EQ(settings.answer("presetposition"), std::nullopt);
}

struct SettingCase {
  const char* model;
  const char* section;
  const char* query;
  bool taken;
};

TEST(ProfiledCamera, TakesWhatItsModelHasAndRefusesTheRest) {
  const SettingCase cases[] = {
      {"LMX-H100", "camera", "VideoStd=ntsc", true},
      {"LMX-H100", "camera", "VideoStd=secam", false},
      {"LMX-H100", "camera", "XDNR=mid", true},
      {"LMX-H100", "camera", "XDNR=middle", false},
      {"LMX-A100", "camera", "XDNR=mid", false},
      {"LMX-H100", "camera", "ViewDR=on", true},
      {"LMX-A100", "camera", "ViewDR=on", false},
      {"LMX-H100", "camera", "VisibilityEnhancer=high", true},
      {"LMX-H100", "camera", "BLComp=on", true},
      {"LMX-H100", "camera", "IRLed=daynight&IRLedMaxStrength=10", true},
      {"LMX-H100", "camera", "IRLed=daynight&IRLedMaxStrength=11", false},
      {"LMX-H100", "camera", "IRLed=on&IRLedMaxStrength=10", false},
      {"LMX-M300", "camera", "IRLed=off&IRLedMaxStrength=0", false},
      {"LMX-H100", "camera", "DayNightMode=manual&DayNight=on", true},
      {"LMX-H100", "camera", "DayNightMode=day", false},
      {"LMX-P100", "camera", "ExpMode=shutter", true},
      {"LMX-P100", "camera", "ExpMode=manual", false},
      {"LMX-H100", "camera", "ExpMode=full", false},
      {"LMX-M300", "camera", "ExpMode=autoirislens&AutoShutter=off&AutoSlowShutter=off", true},
      {"LMX-M300", "camera", "ExpMode=shutter", false},
      {"LMX-P100", "camera", "Shutter=27", true},
      {"LMX-P100", "camera", "Shutter=26", false},
      {"LMX-P100", "camera", "Iris=17", true},
      {"VX-2000", "camera", "Iris=17", false},
      {"LMX-P100", "camera", "FocusMode=manual", true},
      {"LMX-C100", "camera", "FocusMode=manual", false},
      {"LMX-M300", "camera", "AudInCodec=g726_32&AudioIn=on", true},
      {"LMX-M300", "camera", "AudInCodec=g726_40&AudioIn=on", false},
      {"LMX-H100", "camera", "AudInCodec=g711_64&AudioIn=on", false},
      {"LMX-H100", "camera", "RTSPPort=8554", true},
      {"LMX-H100", "camera", "RTSPPort=0", false},
      {"LMX-H100", "camera", "Eflip=on", true},
      {"LMX-C100", "camera", "Eflip=on", false},
      {"LMX-H100", "camera", "ImageCodec2=off", true},
      {"LMX-C100", "camera", "ImageCodec1=off", false},
      {"LMX-C100", "camera", "ImageCodec2=off", false},
      {"LMX-H100", "camera", "FrameRate1=24", false},
      {"LMX-H100", "camera", "FrameRate1=x", false},
      {"LMX-H100", "camera", "BitRate1=8000", true},
      {"LMX-H100", "camera", "BitRate1=8001", false},
      {"LMX-H100", "camera", "ImageCodec1=jpeg&ImageSize1=1280,720&FrameRate1=30&Quality1=10&Eflip=off", true},
      {"LMX-H100", "camera", "ImageCodec1=jpeg&ImageSize1=1280,720&FrameRate1=30&Quality1=11&Eflip=off", false},
      {"LMX-H100", "camera", "ImageCodec1=mpeg4&ImageSize1=1280,720&FrameRate1=30&BitRate1=512", false},
      {"LMX-H100", "camera", "ImageCodec1=mpeg4&ImageSize1=640,368&FrameRate1=30&BitRate1=512", true},
      {"LMX-P100", "camera", "ImageCodec1=mpeg4&ImageSize1=640,368&FrameRate1=30&BitRate1=512", false},
      {"LMX-H100", "camera", "ImageSize1=640,480", false},
      {"LMX-H100", "camera", "VidCapSize=1280,960&ImageSize1=640,480&ImageSize2=640,480", true},
      {"LMX-H100", "camera", "ImageMaxSize=1280,720&ImageSize1=1920,1080", false},
      {"LMX-H100", "camera", "SolidPTZ=on&ImageSize1=640,368", true},
      {"LMX-H100", "camera", "SolidPTZ=on&ImageSize1=1280,720", false},
      {"VX-2000", "camera", "SolidPTZ=off", false},
      {"LMX-H100", "camera", "NoSuchKey=1", false},
      {"LMX-H100", "system", "TamperingFunc=on&TamperingLevel=high", true},
      {"LMX-P100", "system", "TamperingFunc=on&TamperingLevel=high", false},
      {"LMX-H100", "system", "ModelName=LMX-H200", false},
      {"LMX-H100", "system", "ChannelId=3", true},
      {"LMX-C100", "system", "VideoOutMode=ntsc", true},
      {"LMX-C100", "system", "VideoOutMode=vga", false},
      {"LMX-H100", "system", "VideoOutMode=ip", false},
      {"LMX-H100", "system", "AlarmData=on", true},
      {"LMX-P200", "ptzf", "ContinuousPanTiltZoom=0,0,", true},
      {"LMX-P100", "ptzf", "ContinuousPanTiltZoom=0,0,", false},
      {"LMX-P100", "ptzf", "Move=left,12", true},
      {"LMX-H100", "ptzf", "Move=left,12", false},
      {"LMX-H100", "presetposition", "PresetCall=1,24", false},
      {"LMX-P100", "presetposition", "PresetCall=1,24", true},
      {"LMX-M300", "lod", "LODSensitivity=5", true},
      {"LMX-H100", "lod", "LODSensitivity=5", false},
      {"LMX-M300", "objectdetection", "PositionMode=preset", false},
      {"VX-2000", "edgestorage", "Edgestorage=on", true},
      {"LMX-H100", "edgestorage", "Edgestorage=on", false},
      {"LMX-H100", "edgestorage", "EsRTSPRec1Timeout=60", true},
      {"LMX-M300", "audiodetection", "ADFunc=on", true},
      {"LMX-H100", "audiodetection", "ADFunc=on", false},
  };
  for (const SettingCase& c : cases) {
    SettingsStore settings;
    of_model(settings, c.model);
    const auto before = settings.answer(c.section);
    EXPECT_EQ(settings.apply(c.section, c.query), c.taken) << c.model << " " << c.query;
    if (!c.taken) {
      EXPECT_EQ(settings.answer(c.section), before) << c.model << " " << c.query;
    }
  }
}

TEST(ProfiledCamera, ShrinksAStreamThatNoLongerFits) {
  SettingsStore settings;
  of_model(settings, "LMX-H100");
  ASSERT_TRUE(settings.apply("camera", "SolidPTZ=on"));
  EXPECT_EQ(settings.get("camera", "ImageSize1"), "640,368");
  ASSERT_TRUE(settings.apply("camera", "SolidPTZ=off&VidCapSize=1280,960"));
  EXPECT_EQ(settings.get("camera", "ImageSize1"), "1280,960");
  EXPECT_EQ(settings.get("camera", "ImageSize2"), "1280,960");
}

TEST(ProfiledCamera, RefusesACommandWithStatus400) {
  SettingsStore settings;
  of_model(settings, "LMX-H100");
  const auto head = parse_head("GET /command/camera.cgi?XDNR=middle HTTP/1.0\r\n\r\n");
  EXPECT_EQ(answer_command(*head, settings).status, 400);
}

}  // namespace
}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
// The settings of a model that exists nowhere: small, so that each rule shows.
#include "virtual_camera/model/setting_rules.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "virtual_camera/model/camera_profile.h"

namespace vexa::camera {
namespace {

using Pairs = SettingRules::Pairs;

CameraProfile small_model() {
  CameraProfile profile;
  profile.model = "T-1";
  profile.streams = {{"h264", {1280, 720}, 25, 0, 2000}, {"jpeg", {640, 368}, 5, 5, 0}};
  profile.codecs = {{"h264", {{1280, 720}, {640, 368}}, {5, 25}, {}, {512, 2000}},
                    {"jpeg", {{640, 480}, {640, 368}}, {5}, {1, 5}, {}}};
  return profile;
}

std::string value_in(const Pairs& settings, const std::string& key) {
  const auto found =
      std::find_if(settings.begin(), settings.end(), [&key](const auto& pair) { return pair.first == key; });
  return found == settings.end() ? "(none)" : found->second;
}

bool lacks(const SettingRules& rules, const std::string& section) {
  return std::find(rules.lacking().begin(), rules.lacking().end(), section) != rules.lacking().end();
}

// Whether one setting of the camera's section is taken, beside those that leave the factory.
bool takes(const SettingRules& rules, const std::string& key, const std::string& value) {
  Pairs settings = rules.factory().at("camera");
  return rules.change("camera", {{key, value}}, settings);
}

TEST(SettingRules, FactorySettingsAreTheFirstOfEachListAndTheDefaultsOfEachStream) {
  CameraProfile profile = small_model();
  profile.standards = {"ntsc", "pal"};
  profile.capture_sizes = {{1920, 1080}, {1280, 960}};
  const SettingRules rules(profile);
  const Pairs camera = rules.factory().at("camera");
  const std::pair<const char*, const char*> expected[] = {
      {"VideoStd", "ntsc"},     {"VidCapSize", "1920,1080"}, {"ImageCodec1", "h264"},    {"ImageSize1", "1280,720"},
      {"FrameRate1", "25"},     {"BitRate1", "2000"},        {"Quality1", "1"},          {"ImageCodec2", "jpeg"},
      {"Quality2", "5"},        {"BitRate2", "512"},         {"ImageMaxSize", "(none)"}, {"SolidPTZ", "(none)"},
      {"ImageCodec3", "(none)"}};
  for (const auto& [key, value] : expected) EXPECT_EQ(value_in(camera, key), value) << key;
  EXPECT_EQ(value_in(rules.factory().at("system"), "ModelName"), "T-1");
}

TEST(SettingRules, SectionsOfWhatTheModelLacksAreLackingAndTakeNothing) {
  const SettingRules rules(small_model());
  for (const char* section :
       {"ptzf", "presetposition", "sensor", "main", "lod", "objectdetection", "audiodetection", "a-slot"}) {
    EXPECT_TRUE(lacks(rules, section)) << section;
    Pairs settings;
    EXPECT_FALSE(rules.change(section, {{"Key", "value"}}, settings)) << section;
    EXPECT_TRUE(settings.empty()) << section;
  }
}

TEST(SettingRules, EachPartOfAModelBringsItsSection) {
  CameraProfile profile = small_model();
  profile.io = profile.edge_storage = profile.audio_detection = true;
  profile.alarm_outputs = 1;
  profile.video_detection = "object";
  const SettingRules windowed(profile);
  for (const char* section : {"sensor", "main", "objectdetection", "audiodetection", "a-slot"}) {
    EXPECT_FALSE(lacks(windowed, section)) << section;
  }
  EXPECT_TRUE(lacks(windowed, "lod"));
  profile.video_detection = "lod";
  const SettingRules whole(profile);
  EXPECT_FALSE(lacks(whole, "lod"));
  EXPECT_TRUE(lacks(whole, "objectdetection"));
}

TEST(SettingRules, SectionsWithoutRulesTakeEverything) {
  const SettingRules rules(small_model());
  Pairs settings = {{"HttpPort", "80"}};
  ASSERT_TRUE(rules.change("network", {{"HttpPort", "81"}, {"New", "value"}}, settings));
  EXPECT_EQ(settings, (Pairs{{"HttpPort", "81"}, {"New", "value"}}));
}

TEST(SettingRules, NumbersAreTakenFromTheirLeastToTheirMost) {
  const struct {
    const char* key;
    const char* value;
    bool taken;
  } rows[] = {{"UcVideoPort", "1023", false},  {"UcVideoPort", "1024", true}, {"UcVideoPort", "65534", true},
              {"UcVideoPort", "65535", false}, {"RTSPPort", "0", false},      {"RTSPPort", "1", true},
              {"RTSPPort", "65535", true},     {"RTSPPort", "65536", false},  {"RTSPTimeout", "0", true},
              {"RTSPTimeout", "600", true},    {"RTSPTimeout", "601", false}, {"RTSPTimeout", "-1", false},
              {"RTSPTimeout", "60s", false},   {"RTSPTimeout", "", false},    {"RTPUserData", "on", true},
              {"RTPUserData", "yes", false}};
  const SettingRules rules(small_model());
  for (const auto& row : rows) EXPECT_EQ(takes(rules, row.key, row.value), row.taken) << row.key << "=" << row.value;
}

TEST(SettingRules, AStreamTakesWhatItsCodecOffers) {
  const struct {
    Pairs changes;
    bool taken;
  } rows[] = {{{{"FrameRate1", "5"}}, true},
              {{{"FrameRate1", "24"}}, false},
              {{{"BitRate1", "512"}}, true},
              {{{"BitRate1", "513"}}, false},
              {{{"Quality1", "7"}}, true},  // waits for JPEG, which h264 does not ask for
              {{{"ImageSize1", "640,368"}}, true},
              {{{"ImageSize1", "640,480"}}, false},
              {{{"ImageSize1", "640"}}, false},
              {{{"ImageCodec1", "mpeg4"}}, false},
              {{{"ImageCodec1", "jpeg"}}, false},  // not at 25 pictures a second
              {{{"ImageCodec1", "jpeg"}, {"ImageSize1", "640,480"}, {"FrameRate1", "5"}, {"Quality1", "5"}}, true},
              {{{"ImageCodec1", "jpeg"}, {"ImageSize1", "640,480"}, {"FrameRate1", "5"}, {"Quality1", "4"}}, false},
              {{{"ImageCodec2", "off"}, {"FrameRate2", "77"}}, true}};  // a stream that is off need not agree
  const SettingRules rules(small_model());
  for (const auto& row : rows) {
    Pairs settings = rules.factory().at("camera");
    const Pairs before = settings;
    EXPECT_EQ(rules.change("camera", row.changes, settings), row.taken) << row.changes[0].second;
    if (!row.taken) {
      EXPECT_EQ(settings, before) << row.changes[0].second;
    }
  }
}

TEST(SettingRules, TheOnlyStreamIsNeverOff) {
  CameraProfile profile = small_model();
  profile.streams.pop_back();
  EXPECT_FALSE(takes(SettingRules(profile), "ImageCodec1", "off"));
  EXPECT_TRUE(takes(SettingRules(small_model()), "ImageCodec1", "off"));
}

TEST(SettingRules, AStreamTooLargeForANewLimitTakesTheLargestSizeThatFits) {
  CameraProfile profile = small_model();
  profile.max_sizes = {{1280, 720}, {640, 368}};
  profile.solid_ptz = PictureSize{640, 368};
  const SettingRules rules(profile);
  for (const auto& [key, value] : {std::pair("ImageMaxSize", "640,368"), std::pair("SolidPTZ", "on")}) {
    Pairs settings = rules.factory().at("camera");
    ASSERT_TRUE(rules.change("camera", {{key, value}}, settings)) << key;
    EXPECT_EQ(value_in(settings, "ImageSize1"), "640,368") << key;
    EXPECT_FALSE(rules.change("camera", {{"ImageSize1", "1280,720"}}, settings)) << key << ": chosen against the limit";
    EXPECT_EQ(value_in(settings, "ImageSize1"), "640,368") << key;
  }
}

TEST(SettingRules, AnExposureLensHasItsOwnModes) {
  CameraProfile profile = small_model();
  profile.exposure = {"shutter", "full"};
  profile.shutter_steps = {27, 28};
  EXPECT_EQ(value_in(SettingRules(profile).factory().at("camera"), "ExpMode"), "shutter");
  EXPECT_TRUE(takes(SettingRules(profile), "Shutter", "28"));
  EXPECT_FALSE(takes(SettingRules(profile), "Iris", "17"));
  profile.manual_iris_lens = true;
  EXPECT_EQ(value_in(SettingRules(profile).factory().at("camera"), "ExpMode"), "manualirislens");
  EXPECT_FALSE(takes(SettingRules(profile), "ExpMode", "full"));
  EXPECT_TRUE(takes(SettingRules(profile), "AutoSlowShutter", "off"));
}

}  // namespace
}  // namespace vexa::camera

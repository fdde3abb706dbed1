// SPDX-License-Identifier: Apache-2.0
// The profiles that come with the library.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/models/profile_text.h"
#include "vexa/models.h"
#include "vexa/resolution_filter.h"

namespace vexa_test {
namespace {

std::vector<vexa::Profile> shipped_profiles() {
  std::vector<vexa::Profile> profiles;
  for (const std::string& name : vexa::ProfileNames()) profiles.push_back(installed_profile(name));
  return profiles;
}

std::string text_of(const std::vector<SLibDCommonParameterInt>& steps) {
  std::string text;
  for (const SLibDCommonParameterInt& step : steps) text += " " + step.label + "=" + std::to_string(step.value);
  return text;
}

std::string text_of(const std::vector<SLibDVideoCodecInfo>& codecs) {
  std::string text;
  for (const SLibDVideoCodecInfo& codec : codecs) {
    text += codec.name + ":";
    for (const SLibDResolutionInfo& size : codec.resolutions) {
      text += " " + size.text + "=" + std::to_string(size.width) + "," + std::to_string(size.height);
    }
    text += text_of(codec.frameRates) + text_of(codec.qualities) + text_of(codec.bitRates) + "\n";
  }
  return text;
}

TEST(ShippedProfiles, AreNamedByTheirModels) {
  EXPECT_THAT(vexa::ProfileNames(),
              testing::ElementsAre("LMX-A100", "LMX-C100", "LMX-H100", "LMX-M300", "LMX-P100", "LMX-P200", "VX-2000"));
  for (const vexa::Profile& profile : shipped_profiles()) EXPECT_EQ(profile.name, profile.model);
}

TEST(ShippedProfiles, CoverEveryKindOfCamera) {
  struct Kinds {
    bool fixed, continuous, move, sd_with_outputs, storage_and_audio, lod;
  } seen = {};
  for (const vexa::Profile& profile : shipped_profiles()) {
    const bool ptz = (profile.cameraTypes & vexa::kPtzCamera) != 0;
    seen.fixed |= (profile.cameraTypes & vexa::kFixedCamera) != 0 && !ptz;
    seen.continuous |= ptz && profile.continuousPtz;
    seen.move |= ptz && !profile.continuousPtz;
    seen.sd_with_outputs |= (profile.cameraTypes & vexa::kSdCamera) != 0 && profile.videoOutModes.size() == 3;
    seen.storage_and_audio |= profile.edgeStorage && profile.audio.available == 1;
    seen.lod |= profile.lodDetection;
  }
  EXPECT_TRUE(seen.fixed);
  EXPECT_TRUE(seen.continuous);
  EXPECT_TRUE(seen.move);
  EXPECT_TRUE(seen.sd_with_outputs);
  EXPECT_TRUE(seen.storage_and_audio);
  EXPECT_TRUE(seen.lod);
}

// What a profile lists at first, and what the driver lists once the camera has reported its settings, come from two
// tables.
TEST(ShippedProfiles, OfferWhatTheFilterOffersWithoutACriterion) {
  for (const vexa::Profile& profile : shipped_profiles()) {
    CResolutionFilterFacade filter;
    filter.Initialize(profile.model);
    std::vector<SLibDVideoCodecInfo> offered;
    filter.GetFilteredResolutionList(offered);
    EXPECT_EQ(text_of(profile.camera.codecs), text_of(offered)) << profile.name;
  }
}

TEST(ShippedProfiles, FillEveryRecord) {
  const vexa::Profile profile = installed_profile("LMX-P200");
  EXPECT_EQ(profile.description,
            "HD dome with pan, tilt and zoom by motor, moved by signed speeds, with audio and a card");
  EXPECT_EQ(profile.driver, vexa::DriverClass::kCommon);
  EXPECT_EQ(profile.cameraTypes, vexa::kPtzCamera | vexa::kHdCamera | vexa::kAudioCamera | vexa::kEdgeStorageCamera);
  EXPECT_EQ(profile.camera.streamCount1, 3);
  EXPECT_EQ(profile.camera.streamCount2, 3);
  EXPECT_EQ(profile.camera.electronicFlip, 1);
  ASSERT_EQ(profile.streams.size(), 3U);
  EXPECT_EQ(profile.streams[0].streamNumber, 1);
  EXPECT_EQ(profile.streams[0].codecName, "H.264");
  EXPECT_EQ(profile.streams[0].codecType, 2);
  EXPECT_EQ(profile.streams[0].imageSizeText, "1920x1080");
  EXPECT_EQ(profile.streams[0].imageWidth, 1920);
  EXPECT_EQ(profile.streams[0].imageHeight, 1080);
  EXPECT_EQ(profile.streams[0].frameRateText, "30fps");
  EXPECT_EQ(profile.streams[0].frameRate, 30);
  EXPECT_EQ(profile.streams[0].bitRateText, "8000kbit/s");
  EXPECT_EQ(profile.streams[0].bitRate, 8000);
  EXPECT_EQ(profile.streams[0].qualityText, "none");
  EXPECT_EQ(profile.streams[2].streamNumber, 3);
  EXPECT_EQ(profile.streams[2].codecType, 0);
  EXPECT_EQ(profile.streams[2].qualityText, "Level 5");
  EXPECT_EQ(profile.streams[2].quality, 5);
  EXPECT_EQ(profile.streams[2].bitRateText, "none");
  EXPECT_TRUE(profile.videoOutModes.empty());
  EXPECT_TRUE(profile.continuousPtz);
  EXPECT_FALSE(profile.motionDetection);
  EXPECT_FALSE(profile.lodDetection);
  EXPECT_TRUE(profile.edgeStorage);
}

TEST(ShippedProfiles, FillTheControlRecord) {
  const vexa::Profile profile = installed_profile("LMX-P200");
  const SLibDFixedPTZControlInfo& control = profile.control;
  EXPECT_TRUE(profile.hasControl);
  EXPECT_FALSE(control.noMoveSpeed);
  EXPECT_EQ(control.panTilt.panMaxSpeed, 24);
  EXPECT_EQ(control.panTilt.panSpan, 115200);
  EXPECT_EQ(control.panTilt.panAngleRange, 720);
  EXPECT_EQ(control.panTilt.panOrigin, -28800);
  EXPECT_EQ(control.panTilt.horizontalWideAngle, 58);
  EXPECT_EQ(control.panTilt.tiltMaxSpeed, 24);
  EXPECT_EQ(control.panTilt.tiltSpan, 33600);
  EXPECT_EQ(control.panTilt.tiltAngleRange, 210);
  EXPECT_EQ(control.panTilt.tiltOrigin, -2400);
  EXPECT_EQ(control.panTilt.verticalWideAngle, 34);
  EXPECT_EQ(control.panTilt.tiltOffset, 0);
  EXPECT_EQ(control.zoom.minSpeed, 1);
  EXPECT_EQ(control.zoom.maxSpeed, 8);
  EXPECT_EQ(control.zoom.minPosition, 0);
  EXPECT_EQ(control.zoom.maxPosition, 31424);
  EXPECT_EQ(control.focus.minSpeed, 1);
  EXPECT_EQ(control.focus.maxSpeed, 8);
  EXPECT_EQ(control.focus.minPosition, 4096);
  EXPECT_EQ(control.focus.maxPosition, 61440);
  ASSERT_EQ(profile.zoomRatios.size(), 7U);
  EXPECT_EQ(control.zoomSteps.size(), 7U);
  EXPECT_EQ(profile.zoomRatios[6].ratio, 30);
  EXPECT_EQ(profile.zoomRatios[6].position, 31424);
  ASSERT_EQ(control.brightModes.size(), 3U);
  EXPECT_EQ(control.brightModes[1].name, "Shutter Priority");
  EXPECT_EQ(control.brightModes[1].shutterSpeeds.size(), 15U);
  EXPECT_EQ(control.brightModes[1].shutterSpeeds[5].label, "1/50 s");
  EXPECT_EQ(control.brightModes[1].shutterSpeeds[5].value, 10);
  EXPECT_EQ(control.brightModes[2].irisPositions.back().value, 17);
  ASSERT_EQ(control.dayNightModes.size(), 3U);
  EXPECT_EQ(control.dayNightModes[0].mode, LIBD_DAYNIGHT_AUTO);
  EXPECT_EQ(control.dayNightModes[1].mode, LIBD_DAYNIGHT_DAY);
  EXPECT_EQ(control.dayNightModes[2].mode, LIBD_DAYNIGHT_NIGHT);
  EXPECT_EQ(control.presetCount, 256);
  EXPECT_EQ(control.tourCount, 5);
  EXPECT_EQ(control.shadowTourCount, 5);
}

TEST(ShippedProfiles, FillAudioAndIo) {
  const vexa::Profile profile = installed_profile("LMX-P200");
  EXPECT_EQ(profile.audio.available, 1);
  ASSERT_EQ(profile.audio.inputCodecs.size(), 2U);
  EXPECT_EQ(profile.audio.inputCodecs[0].name, "G711");
  EXPECT_EQ(text_of(profile.audio.inputCodecs[0].bitRates), " 64 Kbps=64000");
  EXPECT_EQ(profile.audio.inputCodecs[1].name, "G726");
  EXPECT_EQ(text_of(profile.audio.inputCodecs[1].bitRates), " 40 Kbps=40000 32 Kbps=32000 24 Kbps=24000 16 Kbps=16000");
  EXPECT_EQ(text_of(profile.audio.inputCodecs[1].frameSizes),
            " 800 bytes=800 640 bytes=640 480 bytes=480 320 bytes=320");
  EXPECT_EQ(text_of(profile.audio.inputCodecs[1].samplingRates), " 8 kHz=8000");
  EXPECT_EQ(profile.audio.outputCodecs.size(), 1U);
  EXPECT_TRUE(profile.hasIoBox);
  EXPECT_EQ(profile.ioBox.inputCount, 4);
  EXPECT_EQ(profile.ioBox.outputCount, 2);
  EXPECT_TRUE(profile.ioBox.videoDetection);
  EXPECT_TRUE(profile.ioBox.tamperingDetection);
  EXPECT_TRUE(profile.ioBox.audioDetection);
}

}  // namespace
}  // namespace vexa_test

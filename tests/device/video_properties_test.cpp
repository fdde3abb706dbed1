// SPDX-License-Identifier: Apache-2.0
// What the host sets of the camera's video without asking the camera, and what is offered then.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <future>
#include <string>
#include <vector>

#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using VideoParams = SettingsDriver::VideoParams;

/// A driver of a model with few sizes, in reach of no camera.
class VideoProperties : public testing::Test {
 protected:
  VideoProperties() {
    driver_.expect_no_exchange();
    driver_.m_FixedSystemInfo.modelName = "LMX-P100";
  }
  ~VideoProperties() override { EXPECT_TRUE(driver_.had_no_exchange()); }

  std::vector<std::string> jpeg_sizes() const {
    std::vector<std::string> sizes;
    if (driver_.m_FixedCameraInfo.codecs.empty()) return sizes;
    for (const auto& size : driver_.m_FixedCameraInfo.codecs[0].resolutions) sizes.push_back(size.text);
    return sizes;
  }

  SettingsDriver driver_;
};

TEST_F(VideoProperties, PassTheStandardOnWithoutStoringIt) {
  EXPECT_EQ(driver_.SetVideoStandard(LIBD_VIDEO_NTSC), LIBD_OK);
  EXPECT_THAT(driver_.told, ElementsAre(VideoParams{LIBD_VIDEO_NTSC, -1, -1}));
  EXPECT_EQ(driver_.m_CameraInfo.videoStandard, LIBD_VIDEO_PAL);
  EXPECT_THAT(driver_.m_FixedCameraInfo.codecs, IsEmpty());
}

TEST_F(VideoProperties, PassOnAStandardThatIsNone) {
  EXPECT_EQ(driver_.SetVideoStandard(static_cast<ELibDVideoStandard>(77)), LIBD_OK);
  EXPECT_THAT(driver_.told, ElementsAre(VideoParams{77, -1, -1}));
}

TEST_F(VideoProperties, OfferWhatTheCaptureSizeLeaves) {
  driver_.m_CameraInfo.videoStandard = LIBD_VIDEO_NTSC;
  EXPECT_EQ(driver_.SetVidCapSize(1280, 720), LIBD_OK);
  EXPECT_THAT(driver_.told, ElementsAre(VideoParams{LIBD_VIDEO_NTSC, 1280, 720}));
  EXPECT_THAT(jpeg_sizes(), ElementsAre("1280x720", "640x368", "320x192"));
  EXPECT_EQ(driver_.m_CameraInfo.captureWidth, 0);
}

TEST_F(VideoProperties, OfferWhatSolidPtzLeaves) {
  driver_.m_CameraInfo.videoStandard = LIBD_VIDEO_NTSC;
  EXPECT_EQ(driver_.SetSolidPTZState(true), LIBD_OK);
  EXPECT_THAT(driver_.told, ElementsAre(VideoParams{LIBD_VIDEO_NTSC, -1, -1}));
  EXPECT_EQ(jpeg_sizes().front(), "1280x720");
  EXPECT_EQ(driver_.SetSolidPTZState(false), LIBD_OK);
  EXPECT_EQ(jpeg_sizes().front(), "1920x1080");
  EXPECT_FALSE(driver_.m_CameraInfo.solidPtz);
}

TEST_F(VideoProperties, OfferWhatTheLargestSizeLeaves) {
  EXPECT_EQ(driver_.SetImageMaxSize(640, 400, LIBD_VIDEO_NTSC), LIBD_OK);
  EXPECT_THAT(driver_.told, ElementsAre(VideoParams{LIBD_VIDEO_NTSC, 640, 400}));
  EXPECT_THAT(jpeg_sizes(), ElementsAre("640x368", "320x240", "320x192"));
  EXPECT_EQ(driver_.m_CameraInfo.maxImageWidth, 0);
}

TEST_F(VideoProperties, FollowTheOneThatWasSetLast) {
  driver_.SetImageMaxSize(320, 192, LIBD_VIDEO_PAL);
  driver_.SetSolidPTZState(true);
  EXPECT_EQ(jpeg_sizes().front(), "1280x720");
  driver_.SetVidCapSize(640, 480);
  EXPECT_THAT(jpeg_sizes(), ElementsAre("640x480", "320x240"));
  driver_.SetImageMaxSize(-1, -1, LIBD_VIDEO_PAL);
  EXPECT_EQ(jpeg_sizes().size(), 9u);
}

TEST_F(VideoProperties, LeaveTheListWholeWhenNoSizeIsGiven) {
  EXPECT_EQ(driver_.SetVidCapSize(-1, -1), LIBD_OK);
  EXPECT_EQ(jpeg_sizes().size(), 9u);
  EXPECT_THAT(driver_.told, ElementsAre(VideoParams{LIBD_VIDEO_PAL, -1, -1}));
}

TEST_F(VideoProperties, AreNotHandedOutBeforeAModelClassFillsThem) {
  SLibDFixedCameraInfo info;
  info.value1 = 9;
  EXPECT_EQ(driver_.GetFixedCameraInfo(info), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(info.value1, 9);
}

TEST_F(VideoProperties, AreHandedOutWhole) {
  driver_.m_FixedCameraInfoAvailable = true;
  driver_.SetImageMaxSize(320, 192, LIBD_VIDEO_PAL);
  SLibDFixedCameraInfo& fixed = driver_.m_FixedCameraInfo;
  fixed.reserved2 = {"a", "b"};
  fixed.reserved4 = {4, 5};
  fixed.electronicFlip = 1;
  fixed.streamCount1 = 2;
  fixed.streamCount2 = 3;
  fixed.flag1 = fixed.flag3 = fixed.flag5 = true;
  fixed.value1 = 11;
  fixed.value2 = 12;
  fixed.value3 = 13;
  fixed.value4 = 14;
  fixed.value5 = 15;
  SLibDFixedCameraInfo info;
  info.reserved2 = {"old"};
  EXPECT_EQ(driver_.GetFixedCameraInfo(info), LIBD_OK);
  ASSERT_EQ(info.codecs.size(), 2u);
  EXPECT_EQ(info.codecs[1].name, "H.264");
  EXPECT_EQ(info.codecs[1].resolutions[0].text, "320x192");
  EXPECT_THAT(info.reserved2, ElementsAre("a", "b"));
  EXPECT_THAT(info.reserved4, ElementsAre(4, 5));
  EXPECT_EQ(info.electronicFlip, 1);
  EXPECT_EQ(info.streamCount1, 2);
  EXPECT_EQ(info.streamCount2, 3);
  EXPECT_TRUE(info.flag1 && !info.flag2 && info.flag3 && !info.flag4 && info.flag5 && !info.flag6);
  EXPECT_THAT((std::vector<int>{info.value1, info.value2, info.value3, info.value4, info.value5}),
              ElementsAre(11, 12, 13, 14, 15));
}

/// A model class whose hook has another thread use what the driver's locks guard.
class AskingModel : public Settings<CVexaCommon> {
 public:
  ELibDReturnCode InitializeFixedVideoParams(ELibDVideoStandard, int, int) override {
    answers_.push_back(std::async(std::launch::async, [this] {
      SLibDFixedCameraInfo fixed;
      GetFixedCameraInfo(fixed);
      SLibDConnectionInfo connection;
      GetCurrentConnectionInfo(connection);
      std::string text;
      GetLatestErrorText(text);
    }));
    if (answers_.back().wait_for(std::chrono::seconds(20)) == std::future_status::ready) ++answered;
    return LIBD_OK;
  }

  int answered = 0;

 private:
  std::vector<std::future<void>> answers_;
};

TEST(VideoHook, RunsWithNoLockHeld) {
  ScriptedCamera camera({inquiry("camera", "VideoStd=ntsc&VidCapSize=1280,960")});
  AskingModel model;
  model.use(camera.host(), camera.port());
  SLibDCameraInfo info;
  EXPECT_EQ(model.GetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(model.answered, 1);
  model.SetVideoStandard(LIBD_VIDEO_PAL);
  model.SetVidCapSize(1280, 720);
  model.SetSolidPTZState(true);
  model.SetImageMaxSize(640, 480, LIBD_VIDEO_PAL);
  EXPECT_EQ(model.answered, 5);
}

}  // namespace
}  // namespace vexa_test

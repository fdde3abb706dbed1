#include <gtest/gtest.h>

#include "tests/media/live_camera.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraOptions;

CameraOptions codec_options(const std::string& clip, unsigned index = 0) {
  auto options = camera_options(index);
  options.clip_path = std::string(VEXA_CLIPS) + "/" + clip;
  return options;
}

std::string position_of(MediaDriver& driver) {
  const vexa::Guard guard(driver.m_CamPosLock);
  return driver.m_CamPosText;
}

class Codec : public testing::TestWithParam<const char*> {
 protected:
  static bool is_jpeg() { return std::string(GetParam()).ends_with(".mjpeg"); }
  static std::int32_t type_of(const LiveCamera& camera, std::uint64_t picture) {
    if (is_jpeg()) return VIDEO_FRAME_JPEG;
    return camera.is_key(picture) ? VIDEO_FRAME_MPEG4_KEY : VIDEO_FRAME_MPEG4_DELTA;
  }
};

TEST_P(Codec, DeliversEveryPictureAcrossTheLoopOfTheClip) {
  auto options = codec_options(GetParam());
  options.pictures = 120;
  options.start_sequence = 65500;
  options.start_timestamp = 4294900000;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.play(driver);
  const auto frames = FrameTaker().take_all(driver, 120);
  ASSERT_EQ(frames.size(), 120u);
  for (std::size_t i = 0; i < frames.size(); ++i) {
    ASSERT_TRUE(camera.sent(i, frames[i].bytes)) << "picture " << i;
    EXPECT_EQ(frames[i].info.frameType, type_of(camera, i)) << "picture " << i;
    EXPECT_EQ(frames[i].info.seconds, 0);
    EXPECT_EQ(frames[i].info.microseconds, 0);
  }
}

TEST_P(Codec, ReportsTheCamerasPositionAndLosesNoPicture) {
  auto options = codec_options(GetParam());
  options.pictures = 30;
  options.user_data = "CamPos: 0123,4567,89ab,cdef and more";
  LiveCamera camera(options);
  MediaDriver driver;
  camera.play(driver);
  const auto frames = FrameTaker().take_all(driver, 30);
  ASSERT_EQ(frames.size(), 30u);
  for (std::size_t i = 0; i < frames.size(); ++i) ASSERT_TRUE(camera.sent(i, frames[i].bytes)) << "picture " << i;
  EXPECT_EQ(position_of(driver), "CamPos: 0123,4567,89ab,c");
}

INSTANTIATE_TEST_SUITE_P(Clips, Codec, testing::Values("small.m4v", "plain.mjpeg", "restart.mjpeg", "sliced.mjpeg"),
                         [](const auto& tested) {
                           std::string name = tested.param;
                           name[name.find('.')] = '_';
                           return name;
                         });

TEST(LiveH264, ReportsTheCamerasPosition) {
  auto options = codec_options("small.h264");
  options.pictures = 30;
  options.user_data = "CamPos: 0123,4567";
  LiveCamera camera(options);
  MediaDriver driver;
  camera.play(driver);
  const auto frames = FrameTaker().take_all(driver, 30);
  ASSERT_EQ(frames.size(), 30u);
  for (std::size_t i = 0; i < frames.size(); ++i) ASSERT_TRUE(camera.sent(i, frames[i].bytes)) << "picture " << i;
  EXPECT_EQ(position_of(driver).substr(0, 17), "CamPos: 0123,4567");
}

}  // namespace
}  // namespace vexa_test

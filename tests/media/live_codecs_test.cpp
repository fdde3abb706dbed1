#include <gtest/gtest.h>

#include <thread>

#include "tests/media/pace.h"
#include "tests/media/whole_stream.h"

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

class LiveCodec : public testing::TestWithParam<const char*> {
 protected:
  static bool is_jpeg() { return std::string(GetParam()).ends_with(".mjpeg"); }
  static std::int32_t type_of(const LiveCamera& camera, std::uint64_t picture) {
    if (is_jpeg()) return VIDEO_FRAME_JPEG;
    return camera.is_key(picture) ? VIDEO_FRAME_MPEG4_KEY : VIDEO_FRAME_MPEG4_DELTA;
  }
};

TEST_P(LiveCodec, DeliversEveryPictureAcrossTheLoopOfTheClip) {
  auto options = codec_options(GetParam());
  options.pictures = 120;
  options.start_sequence = 65500;
  options.start_timestamp = 4294900000;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  const auto frames = FrameTaker().take_all(driver, 120);
  ASSERT_EQ(frames.size(), 120u);
  for (std::size_t i = 0; i < frames.size(); ++i) {
    ASSERT_TRUE(camera.sent(i, frames[i].bytes)) << "picture " << i;
    EXPECT_EQ(frames[i].info.frameType, type_of(camera, i)) << "picture " << i;
    EXPECT_EQ(frames[i].info.seconds, 0);
    EXPECT_EQ(frames[i].info.microseconds, 0);
  }
}

TEST_P(LiveCodec, TellsWhereTheCameraLooksAndLosesNoPictureByIt) {
  auto options = codec_options(GetParam());
  options.pictures = 30;
  options.user_data = "CamPos: 0123,4567,89ab,cdef and more";
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  const auto frames = FrameTaker().take_all(driver, 30);
  ASSERT_EQ(frames.size(), 30u);
  for (std::size_t i = 0; i < frames.size(); ++i) ASSERT_TRUE(camera.sent(i, frames[i].bytes)) << "picture " << i;
  EXPECT_EQ(position_of(driver), "CamPos: 0123,4567,89ab,c");
}

INSTANTIATE_TEST_SUITE_P(Clips, LiveCodec, testing::Values("small.m4v", "plain.mjpeg", "restart.mjpeg", "sliced.mjpeg"),
                         [](const auto& tested) {
                           std::string name = tested.param;
                           name[name.find('.')] = '_';
                           return name;
                         });

TEST(LiveH264, TellsWhereTheCameraLooks) {
  auto options = codec_options("small.h264");
  options.pictures = 30;
  options.user_data = "CamPos: 0123,4567";
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  const auto frames = FrameTaker().take_all(driver, 30);
  ASSERT_EQ(frames.size(), 30u);
  for (std::size_t i = 0; i < frames.size(); ++i) ASSERT_TRUE(camera.sent(i, frames[i].bytes)) << "picture " << i;
  EXPECT_EQ(position_of(driver).substr(0, 17), "CamPos: 0123,4567");
}

struct CodecFaults {
  const char* name;
  double loss = 0;
  double reorder = 0;
  double duplicate = 0;
  std::uint32_t start_timestamp = 0;
};

class LiveCodecImpaired : public testing::TestWithParam<CodecFaults> {
 protected:
  static constexpr int kPatience = 500;  // milliseconds: longer than a picture is ever held back

  /// Read without the frame queue, which drops JPEG pictures of a host that is slow for a moment.
  static std::vector<std::string> read_whole_stream(LiveCamera& camera, MediaDriver& driver) {
    std::vector<unsigned char> buffer(1200000);
    std::vector<std::string> frames;
    for (;;) {
      const bool finished = camera->sent().finished_streams() != 0;
      CVexaCommon::VideoFrameInfo frame;
      frame.data = buffer.data();
      frame.capacity = static_cast<unsigned int>(buffer.size());
      const ELibDReturnCode code = driver.GetRtpCurrentVideoFrame(driver.StreamCodec(), frame);
      if (code == LIBD_OK) frames.emplace_back(buffer.begin(), buffer.begin() + frame.length);
      if (code != LIBD_OK && finished) return frames;
    }
  }

  static void stream(const std::string& clip, unsigned index) {
    auto options = codec_options(clip, index);
    options.seed = 7 + index;
    options.speed = kJpegPace;
    options.max_payload = 900;
    options.pictures = 400;
    options.start_sequence = 65000;
    options.start_timestamp = GetParam().start_timestamp;
    options.packet_faults.loss = GetParam().loss;
    options.packet_faults.reorder = GetParam().reorder;
    options.packet_faults.duplicate = GetParam().duplicate;
    options.packet_faults.duplicate_distance = 20;
    LiveCamera camera(options);
    MediaDriver driver;
    camera.introduce(driver);
    driver.use(camera->address(), camera->http_port(), kPatience);
    ASSERT_TRUE(driver.OpenLiveRtp(1));
    const std::vector<std::string> frames = read_whole_stream(camera, driver);
    const std::vector<std::uint64_t> wanted = predicted(camera, camera->sent().snapshot());
    ASSERT_EQ(frames.size(), wanted.size()) << clip;
    for (std::size_t i = 0; i < frames.size(); ++i) {
      ASSERT_TRUE(camera.sent(wanted[i], frames[i])) << clip << ", frame " << i;
    }
  }
};

TEST_P(LiveCodecImpaired, DeliversEveryWholePictureOnceInOrderAndNoDamagedOne) {
  std::vector<std::thread> hosts;
  unsigned index = 0;
  for (const char* clip : {"small.m4v", "plain.mjpeg", "sliced.mjpeg"}) hosts.emplace_back(stream, clip, index++);
  for (std::thread& host : hosts) host.join();
}

INSTANTIATE_TEST_SUITE_P(
    All, LiveCodecImpaired,
    testing::Values(
        CodecFaults{.name = "LossPermille1", .loss = 0.001, .start_timestamp = 100000000},
        CodecFaults{.name = "Loss1", .loss = 0.01, .start_timestamp = 4294000000},
        CodecFaults{.name = "Loss5", .loss = 0.05, .start_timestamp = 9000000},
        CodecFaults{.name = "Reorder5", .reorder = 0.05, .start_timestamp = 4294000000},
        CodecFaults{.name = "Duplicate1", .duplicate = 0.01, .start_timestamp = 9000000},
        CodecFaults{.name = "All", .loss = 0.01, .reorder = 0.05, .duplicate = 0.01, .start_timestamp = 4294000000}),
    [](const auto& tested) { return tested.param.name; });

}  // namespace
}  // namespace vexa_test

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <unistd.h>

#include <thread>

#include "tests/media/live_camera.h"

namespace vexa_test {
namespace {

void expect_clip(const LiveCamera& camera, const std::vector<TakenFrame>& frames, std::size_t count) {
  ASSERT_EQ(frames.size(), count);
  for (std::size_t i = 0; i < count; ++i) {
    ASSERT_EQ(frames[i].bytes, camera.picture(i)) << "picture " << i;
    EXPECT_EQ(frames[i].info.frameType, camera.is_key(i) ? VIDEO_FRAME_H264_KEY : VIDEO_FRAME_H264_DELTA)
        << "picture " << i;
    EXPECT_EQ(frames[i].info.seconds, 0);
    EXPECT_EQ(frames[i].info.microseconds, 0);
  }
}

TEST(LiveStream, EveryFrameEqualsTheEncodersAcrossTheLoopOfTheClip) {
  auto options = camera_options();
  options.pictures = 300;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.play(driver);
  expect_clip(camera, FrameTaker().take_all(driver, 300), 300);
}

TEST(LiveStream, PicturesOfSeveralSlicesArriveWhole) {
  auto options = camera_options();
  options.clip_path = VEXA_CLIPS "/slices.h264";
  options.pictures = 100;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.play(driver);
  expect_clip(camera, FrameTaker().take_all(driver, 100), 100);
}

TEST(LiveStream, EightCamerasAtOnceLoseNothing) {
  constexpr std::size_t kCameras = 8;
  constexpr std::size_t kPictures = 200;
  std::vector<std::unique_ptr<LiveCamera>> cameras;
  for (unsigned i = 0; i < kCameras; ++i) {
    auto options = camera_options(i);
    options.pictures = kPictures;
    cameras.push_back(std::make_unique<LiveCamera>(options));
  }
  std::vector<std::thread> hosts;
  for (auto& camera : cameras) {
    hosts.emplace_back([&camera] {
      MediaDriver driver;
      camera->play(driver);
      expect_clip(*camera, FrameTaker().take_all(driver, kPictures), kPictures);
    });
  }
  for (std::thread& host : hosts) host.join();
}

TEST(LiveStream, AProcessWith5000OpenDescriptorsStreamsAsWellAsAny) {
  rlimit limit = {};
  ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &limit), 0);
  limit.rlim_cur = std::min<rlim_t>(limit.rlim_max, 6000);
  ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &limit), 0);
  ASSERT_GE(limit.rlim_cur, 5200u) << "raise the hard limit of open files (ulimit -Hn) to 6000";
  auto options = camera_options();
  options.pictures = 50;
  LiveCamera camera(options);
  std::vector<int> descriptors;
  while (descriptors.size() < 5000) descriptors.push_back(open("/dev/null", O_RDONLY | O_CLOEXEC));
  ASSERT_GE(descriptors.back(), 5000);
  MediaDriver driver;
  camera.play(driver);
  EXPECT_GT(driver.m_StreamSocket, 1023);
  expect_clip(camera, FrameTaker().take_all(driver, 50), 50);
  driver.StopVideoStreaming();
  for (const int descriptor : descriptors) close(descriptor);
}

/// The frames of a stream that ends by itself, up to its picture `last`; without it when that one does not come.
std::vector<TakenFrame> take_to_the_end(LiveCamera& camera, MediaDriver& driver, std::uint64_t last) {
  FrameTaker host;
  std::vector<TakenFrame> frames;
  const auto done = [&] {
    return camera->sent().finished_streams() != 0 && !frames.empty() && frames.back().bytes == camera.picture(last);
  };
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  while (!done() && std::chrono::steady_clock::now() < end) {
    const auto next = host.take_all(driver, 1, std::chrono::milliseconds(20));
    frames.insert(frames.end(), next.begin(), next.end());
  }
  return frames;
}

struct RestartCase {
  const char* name;
  bool sequence;
  bool timestamp;
};

class LiveStreamRestart : public testing::TestWithParam<RestartCase> {};

TEST_P(LiveStreamRestart, IsFollowedFromTheNextKeyPicture) {
  constexpr std::size_t kBefore = 60;
  constexpr std::size_t kLast = 75;
  constexpr std::size_t kAll = 150;
  auto options = camera_options();
  options.pictures = kAll;
  if (GetParam().sequence) options.packet_faults.sequence_restarts = {{kBefore, 60000}};
  if (GetParam().timestamp) options.packet_faults.timestamp_restarts = {{kBefore, 50000000}};
  LiveCamera camera(options);
  MediaDriver driver;
  camera.play(driver);
  const auto frames = take_to_the_end(camera, driver, kAll - 1);
  ASSERT_GE(frames.size(), kBefore + kLast);
  for (std::size_t i = 0; i < kBefore; ++i) ASSERT_EQ(frames[i].bytes, camera.picture(i)) << i;
  for (std::size_t back = 1; back <= kLast; ++back) {
    ASSERT_EQ(frames[frames.size() - back].bytes, camera.picture(kAll - back)) << back;
  }
}

INSTANTIATE_TEST_SUITE_P(All, LiveStreamRestart,
                         testing::Values(RestartCase{"Sequence", true, false}, RestartCase{"Timestamp", false, true},
                                         RestartCase{"Both", true, true}),
                         [](const auto& tested) { return tested.param.name; });

TEST(LiveStream, CorruptedPacketsEndInNeitherCrashNorHang) {
  auto options = camera_options();
  options.pictures = 300;
  options.packet_faults.corrupt_header = 0.02;
  options.packet_faults.corrupt_payload = 0.02;
  options.packet_faults.missing_marker = 0.02;
  options.packet_faults.last_picture = 200;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.play(driver);
  const auto frames = take_to_the_end(camera, driver, 299);
  ASSERT_GE(frames.size(), 25u);
  for (std::size_t back = 1; back <= 25; ++back) {
    EXPECT_EQ(frames[frames.size() - back].bytes, camera.picture(300 - back)) << "the clean end of the stream";
  }
}

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

TEST_P(Codec, TellsWhereTheCameraLooksAndLosesNoPictureByIt) {
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

TEST(LiveH264, TellsWhereTheCameraLooks) {
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

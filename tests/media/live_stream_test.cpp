#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <unistd.h>

#include <map>
#include <thread>

#include "tests/media/live_camera.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraOptions;
using vexa::camera::PacketFaults;
using vexa::camera::SentPacket;

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
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  expect_clip(camera, FrameTaker().take_all(driver, 300), 300);
}

TEST(LiveStream, PicturesOfSeveralSlicesArriveWhole) {
  auto options = camera_options();
  options.clip_path = VEXA_CLIPS "/slices.h264";
  options.pictures = 100;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
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
      camera->introduce(driver);
      ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
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
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  EXPECT_GT(driver.m_StreamSocket, 1023);
  expect_clip(camera, FrameTaker().take_all(driver, 50), 50);
  driver.StopVideoStreaming();
  for (const int descriptor : descriptors) close(descriptor);
}

/// What must arrive of the stream that the camera logged: a picture whose packets all left, behind a key picture
/// without a gap.
std::vector<std::uint64_t> predicted(const LiveCamera& camera, const std::vector<SentPacket>& sent) {
  std::map<std::uint64_t, std::size_t> left;
  std::map<std::uint64_t, std::size_t> packets;
  for (const SentPacket& packet : sent) {
    packets[packet.picture] = packet.picture_packets;
    if (!packet.lost && !packet.duplicate) ++left[packet.picture];
  }
  std::vector<std::uint64_t> delivered;
  bool chain = false;
  for (const auto& [picture, count] : packets) {
    chain = left[picture] == count && (chain || camera.is_key(picture));
    if (chain) delivered.push_back(picture);
  }
  return delivered;
}

/// All frames of a stream that ends by itself: what is late by more than its last second is lost.
std::vector<TakenFrame> take_until_finished(LiveCamera& camera, MediaDriver& driver) {
  FrameTaker host;
  std::vector<TakenFrame> frames;
  bool finished = false;
  do {
    finished = camera->sent().finished_streams() != 0;
    const auto more = host.take_all(driver, frames.max_size(), std::chrono::milliseconds(1500));
    frames.insert(frames.end(), more.begin(), more.end());
  } while (!finished);
  return frames;
}

struct ImpairedCase {
  const char* what;
  double loss;
  double reorder;
  double duplicate;
  std::uint32_t start_timestamp;
};

void stream_impaired(const ImpairedCase& impaired, unsigned index) {
  constexpr std::uint64_t kPictures = 2000;
  auto options = camera_options(index);
  options.seed = 42 + index;
  options.speed = 2.5;
  options.max_payload = 600;
  options.pictures = kPictures;
  options.start_sequence = 65000;
  options.start_timestamp = impaired.start_timestamp;
  options.packet_faults.loss = impaired.loss;
  options.packet_faults.reorder = impaired.reorder;
  options.packet_faults.duplicate = impaired.duplicate;
  options.packet_faults.duplicate_distance = 20;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  const auto frames = take_until_finished(camera, driver);
  const std::vector<std::uint64_t> wanted = predicted(camera, camera->sent().snapshot());
  ASSERT_EQ(frames.size(), wanted.size()) << impaired.what;
  for (std::size_t i = 0; i < frames.size(); ++i) {
    ASSERT_EQ(frames[i].bytes, camera.picture(wanted[i])) << impaired.what << ", frame " << i;
  }
}

TEST(LiveStream, ThroughLossReorderingAndDuplicationEveryWholePictureArrivesOnceInOrderAndNoDamagedOne) {
  const ImpairedCase cases[] = {
      {"0.1 % loss", 0.001, 0, 0, 100000000},      {"1 % loss", 0.01, 0, 0, 4294000000},
      {"5 % loss", 0.05, 0, 0, 9000000},           {"10 % loss", 0.1, 0, 0, 100000000},
      {"5 % reordering", 0, 0.05, 0, 4294000000},  {"5 % reordering again", 0, 0.05, 0, 9000000},
      {"1 % duplication", 0, 0, 0.01, 4294000000}, {"all of them", 0.01, 0.05, 0.01, 4294000000},
  };
  std::vector<std::thread> hosts;
  unsigned index = 0;
  for (const ImpairedCase& impaired : cases) hosts.emplace_back(stream_impaired, impaired, index++);
  for (std::thread& host : hosts) host.join();
}

struct RestartCase {
  const char* what;
  bool sequence;
  bool timestamp;
};

TEST(LiveStream, ACameraThatRestartsItsNumbersIsFollowedFromItsNextKeyPicture) {
  for (const RestartCase& restart :
       {RestartCase{"sequence", true, false}, RestartCase{"timestamp", false, true}, RestartCase{"both", true, true}}) {
    auto options = camera_options();
    options.pictures = 150;
    if (restart.sequence) options.packet_faults.sequence_restarts = {{60, 60000}};
    if (restart.timestamp) options.packet_faults.timestamp_restarts = {{60, 50000000}};
    LiveCamera camera(options);
    MediaDriver driver;
    camera.introduce(driver);
    ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
    const auto frames = FrameTaker().take_all(driver, 150, std::chrono::seconds(2));
    ASSERT_GE(frames.size(), 60u + 75u) << restart.what;
    for (std::size_t i = 0; i < 60; ++i) ASSERT_EQ(frames[i].bytes, camera.picture(i)) << restart.what << i;
    for (std::size_t back = 1; back <= 75; ++back) {
      ASSERT_EQ(frames[frames.size() - back].bytes, camera.picture(150 - back)) << restart.what << back;
    }
  }
}

TEST(LiveStream, CorruptedPacketsEndInNeitherCrashNorHang) {
  auto options = camera_options();
  options.pictures = 300;
  options.packet_faults.corrupt_header = 0.02;
  options.packet_faults.corrupt_payload = 0.02;
  options.packet_faults.missing_marker = 0.02;
  options.packet_faults.last_picture = 200;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  const auto frames = FrameTaker().take_all(driver, 300, std::chrono::seconds(3));
  ASSERT_GE(frames.size(), 25u);
  for (std::size_t back = 1; back <= 25; ++back) {
    EXPECT_EQ(frames[frames.size() - back].bytes, camera.picture(300 - back)) << "the clean end of the stream";
  }
}

}  // namespace
}  // namespace vexa_test

// Recordings played back: what comes out is what was stored, at the times it was stored at.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

/// A camera with a recording on its card.
class RecordedCamera : public LiveCamera {
 public:
  static constexpr std::int64_t kStart = 1706745599;  // 2024-01-31 23:59:59 UTC, and a quarter of a second
  static constexpr int kStartMicros = 250000;
  static constexpr int kInterval = 33300;  // microseconds between two pictures

  explicit RecordedCamera(const vexa::camera::CameraOptions& options, std::uint64_t pictures = 60)
      : LiveCamera(with_card(options)), name_(record(pictures)) {}

  const std::string& name() const { return name_; }

  SLibDEdgeStorageStreamingInfo recording(int scale = 1) {
    SLibDEdgeStorageStreamingInfo info;
    info.streamName = name_;
    info.codecName = codec_name();
    info.scale = scale;
    return info;
  }

  /// Microseconds since 1970 at which picture `index` was stored.
  static std::int64_t stored_at(std::uint64_t index) {
    return kStart * 1000000 + kStartMicros + static_cast<std::int64_t>(index) * kInterval;
  }

 private:
  static vexa::camera::CameraOptions with_card(vexa::camera::CameraOptions options) {
    options.card_bytes = 64U << 20U;
    return options;
  }

  std::string record(std::uint64_t pictures) {
    if ((*this)->clip() == nullptr) return {};  // the failure has been told
    vexa::camera::Card& card = (*this)->card();
    vexa::camera::RecordingHead head;
    head.codec = (*this)->clip()->codec();
    head.frame_rate = 30;
    head.start = std::chrono::seconds(kStart) + std::chrono::microseconds(kStartMicros);
    const std::string name = card.begin(head);
    for (std::uint64_t i = 0; i < pictures; ++i) {
      EXPECT_TRUE(card.add({std::make_shared<const std::string>(picture(i)), is_key(i),
                            std::chrono::microseconds(i * static_cast<std::uint64_t>(kInterval))}));
    }
    card.finish();
    return name;
  }

  std::string name_;
};

std::int64_t stamp_of(const TakenFrame& frame) {
  return std::int64_t{frame.info.seconds} * 1000000 + frame.info.microseconds;
}

struct PlayedClip {
  const char* what;
  const char* clip;
  double pace;
  std::uint16_t first_sequence;
  std::uint32_t first_timestamp;
};

class Playback : public testing::TestWithParam<PlayedClip> {};

TEST_P(Playback, GivesEveryPictureAsItWasStoredWithItsStoredTime) {
  auto options = camera_options();
  options.clip_path = std::string(VEXA_CLIPS) + GetParam().clip;
  options.speed = GetParam().pace;
  options.start_sequence = GetParam().first_sequence;
  options.start_timestamp = GetParam().first_timestamp;
  RecordedCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartEdgeStorageVideoStreaming(camera.recording()), LIBD_OK);
  const auto frames = FrameTaker().take_all(driver, 60);
  ASSERT_EQ(frames.size(), 60u);
  for (std::size_t i = 0; i < frames.size(); ++i) {
    EXPECT_TRUE(camera.sent(i, frames[i].bytes)) << i;
    EXPECT_EQ(stamp_of(frames[i]), RecordedCamera::stored_at(i)) << i;
  }
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
}

// A second before the end of the clock's 32 bits; with it the base moves to the first picture behind the wrap.
constexpr std::uint32_t kNearTheEnd = 0xFFFFFFFFU - 90000U;

INSTANTIATE_TEST_SUITE_P(Clips, Playback,
                         testing::Values(PlayedClip{"h264", "/small.h264", kPace, 1, 100000000},
                                         PlayedClip{"h264_wraps", "/small.h264", kPace, 65500, kNearTheEnd},
                                         PlayedClip{"mpeg4_wraps", "/small.m4v", kPace, 65500, kNearTheEnd},
                                         PlayedClip{"jpeg_wraps", "/plain.mjpeg", kJpegPace, 65500, kNearTheEnd}),
                         [](const auto& row) { return std::string(row.param.what); });

TEST(PlaybackScale, IsAskedForAndLeavesTheStoredTimes) {
  auto options = camera_options();
  options.speed = 1;
  RecordedCamera camera(options, 30);
  MediaDriver driver;
  camera.introduce(driver);
  for (const int scale : {2, 4}) {
    camera->journal().clear();
    ASSERT_EQ(driver.StartEdgeStorageVideoStreaming(camera.recording(scale)), LIBD_OK);
    EXPECT_EQ(camera->journal().count("\r\nScale: " + std::to_string(scale) + "\r\n"), 1u);
    const auto frames = FrameTaker().take_all(driver, 30);
    ASSERT_EQ(frames.size(), 30u) << scale;
    for (std::size_t i = 0; i < frames.size(); ++i) {
      EXPECT_TRUE(camera.sent(i, frames[i].bytes)) << i;
      EXPECT_EQ(stamp_of(frames[i]), RecordedCamera::stored_at(i)) << i;
    }
  }
}

TEST(PlaybackScale, BackwardGivesTheKeyPicturesFromTheLastOn) {
  RecordedCamera camera(camera_options());
  std::vector<std::uint64_t> keys;
  for (std::uint64_t i = 0; i < 60; ++i) {
    if (camera.is_key(i)) keys.insert(keys.begin(), i);
  }
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartEdgeStorageVideoStreaming(camera.recording(-1)), LIBD_OK);
  EXPECT_EQ(camera->journal().count("\r\nScale: -1\r\n"), 1u);
  const auto frames = FrameTaker().take_all(driver, keys.size());
  ASSERT_EQ(frames.size(), keys.size());
  for (std::size_t i = 0; i < keys.size(); ++i) {
    EXPECT_EQ(frames[i].bytes, camera.picture(keys[i])) << i;
    const auto run = static_cast<std::int64_t>(keys.front() - keys[i]) * RecordedCamera::kInterval;
    EXPECT_EQ(stamp_of(frames[i]), RecordedCamera::stored_at(0) + run) << "a clock that goes forward";
  }
}

TEST(PlaybackStream, KeepsLargeFramesByTheRecordingsCodec) {
  auto options = camera_options();
  options.clip_path = VEXA_CLIPS "/plain.mjpeg";
  RecordedCamera camera(options, 1);
  MediaDriver driver;
  camera.introduce(driver);
  driver.use_live_h264();
  driver.m_LargeFrameBuffers = true;
  SLibDEdgeStorageStreamingInfo recording = camera.recording();
  ASSERT_EQ(driver.StartEdgeStorageVideoStreaming(recording), LIBD_OK);
  EXPECT_EQ(driver.m_StagingBufferSize, 2000000u);
  recording.codecName = "H.264";
  ASSERT_EQ(driver.StartEdgeStorageVideoStreaming(recording), LIBD_OK);
  EXPECT_EQ(driver.m_StagingBufferSize, 1200000u);
}

TEST(PlaybackStream, IsNotTornDownWhenTheHostWantsItSo) {
  RecordedCamera camera(camera_options(), 2);
  MediaDriver driver;
  camera.introduce(driver);
  driver.m_EdgeStorageSupported = true;
  for (const bool wanted : {false, true}) {
    camera->journal().clear();
    ASSERT_EQ(driver.SetEdgeStorageNoTearDown(!wanted), LIBD_OK);
    ASSERT_EQ(driver.StartEdgeStorageVideoStreaming(camera.recording()), LIBD_OK);
    ASSERT_EQ(driver.StopVideoStreaming(), LIBD_OK);
    EXPECT_EQ(camera->journal().count("TEARDOWN"), wanted ? 1u : 0u);
    EXPECT_EQ(driver.m_RtspSocket, -1);
    EXPECT_EQ(driver.m_StreamSocket, -1);
  }
}

/// Moves the driver's clock until the host has been told of the silence.
ELibDReturnCode code_of_silence(MediaDriver& driver, std::atomic<std::time_t>& now) {
  FrameTaker host;
  TakenFrame frame;
  ELibDReturnCode code = LIBD_NO_FRAME;
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
  while ((code == LIBD_NO_FRAME || code == LIBD_OK) && std::chrono::steady_clock::now() < end) {
    code = host.take(driver, frame);
    if (code == LIBD_NO_FRAME) {
      ++now;
      std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
  }
  return code;
}

TEST(PlaybackStream, ThatEndsOrWhoseRecordingIsDeletedOrWhoseCameraVanishesFallsSilent) {
  static std::atomic<std::time_t> now;
  using Event = void (*)(RecordedCamera&);
  const struct {
    const char* what;
    Event event;
  } rows[] = {
      {"deleted", [](RecordedCamera& camera) { EXPECT_TRUE(camera->card().erase_all()); }},
      {"card pulled", [](RecordedCamera& camera) { camera->card().set_health(vexa::camera::CardHealth::kMissing); }},
      {"vanished", [](RecordedCamera& camera) { camera->unplug(); }}};
  for (const auto& row : rows) {
    now = 5000;
    RecordedCamera camera(camera_options(), 500);
    const std::size_t descriptors = open_descriptors();
    {
      MediaDriver driver;
      camera.introduce(driver, 4000);  // a read of before outlives what happens to the camera by as much
      driver.state().now = [] { return now.load(); };
      driver.state().teardown_timeout = 1000;
      ASSERT_EQ(driver.StartEdgeStorageVideoStreaming(camera.recording()), LIBD_OK) << row.what;
      EXPECT_EQ(FrameTaker().take_all(driver, 3).size(), 3u) << row.what;
      {
        const vexa::Guard guard(driver.m_ConnectionLock);
        driver.m_ConnectionInfo.timeout = 20;  // of the reads from here on
      }
      row.event(camera);
      EXPECT_EQ(code_of_silence(driver, now), LIBD_TIMEOUT) << row.what;
      EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK) << row.what;
      EXPECT_EQ(driver.m_RtspSocket, -1) << row.what;
      EXPECT_EQ(driver.m_StreamSocket, -1) << row.what;
    }
    EXPECT_TRUE(eventually([&] { return open_descriptors() <= descriptors; })) << row.what;
  }
}

TEST(PlaybackStart, ThatRunsOutOfMemoryAnywhereFailsAndLeavesNothingBehind) {
  RecordedCamera camera(camera_options(), 2);
  const std::size_t descriptors = open_descriptors();
  fails_at_every_allocation(
      [&camera](Shortage& shortage) {
        MediaDriver driver;
        camera.introduce(driver);
        driver.m_NoTearDown = true;  // only the start's own allocations are counted
        const SLibDEdgeStorageStreamingInfo recording = camera.recording();
        const auto start = [&] { return driver.StartEdgeStorageVideoStreaming(recording); };
        EXPECT_EQ(shortage.run(start), shortage.failed() ? LIBD_FAILED : LIBD_OK);
        EXPECT_EQ(driver.m_ConnectionInfo.timeout, 5000);
        if (!shortage.failed()) return;
        EXPECT_EQ(driver.m_StreamSocket, -1);
        EXPECT_EQ(driver.m_RtspSocket, -1);
        EXPECT_EQ(driver.m_RtpPacketBuffer, nullptr);
      },
      19);
  EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; }));
}

/// Everything that names a session, with the URL that the session was set up for; true when all agree.
std::size_t requests_within_sessions(LiveCamera& camera, const std::string& method) {
  const auto after = [](const std::string& text, const std::string& key) {
    const std::size_t at = text.find(key);
    return at == std::string::npos ? 0 : std::stoul(text.substr(at + key.size()));
  };
  const auto url = [](const std::string& text) {
    const std::size_t begin = text.find(' ') + 1;
    return text.substr(begin, text.find(' ', begin) - begin);
  };
  std::map<unsigned long, std::string> urls;
  std::size_t right = 0;
  for (const auto& request : camera->journal().snapshot()) {
    if (request.bytes.starts_with("SETUP")) urls[after(request.answer, "Session: ")] = url(request.bytes);
    if (!request.bytes.starts_with(method)) continue;
    right += urls[after(request.bytes, "Session: ")] == url(request.bytes) + "/video" ? 1 : 0;
  }
  return right;
}

TEST(PlaybackStream, LiveAndRecordedTakeTurnsAHundredTimesWithoutALeak) {
  RecordedCamera camera(camera_options(), 200);
  const std::size_t descriptors = open_descriptors();
  const std::size_t threads = running_threads();
  std::atomic<int> failures{0};
  std::vector<std::thread> hosts;
  for (int h = 0; h < 10; ++h) {
    hosts.emplace_back([&] {
      MediaDriver driver;
      camera.introduce(driver);
      for (int i = 0; i < 10; ++i) {
        for (const bool live : {true, false}) {
          driver.m_LastKeepAliveTime = 0;
          const ELibDReturnCode started =
              live ? driver.StartVideoStreaming() : driver.StartEdgeStorageVideoStreaming(camera.recording(2));
          if (started != LIBD_OK || driver.m_ConnectionInfo.timeout != 5000) ++failures;
          const auto frames = FrameTaker().take_all(driver, 2);
          if (frames.size() != 2 || frames[0].bytes != camera.picture(0)) {
            ++failures;
          } else if (stamp_of(frames[1]) != (live ? 0 : RecordedCamera::stored_at(1))) {
            ++failures;
          }
          if (driver.StopVideoStreaming() != LIBD_OK) ++failures;
        }
      }
    });
  }
  for (std::thread& host : hosts) host.join();
  EXPECT_EQ(failures, 0);
  EXPECT_EQ(requests_within_sessions(camera, "GET_PARAMETER"), 200u);
  EXPECT_EQ(requests_within_sessions(camera, "TEARDOWN"), 200u);
  EXPECT_EQ(camera->journal().count("GET_PARAMETER rtsp://" + camera->address() + ":554/media/" + camera.name()), 100u);
  EXPECT_EQ(camera->journal().count("RTSPTimeout=60 HTTP"), 200u);
  EXPECT_TRUE(eventually([&] { return running_threads() == threads; })) << running_threads() << " of " << threads;
  EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; }));
  EXPECT_EQ(camera->sessions(), 0u);
}

TEST(PlaybackStart, TakesTurnsWithStartsAndStopsOfOtherThreads) {
  RecordedCamera camera(camera_options(), 50);
  const std::size_t threads = running_threads();
  MediaDriver driver;
  camera.introduce(driver);
  std::vector<std::thread> hosts;
  std::atomic<int> strange{0};
  for (int h = 0; h < 3; ++h) {
    hosts.emplace_back([&, h] {
      for (int i = 0; i < 3; ++i) {
        const ELibDReturnCode started =
            h == 0 ? driver.StartVideoStreaming() : driver.StartEdgeStorageVideoStreaming(camera.recording());
        const ELibDReturnCode stopped = driver.StopVideoStreaming();
        for (const auto code : {started, stopped}) strange += code != LIBD_OK && code != LIBD_FAILED ? 1 : 0;
      }
    });
  }
  for (std::thread& host : hosts) host.join();
  EXPECT_EQ(strange, 0);
  EXPECT_EQ(driver.m_StreamSocket, -1);
  EXPECT_EQ(driver.m_RtspSocket, -1);
  EXPECT_TRUE(eventually([&] { return running_threads() == threads; }));
  EXPECT_EQ(camera->sessions(), 0u);
}

}  // namespace
}  // namespace vexa_test

// Starting and stopping video: turns, failures on the way, what is left behind.
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <memory>
#include <thread>

#include "tests/media/live_camera.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;

void expect_stopped(MediaDriver& driver) {
  EXPECT_EQ(driver.m_StreamSocket, -1);
  EXPECT_EQ(driver.m_RtspSocket, -1);
  EXPECT_EQ(driver.m_StreamingThread, nullptr);
  EXPECT_EQ(driver.m_StagingBuffer, nullptr);
  EXPECT_EQ(driver.m_RtpPacketBuffer, nullptr);
  EXPECT_FALSE(driver.m_StopVideoRequested);
}

TEST(VideoStart, IsLetFinishByAStopFromAnotherThreadWhichThenStops) {
  LiveCamera camera(camera_options());
  camera->add_request_fault(RequestFault::slow("PLAY", std::chrono::milliseconds(200)));
  MediaDriver driver;
  camera.introduce(driver);
  std::thread starter([&] { EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK); });
  ASSERT_TRUE(camera->journal().wait_for_count("PLAY", 1, std::chrono::seconds(10)));
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  starter.join();
  expect_stopped(driver);
  EXPECT_EQ(camera->sessions(), 0u);
}

TEST(VideoStart, TakesTurnsWithStartsAndStopsOfOtherThreads) {
  LiveCamera camera(camera_options());
  const std::size_t descriptors = open_descriptors();
  const std::size_t threads = running_threads();
  MediaDriver driver;
  camera.introduce(driver);
  std::vector<std::thread> hosts;
  std::atomic<int> strange{0};
  for (int h = 0; h < 3; ++h) {
    hosts.emplace_back([&] {
      for (int i = 0; i < 5; ++i) {
        const ELibDReturnCode started = driver.StartVideoStreaming();
        const ELibDReturnCode stopped = driver.StopVideoStreaming();
        for (const auto code : {started, stopped}) strange += code != LIBD_OK && code != LIBD_FAILED ? 1 : 0;
      }
    });
  }
  for (std::thread& host : hosts) host.join();
  EXPECT_EQ(strange, 0);
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  EXPECT_EQ(FrameTaker().take_all(driver, 2).size(), 2u);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  expect_stopped(driver);
  EXPECT_TRUE(eventually([&] { return running_threads() == threads; })) << running_threads() << " of " << threads;
  EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors + 2; })) << "the stop event alone is open";
  EXPECT_EQ(camera->sessions(), 0u);
}

TEST(VideoStart, AsksPort554AlsoWhenTheHostReadsAnotherFromTheCameraMeanwhile) {
  vexa::camera::VirtualCamera camera(camera_options());
  MediaDriver driver;
  camera.journal().observe([&](const vexa::camera::Request& request) {
    if (request.kind != vexa::camera::RequestKind::kHttp) return;
    const vexa::Guard guard(driver.m_ConnectionLock);
    driver.m_CameraInfo.rtspPort = 8554;
  });
  ASSERT_TRUE(camera.start()) << camera.error();
  driver.use(camera.address(), camera.http_port(), 5000);
  driver.use_live_h264();
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  EXPECT_EQ(driver.m_CameraInfo.rtspPort, 554);
  EXPECT_GT(camera.journal().count("RTSPTimeout"), 0u);
}

TEST(VideoStart, ThatRunsOutOfMemoryAnywhereFailsAndLeavesNothingBehind) {
  LiveCamera camera(camera_options());
  const std::size_t descriptors = open_descriptors();
  fails_at_every_allocation(
      [&camera](Shortage& shortage) {
        MediaDriver driver;
        camera.introduce(driver);
        driver.m_NoTearDown = true;  // only the start's own allocations are counted
        const auto start = [&] { return driver.StartVideoStreaming(); };
        EXPECT_EQ(shortage.run(start), shortage.failed() ? LIBD_FAILED : LIBD_OK);
        EXPECT_EQ(driver.m_ConnectionInfo.timeout, 5000);
        if (shortage.failed()) expect_stopped(driver);
      },
      19);
  EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; }));
}

TEST(VideoStop, ThatRunsOutOfMemoryClosesEverythingAllTheSame) {
  LiveCamera camera(camera_options());
  fails_at_every_allocation(
      [&camera](Shortage& shortage) {
        MediaDriver driver;
        camera.play(driver);
        EXPECT_EQ(shortage.run([&] { return driver.StopVideoStreaming(); }), LIBD_OK);
        expect_stopped(driver);
      },
      -1);
}

TEST(VideoStart, HasFortySecondsForTheOpenAloneAndPutsTheTimeOutBack) {
  auto camera = std::make_unique<LiveCamera>(camera_options());
  (*camera)->add_request_fault(RequestFault::no_answer("DESCRIBE"));
  MediaDriver driver;
  camera->introduce(driver, 7000);
  driver.m_SavedTimeout = 6000;
  std::thread starter([&] { EXPECT_EQ(driver.StartVideoStreaming(), LIBD_STREAM_OPEN_FAILED); });
  EXPECT_TRUE((*camera)->journal().wait_for_count("DESCRIBE", 1, std::chrono::seconds(10)));
  EXPECT_EQ(driver.ConnectionTimeout(), 40000);
  camera.reset();  // which ends the wait
  starter.join();
  EXPECT_EQ(driver.ConnectionTimeout(), 6000) << "from the saved copy";
}

class CountingDriver : public MediaDriver {
 public:
  ELibDReturnCode StopVideoStreaming() override {
    ++stops;
    return MediaDriver::StopVideoStreaming();
  }
  int stops = 0;
};

TEST(VideoStart, EndsARunningStreamThroughTheInterfaceUnlessItIsRefused) {
  LiveCamera camera(camera_options());
  camera->add_request_fault(RequestFault::status("RTSPTimeout", "500 No"));
  CountingDriver driver;
  camera.introduce(driver);
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_FAILED);
  EXPECT_EQ(driver.stops, 1);
  EXPECT_EQ(driver.StartEdgeStorageVideoStreaming({}), LIBD_FAILED);
  EXPECT_EQ(driver.stops, 2);
  driver.m_StopVideoRequested = true;
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_FAILED);
  EXPECT_EQ(driver.StartEdgeStorageVideoStreaming({}), LIBD_FAILED);
  EXPECT_EQ(driver.stops, 2) << "a refused start stops nothing";
}

/// A driver in the middle of a start: its HTTP image stream is open, the thread is next.
class OpenedDriver : public MediaDriver {
 public:
  OpenedDriver() {
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends_), 0);
    m_StreamSocket = ends_[0];
    use("127.0.0.1", 1, 50);
  }
  ~OpenedDriver() override {
    CVexaCommon::StopVideoStreaming();
    close(ends_[1]);
  }

 private:
  int ends_[2] = {-1, -1};
};

struct StagingCase {
  const char* codec;
  bool large_before;
  bool large_after;
  std::size_t size;
};

TEST(VideoStart, SetsAsideAZeroedStagingBufferAndKeepsLargeFramesForJpegAlone) {
  const StagingCase cases[] = {{"JPEG", true, true, 2000000},    {"JPEG", false, false, 1200000},
                               {"H.264", true, false, 1200000},  {"MPEG4", true, false, 1200000},
                               {"H.264", false, false, 1200000}, {"jpeg", true, false, 1200000}};
  for (const StagingCase& c : cases) {
    OpenedDriver driver;
    driver.m_LargeFrameBuffers = c.large_before;
    driver.m_StreamWaitMs = 600000;
    ASSERT_EQ(driver.state().start_thread(c.codec), LIBD_OK);
    {
      const vexa::Guard guard(driver.m_FrameQueueLock);
      EXPECT_EQ(driver.m_LargeFrameBuffers, c.large_after) << c.codec;
    }
    ASSERT_EQ(driver.m_StagingBufferSize, c.size) << c.codec;
    EXPECT_EQ(std::count(driver.m_StagingBuffer, driver.m_StagingBuffer + c.size, 0), static_cast<long>(c.size));
    EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
    expect_stopped(driver);
    EXPECT_EQ(driver.m_StagingBufferSize, 0u);
  }
}

TEST(VideoStart, CountsTheSilenceFromBehindTheOpen) {
  static std::atomic<std::time_t> now;
  now = 5000;
  auto options = camera_options();
  options.clip_path.clear();
  vexa::camera::VirtualCamera camera(options);
  camera.journal().observe([](const vexa::camera::Request& request) {
    if (request.bytes.find("TEARDOWN") == std::string::npos) ++now;
  });
  ASSERT_TRUE(camera.start()) << camera.error();
  MediaDriver driver;
  driver.use(camera.address(), camera.http_port(), 5000);
  driver.use_live_h264();
  driver.m_LastKeepAliveTime = 5000;
  driver.state().now = [] { return now.load(); };
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  EXPECT_EQ(driver.m_LastFrameTime, 5006) << "three requests for the keep-alive, three for the session";
}

TEST(VideoStart, WithoutAThreadFailsWithTheSystemsTextAndClosesTheStream) {
  OpenedDriver driver;
  const std::string codec = "H.264";
  driver.soil_latest_error();
  ELibDReturnCode code = LIBD_OK;
  {
    const AllocationFailure failure(1);  // the staging buffer is had, the thread's record is not
    code = driver.state().start_thread(codec);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(code, LIBD_FAILED);
  EXPECT_EQ(driver.LatestErrorText(), "Resource temporarily unavailable");
  expect_stopped(driver);
}

TEST(VideoStop, EmptiesTheQueueAndForgetsATimeOut) {
  OpenedDriver driver;
  bool wait_key = false;
  for (const ELibDReturnCode result : {LIBD_OK, LIBD_OK, LIBD_TIMEOUT}) {
    CVexaCommon::VideoFrameInfo frame;
    frame.capacity = 8;
    frame.data = new unsigned char[frame.capacity];
    frame.frameType = VIDEO_FRAME_JPEG;
    MediaDriver::ProcessCurrentFrameData(&driver, frame, wait_key, result);
  }
  ASSERT_EQ(driver.m_FrameQueue.size(), 2u);
  ASSERT_TRUE(driver.m_VideoTimedOut);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  EXPECT_TRUE(driver.m_FrameQueue.empty());
  SLibDVideoFrameInfo frame;
  EXPECT_EQ(driver.GetCurrentVideoFrame(frame), LIBD_NO_FRAME) << "neither a frame nor a time-out";
}

TEST(StreamingThread, CountsAFrameWithoutMemoryAsATimeOut) {
  MediaDriver driver;
  driver.m_StreamWaitMs = 600000;  // it stays with its first frame until the stop
  std::thread thread([&] {
    const AllocationFailure failure(0);
    MediaDriver::StreamingThread(static_cast<CVexaCommon*>(&driver));
    EXPECT_TRUE(failure.happened());
  });
  SLibDVideoFrameInfo frame;
  EXPECT_TRUE(eventually([&] { return driver.GetCurrentVideoFrame(frame) == LIBD_TIMEOUT; }));
  EXPECT_EQ(driver.GetCurrentVideoFrame(frame), LIBD_NO_FRAME);
  {
    const vexa::Guard guard(driver.m_VideoStateLock);
    driver.m_StopVideoRequested = true;
  }
  SetEvent(driver.m_StopVideoEvent);
  thread.join();
}

}  // namespace
}  // namespace vexa_test

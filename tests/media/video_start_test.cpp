// Starting and stopping video: turns, failures on the way, what is left behind.
#include <gtest/gtest.h>

#include <atomic>
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
  LiveCamera camera(camera_options());
  camera->add_request_fault(RequestFault::slow("RTSPTimeout=60", std::chrono::milliseconds(200)));
  MediaDriver driver;
  camera.introduce(driver);
  std::thread starter([&] { EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK); });
  EXPECT_TRUE(camera->journal().wait_for_count("RTSPTimeout=60", 1, std::chrono::seconds(10)));
  {
    const vexa::Guard guard(driver.m_ConnectionLock);
    driver.m_CameraInfo.rtspPort = 8554;
  }
  starter.join();
  EXPECT_EQ(driver.m_CameraInfo.rtspPort, 554);
}

TEST(VideoStart, ThatRunsOutOfMemoryAnywhereFailsAndLeavesNothingBehind) {
  LiveCamera camera(camera_options());
  const std::size_t descriptors = open_descriptors();
  bool failed = true;
  int allocation = 0;
  for (; failed && allocation < 2000; ++allocation) {
    MediaDriver driver;
    camera.introduce(driver);
    driver.m_NoTearDown = true;  // only the start's own allocations are counted
    ELibDReturnCode code = LIBD_NOT_SUPPORTED;
    {
      const AllocationFailure failure(allocation);
      code = driver.StartVideoStreaming();
      failed = failure.happened();
    }
    EXPECT_EQ(code, failed ? LIBD_FAILED : LIBD_OK) << "allocation " << allocation;
    EXPECT_EQ(driver.m_ConnectionInfo.timeout, 5000) << "allocation " << allocation;
    if (failed) expect_stopped(driver);
  }
  EXPECT_FALSE(failed);
  EXPECT_GT(allocation, 20);
  EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; }));
}

TEST(VideoStop, ThatRunsOutOfMemoryClosesEverythingAllTheSame) {
  LiveCamera camera(camera_options());
  bool failed = true;
  for (int allocation = 0; failed && allocation < 100; ++allocation) {
    MediaDriver driver;
    camera.introduce(driver);
    ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
    {
      const AllocationFailure failure(allocation);
      EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
      failed = failure.happened();
    }
    expect_stopped(driver);
  }
  EXPECT_FALSE(failed);
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

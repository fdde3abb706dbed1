// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/process_state.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

using std::chrono::milliseconds;
using vexa::camera::RequestFault;

TEST(StreamingThread, EndsAtOnceForNoDriverAndForOneThatIsStopping) {
  EXPECT_EQ(MediaDriver::StreamingThread(nullptr), 0u);
  MediaDriver driver;
  driver.m_StopVideoRequested = true;
  EXPECT_EQ(MediaDriver::StreamingThread(static_cast<CVexaCommon*>(&driver)), 0u);
}

using VideoStreaming = LiveVideo<MediaDriver>;

TEST_F(VideoStreaming, BeginsWithoutAStreamAndWithTheWaitsOfOne) {
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
  EXPECT_EQ(driver_.m_PlaybackScale, 1);
  EXPECT_EQ(driver_.m_KeepAlivePeriod, 1);
  EXPECT_EQ(driver_.m_LastKeepAliveTime, 0);
  EXPECT_EQ(driver_.m_StreamWaitMs, 1);
  EXPECT_FALSE(driver_.m_NoTearDown);
  EXPECT_FALSE(driver_.m_StopVideoRequested);
  EXPECT_EQ(WaitForSingleObject(driver_.m_StopVideoEvent, 0), static_cast<unsigned long>(WAIT_TIMEOUT));
  const vexa::Guard guard(driver_.m_FrameQueueLock);
  EXPECT_FALSE(driver_.m_LargeFrameBuffers);
  EXPECT_FALSE(driver_.m_VideoTimedOut);
}

TEST_F(VideoStreaming, StopOfADriverThatNeverStartedIsOkAndDoesNothing) {
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
  EXPECT_EQ(driver_.LatestErrorText(), "");
}

TEST_F(VideoStreaming, StartIsRefusedWhileAStopIsInProgress) {
  driver_.m_StopVideoRequested = true;
  EXPECT_EQ(driver_.StartVideoStreaming(), LIBD_FAILED);
}

TEST_F(VideoStreaming, OpensTheSessionByItsTextsAndEndsItWithTearDown) {
  play();
  EXPECT_NE(driver_.m_StagingBuffer, nullptr);
  EXPECT_EQ(driver_.m_RtpClockRate, 90000);
  ASSERT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.m_StagingBuffer, nullptr);
  EXPECT_EQ(driver_.m_RtpPacketBuffer, nullptr);
  EXPECT_EQ(driver_.m_StreamingThread, nullptr);
  EXPECT_EQ(driver_.m_ConnectionInfo.timeout, 5000);
  std::string lines;
  for (const auto& request : camera()->journal().snapshot())
    lines += request.bytes.substr(0, request.bytes.find('\r')) + "\n";
  const std::string url = "rtsp://" + camera()->address() + ":554/media/video1";
  const std::string http = "http://" + camera()->address() + ":" + std::to_string(camera()->http_port());
  const std::string opening = "GET " + http + "/command/camera.cgi?RTSPTimeout=60 HTTP/1.0\n" +  //
                              "GET " + http + "/command/edgestorage.cgi?EsRTSPRec1Timeout=60 HTTP/1.0\n" + "GET " +
                              http + "/command/inquiry.cgi?inq=edgestorage HTTP/1.0\n" +  //
                              "DESCRIBE " + url + " RTSP/1.0\nSETUP " + url + "/video RTSP/1.0\nPLAY " + url +
                              " RTSP/1.0\n";
  EXPECT_EQ(lines.substr(0, opening.size()), opening);
  EXPECT_EQ(lines.substr(lines.rfind("TEARDOWN")), "TEARDOWN " + url + " RTSP/1.0\n");
  EXPECT_EQ(camera()->sessions(), 0u);
}

TEST_F(VideoStreaming, WithoutTearDownNothingIsSentAtTheEnd) {
  introduce();
  driver_.m_NoTearDown = true;
  ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
  ASSERT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
  for (const auto& request : camera()->journal().snapshot())
    EXPECT_EQ(request.bytes.find("TEARDOWN"), std::string::npos);
  EXPECT_EQ(driver_.m_RtspSocket, -1);
}

TEST_F(VideoStreaming, PicturesOverRtpDoNotWaitForEachOther) {
  options_.pictures = 3;
  introduce();
  driver_.m_StreamWaitMs = 600000;
  ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
  EXPECT_EQ(FrameTaker().take_all(driver_, 3).size(), 3u);
}

TEST_F(VideoStreaming, ADestroyedDriverStopsVideoFirstAndTheAlarmStreamLast) {
  int ends[2] = {-1, -1};
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
  {
    MediaDriver driver;
    camera().play(driver);
    const vexa::Guard guard(driver.m_IoStreamLock);
    driver.m_IoStreamSocket = ends[0];
  }
  close(ends[1]);
  std::vector<std::string> lines;
  for (const auto& request : camera()->journal().snapshot())
    lines.push_back(request.bytes.substr(0, request.bytes.find(' ')));
  ASSERT_GE(lines.size(), 2u);
  EXPECT_EQ(lines[lines.size() - 2], "TEARDOWN");
  EXPECT_EQ(lines.back(), "GET");
  EXPECT_NE(camera()->journal().snapshot().back().bytes.find("AlarmData=off"), std::string::npos);
}

struct RefusalCase {
  const char* what;
  RequestFault fault;
  int timeout;
  ELibDReturnCode code;
  const char* text;
};

TEST_F(VideoStreaming, AFailedStartGivesItsCodeAndClosesEverything) {
  const RefusalCase cases[] = {
      {"keep-alive set-up refused", RequestFault::status("RTSPTimeout", "500 No"), 20000, LIBD_FAILED, "No"},
      {"keep-alive inquiry refused", RequestFault::status("inq=edgestorage", "401 Who"), 20000, LIBD_FAILED, "Who"},
      {"session refused", RequestFault::status("DESCRIBE", "404 Gone"), 20000, LIBD_STREAM_OPEN_FAILED, "Gone"},
      {"session unauthorized", RequestFault::status("SETUP", "401 Who"), 20000, LIBD_STREAM_OPEN_FAILED, "Who"},
      {"play refused", RequestFault::status("PLAY", "453 Full"), 20000, LIBD_STREAM_OPEN_FAILED, "Full"},
  };
  for (const RefusalCase& c : cases) {
    camera()->clear_request_faults();
    camera()->add_request_fault(c.fault);
    const auto descriptors = open_descriptors();
    {
      MediaDriver driver;
      camera().introduce(driver, c.timeout);
      EXPECT_EQ(driver.StartVideoStreaming(), c.code) << c.what;
      EXPECT_EQ(driver.LatestErrorText(), c.text) << c.what;
      EXPECT_EQ(driver.m_StreamSocket, -1) << c.what;
      EXPECT_EQ(driver.m_RtpPacketBuffer, nullptr) << c.what;
      EXPECT_EQ(driver.m_ConnectionInfo.timeout, c.timeout) << c.what;
      EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK) << c.what;
    }
    EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; })) << c.what;
  }
}

TEST_F(VideoStreaming, AnUnreachableRtspServiceGivesStreamOpenFailed) {
  options_.rtsp_port = 0;  // any port but the one that drivers ask for
  introduce();
  EXPECT_EQ(driver_.StartVideoStreaming(), LIBD_STREAM_OPEN_FAILED);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
  EXPECT_EQ(driver_.m_RtspSocket, -1);
}

TEST_F(VideoStreaming, OnHttpARefusedImageStreamGivesTheExchangesCode) {
  camera()->add_request_fault(RequestFault::wrong_credentials("/image"));
  introduce();
  driver_.m_ConnectionInfo.streamTransport = 0;
  EXPECT_EQ(driver_.StartVideoStreaming(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
}

TEST_F(VideoStreaming, ASecondStopWhileTheFirstStillWaitsGivesFailed) {
  play();
  std::thread first;
  {
    const vexa::Guard turn(driver_.state().start_stop_lock);  // as a start in another thread holds it
    first = std::thread([&] { EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK); });
    EXPECT_TRUE(eventually([&] {
      const vexa::Guard guard(driver_.m_VideoStateLock);
      return driver_.m_StopVideoRequested;
    }));
    EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_FAILED);
    EXPECT_EQ(driver_.StartVideoStreaming(), LIBD_FAILED);
  }
  first.join();
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
}

TEST_F(VideoStreaming, AStartWhileStreamingEndsTheRunningStreamFirst) {
  introduce();
  FrameTaker host;
  for (int i = 0; i < 3; ++i) {
    ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
    const auto frames = host.take_all(driver_, 3);
    ASSERT_EQ(frames.size(), 3u);
    EXPECT_EQ(frames[0].bytes, camera().picture(0));
  }
  EXPECT_EQ(camera()->sessions(), 1u);
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
}

TEST_F(VideoStreaming, ADriverDestroyedWhileStreamingLeavesNothingBehind) {
  start();
  const std::size_t descriptors = open_descriptors();
  const std::size_t threads = running_threads();
  {
    MediaDriver driver;
    camera().play(driver);
    ASSERT_EQ(FrameTaker().take_all(driver, 2).size(), 2u);
  }
  EXPECT_TRUE(eventually([&] { return running_threads() == threads; })) << running_threads() << " of " << threads;
  EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; }));
  EXPECT_EQ(camera()->sessions(), 0u);
}

TEST_F(VideoStreaming, FiveHundredStartsAndStopsLeakNoDescriptorAndNoThread) {
  start();
  const std::size_t descriptors = open_descriptors();
  const std::size_t threads = running_threads();
  std::atomic<int> failures{0};
  std::vector<std::thread> hosts;
  for (int h = 0; h < 10; ++h) {
    hosts.emplace_back([&] {
      MediaDriver driver;
      camera().introduce(driver);
      for (int i = 0; i < 50; ++i) {
        if (driver.StartVideoStreaming() != LIBD_OK) ++failures;
        if (i % 5 == 0 && FrameTaker().take_all(driver, 1).size() != 1) ++failures;
        if (driver.StopVideoStreaming() != LIBD_OK) ++failures;
      }
    });
  }
  for (std::thread& host : hosts) host.join();
  EXPECT_EQ(failures, 0);
  EXPECT_TRUE(eventually([&] { return running_threads() == threads; })) << running_threads() << " of " << threads;
  EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; }));
  EXPECT_EQ(camera()->sessions(), 0u);
}

TEST_F(VideoStreaming, ACameraThatFallsSilentGivesOneTimeOut) {
  static std::atomic<std::time_t> now;
  now = 5000;
  options_.pictures = 3;
  introduce(4000);
  driver_.state().now = [] { return now.load(); };
  driver_.m_KeepAlivePeriod = 60;
  ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
  FrameTaker host;
  ASSERT_EQ(host.take_all(driver_, 3).size(), 3u);
  TakenFrame frame;
  EXPECT_EQ(host.take(driver_, frame), LIBD_NO_FRAME);
  now += 5;  // more than the time-out
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(30);
  ELibDReturnCode code = LIBD_NO_FRAME;
  while (code == LIBD_NO_FRAME && std::chrono::steady_clock::now() < end) {
    code = host.take(driver_, frame);
    std::this_thread::sleep_for(milliseconds(1));
  }
  EXPECT_EQ(code, LIBD_TIMEOUT);
  EXPECT_EQ(host.take(driver_, frame), LIBD_NO_FRAME);
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
}

}  // namespace
}  // namespace vexa_test

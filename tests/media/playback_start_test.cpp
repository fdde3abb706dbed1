// Starting the playback of a recording: what is asked, what a failure leaves.
#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <string>

#include "tests/media/live_camera.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;

SLibDEdgeStorageStreamingInfo recording_named(const std::string& name) {
  SLibDEdgeStorageStreamingInfo info;
  info.streamName = name;
  info.codecName = "H.264";
  info.scale = 2;
  return info;
}

std::string request_with(LiveCamera& camera, const std::string& text) {
  for (const auto& request : camera->journal().snapshot()) {
    if (request.bytes.find(text) != std::string::npos) return request.bytes;
  }
  return {};
}

void expect_nothing_open(MediaDriver& driver) {
  EXPECT_EQ(driver.m_StreamSocket, -1);
  EXPECT_EQ(driver.m_RtspSocket, -1);
  EXPECT_EQ(driver.m_StreamingThread, nullptr);
  EXPECT_EQ(driver.m_RtpPacketBuffer, nullptr);
  EXPECT_EQ(driver.m_StagingBuffer, nullptr);
}

struct RefusedPlayback {
  const char* what;
  RequestFault fault;
  ELibDReturnCode code;
  const char* text;
};

TEST(PlaybackStart, ThatFailsGivesItsCodePutsTheTimeOutBackAndClosesEverything) {
  const RefusedPlayback rows[] = {
      {"live time-out refused", RequestFault::status("RTSPTimeout=60 ", "401 Who"), LIBD_FAILED, "Who"},
      {"playback time-out refused", RequestFault::status("EsRTSPRec1Timeout", "500 No"), LIBD_FAILED, "No"},
      {"inquiry refused", RequestFault::status("inq=edgestorage", "401 Who"), LIBD_FAILED, "Who"},
      {"session refused", RequestFault::status("DESCRIBE", "404 Gone"), LIBD_STREAM_OPEN_FAILED, "Gone"},
      {"session unauthorised", RequestFault::status("DESCRIBE", "401 Who"), LIBD_STREAM_OPEN_FAILED, "Who"},
      {"connection torn", RequestFault::reset("DESCRIBE"), LIBD_STREAM_OPEN_FAILED, "Connection reset by peer"}};
  LiveCamera camera(camera_options());
  for (const RefusedPlayback& row : rows) {
    camera->clear_request_faults();
    camera->add_request_fault(row.fault);
    const auto descriptors = open_descriptors();
    {
      MediaDriver driver;
      camera.introduce(driver, 5000);
      driver.m_SavedTimeout = 4000;
      driver.m_CameraInfo.rtspPort = 8554;
      EXPECT_EQ(driver.StartEdgeStorageVideoStreaming(recording_named("a")), row.code) << row.what;
      EXPECT_EQ(driver.LatestErrorText(), row.text) << row.what;
      EXPECT_EQ(driver.m_ConnectionInfo.timeout, 4000) << row.what;
      EXPECT_EQ(driver.m_CameraInfo.rtspPort, 554) << row.what;
      expect_nothing_open(driver);
      EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK) << row.what;
    }
    EXPECT_TRUE(eventually([&] { return open_descriptors() == descriptors; })) << row.what;
  }
}

TEST(PlaybackStart, ThatFailsBeforeThereIsAMediaSocketGivesTheTransportsCode) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  // The requests reach the camera by a proxy; the session's host is looked up and not found.
  driver.m_ConnectionInfo.useProxy = true;
  driver.m_ConnectionInfo.proxyHost = camera->address();
  driver.m_ConnectionInfo.proxyPort = camera->http_port();
  driver.m_ConnectionInfo.host = "256.256.256.256";
  EXPECT_EQ(driver.StartEdgeStorageVideoStreaming(recording_named("a")), LIBD_FAILED);
  EXPECT_EQ(camera->journal().count("inq=edgestorage"), 1u);
  EXPECT_EQ(camera->journal().count("DESCRIBE"), 0u);
  EXPECT_EQ(driver.m_ConnectionInfo.timeout, 5000);
  expect_nothing_open(driver);
}

TEST(PlaybackStart, HasFortySecondsForTheKeepAliveSetUpAndTheOpen) {
  vexa::camera::VirtualCamera camera(camera_options());
  MediaDriver driver;
  std::atomic<int> wrong{0};
  camera.journal().observe([&](const vexa::camera::Request&) {
    const vexa::Guard guard(driver.m_ConnectionLock);
    wrong += driver.m_ConnectionInfo.timeout == 40000 ? 0 : 1;
  });
  ASSERT_TRUE(camera.start()) << camera.error();
  driver.use(camera.address(), camera.http_port(), 5000);
  EXPECT_EQ(driver.StartEdgeStorageVideoStreaming(recording_named("missing")), LIBD_STREAM_OPEN_FAILED);
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(camera.journal().count("DESCRIBE"), 1u);
}

TEST(PlaybackStart, CountsItsSilenceFromBeforeTheOpen) {
  static std::atomic<std::time_t> now;
  now = 1000;
  vexa::camera::VirtualCamera camera(camera_options());
  camera.journal().observe([](const vexa::camera::Request&) { ++now; });
  ASSERT_TRUE(camera.start()) << camera.error();
  MediaDriver driver;
  driver.use(camera.address(), camera.http_port(), 5000);
  driver.state().now = [] { return now.load(); };
  driver.StartEdgeStorageVideoStreaming(recording_named("missing"));
  EXPECT_EQ(driver.m_LastFrameTime, 1000);
  EXPECT_GT(now, 1003);
}

TEST(PlaybackStart, CutsItsPathAt259Characters) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  const std::string url = "rtsp://" + camera->address() + ":554";
  for (const std::size_t length : {252U, 253U, 4096U}) {
    camera->journal().clear();
    driver.StartEdgeStorageVideoStreaming(recording_named(std::string(length, 'n')));
    const std::string path = ("/media/" + std::string(length, 'n')).substr(0, 259);
    EXPECT_EQ(request_with(camera, "DESCRIBE").substr(0, 9 + url.size() + path.size() + 11),
              "DESCRIBE " + url + path + " RTSP/1.0\r\n");
  }
}

TEST(PlaybackStart, HasANameThatAddsNeitherAHeaderNorARequest) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  driver.StartEdgeStorageVideoStreaming(recording_named("a RTSP/1.0\r\nCSeq: 9\r\n\r\nPLAY &b%c\x7f"));
  EXPECT_EQ(request_with(camera, "DESCRIBE"),
            "DESCRIBE rtsp://" + camera->address() +
                ":554/media/a%20RTSP/1.0%0D%0ACSeq:%209%0D%0A%0D%0APLAY%20&b%c%7F RTSP/1.0\r\nCSeq: 1\r\n"
                "Accept: application/sdp\r\nAuthorization: Basic YWRtaW46c2VjcmV0\r\n\r\n");
  EXPECT_EQ(camera->journal().count("PLAY"), 1u);  // inside that one
}

TEST(PlaybackStart, EndsTheStreamThatRunsAlsoWhenItFails) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.play(driver);
  EXPECT_EQ(driver.StartEdgeStorageVideoStreaming(recording_named("missing")), LIBD_STREAM_OPEN_FAILED);
  expect_nothing_open(driver);
  EXPECT_EQ(camera->sessions(), 0u);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  EXPECT_FALSE(driver.m_EdgeStoragePlayback);
  EXPECT_EQ(FrameTaker().take_all(driver, 2).size(), 2u);
}

}  // namespace
}  // namespace vexa_test

// The camera's RTSP side over real connections.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "tests/support/process_state.h"
#include "tests/virtual_camera/camera_client.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

// The number behind "server_port=".
std::string server_ports(const std::string& answer) {
  const std::size_t begin = answer.find("server_port=") + 12;
  return answer.substr(begin, answer.find("\r\n", begin) - begin);
}

class RtspCamera : public testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(camera_.start()) << camera_.error(); }
  Client connect() { return {camera_.address(), camera_.rtsp_port()}; }

  VirtualCamera camera_{test_options()};
};

TEST_F(RtspCamera, ADialogueRunsByteForByte) {
  Client client(camera_.address(), camera_.rtsp_port());
  const std::string sdp = fmt::format(
      "v=0\r\no=- 1 1 IN IP4 {}\r\ns=video\r\nt=0 0\r\nm=video 0 RTP/AVP 96\r\na=rtpmap:96 H264/90000\r\n"
      "a=fmtp:96 packetization-mode=1\r\na=control:video\r\n",
      camera_.address());
  EXPECT_EQ(client.ask(kAsk.describe(1)),
            fmt::format("RTSP/1.0 200 OK\r\nCSeq: 1\r\nContent-Type: application/sdp\r\nContent-Length: {}\r\n\r\n{}",
                        sdp.size(), sdp));
  const std::string setup = client.ask(kAsk.setup(2, 5000));
  EXPECT_EQ(setup, fmt::format("RTSP/1.0 200 OK\r\nCSeq: 2\r\nSession: 12345678;timeout=60\r\n"
                               "Transport: RTP/AVP;unicast;client_port=5000-5001;server_port={}\r\n\r\n",
                               server_ports(setup)));
  EXPECT_EQ(client.ask(kAsk.play(3, 12345678)),
            "RTSP/1.0 200 OK\r\nCSeq: 3\r\nSession: 12345678\r\nRange: npt=0.000-\r\n\r\n");
  EXPECT_EQ(client.ask(kAsk.get_parameter(4, 12345678)), "RTSP/1.0 200 OK\r\nCSeq: 4\r\nSession: 12345678\r\n\r\n");
  EXPECT_EQ(camera_.sessions(), 1U);
  EXPECT_EQ(client.ask(kAsk.teardown(5, 12345678)), "RTSP/1.0 200 OK\r\nCSeq: 5\r\n\r\n");
  EXPECT_EQ(camera_.sessions(), 0U);
  EXPECT_EQ(client.ask(kAsk.get_parameter(6, 12345678)), "RTSP/1.0 454 Session Not Found\r\nCSeq: 6\r\n\r\n");
}

TEST_F(RtspCamera, TheJournalHoldsTheDialogueWithEveryEmptyLine) {
  Client client(camera_.address(), camera_.rtsp_port());
  const std::string requests[] = {kAsk.describe(1), kAsk.setup(2, 5000), kAsk.play(3, 12345678),
                                  kAsk.teardown(4, 12345678), kAsk.describe(5)};
  for (const std::string& request : requests) client.ask(request);
  const std::vector<Request> journal = camera_.journal().snapshot();
  ASSERT_EQ(journal.size(), 5U);
  for (std::size_t i = 0; i < 5; ++i) {
    EXPECT_EQ(journal[i].bytes, requests[i]);
    EXPECT_EQ(journal[i].status, 200);
    EXPECT_EQ(journal[i].kind, RequestKind::kRtsp);
  }
}

TEST_F(RtspCamera, WhatItCannotServeIsRefused) {
  const std::string authorised = std::string(kBasicAdmin) + "\r\n";
  const struct {
    std::string request, answer;
  } cases[] = {
      {"DESCRIBE rtsp://h/media/video1 RTSP/1.0\r\nCSeq: 1\r\n\r\n",
       "RTSP/1.0 401 Unauthorized\r\nCSeq: 1\r\nWWW-Authenticate: Basic realm=\"camera\"\r\n\r\n"},
      {"DESCRIBE rtsp://h/media/none RTSP/1.0\r\nCSeq: 1\r\n" + authorised,
       "RTSP/1.0 404 Not Found\r\nCSeq: 1\r\n\r\n"},
      {"SETUP rtsp://h/media/video1 RTSP/1.0\r\nCSeq: 2\r\nTransport: RTP/AVP;client_port=5-6\r\n" + authorised,
       "RTSP/1.0 404 Not Found\r\nCSeq: 2\r\n\r\n"},
      {"SETUP rtsp://h/media/video1/video RTSP/1.0\r\nCSeq: 2\r\n" + authorised,
       "RTSP/1.0 461 Unsupported Transport\r\nCSeq: 2\r\n\r\n"},
      {"SETUP rtsp://h/media/video1/video RTSP/1.0\r\nCSeq: 2\r\n"
       "Transport: RTP/AVP/TCP;unicast;interleaved=256-257\r\n" +
           authorised,
       "RTSP/1.0 461 Unsupported Transport\r\nCSeq: 2\r\n\r\n"},
      {kAsk.play(3, 1), "RTSP/1.0 454 Session Not Found\r\nCSeq: 3\r\n\r\n"},
      {kAsk.teardown(3, 1), "RTSP/1.0 454 Session Not Found\r\nCSeq: 3\r\n\r\n"},
      {"RECORD rtsp://h/media/video1 RTSP/1.0\r\nCSeq: 1\r\n" + authorised,
       "RTSP/1.0 501 Not Implemented\r\nCSeq: 1\r\nPublic: OPTIONS, DESCRIBE, SETUP, PLAY, GET_PARAMETER, "
       "TEARDOWN\r\n\r\n"},
      {"OPTIONS * RTSP/1.0\r\nCSeq: 9\r\n\r\n",
       "RTSP/1.0 200 OK\r\nCSeq: 9\r\nPublic: OPTIONS, DESCRIBE, SETUP, PLAY, GET_PARAMETER, TEARDOWN\r\n\r\n"},
      {"DESCRIBE rtsp://h/media/video1 RTSP/1.0\r\n" + authorised, "RTSP/1.0 400 Bad Request\r\n\r\n"},
      {"DESCRIBE rtsp://h/media/video1 HTTP/1.0\r\nCSeq: 1\r\n" + authorised, "RTSP/1.0 400 Bad Request\r\n\r\n"},
      {"nonsense\r\n\r\n", "RTSP/1.0 400 Bad Request\r\n\r\n"},
  };
  Client client(camera_.address(), camera_.rtsp_port());
  for (const auto& c : cases) EXPECT_EQ(client.ask(c.request), c.answer) << c.request;
}

TEST_F(RtspCamera, RequestsInOneSegmentAreAnsweredInOrder) {
  Client client(camera_.address(), camera_.rtsp_port());
  client.send("OPTIONS * RTSP/1.0\r\nCSeq: 1\r\n\r\nOPTIONS * RTSP/1.0\r\nCSeq: 2\r\n\r\n");
  std::string answers;
  while (answers.find("CSeq: 2") == std::string::npos) {
    const std::string piece = client.read_once();
    ASSERT_FALSE(piece.empty());
    answers += piece;
  }
  EXPECT_LT(answers.find("CSeq: 1"), answers.find("CSeq: 2"));
}

TEST_F(RtspCamera, EachSessionHasANumberOfItsOwn) {
  std::vector<std::unique_ptr<Client>> clients;
  for (std::uint32_t i = 0; i < 5; ++i) {
    clients.push_back(std::make_unique<Client>(camera_.address(), camera_.rtsp_port()));
    const std::string answer = clients.back()->ask(kAsk.setup(1, 5000));
    EXPECT_NE(answer.find(fmt::format("Session: {};timeout=60\r\n", 12345678 + i)), std::string::npos) << answer;
  }
  EXPECT_EQ(camera_.sessions(), 5U);
}

TEST_F(RtspCamera, SessionsEndWithTheirConnection) {
  auto client = std::make_unique<Client>(camera_.address(), camera_.rtsp_port());
  client->ask(kAsk.setup(1, 5000));
  EXPECT_EQ(camera_.sessions(), 1U);
  client->send("GET_PARAM");
  client.reset();
  ASSERT_TRUE(camera_.journal().wait_for_count("GET_PARAM", 1, milliseconds(kPatience)));
  EXPECT_EQ(camera_.sessions(), 0U);
}

TEST(RtspCameraAnswers, StayWithinHalfOfWhatAHostReads) {
  CameraOptions options = test_options();
  options.clip_path = std::string(VEXA_CLIPS) + "/hd.h264";
  options.range_clock = "20240131T235959.250Z";
  options.session_timeout = std::chrono::seconds(2000000000);
  options.first_session = 4000000000U;
  StartedCamera camera(options);
  Client client(camera.address(), camera.rtsp_port());
  const std::string description = client.ask(kAsk.describe(2147483647));
  EXPECT_NE(description.find("sprop-parameter-sets="), std::string::npos);
  EXPECT_NE(description.find("a=range:clock=20240131T235959.250Z\r\n"), std::string::npos);
  EXPECT_LE(description.size(), 500U);
  EXPECT_LE(client.ask(kAsk.setup(2147483647, 65534)).size(), 500U);
  EXPECT_LE(client.ask(kAsk.play(2147483647, 4000000000U)).size(), 500U);
}

TEST(RtspCameraExpiry, ASilentSessionEndsAfterItsTimeout) {
  CameraOptions options = test_options();
  options.session_timeout = std::chrono::seconds(1);
  options.session_expiry = SessionExpiry::kWhenSilent;
  StartedCamera camera(options);
  Client client(camera.address(), camera.rtsp_port());
  client.ask(kAsk.setup(1, 5000));
  EXPECT_EQ(client.ask(kAsk.get_parameter(2, 12345678)).substr(0, 15), "RTSP/1.0 200 OK");
  EXPECT_TRUE(vexa_test::eventually([&] { return camera.sessions() == 0; }));
  EXPECT_EQ(client.read_once(0), "");
  EXPECT_EQ(client.ask(kAsk.get_parameter(3, 12345678)), "RTSP/1.0 454 Session Not Found\r\nCSeq: 3\r\n\r\n");
}

}  // namespace
}  // namespace vexa::camera

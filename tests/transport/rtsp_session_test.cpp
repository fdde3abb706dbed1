// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>

#include <netinet/in.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>
#include <algorithm>
#include <fstream>

#include <climits>
#include <set>

#include "tests/support/descriptors.h"
#include "tests/support/exchange_file.h"
#include "tests/support/in_child.h"
#include "tests/support/interruptions.h"
#include "tests/support/process_state.h"
#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

/// The requests and answers of a session that opens.
Script live_session() { return read_exchange(VEXA_TEST_DATA "/exchanges/rtsp/live_session.txt").script; }

class RtspSession : public testing::Test {
 protected:
  RtspSession() { driver_.soil_latest_error(); }
  ~RtspSession() override { driver_.rtp_stream_socket_close_all(); }

  /// Opens a session, and gives what was written to standard output.
  std::string open(const std::string& url) {
    testing::internal::CaptureStdout();
    driver_.m_RtspSocket = driver_.rtp_over_udp_open("%s", url.c_str());
    return testing::internal::GetCapturedStdout();
  }
  std::string open(const ScriptedCamera& camera, int timeout = 20000) {
    driver_.use(camera.host(), camera.port(), timeout);
    return open("rtsp://" + camera.host() + ":" + std::to_string(camera.port()) + "/media/video1");
  }

  TestDriver driver_;
  const std::size_t descriptors_ = open_descriptors();
};

TEST_F(RtspSession, KeepsWhatTheSessionNeeds) {
  ScriptedCamera camera(live_session());
  open(camera, 2345);
  EXPECT_EQ(driver_.m_RtspUrl, "rtsp://" + camera.host() + ":" + std::to_string(camera.port()) + "/media/video1");
  EXPECT_STREQ(driver_.m_BasicCredentials, "YWRtaW46c2VjcmV0");
  EXPECT_EQ(fcntl(driver_.m_RtspSocket, F_GETFL) & O_NONBLOCK, 0);
  EXPECT_NE(fcntl(driver_.m_RtspSocket, F_GETFD) & FD_CLOEXEC, 0);
  for (const int option : {SO_RCVTIMEO, SO_SNDTIMEO}) {
    timeval limit{};
    socklen_t length = sizeof limit;
    EXPECT_EQ(getsockopt(driver_.m_RtspSocket, SOL_SOCKET, option, &limit, &length), 0);
    EXPECT_EQ(limit.tv_sec, 2);
    EXPECT_EQ(limit.tv_usec, 0);
  }
}

TEST_F(RtspSession, BindsAMediaSocketToAnyAddress) {
  const int port = driver_.bind_media_socket();
  sockaddr_in address{};
  socklen_t length = sizeof address;
  ASSERT_EQ(getsockname(driver_.m_StreamSocket, reinterpret_cast<sockaddr*>(&address), &length), 0);
  EXPECT_EQ(ntohs(address.sin_port), port);
  EXPECT_EQ(address.sin_addr.s_addr, htonl(INADDR_ANY));
  EXPECT_NE(fcntl(driver_.m_StreamSocket, F_GETFD) & FD_CLOEXEC, 0);
  EXPECT_EQ(fcntl(driver_.m_StreamSocket, F_GETFL) & O_NONBLOCK, 0);
  int reuse = 0;
  length = sizeof reuse;
  EXPECT_EQ(getsockopt(driver_.m_StreamSocket, SOL_SOCKET, SO_REUSEADDR, &reuse, &length), 0);
  EXPECT_EQ(reuse, 1);
  int room = 0;
  length = sizeof room;
  EXPECT_EQ(getsockopt(driver_.m_StreamSocket, SOL_SOCKET, SO_RCVBUF, &room, &length), 0);
  int most = 0;
  ASSERT_TRUE(std::ifstream("/proc/sys/net/core/rmem_max") >> most);
  EXPECT_EQ(room, 2 * std::min(524288, most));  // the system doubles what it is asked for
}

TEST_F(RtspSession, GivesEachSessionAPortOfItsOwn) {
  // Sockets that are reusable before they are bound meet on one port long before there are so many.
  constexpr std::size_t kSessions = 800;
  std::set<int> ports;
  std::set<int> sockets;
  for (std::size_t i = 0; i < kSessions; ++i) {
    ports.insert(driver_.bind_media_socket());
    sockets.insert(driver_.m_StreamSocket);
  }
  driver_.m_StreamSocket = -1;
  EXPECT_EQ(ports.size(), kSessions);
  for (const int socket : sockets) close(socket);
}

TEST_F(RtspSession, TracesEveryRequestWhole) {
  const Script script = live_session();
  ScriptedCamera camera(script);
  const std::string trace = open(camera);
  std::string expected;
  for (const ScriptStep& step : script) expected += "send <" + step.expected + ">\n";
  const int port = port_of(driver_.m_StreamSocket);
  ASSERT_NE(port, 0);
  const struct {
    std::string name, value;
  } names[] = {{"{host}", camera.host()},
               {"{port}", std::to_string(camera.port())},
               {"{udp}", std::to_string(port)},
               {"{udp+1}", std::to_string(port + 1)}};
  for (const auto& name : names) {
    for (std::size_t at = 0; (at = expected.find(name.name)) != std::string::npos;) {
      expected.replace(at, name.name.size(), name.value);
    }
  }
  EXPECT_EQ(trace, expected);
}

TEST_F(RtspSession, CountsFromOneAgainAfterAFailedOpen) {
  Script twice = live_session();
  twice[0].answer = "RTSP/1.0 500 Not yet\r\n\r\n";
  twice.resize(1);
  for (ScriptStep step : live_session()) twice.push_back(step);
  twice[1].new_connection = true;
  ScriptedCamera camera(twice);
  open(camera);
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.LatestErrorText(), "Not yet");
  driver_.rtp_stream_socket_close_all();
  open(camera);
  EXPECT_NE(driver_.m_RtspSocket, -1);
  driver_.rtp_stream_socket_close_all();
  EXPECT_EQ(camera.finish(), "");
}

TEST_F(RtspSession, OpensWithoutAClock) {
  ScriptedCamera camera(read_exchange(VEXA_TEST_DATA "/exchanges/rtsp/no_clock.txt").script);
  driver_.m_RangeClockSeconds = 77;
  open(camera);
  EXPECT_NE(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.m_RangeClockSeconds, 77);
}

TEST_F(RtspSession, DoesNotResetTheTimeOfTheLastKeepAlive) {
  ScriptedCamera camera(live_session());
  driver_.m_LastKeepAliveTime = 1234;
  open(camera);
  EXPECT_EQ(driver_.m_LastKeepAliveTime, 1234);
}

TEST_F(RtspSession, IsNotEndedBySignals) {
  const Interruptions interruptions;
  EXPECT_TRUE(interruptions.come_during([this] {
    ScriptedCamera camera(live_session());
    open(camera);
    EXPECT_NE(driver_.m_RtspSocket, -1);
    driver_.rtp_stream_socket_close_all();
    EXPECT_EQ(camera.finish(), "");
  }));
}

TEST_F(RtspSession, LeavesTheMediaSocketOpenWhenTheOpenFails) {
  driver_.use(own_loopback(0), refusing_port(), 1000);
  open("rtsp://camera/");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.latest_error(), "0 Connection refused");
  EXPECT_NE(driver_.m_StreamSocket, -1);
  EXPECT_EQ(open_descriptors(), descriptors_ + 1);
}

TEST_F(RtspSession, ReportsThatTheConnectionTimedOut) {
  const FullListener camera;
  const std::size_t descriptors = open_descriptors();
  driver_.use(camera.host(), camera.port(), 30);
  EXPECT_EQ(open("rtsp://camera/"), "");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.latest_error(), "-200 Connection timed out");
  EXPECT_EQ(open_descriptors(), descriptors + 1);
}

TEST_F(RtspSession, OpensNoSocketForAHostThatIsNotFound) {
  driver_.use("256.256.256.256", 554, 1000);
  open("rtsp://camera/");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
  EXPECT_EQ(driver_.latest_error(), "0 Operation not permitted");
}

TEST_F(RtspSession, ReportsThatThereIsNoDescriptorLeft) {
  driver_.use("127.0.0.1", 1, 1000);
  for (const rlim_t spare : {0U, 1U}) {
    EXPECT_EQ(in_child([&driver = driver_, spare] {
                driver.rtp_over_udp_open("rtsp://camera/");  // sanitizers look at new types with a descriptor
                driver.rtp_stream_socket_close_all();
                const int next = dup(2);
                close(next);
                const rlimit limit{static_cast<rlim_t>(next) + spare, static_cast<rlim_t>(next) + spare};
                if (setrlimit(RLIMIT_NOFILE, &limit) != 0) return std::string("no limit");
                const int socket = driver.rtp_over_udp_open("rtsp://camera/");
                return std::to_string(socket) + " " + std::to_string(driver.m_StreamSocket) + " " +
                       driver.latest_error();
              }),
              "-1 -1 0 Too many open files")
        << spare;
  }
}

/// Answers for a session whose number and scale make PLAY the longest of the three requests.
Script any_session(std::size_t steps) {
  Script script = live_session();
  script[1].answer = "RTSP/1.0 200 OK\r\nSession: -2147483648\r\n\r\n";
  script.resize(steps);
  return script;
}

TEST_F(RtspSession, RefusesEachRequestAbove1023Characters) {
  const std::string around_describe =
      "DESCRIBE  RTSP/1.0\r\nCSeq: 1\r\nAccept: application/sdp\r\nAuthorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
  const std::string around_setup =
      "SETUP /video RTSP/1.0\r\nCSeq: 2\r\nTransport: RTP/AVP;unicast;client_port=40000-40001\r\n"
      "Authorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
  const std::string around_play =
      "PLAY  RTSP/1.0\r\nCSeq: 3\r\nSession: -2147483648\r\nScale: -2147483648\r\nRange: npt=0.000-\r\n"
      "Authorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
  ASSERT_GT(around_setup.size(), around_describe.size());
  ASSERT_GT(around_play.size(), around_setup.size());
  const struct {
    std::size_t url;
    std::size_t requests;  ///< sent before one is refused
  } cases[] = {{1023 - around_play.size(), 3},
               {1024 - around_play.size(), 2},
               {1023 - around_setup.size(), 2},
               {1024 - around_setup.size(), 1},
               {1023 - around_describe.size(), 1},
               {1024 - around_describe.size(), 0},
               {5000, 0}};
  driver_.m_EdgeStoragePlayback = true;
  driver_.m_PlaybackScale = INT_MIN;
  for (const auto& c : cases) {
    Script script = any_session(c.requests);
    const std::string url(c.url, 'u');
    const std::string token = "Authorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
    const std::string requests[] = {
        "DESCRIBE " + url + " RTSP/1.0\r\nCSeq: 1\r\nAccept: application/sdp\r\n" + token,
        "SETUP " + url + "/video RTSP/1.0\r\nCSeq: 2\r\nTransport: RTP/AVP;unicast;client_port={udp}-{udp+1}\r\n" +
            token,
        "PLAY " + url + " RTSP/1.0\r\nCSeq: 3\r\nSession: -2147483648\r\nScale: -2147483648\r\nRange: npt=0.000-\r\n" +
            token};
    for (std::size_t i = 0; i < c.requests; ++i) script[i].expected = requests[i];
    if (c.requests == 0) script.push_back({});
    ScriptedCamera camera(script);
    driver_.use(camera.host(), camera.port(), 20000);
    driver_.soil_latest_error();
    open(url);
    EXPECT_EQ(driver_.m_RtspSocket != -1, c.requests == 3) << c.url;
    EXPECT_EQ(driver_.latest_error(), c.requests == 3 ? "0 from before" : "0 URL too long") << c.url;
    EXPECT_EQ(driver_.m_RtspCSeq, std::min<int>(static_cast<int>(c.requests) + 1, 3));
    driver_.rtp_stream_socket_close_all();
    EXPECT_TRUE(eventually([&] { return camera.played(); }));
    EXPECT_EQ(camera.finish(), "");
  }
}

class RtspClose : public RtspSession {
 protected:
  RtspClose() {
    int ends[2];
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    driver_.m_RtspSocket = ends[0];
    camera_ = ends[1];
    driver_.m_RtspUrl = "rtsp://camera/";
    driver_.m_RtspSession = 7;
    driver_.m_RtspCSeq = 3;
  }
  ~RtspClose() override { ::close(camera_); }

  std::string close() {
    testing::internal::CaptureStdout();
    driver_.rtp_over_udp_close();
    return testing::internal::GetCapturedStdout();
  }
  void say(const std::string& bytes) const {
    ASSERT_EQ(send(camera_, bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }
  void leave_no_room_to_send() {
    const int flags = fcntl(driver_.m_RtspSocket, F_GETFL);
    ASSERT_EQ(fcntl(driver_.m_RtspSocket, F_SETFL, flags | O_NONBLOCK), 0);
    const char filling[4096] = {};
    while (send(driver_.m_RtspSocket, filling, sizeof filling, MSG_NOSIGNAL) > 0) {
    }
  }
  std::string heard() const {
    char bytes[4096];
    const ssize_t got = recv(camera_, bytes, sizeof bytes, MSG_DONTWAIT);
    return {bytes, static_cast<std::size_t>(std::max<ssize_t>(got, 0))};
  }

  int camera_ = -1;
};

TEST_F(RtspClose, SendsATooLongTeardownCut) {
  driver_.m_RtspUrl = std::string(2000, 'u');
  say("RTSP/1.0 200 OK\r\n\r\n");
  const std::string cut = ("TEARDOWN " + driver_.m_RtspUrl).substr(0, 1023);
  EXPECT_EQ(close(), "send <" + cut + ">\n");
  EXPECT_EQ(heard(), cut);
  EXPECT_EQ(driver_.latest_error(), "0 URL too long");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
}

TEST_F(RtspClose, SendsNothingWhenTheHostWantsNoTeardown) {
  driver_.m_NoTearDown = true;
  ASSERT_NE(driver_.bind_media_socket(), -1);
  EXPECT_EQ(close(), "");
  EXPECT_EQ(heard(), "");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
  EXPECT_EQ(driver_.m_RtspCSeq, 3);
}

TEST_F(RtspClose, DoesNothingWhenBothSocketsAreClosed) {
  driver_.rtp_stream_socket_close_all();
  EXPECT_EQ(close(), "");
  EXPECT_EQ(driver_.m_RtspCSeq, 3);
  EXPECT_EQ(driver_.LatestErrorText(), "from before");
}

TEST_F(RtspClose, WithoutAControlSocketFailsAtOnceAndClosesTheMediaSocket) {
  driver_.rtp_stream_socket_close_all();
  ASSERT_NE(driver_.bind_media_socket(), -1);
  EXPECT_EQ(close(), "send <TEARDOWN rtsp://camera/ RTSP/1.0\r\nCSeq: 4\r\nSession: 7\r\n\r\n\r\n>\n");
  EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
  EXPECT_EQ(driver_.m_StreamSocket, -1);
}

TEST_F(RtspClose, WaitsFifteenSecondsForTheAnswer) { EXPECT_EQ(driver_.state().teardown_timeout, 15000); }

TEST_F(RtspClose, OfASilentCameraTimesOutAndClosesBothSockets) {
  driver_.state().teardown_timeout = 1000;
  ASSERT_NE(driver_.bind_media_socket(), -1);
  close();
  EXPECT_EQ(driver_.latest_error(), "-200 Receive timed out");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
}

TEST_F(RtspClose, ThatCannotSendReadsTheAnswerAllTheSame) {
  leave_no_room_to_send();
  driver_.state().teardown_timeout = 1000;
  say("RTSP/1.0 454 No such session\r\n\r\n");
  driver_.ClearLatestError();
  close();
  EXPECT_EQ(driver_.latest_error(), "0 No such session");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
}

TEST_F(RtspClose, ThatCannotSendReportsTheSystemsText) {
  leave_no_room_to_send();
  say("RTSP/1.0 200 OK\r\n\r\n");
  close();
  EXPECT_EQ(driver_.LatestErrorText(), "Resource temporarily unavailable");
}

TEST_F(RtspClose, CalledTwiceTearsDownOnce) {
  say("RTSP/1.0 200 OK\r\n\r\n");
  close();
  EXPECT_EQ(close(), "");
  EXPECT_EQ(heard(), "TEARDOWN rtsp://camera/ RTSP/1.0\r\nCSeq: 4\r\nSession: 7\r\n\r\n\r\n");
}

TEST_F(RtspClose, OfOneSocketNotifiesThePeer) {
  driver_.rtp_over_tcp_close(driver_.m_RtspSocket);
  driver_.m_RtspSocket = -1;
  char nothing = 0;
  EXPECT_EQ(recv(camera_, &nothing, 1, MSG_DONTWAIT), 0);
}

TEST(ParseClock, KeepsWhatTheClockGives) {
  TestDriver driver;
  EXPECT_TRUE(driver.parse_clock("20240131T235959.250Z"));
  EXPECT_EQ(driver.m_RangeClockSeconds, 1706745599);
  EXPECT_EQ(driver.m_RangeClockMicros, 250000);
}

TEST(ParseClock, LeavesWhatTheClockDoesNotTell) {
  TestDriver driver;
  driver.m_RangeClockSeconds = 77;
  driver.m_RangeClockMicros = 78;
  EXPECT_FALSE(driver.parse_clock(nullptr));
  EXPECT_FALSE(driver.parse_clock(""));
  EXPECT_FALSE(driver.parse_clock("20240131T235959"));
  EXPECT_EQ(driver.m_RangeClockSeconds, 77);
  EXPECT_TRUE(driver.parse_clock("20240131T235959Z"));
  EXPECT_EQ(driver.m_RangeClockSeconds, 77);
  EXPECT_EQ(driver.m_RangeClockMicros, 235959);
  EXPECT_FALSE(driver.parse_clock("19700101T000000.5"));
  EXPECT_EQ(driver.m_RangeClockSeconds, 0);
  EXPECT_EQ(driver.m_RangeClockMicros, 235959);
}

TEST(Base64Decode, GivesAnArrayOfItsSize) {
  TestDriver driver;
  const struct {
    const char* text;
    bool trim;
    std::string bytes;
  } cases[] = {{"QUJD", false, "ABC"},   {"QUI=", false, std::string("AB\0", 3)},
               {"QUI=", true, "AB"},     {"QU", false, ""},
               {"", true, ""},           {nullptr, false, ""},
               {"AAAA", true, ""},       {"AEEA", true, std::string("\0A", 2)},
               {"QU?D", false, "A@\x03"}};
  for (const auto& c : cases) {
    unsigned int size = 99;
    const std::unique_ptr<unsigned char[]> bytes(driver.base64Decode(c.text, size, c.trim));
    EXPECT_EQ(std::string(bytes.get(), bytes.get() + size), c.bytes);
  }
}

}  // namespace
}  // namespace vexa_test

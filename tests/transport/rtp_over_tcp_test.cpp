// SPDX-License-Identifier: Apache-2.0
// RTP inside the RTSP connection, on connections of the test's own.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/time.h>

#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "tests/support/exchange_file.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"
#include "tests/support/stream_pair.h"
#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

/// An interleaved frame of channel 0 that announces a packet of `length` bytes.
std::string interleaved(std::string packet, std::size_t length) {
  return std::string("$\0", 2) + static_cast<char>(length >> 8) + static_cast<char>(length) + packet;
}

std::string interleaved(const std::string& packet) { return interleaved(packet, packet.size()); }

/// Marker, type 96, sequence 258, timestamp 0x01020304.
std::string rtp_header(int first_byte = 0x80) {
  return static_cast<char>(first_byte) + std::string("\xe0\1\2\1\2\3\4\x09\x09\x09\x09", 11);
}

class RtpOverTcp : public testing::Test {
 protected:
  RtpOverTcp() { driver_.soil_latest_error(); }

  int receive(int size = 65535, int timeout = 50) {
    return driver_.rtp_over_tcp_payload_recv(pair_.driver_end(), buffer_.data(), size, &marker_, &type_, timeout,
                                             &timestamp_);
  }
  std::string payload(int length) const { return {buffer_.data(), static_cast<std::size_t>(length)}; }

  StreamDriver driver_;
  StreamPair pair_;
  std::vector<char> buffer_ = std::vector<char>(65535, '#');
  bool marker_ = false;
  unsigned char type_ = 1;
  unsigned int timestamp_ = 2;
};

TEST_F(RtpOverTcp, GivesThePayloadAndTheHeadersFields) {
  pair_.say(interleaved(rtp_header() + "payload") + interleaved(rtp_header() + "next"));
  EXPECT_EQ(receive(), 7);
  EXPECT_EQ(payload(8), "payload#");
  EXPECT_TRUE(marker_);
  EXPECT_EQ(type_, 96);
  EXPECT_EQ(timestamp_, 0x01020304U);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  EXPECT_EQ(receive(), 4);
  EXPECT_EQ(payload(4), "next");
}

TEST_F(RtpOverTcp, TakesNullPointers) {
  pair_.say(interleaved(rtp_header() + "payload"));
  EXPECT_EQ(driver_.rtp_over_tcp_payload_recv(pair_.driver_end(), buffer_.data(), 65535, nullptr, nullptr, 50, nullptr),
            7);
}

TEST_F(RtpOverTcp, TakesEveryChannelForMedia) {
  std::string frame = interleaved(rtp_header() + "control");
  frame[1] = 1;
  pair_.say(frame);
  EXPECT_EQ(receive(), 7);
}

TEST_F(RtpOverTcp, LeavesPaddingAndExtensionInThePayload) {
  pair_.say(interleaved(rtp_header(0xb0) + "extension, payload, padding"));
  EXPECT_EQ(receive(), 27);
}

TEST_F(RtpOverTcp, PassesOverContributingSources) {
  for (int count = 0; count <= 15; ++count) {
    pair_.say(interleaved(rtp_header(0x80 | count) + std::string(4 * static_cast<std::size_t>(count), 's') + "data"));
    EXPECT_EQ(receive(), 4) << count;
    EXPECT_EQ(payload(4), "data");
  }
}

TEST_F(RtpOverTcp, TakesThePayloadOfTheLargestPacket) {
  const std::string large(65535 - 12, 'x');
  std::thread camera([&] { pair_.say(interleaved(rtp_header() + large)); });
  EXPECT_EQ(receive(65535, 5000), 65535 - 12);
  camera.join();
  EXPECT_EQ(payload(65535 - 12), large);
}

TEST_F(RtpOverTcp, ABufferBelow65535BytesIsRefused) {
  pair_.say(interleaved(rtp_header() + "payload"));
  for (const int size : {65534, 0, -1}) {
    driver_.soil_latest_error();
    EXPECT_EQ(receive(size), -1);
    EXPECT_EQ(driver_.latest_error(), "0 Invalid argument");
  }
  EXPECT_EQ(receive(65535), 7);
}

TEST_F(RtpOverTcp, WaitsASecondForAPacketWhateverTheTimeout) {
  EXPECT_EQ(receive(65535, 0), 0);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  const long reader = kernel_thread_id();
  std::thread late([this, reader] {
    EXPECT_TRUE(eventually([reader] { return is_sleeping(reader); }));
    pair_.say(interleaved(rtp_header() + "late"));
  });
  EXPECT_EQ(receive(65535, 0), 4);
  late.join();
}

TEST_F(RtpOverTcp, RefusesWhatIsNoPacket) {
  const struct {
    std::string bytes;
    const char* error;
  } cases[] = {{"RTSP/1.0 200 OK\r\n\r\n", "0 ASCII dollar not found"},
               {std::string("\0\0\0\x0c", 4) + rtp_header(), "0 ASCII dollar not found"},
               {interleaved(rtp_header(0x00) + "x"), "0 Invalid RTP version"},
               {interleaved(rtp_header(0x40) + "x"), "0 Invalid RTP version"},
               {interleaved(rtp_header(0xc0) + "x"), "0 Invalid RTP version"},
               {interleaved(rtp_header(), 8), "0 Invalid payload length"},
               {interleaved(rtp_header(), 11), "0 Invalid payload length"},
               {interleaved(rtp_header(0x81) + "1234", 15), "0 Invalid payload length"},
               {interleaved(rtp_header(), 0), "0 Invalid payload length"}};
  for (const auto& c : cases) {
    driver_.soil_latest_error();
    pair_.say(c.bytes);
    EXPECT_EQ(receive(), -1);
    EXPECT_EQ(driver_.latest_error(), c.error);
    pair_.left();
  }
  EXPECT_FALSE(marker_);
  EXPECT_EQ(type_, 1);
  EXPECT_EQ(timestamp_, 2U);
}

TEST_F(RtpOverTcp, TakesAPacketWithoutPayloadForNone) {
  pair_.say(interleaved(rtp_header()));
  EXPECT_EQ(receive(), 0);
  EXPECT_TRUE(marker_);
}

TEST_F(RtpOverTcp, CutAnywhereByASilentCameraTimesOut) {
  const std::string whole = interleaved(rtp_header(0x81) + "1234" + "payload");
  for (std::size_t length = 1; length < whole.size(); ++length) {
    driver_.soil_latest_error();
    pair_.say(whole.substr(0, length));
    EXPECT_EQ(receive(65535, 1), -1) << length;
    EXPECT_EQ(driver_.latest_error(), "-200 Receive timed out");
  }
}

TEST_F(RtpOverTcp, CutAnywhereByTheClosingCameraFails) {
  const std::string whole = interleaved(rtp_header(0x81) + "1234" + "payload");
  for (std::size_t length = 0; length < whole.size(); ++length) {
    StreamPair pair;
    pair.say(whole.substr(0, length));
    pair.hang_up();
    driver_.soil_latest_error();
    EXPECT_EQ(
        driver_.rtp_over_tcp_payload_recv(pair.driver_end(), buffer_.data(), 65535, nullptr, nullptr, 50, nullptr), -1);
    EXPECT_EQ(driver_.latest_error(), "0 Connection closed") << length;
  }
}

TEST_F(RtpOverTcp, ComesAByteAtATime) {
  std::thread camera([this] {
    for (const char byte : interleaved(rtp_header(0x81) + "1234" + "slow")) {
      pair_.say({&byte, 1});
      std::this_thread::yield();
    }
  });
  EXPECT_EQ(receive(65535, 5000), 4);
  camera.join();
  EXPECT_EQ(payload(4), "slow");
}

TEST_F(RtpOverTcp, ReadsExactlyWhatIsAskedFor) {
  pair_.say("12345");
  EXPECT_EQ(driver_.rtp_over_tcp_recvn(pair_.driver_end(), buffer_.data(), 0, 0), 0);
  EXPECT_EQ(driver_.rtp_over_tcp_recvn(pair_.driver_end(), buffer_.data(), 4, 0), 0);
  EXPECT_EQ(payload(5), "1234#");
  EXPECT_EQ(pair_.left(), "5");
}

TEST_F(RtpOverTcp, OfAClosedSocketIsASystemFailure) {
  EXPECT_EQ(driver_.rtp_over_tcp_recvn(-1, buffer_.data(), 1, 50), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
  EXPECT_EQ(driver_.rtp_over_tcp_payload_recv(-1, buffer_.data(), 65535, nullptr, nullptr, 50, nullptr), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
}

/// The exchange of an open over UDP as it goes inside the connection.
Script inside_the_connection(const std::string& name) {
  constexpr std::string_view kOverUdp = "RTP/AVP;unicast;client_port={udp}-{udp+1}";
  Script script = read_exchange(std::string(VEXA_TEST_DATA "/exchanges/rtsp/") + name + ".txt").script;
  for (ScriptStep& step : script) {
    const std::size_t at = step.expected.find(kOverUdp);
    if (at != std::string::npos) step.expected.replace(at, kOverUdp.size(), "RTP/AVP/TCP;unicast;interleaved=0-1;");
  }
  return script;
}

class RtpOverTcpOpen : public RtpOverTcp {
 protected:
  void open(ScriptedCamera& camera, int timeout) {
    driver_.use(camera.host(), camera.port(), timeout);
    testing::internal::CaptureStdout();
    socket_ = driver_.rtp_over_tcp_open("rtsp://%s:%d/media/video%d", camera.host().c_str(), camera.port(), 1);
    trace_ = testing::internal::GetCapturedStdout();
    if (socket_ != -1) driver_.rtp_over_tcp_close(socket_);
    EXPECT_EQ(camera.finish(), "");
  }

  int socket_ = -1;
  std::string trace_;
};

TEST_F(RtpOverTcpOpen, GivesTheSocketThatCarriesTheMedia) {
  ScriptedCamera camera(inside_the_connection("live_session"));
  open(camera, 20000);
  EXPECT_NE(socket_, -1);
  EXPECT_EQ(driver_.m_StreamSocket, socket_);
  EXPECT_EQ(driver_.m_RtspSocket, -1);
  EXPECT_EQ(driver_.m_RtspUrl, "");
  EXPECT_EQ(driver_.m_RtspSession, 0);
  EXPECT_EQ(driver_.m_RtspCSeq, 3);
  EXPECT_EQ(driver_.m_RtpClockRate, 90000);
  EXPECT_EQ(driver_.m_RangeClockSeconds, 1706745599);
  EXPECT_EQ(driver_.m_RangeClockMicros, 250000);
  EXPECT_NE(trace_.find("Transport: RTP/AVP/TCP;unicast;interleaved=0-1;\r\n"), std::string::npos);
  driver_.m_StreamSocket = -1;
}

TEST_F(RtpOverTcpOpen, GivesABlockingSocketWithRoomWhoseSingleReadsEndAfterWholeSeconds) {
  ScriptedCamera camera(inside_the_connection("live_session"));
  driver_.use(camera.host(), camera.port(), 2345);
  testing::internal::CaptureStdout();
  const int socket = driver_.rtp_over_tcp_open("rtsp://%s:%d/media/video%d", camera.host().c_str(), camera.port(), 1);
  testing::internal::GetCapturedStdout();
  ASSERT_NE(socket, -1);
  EXPECT_EQ(fcntl(socket, F_GETFL) & O_NONBLOCK, 0);
  EXPECT_NE(fcntl(socket, F_GETFD) & FD_CLOEXEC, 0);
  int room = 0;
  socklen_t length = sizeof room;
  EXPECT_EQ(getsockopt(socket, SOL_SOCKET, SO_RCVBUF, &room, &length), 0);
  EXPECT_EQ(room, 2 * 131072);  // the system doubles what it is asked for
  for (const int option : {SO_RCVTIMEO, SO_SNDTIMEO}) {
    timeval limit{};
    length = sizeof limit;
    EXPECT_EQ(getsockopt(socket, SOL_SOCKET, option, &limit, &length), 0);
    EXPECT_EQ(limit.tv_sec, 2);
    EXPECT_EQ(limit.tv_usec, 0);
  }
  driver_.rtp_over_tcp_close(socket);
  driver_.m_StreamSocket = -1;
}

TEST_F(RtpOverTcpOpen, FailsWhenAnyOneAllocationDoesAndLeavesNoSocket) {
  const std::size_t descriptors = open_descriptors();
  testing::internal::CaptureStdout();
  fails_at_every_allocation(
      [this](Shortage& shortage) {
        ScriptedCamera camera(inside_the_connection("live_session"));
        driver_.use(camera.host(), camera.port(), 20000);
        const int socket = shortage.run([&] {
          return driver_.rtp_over_tcp_open("rtsp://%s:%d/media/video%d", camera.host().c_str(), camera.port(), 1);
        });
        EXPECT_EQ(socket == -1, shortage.failed());
        EXPECT_EQ(driver_.m_StreamSocket, socket);
        EXPECT_EQ(driver_.LatestErrorText(),
                  shortage.failed() || shortage.nth() > 0 ? "Cannot allocate memory" : "from before");
        driver_.rtp_over_tcp_close(std::exchange(driver_.m_StreamSocket, -1));
      },
      4);
  testing::internal::GetCapturedStdout();
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST_F(RtpOverTcpOpen, NeedsAClock) {
  Script script = inside_the_connection("no_clock");
  script.resize(1);
  ScriptedCamera camera(script);
  open(camera, 20000);
  EXPECT_EQ(socket_, -1);
  EXPECT_EQ(driver_.latest_error(), "0 clock= not found");
}

TEST_F(RtpOverTcpOpen, CarriesTheScaleOfAPlayback) {
  ScriptedCamera camera(inside_the_connection("playback_at_scale_4"));
  driver_.m_EdgeStoragePlayback = true;
  driver_.m_PlaybackScale = 4;
  open(camera, 20000);
  EXPECT_NE(socket_, -1);
  driver_.m_StreamSocket = -1;
}

TEST_F(RtpOverTcpOpen, FailsAsTheOpenOverUdpDoesAndLeavesNoSocket) {
  for (const std::string& name : exchange_names(VEXA_TEST_DATA "/exchanges/rtsp")) {
    const ExchangeFile file = read_exchange(VEXA_TEST_DATA "/exchanges/rtsp/" + name + ".txt");
    if (file.results.at("result") != "-1") continue;
    ScriptedCamera camera(inside_the_connection(name));
    driver_.soil_latest_error();
    const auto timeout = file.before.find("timeout");
    open(camera, timeout == file.before.end() ? 20000 : std::stoi(timeout->second));
    EXPECT_EQ(socket_, -1) << name;
    EXPECT_EQ(driver_.m_StreamSocket, -1) << name;
    EXPECT_EQ(driver_.latest_error(), file.results.at("code") + " " + file.results.at("text")) << name;
    EXPECT_EQ(std::to_string(driver_.m_RtspCSeq), file.results.at("cseq")) << name;
  }
}

TEST_F(RtpOverTcpOpen, OpensNoSocketForAHostThatIsNotFound) {
  const std::size_t descriptors = open_descriptors();
  driver_.use("256.256.256.256", 554, 1000);
  EXPECT_EQ(driver_.rtp_over_tcp_open("rtsp://camera/"), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Operation not permitted");
  EXPECT_EQ(open_descriptors(), descriptors);
}

}  // namespace
}  // namespace vexa_test

// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <fcntl.h>
#include <array>
#include <atomic>
#include <csignal>
#include <thread>
#include <vector>

#include "tests/media/media_driver.h"
#include "tests/support/process_state.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

constexpr int kSize = 65536;

/// A camera's end and the driver's end of a datagram connection.
class RtpOverUdp : public testing::Test {
 protected:
  RtpOverUdp() {
    int ends[2];
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0, ends), 0);
    camera_ = ends[0];
    socket_ = ends[1];
    driver_.soil_latest_error();
  }
  ~RtpOverUdp() override {
    close(camera_);
    close(socket_);
  }

  void send_datagram(const std::vector<unsigned char>& bytes) {
    ASSERT_EQ(send(camera_, bytes.data(), bytes.size(), 0), static_cast<ssize_t>(bytes.size()));
  }
  int receive(int timeout = 1000) {
    return driver_.rtp_over_udp_payload_recv(socket_, buffer_.data(), kSize, timeout, packet_);
  }

  MediaDriver driver_;
  int camera_ = -1;
  int socket_ = -1;
  std::vector<char> buffer_ = std::vector<char>(kSize);
  SPacketInfo packet_;
};

const std::vector<unsigned char> kPacket = {0x80, 0xe0, 0xff, 0xfe, 0, 0, 0, 5, 9, 9, 9, 9, 0x65, 0x88};

TEST_F(RtpOverUdp, FillsThePacketFromTheHeaderInHostOrder) {
  for (const bool twin : {false, true}) {
    send_datagram(kPacket);
    packet_ = {};
    const int length =
        twin ? driver_.rtp_over_udp_payload_recv_h264(socket_, buffer_.data(), kSize, 1000, packet_) : receive();
    EXPECT_EQ(length, 14);
    EXPECT_TRUE(packet_.received);
    EXPECT_TRUE(packet_.marker);
    EXPECT_EQ(packet_.payloadType, 96);
    EXPECT_EQ(packet_.sequence, 65534);
    EXPECT_EQ(packet_.length, 14u);
    EXPECT_EQ(packet_.timestamp, 5u);
    EXPECT_EQ(packet_.data, reinterpret_cast<unsigned char*>(buffer_.data()));
    EXPECT_EQ(driver_.LatestErrorCode(), LIBD_FAILED);
  }
}

TEST_F(RtpOverUdp, ADatagramOf11BytesSetsTheReceivedFlagAlone) {
  send_datagram(std::vector<unsigned char>(11, 0xff));
  unsigned char byte = 0;
  packet_.data = &byte;
  packet_.marker = true;
  packet_.payloadType = 7;
  packet_.sequence = 8;
  packet_.length = 9;
  packet_.timestamp = 10;
  EXPECT_EQ(receive(), 11);
  EXPECT_TRUE(packet_.received);
  EXPECT_EQ(packet_.data, &byte);
  EXPECT_TRUE(packet_.marker);
  EXPECT_EQ(packet_.payloadType, 7);
  EXPECT_EQ(packet_.sequence, 8);
  EXPECT_EQ(packet_.length, 9u);
  EXPECT_EQ(packet_.timestamp, 10u);
}

TEST_F(RtpOverUdp, ABufferOf65534BytesIsRefusedAndOneMoreIsTaken) {
  send_datagram(kPacket);
  EXPECT_EQ(driver_.rtp_over_udp_payload_recv(socket_, buffer_.data(), 65534, 0, packet_), -1);
  EXPECT_EQ(driver_.LatestErrorText(), "Invalid argument");
  EXPECT_EQ(driver_.LatestErrorCode(), LIBD_FAILED);
  EXPECT_FALSE(packet_.received);
  EXPECT_EQ(driver_.rtp_over_udp_payload_recv(socket_, buffer_.data(), 65534, nullptr, nullptr, 0, nullptr, nullptr),
            -1);
  EXPECT_EQ(driver_.rtp_over_udp_payload_recv(socket_, buffer_.data(), 65535, 0, packet_), 14);
}

TEST_F(RtpOverUdp, NoDatagramInTimeGivesReceiveTimedOut) {
  for (const int timeout : {20, 0, -1}) {
    driver_.soil_latest_error();
    EXPECT_EQ(receive(timeout), -1);
    EXPECT_EQ(driver_.LatestErrorText(), "Receive timed out");
    EXPECT_EQ(driver_.LatestErrorCode(), LIBD_TIMEOUT);
    EXPECT_FALSE(packet_.received);
  }
}

TEST_F(RtpOverUdp, AFailingReadGivesTheSystemText) {
  EXPECT_EQ(driver_.rtp_over_udp_payload_recv(-1, buffer_.data(), kSize, 20, packet_), -1);
  EXPECT_EQ(driver_.LatestErrorText(), "Bad file descriptor");
  EXPECT_EQ(driver_.LatestErrorCode(), LIBD_FAILED);
}

TEST_F(RtpOverUdp, ThePointerFormMovesThePayloadToTheStart) {
  send_datagram(kPacket);
  bool marker = false;
  unsigned char type = 0;
  unsigned int timestamp = 0;
  unsigned short sequence = 0;
  EXPECT_EQ(
      driver_.rtp_over_udp_payload_recv(socket_, buffer_.data(), kSize, &marker, &type, 1000, &timestamp, &sequence),
      2);
  EXPECT_TRUE(marker);
  EXPECT_EQ(type, 96);
  EXPECT_EQ(timestamp, 5u);
  EXPECT_EQ(sequence, 65534);
  EXPECT_EQ(std::string(buffer_.data(), 2), "\x65\x88");
}

TEST_F(RtpOverUdp, ThePointerFormTakesNullPointersAndShortDatagrams) {
  send_datagram(kPacket);
  EXPECT_EQ(driver_.rtp_over_udp_payload_recv(socket_, buffer_.data(), kSize, nullptr, nullptr, 1000, nullptr, nullptr),
            2);
  send_datagram({1, 2, 3});
  unsigned short sequence = 77;
  EXPECT_EQ(
      driver_.rtp_over_udp_payload_recv(socket_, buffer_.data(), kSize, nullptr, nullptr, 1000, nullptr, &sequence), 3);
  EXPECT_EQ(sequence, 77);
  EXPECT_EQ(std::string(buffer_.data(), 3), "\x01\x02\x03");
}

TEST_F(RtpOverUdp, DatagramsOfEveryLengthAreTaken) {
  for (int length = 0; length <= 64; ++length) {
    send_datagram(std::vector<unsigned char>(static_cast<std::size_t>(length), 0x80));
    EXPECT_EQ(receive(), length);
  }
  send_datagram(std::vector<unsigned char>(65535, 0x80));
  EXPECT_EQ(receive(), 65535);
}

TEST_F(RtpOverUdp, ADatagramThatComesDuringTheWaitIsTaken) {
  const long reader = kernel_thread_id();
  std::thread late([this, reader] {
    EXPECT_TRUE(eventually([reader] { return is_sleeping(reader); }));
    send_datagram(kPacket);
  });
  EXPECT_EQ(receive(20000), 14);
  late.join();
}

TEST_F(RtpOverUdp, AStopEndsTheWaitAtOnceAndIsNoTimeOut) {
  SetEvent(driver_.m_StopVideoEvent);
  EXPECT_EQ(receive(600000), -1);
  EXPECT_EQ(driver_.LatestErrorCode(), LIBD_FAILED);
  EXPECT_EQ(driver_.LatestErrorText(), "from before");
}

std::atomic<int> signals_taken{0};

void count_signal(int) { ++signals_taken; }

TEST_F(RtpOverUdp, ASignalDoesNotEndTheWait) {
  struct sigaction action = {};
  action.sa_handler = count_signal;
  sigaction(SIGUSR1, &action, nullptr);
  const pthread_t reader = pthread_self();
  const long reader_id = kernel_thread_id();
  std::thread disturber([&] {
    for (int i = 0; i < 5; ++i) {
      EXPECT_TRUE(eventually([reader_id] { return is_sleeping(reader_id); }));
      const int before = signals_taken;
      pthread_kill(reader, SIGUSR1);
      EXPECT_TRUE(eventually([before] { return signals_taken > before; }));
    }
    EXPECT_TRUE(eventually([reader_id] { return is_sleeping(reader_id); }));
    send_datagram(kPacket);
  });
  EXPECT_EQ(receive(60000), 14);
  disturber.join();
}

TEST_F(RtpOverUdp, ADescriptorAbove1023IsAsGoodAsAny) {
  rlimit limit = {};
  ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &limit), 0);
  limit.rlim_cur = std::max<rlim_t>(limit.rlim_cur, 2048);
  ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &limit), 0);
  const int high = fcntl(socket_, F_DUPFD_CLOEXEC, 1500);
  ASSERT_GE(high, 1500);
  send_datagram(kPacket);
  EXPECT_EQ(driver_.rtp_over_udp_payload_recv(high, buffer_.data(), kSize, 1000, packet_), 14);
  EXPECT_EQ(driver_.rtp_over_udp_payload_recv(high, buffer_.data(), kSize, 10, packet_), -1);
  EXPECT_EQ(driver_.LatestErrorText(), "Receive timed out");
  close(high);
}

}  // namespace
}  // namespace vexa_test

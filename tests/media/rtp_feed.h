// SPDX-License-Identifier: Apache-2.0
// A driver whose media socket is one end of a pair, and packets that a test sends into the other.
#pragma once

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <ctime>
#include <string>
#include <vector>

#include "tests/media/media_driver.h"

namespace vexa_test {

using Payload = std::vector<unsigned char>;

struct RtpFields {
  bool marker = false;
  unsigned char type = 96;
  unsigned sequence = 0;
  unsigned timestamp = 0;
};

inline Payload rtp_datagram(const RtpFields& fields, const Payload& payload) {
  const auto [marker, type, sequence, timestamp] = fields;
  Payload datagram = {0x80, static_cast<unsigned char>(type | (marker ? 0x80 : 0))};
  for (const unsigned value : {sequence >> 8 & 255u, sequence & 255u, timestamp >> 24, timestamp >> 16 & 255u,
                               timestamp >> 8 & 255u, timestamp & 255u, 0u, 0u, 0u, 0u}) {
    datagram.push_back(static_cast<unsigned char>(value));
  }
  datagram.insert(datagram.end(), payload.begin(), payload.end());
  return datagram;
}

class RtpFeed : public testing::Test {
 protected:
  explicit RtpFeed(std::string codec = "H.264", unsigned char payload_type = 96)
      : codec_(std::move(codec)), payload_type_(payload_type), buffer_(1200000) {
    int ends[2];
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0, ends), 0);
    camera_ = ends[0];
    driver_.m_StreamSocket = ends[1];
    driver_.m_RtpClockRate = 90000;
    driver_.use("127.0.0.1", 1, 50);
    driver_.state().now = [] { return clock_now; };
    driver_.m_LastFrameTime = clock_now = 1000;
    EXPECT_TRUE(driver_.state().allocate_packets());
    frame_.data = buffer_.data();
    frame_.capacity = static_cast<unsigned int>(buffer_.size());
  }
  ~RtpFeed() override {
    driver_.ReleaseRtpPacketsPtr();
    close(driver_.m_StreamSocket);
    driver_.m_StreamSocket = -1;
    close(camera_);
  }

  enum class Marker { kUnset, kSet };

  void send_packet(const Payload& payload, Marker marker) {
    const Payload datagram = rtp_datagram({marker == Marker::kSet, payload_type_, sequence_, timestamp_}, payload);
    EXPECT_EQ(send(camera_, datagram.data(), datagram.size(), 0), static_cast<ssize_t>(datagram.size()));
    ++sequence_;
  }

  /// A picture of one packet a payload.
  void send_picture(const std::vector<Payload>& payloads) {
    for (std::size_t i = 0; i < payloads.size(); ++i) {
      send_packet(payloads[i], i + 1 == payloads.size() ? Marker::kSet : Marker::kUnset);
    }
    timestamp_ += 3600;
  }

  ELibDReturnCode read() { return driver_.GetRtpCurrentVideoFrame(codec_, frame_); }
  Payload frame_bytes() const { return {buffer_.begin(), buffer_.begin() + frame_.length}; }

  static inline std::time_t clock_now = 1000;  ///< seconds, as the driver sees them

  std::string codec_;
  unsigned char payload_type_;
  MediaDriver driver_;
  CVexaCommon::VideoFrameInfo frame_;
  Payload buffer_;
  int camera_ = -1;
  unsigned sequence_ = 1;
  unsigned timestamp_ = 50000000;
};

}  // namespace vexa_test

// SPDX-License-Identifier: Apache-2.0
// A whole stream of H.264 packets inside a connection.
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <string>
#include <thread>
#include <vector>

#include "tests/support/stream_pair.h"
#include "tests/support/test_driver.h"
#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/rtp/rtp_stream.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraOptions;
using vexa::camera::Outgoing;

constexpr int kInterleavedPictures = 100;

/// The packets of the first pictures of a clip.
std::vector<Outgoing> packets_of(const CameraOptions& options) {
  vexa::camera::RtpStream stream(options, {}, 1, 1);
  std::vector<Outgoing> packets;
  for (int i = 0; i < kInterleavedPictures; ++i) stream.take_picture(packets);
  return packets;
}

std::string framed(const Outgoing& packet) {
  const auto payload = packet.payload_to_send();
  const std::size_t length = packet.header.size() + payload.size();
  std::string bytes("$\0", 2);
  bytes += static_cast<char>(length >> 8);
  bytes += static_cast<char>(length & 0xff);
  bytes.append(packet.header.begin(), packet.header.end());
  return bytes.append(payload.begin(), payload.end());
}

TEST(InterleavedStream, EveryPacketArrivesAsItWasSentHoweverTheBytesAreCut) {
  CameraOptions options;
  options.max_payload = 60000;  // far more than a datagram of the network holds
  options.clip = vexa::camera::PacketisedClip::load(VEXA_CLIPS "/small.h264", options.max_payload);
  ASSERT_NE(options.clip, nullptr);
  const std::vector<Outgoing> packets = packets_of(options);
  std::string bytes;
  for (const Outgoing& packet : packets) bytes += framed(packet);
  for (const std::size_t piece : {std::size_t{13}, std::size_t{1000}, bytes.size()}) {
    StreamPair pair;
    std::thread camera([&] {
      for (std::size_t at = 0; at < bytes.size(); at += piece) pair.say(std::string_view(bytes).substr(at, piece));
    });
    StreamDriver driver;
    std::vector<char> buffer(65535);
    std::size_t same = 0;
    for (const Outgoing& packet : packets) {
      bool marker = false;
      unsigned char type = 0;
      unsigned int timestamp = 0;
      const int length =
          driver.rtp_over_tcp_payload_recv(pair.driver_end(), buffer.data(), 65535, &marker, &type, 10000, &timestamp);
      const auto payload = packet.payload_to_send();
      const std::string expected(payload.begin(), payload.end());
      const bool equal = length >= 0 && std::string(buffer.data(), static_cast<std::size_t>(length)) == expected &&
                         marker == packet.record.marker && type == options.payload_type &&
                         timestamp == packet.record.timestamp;
      if (!equal) break;
      ++same;
    }
    if (same != packets.size()) shutdown(pair.driver_end(), SHUT_RDWR);
    camera.join();
    EXPECT_EQ(same, packets.size()) << piece;
  }
}

}  // namespace
}  // namespace vexa_test

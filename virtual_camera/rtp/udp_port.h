// RTP packets as datagrams from a port of the session's own.
#ifndef VIRTUAL_CAMERA_RTP_UDP_PORT_H_
#define VIRTUAL_CAMERA_RTP_UDP_PORT_H_

#include <asio/ip/udp.hpp>
#include <cstdint>
#include <string>
#include <vector>

#include "virtual_camera/rtp/datagram_batch.h"
#include "virtual_camera/rtp/packet_port.h"

namespace vexa::camera {

// Owned by the sender of a session, on the loop's thread. What the client sends to the port is not read.
class UdpPort : public PacketPort {
 public:
  explicit UdpPort(asio::io_context& context) : socket_(context), control_(context) {}

  // Opens the socket at the camera's address, towards the client.
  [[nodiscard]] asio::error_code open(const std::string& address, const asio::ip::udp::endpoint& client);
  [[nodiscard]] std::uint16_t number() const { return number_; }

  const std::vector<SentPacket>& send(const std::vector<Outgoing>& packets, Hashing hashing) override;
  void send_control(std::span<const std::uint8_t> packet) override;
  std::uint64_t take_heard() override;
  void close() override;

 private:
  asio::ip::udp::socket socket_;
  asio::ip::udp::socket control_;
  DatagramBatch batch_;
  std::uint16_t number_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_UDP_PORT_H_

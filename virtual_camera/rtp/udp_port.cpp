#include "virtual_camera/rtp/udp_port.h"

#include <array>
#include <asio/buffer.hpp>

namespace vexa::camera {
namespace {

constexpr int kSendBuffer = 1 << 20;

}  // namespace

asio::error_code UdpPort::open(const std::string& address, const asio::ip::udp::endpoint& client) {
  asio::error_code error;
  const asio::ip::address own = asio::ip::make_address(address, error);
  if (!error) socket_.open(client.protocol(), error);
  if (!error) socket_.bind({own, 0}, error);
  if (!error) socket_.connect(client, error);
  if (error) return error;
  asio::error_code ignored;
  socket_.set_option(asio::socket_base::send_buffer_size(kSendBuffer), ignored);
  number_ = socket_.local_endpoint(error).port();
  // The host's control port is the one after its media port; where it has none, reports are lost.
  asio::error_code no_control;
  control_.open(client.protocol(), no_control);
  control_.bind({own, 0}, no_control);
  control_.connect({client.address(), static_cast<std::uint16_t>(client.port() + 1)}, no_control);
  control_.non_blocking(true, no_control);
  return error;
}

void UdpPort::send_control(std::span<const std::uint8_t> packet) {
  asio::error_code ignored;
  control_.send(asio::buffer(packet.data(), packet.size()), 0, ignored);
}

std::uint64_t UdpPort::take_heard() {
  std::uint64_t heard = 0;
  std::array<std::uint8_t, 1500> room{};
  asio::error_code error;
  // A refusal of what was sent before is an error once.
  for (int tries = 0; tries < 8; ++tries) {
    error.clear();
    if (control_.receive(asio::buffer(room), 0, error) > 0 && !error) ++heard;
    if (error == asio::error::would_block) break;
  }
  return heard;
}

const std::vector<SentPacket>& UdpPort::send(const std::vector<Outgoing>& packets, Hashing hashing) {
  return batch_.send(socket_.native_handle(), packets, hashing);
}

void UdpPort::close() {
  asio::error_code ignored;
  socket_.close(ignored);
  control_.close(ignored);
}

}  // namespace vexa::camera

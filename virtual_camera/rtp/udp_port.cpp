#include "virtual_camera/rtp/udp_port.h"

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
  return error;
}

const std::vector<SentPacket>& UdpPort::send(const std::vector<Outgoing>& packets, Hashing hashing) {
  return batch_.send(socket_.native_handle(), packets, hashing);
}

void UdpPort::close() {
  asio::error_code ignored;
  socket_.close(ignored);
}

}  // namespace vexa::camera

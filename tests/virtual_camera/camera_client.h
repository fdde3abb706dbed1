// A plain client for tests of the virtual camera: blocking, with a limit on every wait.
#ifndef TESTS_VIRTUAL_CAMERA_CAMERA_CLIENT_H_
#define TESTS_VIRTUAL_CAMERA_CAMERA_CLIENT_H_

#include <fmt/format.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <asio.hpp>
#include <cstdint>
#include <string>
#include <vector>

#include "tests/support/own_address.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {

using vexa_test::own_loopback;

constexpr int kPatience = 20000;  // milliseconds for what must come
constexpr const char* kBasicAdmin = "Authorization: Basic YWRtaW46YWRtaW4=\r\n";

inline CameraOptions test_options() {
  CameraOptions options;
  options.address = own_loopback(1);
  options.rtsp_port = 0;
  return options;
}

/// A camera that runs as long as its test.
class StartedCamera : public VirtualCamera {
 public:
  explicit StartedCamera(const CameraOptions& options) : VirtualCamera(options) { EXPECT_TRUE(start()) << error(); }
};

enum class Ended { kNot, kClosed, kReset };

class Client {
 public:
  Client(const std::string& address, std::uint16_t port) : socket_(context_) {
    asio::error_code error;
    socket_.connect({asio::ip::make_address(address), port}, error);
    connected_ = !error;
  }

  [[nodiscard]] bool connected() const { return connected_; }
  [[nodiscard]] Ended ended() const { return ended_; }

  void send(const std::string& text) {
    asio::error_code error;
    asio::write(socket_, asio::buffer(text), error);
  }

  // What one receive brings; empty when nothing came in time or the camera ended the connection.
  std::string read_once(int patience = kPatience) {
    pollfd waiting{socket_.native_handle(), POLLIN, 0};
    if (::poll(&waiting, 1, patience) != 1) return {};
    std::array<char, 65536> buffer{};
    const ssize_t size = ::recv(socket_.native_handle(), buffer.data(), buffer.size(), 0);
    if (size > 0) return {buffer.data(), static_cast<std::size_t>(size)};
    ended_ = size == 0 ? Ended::kClosed : Ended::kReset;
    return {};
  }

  std::string read_to_end() {
    std::string all;
    for (std::string piece = read_once(); !piece.empty(); piece = read_once()) all += piece;
    return all;
  }

  // Whether the camera ends the connection although nobody reads.
  [[nodiscard]] bool reset_unread(int patience = kPatience) {
    pollfd waiting{socket_.native_handle(), 0, 0};
    return ::poll(&waiting, 1, patience) == 1 && (waiting.revents & (POLLERR | POLLHUP)) != 0;
  }

  std::string ask(const std::string& request) {
    send(request);
    return read_once();
  }

 private:
  asio::io_context context_;
  asio::ip::tcp::socket socket_;
  bool connected_ = false;
  Ended ended_ = Ended::kNot;
};

class UdpReceiver {
 public:
  UdpReceiver() : socket_(context_, asio::ip::udp::endpoint(asio::ip::make_address("127.0.0.1"), 0)) {
    socket_.set_option(asio::socket_base::receive_buffer_size(1 << 22));
  }

  [[nodiscard]] std::uint16_t port() const { return socket_.local_endpoint().port(); }

  // The next datagram; empty when none came in time.
  std::vector<std::uint8_t> receive(int patience = kPatience) {
    pollfd waiting{socket_.native_handle(), POLLIN, 0};
    if (::poll(&waiting, 1, patience) != 1) return {};
    std::vector<std::uint8_t> datagram(65536);
    const ssize_t size = ::recv(socket_.native_handle(), datagram.data(), datagram.size(), 0);
    datagram.resize(size < 0 ? 0 : static_cast<std::size_t>(size));
    return datagram;
  }

 private:
  mutable asio::io_context context_;
  asio::ip::udp::socket socket_;
};

inline std::string http_get(const std::string& path) {
  return fmt::format("GET http://camera:80{} HTTP/1.0\r\n{}\r\n", path, kBasicAdmin);
}

// The five requests of a host, as hosts write them.
struct RtspRequests {
  std::string url = "rtsp://camera:554/media/video1";

  [[nodiscard]] std::string describe(int sequence) const {
    return fmt::format("DESCRIBE {} RTSP/1.0\r\nCSeq: {}\r\nAccept: application/sdp\r\n{}\r\n", url, sequence,
                       kBasicAdmin);
  }
  [[nodiscard]] std::string setup(int sequence, std::uint16_t port) const {
    return fmt::format("SETUP {}/video RTSP/1.0\r\nCSeq: {}\r\nTransport: RTP/AVP;unicast;client_port={}-{}\r\n{}\r\n",
                       url, sequence, port, port + 1, kBasicAdmin);
  }
  [[nodiscard]] std::string setup_interleaved(int sequence) const {
    return fmt::format(
        "SETUP {}/video RTSP/1.0\r\nCSeq: {}\r\nTransport: RTP/AVP/TCP;unicast;interleaved=0-1;\r\n{}\r\n", url,
        sequence, kBasicAdmin);
  }
  [[nodiscard]] std::string play(int sequence, std::uint32_t session) const {
    return fmt::format("PLAY {} RTSP/1.0\r\nCSeq: {}\r\nSession: {}\r\nScale: 1\r\nRange: npt=0.000-\r\n{}\r\n", url,
                       sequence, session, kBasicAdmin);
  }
  [[nodiscard]] std::string get_parameter(int sequence, std::uint32_t session) const {
    return fmt::format("GET_PARAMETER {} RTSP/1.0\r\nCSeq: {}\r\nSession: {}\r\nAccept: application/sdp\r\n{}\r\n", url,
                       sequence, session, kBasicAdmin);
  }
  [[nodiscard]] std::string teardown(int sequence, std::uint32_t session) const {
    return fmt::format("TEARDOWN {} RTSP/1.0\r\nCSeq: {}\r\nSession: {}\r\n\r\n\r\n", url, sequence, session);
  }
};
inline const RtspRequests kAsk;

}  // namespace vexa::camera

#endif  // TESTS_VIRTUAL_CAMERA_CAMERA_CLIENT_H_

// SPDX-License-Identifier: Apache-2.0
// One listening port of the camera.
#ifndef VIRTUAL_CAMERA_SERVER_LISTENER_H_
#define VIRTUAL_CAMERA_SERVER_LISTENER_H_

#include <asio/ip/tcp.hpp>
#include <asio/steady_timer.hpp>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>

namespace vexa::camera {

// Accepts connections and passes each to a function. Held by the camera's core; on the loop's thread.
class Listener : public std::enable_shared_from_this<Listener> {
 public:
  // Takes a connection that has been accepted.
  using Take = std::function<void(asio::ip::tcp::socket)>;

  // The context outlives it.
  Listener(asio::io_context& context, std::string address, Take take);

  // Port 0 takes any free one the first time and the same again later.
  [[nodiscard]] asio::error_code open(std::uint16_t port);
  void close();
  [[nodiscard]] std::uint16_t port() const { return port_; }

 private:
  void accept();

  const std::string address_;
  const Take take_;
  asio::ip::tcp::acceptor acceptor_;
  asio::steady_timer retry_;
  std::uint16_t port_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_LISTENER_H_

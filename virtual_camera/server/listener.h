// One listening port of the camera.
#ifndef VIRTUAL_CAMERA_SERVER_LISTENER_H_
#define VIRTUAL_CAMERA_SERVER_LISTENER_H_

#include <asio.hpp>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/server/connection.h"

namespace vexa::camera {

class Listener : public std::enable_shared_from_this<Listener> {
 public:
  using Factory = std::function<std::shared_ptr<Connection>(asio::ip::tcp::socket)>;

  Listener(std::shared_ptr<CameraState> state, Factory make);

  // Port 0 takes any free one the first time and the same again later.
  [[nodiscard]] asio::error_code open(std::uint16_t port);
  void close();
  [[nodiscard]] std::uint16_t port() const { return port_; }

 private:
  void accept();
  void accepted(asio::ip::tcp::socket socket);

  std::shared_ptr<CameraState> state_;
  Factory make_;
  asio::ip::tcp::acceptor acceptor_;
  asio::steady_timer retry_;
  std::uint16_t port_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_LISTENER_H_

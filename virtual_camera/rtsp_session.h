// One RTSP session: its number, its sender, and its end when the host falls silent.
#ifndef VIRTUAL_CAMERA_RTSP_SESSION_H_
#define VIRTUAL_CAMERA_RTSP_SESSION_H_

#include <asio.hpp>
#include <cstdint>
#include <memory>

#include "virtual_camera/camera_state.h"
#include "virtual_camera/rtp_sender.h"

namespace vexa::camera {

class RtspSession : public std::enable_shared_from_this<RtspSession> {
 public:
  // `video`: the number of the camera's video stream that it plays.
  RtspSession(std::shared_ptr<CameraState> state, std::uint32_t number, int video);

  [[nodiscard]] std::uint32_t number() const { return number_; }
  [[nodiscard]] asio::error_code open(const asio::ip::udp::endpoint& client) { return sender_->open(client); }
  [[nodiscard]] std::uint16_t server_port() const { return sender_->port(); }
  void play() { sender_->play(); }
  // A request named the session: its time starts over.
  void touch();
  // Stops sending for good. The session leaves the camera's table, when it still stands there.
  void end();

 private:
  std::shared_ptr<CameraState> state_;
  const std::uint32_t number_;
  std::shared_ptr<RtpSender> sender_;
  asio::steady_timer expiry_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTSP_SESSION_H_

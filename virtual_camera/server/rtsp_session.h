// SPDX-License-Identifier: Apache-2.0
// One RTSP session: its number, its sender, and its end when the host falls silent.
#ifndef VIRTUAL_CAMERA_SERVER_RTSP_SESSION_H_
#define VIRTUAL_CAMERA_SERVER_RTSP_SESSION_H_

#include <asio/steady_timer.hpp>
#include <chrono>
#include <cstdint>
#include <memory>
#include <utility>

#include "virtual_camera/rtp/packet_port.h"
#include "virtual_camera/rtp/rtp_sender.h"
#include "virtual_camera/source/picture_source.h"

namespace vexa::camera {

struct CameraState;

// Owned by the camera's table of sessions; its connection takes it out. On the loop's thread. Sends no answer: the
// connection does.
class RtspSession : public std::enable_shared_from_this<RtspSession> {
 public:
  // `video`: the number of the camera's video stream that it plays. `port` is open; the first picture leaves through
  // it `pause` after PLAY.
  RtspSession(std::shared_ptr<CameraState> state, std::uint32_t number, int video, std::unique_ptr<PacketPort> port,
              std::chrono::milliseconds pause);

  [[nodiscard]] std::uint32_t number() const { return number_; }
  // What the next play() sends instead of the video stream.
  void load(std::unique_ptr<PictureSource> source) { source_ = std::move(source); }
  // Starts with the first picture, unless it plays already or the video stream has no picture as it is set.
  void play();
  void change_faults(PacketFaults faults) { sender_->change_faults(std::move(faults)); }
  // A request named the session: its time starts over.
  void touch();
  // Stops sending for good. The session leaves the camera's table, if it is still there.
  void end();

 private:
  std::shared_ptr<CameraState> state_;
  const std::uint32_t number_;
  const int video_;
  const std::shared_ptr<RtpSender> sender_;
  const std::chrono::milliseconds pause_;
  std::unique_ptr<PictureSource> source_;  // null: the video stream's
  asio::steady_timer expiry_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_RTSP_SESSION_H_

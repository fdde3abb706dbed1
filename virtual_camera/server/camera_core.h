// SPDX-License-Identifier: Apache-2.0
// A running camera: its two ports, its sessions, its life cycle. Lives on the loop's thread.
#ifndef VIRTUAL_CAMERA_SERVER_CAMERA_CORE_H_
#define VIRTUAL_CAMERA_SERVER_CAMERA_CORE_H_

#include <asio/steady_timer.hpp>
#include <chrono>
#include <cstdint>
#include <deque>
#include <memory>
#include <string>

#include "virtual_camera/server/camera_control.h"
#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/server/card_recorder.h"
#include "virtual_camera/server/control_port.h"
#include "virtual_camera/server/listener.h"

namespace vexa::camera {

// Starts, stops and reboots one camera. Held by VirtualCamera and by its own handlers; every operation runs on the
// loop's thread, except that alarm parts may be added by any.
class CameraCore : public std::enable_shared_from_this<CameraCore> {
 public:
  explicit CameraCore(std::shared_ptr<CameraState> state);

  // Empty text on success, else what went wrong and what to do about it.
  [[nodiscard]] std::string start();
  void stop();
  void reboot(std::chrono::milliseconds away);
  // Pulls the network cable, or puts it back: without it the camera cannot be reached, and goes on by itself.
  void set_network(bool plugged);

  [[nodiscard]] const std::shared_ptr<CameraState>& state() const { return state_; }
  [[nodiscard]] std::uint16_t http_port() const { return http_->port(); }
  [[nodiscard]] std::uint16_t rtsp_port() const { return rtsp_->port(); }
  [[nodiscard]] std::uint16_t control_port() const { return control_port_->port(); }
  [[nodiscard]] CameraControl& control() { return *control_; }
  [[nodiscard]] bool plugged() const { return plugged_; }

 private:
  class AlarmParts;

  [[nodiscard]] std::string prepare();
  [[nodiscard]] std::string open_ports();
  void vanish();
  void vanish_for(std::chrono::milliseconds away);
  void come_back();
  void spread_alarms();
  void take_calls();
  void send_alarm_parts(const std::deque<std::string>& parts);

  std::shared_ptr<CameraState> state_;
  std::shared_ptr<Listener> http_;
  std::shared_ptr<Listener> rtsp_;
  std::shared_ptr<CameraControl> control_;
  std::shared_ptr<ControlPort> control_port_;
  std::shared_ptr<CardRecorder> recorder_;
  asio::steady_timer back_;
  bool running_ = false;
  bool plugged_ = true;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_CAMERA_CORE_H_

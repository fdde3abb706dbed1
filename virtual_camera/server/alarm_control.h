// SPDX-License-Identifier: Apache-2.0
// The port by which a person or a test makes things happen around a camera, on the loopback address alone:
//   GET /contact/NUMBER/close or open, /lens/cover or free, /noise/on or off, /motion/WINDOW/VALUE,
//   /walk, /walk/SECONDS, /network/unplug or plug
#ifndef VIRTUAL_CAMERA_SERVER_ALARM_CONTROL_H_
#define VIRTUAL_CAMERA_SERVER_ALARM_CONTROL_H_

#include <asio/error_code.hpp>
#include <asio/ip/tcp.hpp>
#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/scene/alarm_scene.h"
#include "virtual_camera/server/intruder_watch.h"
#include "virtual_camera/server/listener.h"

namespace vexa::camera {

struct CameraState;

// The event that a path of the control port causes; none for a path that it does not know.
[[nodiscard]] std::optional<AlarmEvent> control_event(std::string_view path);
// How long the intruder walks whom a path sends through the scene; none for another path.
[[nodiscard]] std::optional<std::chrono::seconds> control_walk(std::string_view path);

// Held by the camera's core; on the loop's thread. It takes no credentials, and so listens on the loopback address
// alone.
class AlarmControl : public std::enable_shared_from_this<AlarmControl> {
 public:
  explicit AlarmControl(std::shared_ptr<CameraState> state);

  // Port 0 takes any free one.
  [[nodiscard]] asio::error_code open(std::uint16_t port);
  void close();
  [[nodiscard]] std::uint16_t port() const { return listener_ ? listener_->port() : std::uint16_t{0}; }

 private:
  struct Visit;

  void take(const std::shared_ptr<Visit>& visit);
  std::string_view answer(const std::string& request);

  std::shared_ptr<CameraState> state_;
  std::shared_ptr<Listener> listener_;  // null until the first open()
  std::shared_ptr<IntruderWatch> watch_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_ALARM_CONTROL_H_

// SPDX-License-Identifier: Apache-2.0
// What a person or a test makes happen around one camera, as a path: "/lens/cover", "/network/unplug", "/walk" ...
#ifndef VIRTUAL_CAMERA_SERVER_CAMERA_CONTROL_H_
#define VIRTUAL_CAMERA_SERVER_CAMERA_CONTROL_H_

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/scene/alarm_scene.h"
#include "virtual_camera/server/intruder_watch.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

struct CameraState;

// The event that a path causes; none for a path that it does not know.
[[nodiscard]] std::optional<AlarmEvent> control_event(std::string_view path);
// How long the intruder walks whom a path sends through the scene; none for another path.
[[nodiscard]] std::optional<std::chrono::seconds> control_walk(std::string_view path);
// How long a camera is away that a path reboots; none for another path.
[[nodiscard]] std::optional<std::chrono::seconds> control_reboot(std::string_view path);

// A line for each path, with what happens.
[[nodiscard]] std::string_view control_list();

// Held by the camera's core; on the loop's thread.
class CameraControl {
 public:
  explicit CameraControl(std::shared_ptr<CameraState> state);

  // Makes it happen. The status of the answer: "204 No Content", 400 where this camera cannot, 404 for another path.
  [[nodiscard]] std::string_view obey(std::string_view path, std::string_view query);
  // The whole answer of a port that controls this camera alone.
  [[nodiscard]] std::string answer(const RequestHead& request);
  void stop();

 private:
  [[nodiscard]] bool change_packet_faults(std::string_view query);
  [[nodiscard]] bool add_request_fault(std::string_view word, std::string_view query);
  void clear_faults();

  std::shared_ptr<CameraState> state_;
  std::shared_ptr<IntruderWatch> watch_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_CAMERA_CONTROL_H_

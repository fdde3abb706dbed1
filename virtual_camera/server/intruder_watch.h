// SPDX-License-Identifier: Apache-2.0
// Walks an intruder through the scene and sets off the detection windows in which the camera sees the figure.
#ifndef VIRTUAL_CAMERA_SERVER_INTRUDER_WATCH_H_
#define VIRTUAL_CAMERA_SERVER_INTRUDER_WATCH_H_

#include <array>
#include <asio/steady_timer.hpp>
#include <chrono>
#include <memory>

#include "virtual_camera/scene/detection_windows.h"

namespace vexa::camera {

struct CameraState;

// Held by the camera's core and its timer; on the loop's thread.
class IntruderWatch : public std::enable_shared_from_this<IntruderWatch> {
 public:
  explicit IntruderWatch(std::shared_ptr<CameraState> state);

  // Across the picture of the present pose, which may change meanwhile; a walk under way gives way to it.
  void walk(std::chrono::milliseconds duration);
  // The intruder is gone.
  void stop();

 private:
  void check();
  void report(const std::array<bool, kDetectionWindows>& seen);

  std::shared_ptr<CameraState> state_;
  asio::steady_timer pace_;
  std::array<bool, kDetectionWindows> seen_{};
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_INTRUDER_WATCH_H_

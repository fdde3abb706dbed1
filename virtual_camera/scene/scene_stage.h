// SPDX-License-Identifier: Apache-2.0
// Who is about in the scene that a camera sees.
#ifndef VIRTUAL_CAMERA_SCENE_SCENE_STAGE_H_
#define VIRTUAL_CAMERA_SCENE_SCENE_STAGE_H_

#include <chrono>
#include <mutex>
#include <optional>

#include "virtual_camera/scene/scene_geometry.h"

namespace vexa::camera {

// Holds the intruder, if there is one. Owned by the camera's state; thread-safe.
class SceneStage {
 public:
  using Time = std::chrono::steady_clock::time_point;

  // Somebody walks; whoever walked before is gone.
  void enter(const Walk& walk, Time begin) {
    const std::lock_guard<std::mutex> lock(mutex_);
    walk_ = walk;
    begin_ = begin;
  }
  // Nobody before a walk begins and after it ends.
  [[nodiscard]] std::optional<Intruder> intruder(Time now) const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return walker(walk_, std::chrono::duration_cast<std::chrono::milliseconds>(now - begin_));
  }

 private:
  mutable std::mutex mutex_;
  Walk walk_;
  Time begin_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_SCENE_STAGE_H_

#include "virtual_camera/scene/scene_stage.h"

namespace vexa::camera {

void SceneStage::enter(const Walk& walk, Time begin) {
  const std::lock_guard<std::mutex> lock(mutex_);
  walk_ = walk;
  begin_ = begin;
}

std::optional<Intruder> SceneStage::intruder(Time now) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return walker(walk_, std::chrono::duration_cast<std::chrono::milliseconds>(now - begin_));
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
// Virtual cameras whose faults change under way.
#pragma once

#include <atomic>
#include <cstddef>
#include <deque>
#include <random>
#include <string>
#include <unordered_set>

#include "virtual_camera/virtual_camera.h"

namespace vexa_test {

/// All stream the same clip. None of their faults changes a picture's bytes, so that each frame a host gets is one of
/// the clip's pictures.
class ChaosCameras {
 public:
  static constexpr std::size_t kCount = 3;

  ChaosCameras();

  [[nodiscard]] bool start();
  [[nodiscard]] vexa::camera::VirtualCamera& at(std::size_t camera) { return cameras_[camera % kCount]; }
  /// Whether the bytes are those of a picture of the clip. Any thread, once the cameras have started.
  [[nodiscard]] bool sends(const std::string& frame) const { return pictures_.count(frame) != 0; }

  /// Another fault of one of them, drawn by `random`. One thread.
  void change(std::mt19937& random);
  /// Well again, all of them.
  void heal();

 private:
  std::deque<vexa::camera::VirtualCamera> cameras_;
  bool unplugged_[kCount] = {};
  std::unordered_set<std::string> pictures_;
};

}  // namespace vexa_test

// SPDX-License-Identifier: Apache-2.0
// The direction of a camera, and how its pictures report it.
#ifndef VIRTUAL_CAMERA_PTZ_CAMERA_POSE_H_
#define VIRTUAL_CAMERA_PTZ_CAMERA_POSE_H_

#include <chrono>
#include <functional>
#include <string>

namespace vexa::camera {

// A value: the pose at one moment.
struct CameraPose {
  double pan = 0;                // degrees, clockwise seen from above
  double tilt = 0;               // degrees, upwards
  double horizontal_angle = 60;  // degrees that the picture spans
  std::string user_data;         // what the picture carries as its position, "CamPos: ..."; empty: nothing
};

// A flag in the scene at the place that a preset holds.
struct PresetMark {
  int number = 1;
  double pan = 0;  // degrees, as those of a pose
  double tilt = 0;
};

// Any thread.
using PoseSource = std::function<CameraPose(std::chrono::steady_clock::time_point)>;

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PTZ_CAMERA_POSE_H_

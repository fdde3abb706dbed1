// What a running camera sees at a moment.
#ifndef VIRTUAL_CAMERA_SCENE_LIVE_SCENE_H_
#define VIRTUAL_CAMERA_SCENE_LIVE_SCENE_H_

#include <array>
#include <chrono>

#include "virtual_camera/scene/detection_windows.h"
#include "virtual_camera/scene/scene.h"
#include "virtual_camera/server/camera_state.h"

namespace vexa::camera {

// All may be called by any thread.

// From its pose, in a picture of this size; a camera that does not know where it looks, looks north at 60 degrees.
[[nodiscard]] View view_of(const CameraState& state, PictureSize size, std::chrono::steady_clock::time_point now);
// In the pictures of its first stream.
[[nodiscard]] View main_view_of(const CameraState& state, std::chrono::steady_clock::time_point now);
// With the clock of the system.
[[nodiscard]] SceneMoment moment_of(const CameraState& state, std::chrono::steady_clock::time_point now);
// The windows in which it sees the intruder; through a covered lens it sees nobody.
[[nodiscard]] std::array<bool, kDetectionWindows> alarmed_windows(const CameraState& state,
                                                                  std::chrono::steady_clock::time_point now);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_LIVE_SCENE_H_

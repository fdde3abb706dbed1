// SPDX-License-Identifier: Apache-2.0
// What a running camera sees at a moment.
#ifndef VIRTUAL_CAMERA_SCENE_LIVE_SCENE_H_
#define VIRTUAL_CAMERA_SCENE_LIVE_SCENE_H_

#include <array>
#include <chrono>
#include <optional>
#include <utility>

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/ptz/camera_pose.h"
#include "virtual_camera/ptz/ptz_head.h"
#include "virtual_camera/scene/alarm_scene.h"
#include "virtual_camera/scene/detection_windows.h"
#include "virtual_camera/scene/scene.h"
#include "virtual_camera/scene/scene_stage.h"

namespace vexa::camera {

// Reads the camera's settings, its pose and what happens around it whenever it is asked; it changes none of them. Any
// thread.
class LiveScene {
 public:
  using Time = std::chrono::steady_clock::time_point;

  // All that it is given outlives it. An empty `pose`: the camera's direction is not known; the scene is then shown to
  // the north at 60 degrees. `ptz` is null for a camera that does not move.
  LiveScene(const SettingsStore& settings, const AlarmScene& alarms, const SceneStage& stage, PoseSource pose,
            PtzHead* ptz)
      : settings_(settings), alarms_(alarms), stage_(stage), pose_(std::move(pose)), ptz_(ptz) {}
  LiveScene(const LiveScene&) = delete;
  LiveScene& operator=(const LiveScene&) = delete;

  // nullopt for a camera whose direction is not known.
  [[nodiscard]] std::optional<CameraPose> pose(Time now) const;
  // In a picture of this size.
  [[nodiscard]] View view(PictureSize size, Time now) const;
  // In the pictures of the first stream.
  [[nodiscard]] View main_view(Time now) const;
  // With the clock of the system.
  [[nodiscard]] SceneMoment moment(Time now) const;
  // The windows in which the camera sees the intruder; through a covered lens it sees nobody.
  [[nodiscard]] std::array<bool, kDetectionWindows> alarmed_windows(Time now) const;

 private:
  [[nodiscard]] std::optional<int> watching_setting(const CameraPose& pose) const;

  const SettingsStore& settings_;
  const AlarmScene& alarms_;
  const SceneStage& stage_;
  const PoseSource pose_;
  PtzHead* const ptz_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_LIVE_SCENE_H_

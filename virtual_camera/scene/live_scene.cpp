// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/live_scene.h"

#include <cmath>

#include "virtual_camera/model/settings_store.h"

namespace vexa::camera {

// The number of the setting that applies: where settings belong to presets, that of the preset at which the camera
// stands, and none between presets.
std::optional<int> LiveScene::watching_setting(const CameraPose& pose) const {
  constexpr double kNear = 0.1;  // degrees
  if (ptz_ == nullptr || settings_.get("objectdetection", "PositionMode") != "preset") return kPresentView;
  for (const PresetMark& mark : ptz_->preset_marks()) {
    const bool there = std::abs(turn_between(mark.pan, pose.pan)) < kNear && std::abs(mark.tilt - pose.tilt) < kNear;
    if (there) return mark.number;
  }
  return std::nullopt;
}

std::optional<CameraPose> LiveScene::pose(Time now) const {
  return pose_ ? std::optional<CameraPose>(pose_(now)) : std::nullopt;
}

View LiveScene::view(PictureSize size, Time now) const {
  View view;
  if (pose_) view.pose = pose_(now);
  view.size = size;
  view.rotated = settings_.get("camera", "Eflip") == "on";
  return view;
}

View LiveScene::main_view(Time now) const {
  constexpr PictureSize kUsual{1920, 1080};
  const auto stream = stream_settings(settings_, 1);
  const bool known = stream && stream->width > 0 && stream->height > 0;
  return view(known ? PictureSize{stream->width, stream->height} : kUsual, now);
}

SceneMoment LiveScene::moment(Time now) const {
  SceneMoment moment;
  moment.clock = clock_of(std::chrono::system_clock::now());
  moment.intruder = stage_.intruder(now);
  moment.covered = alarms_.lens_covered();
  if (ptz_ != nullptr) moment.presets = ptz_->preset_marks();
  return moment;
}

std::array<bool, kDetectionWindows> LiveScene::alarmed_windows(Time now) const {
  const std::optional<Intruder> intruder = stage_.intruder(now);
  if (!intruder || alarms_.lens_covered()) return {};
  const View view = main_view(now);
  const PictureBox figure = box_of(*intruder, view);
  if (alarms_.detection() == "lod") return windows_with(figure, whole_picture());
  const std::optional<int> number = watching_setting(view.pose);
  if (!number) return {};
  return windows_with(figure, detection_setting(settings_, *number, view.size));
}

}  // namespace vexa::camera

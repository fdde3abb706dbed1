#include "virtual_camera/scene/live_scene.h"

#include <cmath>
#include <optional>

#include "virtual_camera/source/stream_plan.h"

namespace vexa::camera {
namespace {

// Whose setting watches: where settings belong to presets, that of the preset at which the camera stands, and none
// between them.
std::optional<int> watching_setting(const CameraState& state, const CameraPose& pose) {
  constexpr double kNear = 0.1;  // degrees
  if (!state.ptz || state.settings.get("objectdetection", "PositionMode") != "preset") return kPresentView;
  for (const PresetMark& mark : state.ptz->preset_marks()) {
    const bool there = std::abs(turn_between(mark.pan, pose.pan)) < kNear && std::abs(mark.tilt - pose.tilt) < kNear;
    if (there) return mark.number;
  }
  return std::nullopt;
}

}  // namespace

View view_of(const CameraState& state, PictureSize size, std::chrono::steady_clock::time_point now) {
  View view;
  if (state.pose) view.pose = state.pose(now);
  view.size = size;
  view.rotated = state.settings.get("camera", "Eflip") == "on";
  return view;
}

View main_view_of(const CameraState& state, std::chrono::steady_clock::time_point now) {
  constexpr PictureSize kUsual{1920, 1080};
  const auto stream = stream_settings(state.settings, 1);
  const bool known = stream && stream->width > 0 && stream->height > 0;
  return view_of(state, known ? PictureSize{stream->width, stream->height} : kUsual, now);
}

SceneMoment moment_of(const CameraState& state, std::chrono::steady_clock::time_point now) {
  SceneMoment moment;
  moment.clock = clock_of(std::chrono::system_clock::now());
  moment.intruder = state.stage.intruder(now);
  moment.covered = state.alarms.lens_covered();
  if (state.ptz) moment.presets = state.ptz->preset_marks();
  return moment;
}

std::array<bool, kDetectionWindows> alarmed_windows(const CameraState& state,
                                                    std::chrono::steady_clock::time_point now) {
  const std::optional<Intruder> intruder = state.stage.intruder(now);
  if (!intruder || state.alarms.lens_covered()) return {};
  const View view = main_view_of(state, now);
  const PictureBox figure = box_of(*intruder, view);
  if (state.alarms.detection() == "lod") return windows_with(figure, whole_picture());
  const std::optional<int> number = watching_setting(state, view.pose);
  if (!number) return {};
  return windows_with(figure, detection_setting(state.settings, *number, view.size));
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
// A camera's moving head: its motors, presets and tours on one clock, and its direction at any time. There is no
// timer: what tours have done meanwhile is caught up with whenever somebody asks.
#ifndef VIRTUAL_CAMERA_PTZ_PTZ_HEAD_H_
#define VIRTUAL_CAMERA_PTZ_PTZ_HEAD_H_

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/ptz/camera_pose.h"
#include "virtual_camera/ptz/preset_section.h"
#include "virtual_camera/ptz/ptz_command.h"
#include "virtual_camera/ptz/ptz_mechanism.h"

namespace vexa::camera {

// A running tour: what it does next, and when.
struct PtzProgram {
  enum class Kind { kCamera, kShadow, kPreview };

  Kind kind = Kind::kCamera;
  ShadowTour shadow;     // of the shadow kinds
  std::size_t step = 0;  // in the sequence or among the orders
  double due = 0;
  double origin = 0;  // what a shadow tour's orders count from
  double lap = 0;     // the beginning of the present one
  int laps = 0;
};
// A shadow tour that is being recorded.
struct PtzRecording {
  std::string letter;
  double began = 0;
  ShadowTour made;
};

// Owned by the camera's state; thread-safe. Each operation first brings motors and tours up to its own moment.
class PtzHead {
 public:
  using Time = std::chrono::steady_clock::time_point;
  using Pairs = PresetSection::Pairs;

  // `pace` is how much faster than life it moves and tours, above 0.
  PtzHead(const PtzProfile& profile, Time start, double pace);

  // The settings of a "/command/ptzf.cgi" or a "/command/presetposition.cgi"; all are obeyed or none: false.
  [[nodiscard]] bool move(const Pairs& commands, const PtzPicture& picture, Time now);
  [[nodiscard]] bool command_presets(const Pairs& commands, Time now);
  // The section "presetposition".
  [[nodiscard]] Pairs preset_settings(Time now);

  // Its direction, and the text that reports it to hosts; in a turned picture positions are reported negated, as a host
  // counts them that turns them back.
  [[nodiscard]] CameraPose pose(bool turned, Time now);
  [[nodiscard]] PtzPlace place(Time now);
  // The directions of the presets, in the order of their numbers.
  [[nodiscard]] std::vector<PresetMark> preset_marks();

 private:
  [[nodiscard]] double catch_up(Time now);
  [[nodiscard]] double at_rest(double now) const { return std::max(now, mechanism_.rests_from()); }
  void begin_program(double due);
  void resume_later(double now);
  void begin_lap();
  void step_camera_tour();
  void step_shadow_tour();
  void obey_by_hand(const PtzOrder& order, double now);
  void keep_recording(double now);

  [[nodiscard]] bool set_preset(std::string_view value, double now);
  [[nodiscard]] bool call_preset(std::string_view value, double now);
  [[nodiscard]] bool clear_preset(std::string_view value, double now);
  [[nodiscard]] bool record(std::string_view value, double now);
  [[nodiscard]] bool preview(std::string_view value, double now);
  [[nodiscard]] bool set_tours(const Pairs& settings, double now);

  std::mutex mutex_;
  PtzMechanism mechanism_;
  PresetSection section_;
  Time start_;
  double pace_;
  double latest_ = 0;  // seconds from the start, at the pace; never falls
  std::optional<PtzProgram> program_;
  std::optional<PtzRecording> recording_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PTZ_PTZ_HEAD_H_

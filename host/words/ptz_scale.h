// SPDX-License-Identifier: Apache-2.0
// Directions, degrees and magnifications in the scales that the driver takes.
#ifndef HOST_WORDS_PTZ_SCALE_H_
#define HOST_WORDS_PTZ_SCALE_H_

#include <optional>
#include <string>

#include "vexa/models.h"

namespace vexa::host {

inline constexpr int kLargestPosition = 10000;  // of the driver's scales: positions from 0, speeds from minus this

// One axis of a camera, as its profile describes it.
struct PtzAxis {
  int span;         // camera units over the angle range
  int angle_range;  // degrees
  int origin;       // camera position at the driver's position 0
  int offset;       // camera position at 0 degrees

  [[nodiscard]] double degrees_at(int position) const;
  // The driver's position that comes nearest; none when the axis does not turn so far, or is not known.
  [[nodiscard]] std::optional<int> position_at(double degrees) const;
  // "-90 to 90", in degrees.
  [[nodiscard]] std::string range_text() const;
};

[[nodiscard]] PtzAxis pan_axis(const Profile& profile);
[[nodiscard]] PtzAxis tilt_axis(const Profile& profile);

// The driver's zoom position of a magnification; none when the lens does not reach it.
[[nodiscard]] std::optional<int> zoom_position_at(double magnification, const Profile& profile);
// "1 to 18"
[[nodiscard]] std::string zoom_range_text(const Profile& profile);

// A status in degrees.
struct PtzView {
  double pan = 0;
  double tilt = 0;
  double horizontal_angle = 0;
  double vertical_angle = 0;
  double magnification = 0;
  bool moving = false;

  [[nodiscard]] bool operator==(const PtzView&) const = default;
};

[[nodiscard]] PtzView view_of(const SLibDPTZStatus& status, const Profile& profile);

}  // namespace vexa::host

#endif  // HOST_WORDS_PTZ_SCALE_H_

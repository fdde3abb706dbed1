// SPDX-License-Identifier: Apache-2.0
// Which direction of the scene falls where in a picture: the scene is a panorama, unrolled, so that degrees are equally
// long everywhere. Pure functions of the pose.
#ifndef VIRTUAL_CAMERA_SCENE_SCENE_GEOMETRY_H_
#define VIRTUAL_CAMERA_SCENE_SCENE_GEOMETRY_H_

#include <chrono>
#include <optional>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/ptz/camera_pose.h"

namespace vexa::camera {

struct View {
  CameraPose pose;
  PictureSize size;      // pixels
  bool rotated = false;  // by 180 degrees, as the setting "Eflip" has it
};

// Degrees from `from` to `to` the shorter way: -180 to below 180, clockwise above 0.
[[nodiscard]] double turn_between(double from, double to);

// One view of the scene; a value. Angles that are no numbers count as 0, and a tilt ends at a full turn; the picture
// spans 0.1 to 360 degrees.
class Projection {
 public:
  explicit Projection(const View& view);

  // Pixels from the picture's left and upper edge, fractions included; outside the picture too.
  [[nodiscard]] double column(double bearing) const;
  [[nodiscard]] double row(double elevation) const;
  // The bearing from 0 to below 360, and the elevation, in degrees.
  [[nodiscard]] double bearing(double column) const;
  [[nodiscard]] double elevation(double row) const;
  [[nodiscard]] double pixels_per_degree() const { return scale_ < 0 ? -scale_ : scale_; }

 private:
  double pan_;
  double tilt_;
  double scale_;  // pixels per degree, below 0 in a rotated picture
  double middle_column_;
  double middle_row_;
};

// Somebody who stands in the scene.
struct Intruder {
  double bearing = 0;  // of the figure's middle, in degrees
  double feet = 0;     // their elevation, in degrees
  double height = 0;   // degrees
  double steps = 0;    // made so far; the legs follow its fraction

  [[nodiscard]] double width() const { return height * 0.4; }  // degrees
};

// A rectangle in units of 1/10000 of the picture's sides, as detection windows have them.
struct PictureBox {
  double left = 0;
  double top = 0;
  double right = 0;
  double bottom = 0;
};

// The place of the figure in the picture, also outside of it.
[[nodiscard]] PictureBox box_of(const Intruder& intruder, const View& view);

// A straight path through the scene.
struct Walk {
  double from = 0;    // bearing at which it begins
  double turn = 0;    // degrees walked in all, clockwise above 0
  double feet = 0;    // elevation
  double height = 0;  // of the figure, in degrees
  std::chrono::milliseconds duration{0};
};

// From outside the picture's left edge to outside its right one, at a height at which the present pose sees the figure
// whole.
[[nodiscard]] Walk walk_through(const View& view, std::chrono::milliseconds duration);
// Nobody before the beginning and after the end.
[[nodiscard]] std::optional<Intruder> walker(const Walk& walk, std::chrono::milliseconds since_begin);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_SCENE_GEOMETRY_H_

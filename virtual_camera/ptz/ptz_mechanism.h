// SPDX-License-Identifier: Apache-2.0
// The motors of a camera that moves: pan, tilt, zoom and focus of a model, in the camera's units, on a clock that the
// caller counts in seconds.
#ifndef VIRTUAL_CAMERA_PTZ_PTZ_MECHANISM_H_
#define VIRTUAL_CAMERA_PTZ_PTZ_MECHANISM_H_

#include <array>
#include <cstddef>
#include <optional>
#include <utility>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/ptz/ptz_axis.h"

namespace vexa::camera {

enum class PtzMotor { kPan, kTilt, kZoom, kFocus };
constexpr std::size_t kPtzMotors = 4;

// Positions of the motors, in the order of PtzMotor.
using PtzPlace = std::array<int, kPtzMotors>;

// What one motor is to do. Speeds are shares of its full speed.
struct MotorOrder {
  enum class Kind { kRun, kGoTo };

  Kind kind = Kind::kRun;
  double speed = 0;  // of a run with its direction; 0 brakes
  int place = 0;     // to go to
};

// A part of the picture, in shares of its width and height.
struct PictureArea {
  double right = 0;  // of the picture's centre to the area's
  double down = 0;
  double size = 0;  // the larger of both shares that it spans; 0: as much as the picture
};

// One command of a host.
struct PtzOrder {
  std::array<std::optional<MotorOrder>, kPtzMotors> motors;
  std::optional<PictureArea> area;
  std::optional<double> zoom_by;  // share of the zoom's range

  std::optional<MotorOrder>& operator[](PtzMotor motor) { return motors[static_cast<std::size_t>(motor)]; }
};

// Carries out orders by running the four motors together. Owned by PtzHead, whose lock guards it; knows no presets and
// no tours.
class PtzMechanism {
 public:
  explicit PtzMechanism(PtzProfile profile);  // at rest, straight ahead, at the wide end

  void obey(const PtzOrder& order, double now);
  void brake(double now);

  [[nodiscard]] const PtzProfile& profile() const { return profile_; }
  [[nodiscard]] PtzPlace place(double now) const;
  [[nodiscard]] double rests_from() const;
  [[nodiscard]] bool looks_elsewhere(double now) const;  // pan, tilt or zoom is moving
  // Degrees: of the pan from its zero, of the tilt from the horizon, of what the picture spans from left to right.
  [[nodiscard]] double pan_degrees(double now) const;
  [[nodiscard]] double tilt_degrees(double now) const;
  [[nodiscard]] double horizontal_angle(double now) const;

 private:
  [[nodiscard]] PtzAxis& motor(PtzMotor which) { return motors_[static_cast<std::size_t>(which)]; }
  [[nodiscard]] const PtzAxis& motor(PtzMotor which) const { return motors_[static_cast<std::size_t>(which)]; }
  void show(const PictureArea& area, double now);

  PtzProfile profile_;
  std::array<PtzAxis, kPtzMotors> motors_;
};

// Straight to a place; pan and tilt at one of the speeds that they share.
[[nodiscard]] PtzOrder order_to(const PtzPlace& place, int speed, const PtzProfile& profile);

// The magnification at a zoom position, and the position of a magnification; between the points of the curve both are
// straight, outside they stay.
[[nodiscard]] double magnification_at(const PtzProfile& profile, double position);
[[nodiscard]] double position_of_magnification(const PtzProfile& profile, double magnification);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PTZ_PTZ_MECHANISM_H_

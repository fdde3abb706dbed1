// SPDX-License-Identifier: Apache-2.0
// One motor: runs and goes to places with limits, a greatest speed and inertia. Knows no clock: times are seconds that
// the caller counts, and never fall from one order to the next.
#ifndef VIRTUAL_CAMERA_PTZ_PTZ_AXIS_H_
#define VIRTUAL_CAMERA_PTZ_PTZ_AXIS_H_

#include <array>
#include <cstddef>

namespace vexa::camera {

// One motor of a mechanism, which owns it; guarded as the mechanism is. Computes positions when asked and has no timer.
class PtzAxis {
 public:
  struct Mechanics {
    double least = 0;         // position of the one end
    double most = 0;          // of the other
    double full_speed = 1;    // units a second, above 0
    double acceleration = 1;  // units a second squared, above 0
  };

  PtzAxis(const Mechanics& mechanics, double position);

  // Speeds are shares of the full speed. A run's sign is its direction; at 0 the motor brakes.
  void run(double now, double speed);
  void go_to(double now, double target, double speed);  // held within the ends

  [[nodiscard]] const Mechanics& mechanics() const { return mechanics_; }
  [[nodiscard]] double position(double now) const;
  [[nodiscard]] double rests_from() const;  // without another order
  [[nodiscard]] bool moves(double now) const { return now < rests_from(); }

 private:
  // From `begin` on, until the next leg begins.
  struct Leg {
    double begin = 0;
    double position = 0;
    double speed = 0;
    double acceleration = 0;
  };

  [[nodiscard]] const Leg& leg_at(double now) const;
  [[nodiscard]] Leg state_at(double now) const;
  void add_leg(double duration, double acceleration);
  void rest_at(double target);

  Mechanics mechanics_;
  std::array<Leg, 4> legs_{};  // the last of the used ones is at rest
  std::size_t used_ = 1;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PTZ_PTZ_AXIS_H_

// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/ptz/ptz_mechanism.h"

#include <algorithm>
#include <cmath>

namespace vexa::camera {
namespace {

// A motor whose ends are the same position never moves.
PtzAxis::Mechanics mechanics_of(int end, int other_end, const AxisTimes& times) {
  const double way = std::max(std::abs(other_end - end), 1);
  PtzAxis::Mechanics mechanics;
  mechanics.least = std::min(end, other_end);
  mechanics.most = std::max(end, other_end);
  mechanics.full_speed = way * 1000 / times.travel;
  mechanics.acceleration = mechanics.full_speed * 1000 / times.ramp;
  return mechanics;
}

PtzAxis turning_motor(const TurnProfile& turn) {
  return {mechanics_of(turn.origin, turn.end(), turn.times), static_cast<double>(turn.offset)};
}

PtzAxis lens_motor(const LensProfile& lens, double position) {
  return {mechanics_of(lens.min_position, lens.max_position, lens.times), position};
}

PtzAxis focus_motor(const std::optional<LensProfile>& focus) {
  if (!focus) return {PtzAxis::Mechanics{}, 0};
  const int middle = (focus->min_position + focus->max_position) / 2;
  return lens_motor(*focus, middle);
}

// Straight between two points.
double between(double at, double from, double to, double value, double other_value) {
  return from == to ? value : value + (other_value - value) * (at - from) / (to - from);
}

}  // namespace

PtzMechanism::PtzMechanism(PtzProfile profile)
    : profile_(std::move(profile)),
      motors_{turning_motor(profile_.pan), turning_motor(profile_.tilt),
              lens_motor(profile_.zoom, profile_.zoom.min_position), focus_motor(profile_.focus)} {}

void PtzMechanism::obey(const PtzOrder& order, double now) {
  for (std::size_t i = 0; i < kPtzMotors; ++i) {
    const std::optional<MotorOrder>& told = order.motors[i];
    if (!told) continue;
    if (told->kind == MotorOrder::Kind::kRun) {
      motors_[i].run(now, told->speed);
    } else {
      motors_[i].go_to(now, told->place, told->speed);
    }
  }
  if (order.zoom_by) {
    PtzAxis& zoom = motor(PtzMotor::kZoom);
    const double way = zoom.mechanics().most - zoom.mechanics().least;
    zoom.go_to(now, std::round(zoom.position(now) + *order.zoom_by * way), 1);
  }
  if (order.area) show(*order.area, now);
}

// The picture is narrow enough to count its angles as straight.
void PtzMechanism::show(const PictureArea& area, double now) {
  const double width = horizontal_angle(now);
  const double height = width * profile_.tilt.wide_angle / profile_.pan.wide_angle;
  PtzAxis& pan = motor(PtzMotor::kPan);
  PtzAxis& tilt = motor(PtzMotor::kTilt);
  pan.go_to(now, std::round(pan.position(now) + area.right * width / profile_.pan.degrees_of_unit()), 1);
  tilt.go_to(now, std::round(tilt.position(now) - area.down * height / profile_.tilt.degrees_of_unit()), 1);
  if (area.size <= 0) return;
  const double magnification = magnification_at(profile_, motor(PtzMotor::kZoom).position(now)) / area.size;
  motor(PtzMotor::kZoom).go_to(now, std::round(position_of_magnification(profile_, magnification)), 1);
}

void PtzMechanism::brake(double now) {
  for (PtzAxis& each : motors_) each.run(now, 0);
}

PtzPlace PtzMechanism::place(double now) const {
  PtzPlace place{};
  for (std::size_t i = 0; i < kPtzMotors; ++i) place[i] = static_cast<int>(std::lround(motors_[i].position(now)));
  return place;
}

double PtzMechanism::rests_from() const {
  double time = 0;
  for (const PtzAxis& each : motors_) time = std::max(time, each.rests_from());
  return time;
}

bool PtzMechanism::looks_elsewhere(double now) const {
  return motor(PtzMotor::kPan).moves(now) || motor(PtzMotor::kTilt).moves(now) || motor(PtzMotor::kZoom).moves(now);
}

double PtzMechanism::pan_degrees(double now) const {
  return motor(PtzMotor::kPan).position(now) * profile_.pan.degrees_of_unit();
}

double PtzMechanism::tilt_degrees(double now) const {
  return (motor(PtzMotor::kTilt).position(now) - profile_.tilt.offset) * profile_.tilt.degrees_of_unit();
}

double PtzMechanism::horizontal_angle(double now) const {
  return profile_.pan.wide_angle / magnification_at(profile_, motor(PtzMotor::kZoom).position(now));
}

PtzOrder order_to(const PtzPlace& place, int speed, const PtzProfile& profile) {
  const int fastest[kPtzMotors] = {profile.pan.max_speed, profile.tilt.max_speed, speed, speed};
  PtzOrder order;
  for (std::size_t i = 0; i < kPtzMotors; ++i) {
    order.motors[i] = MotorOrder{MotorOrder::Kind::kGoTo, static_cast<double>(speed) / fastest[i], place[i]};
  }
  return order;
}

double magnification_at(const PtzProfile& profile, double position) {
  const std::vector<ZoomPoint>& curve = profile.ratios;
  const auto above = std::find_if(curve.begin(), curve.end(),
                                  [position](const ZoomPoint& point) { return position <= point.position; });
  if (above == curve.end()) return curve.back().ratio;
  if (above == curve.begin()) return above->ratio;
  const ZoomPoint& below = *(above - 1);
  return between(position, below.position, above->position, below.ratio, above->ratio);
}

double position_of_magnification(const PtzProfile& profile, double magnification) {
  const std::vector<ZoomPoint>& curve = profile.ratios;
  const auto above = std::find_if(curve.begin(), curve.end(),
                                  [magnification](const ZoomPoint& point) { return magnification <= point.ratio; });
  if (above == curve.end()) return curve.back().position;
  if (above == curve.begin()) return above->position;
  const ZoomPoint& below = *(above - 1);
  return between(magnification, below.ratio, above->ratio, below.position, above->position);
}

}  // namespace vexa::camera

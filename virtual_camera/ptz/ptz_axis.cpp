// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/ptz/ptz_axis.h"

#include <algorithm>
#include <cmath>

namespace vexa::camera {

PtzAxis::PtzAxis(const Mechanics& mechanics, double position) : mechanics_(mechanics) {
  legs_[0].position = std::clamp(position, mechanics.least, mechanics.most);
}

const PtzAxis::Leg& PtzAxis::leg_at(double now) const {
  std::size_t at = used_ - 1;
  while (at > 0 && now < legs_[at].begin) --at;
  return legs_[at];
}

PtzAxis::Leg PtzAxis::state_at(double now) const {
  Leg state = leg_at(now);
  const double time = std::max(now - state.begin, 0.0);
  state.position += (state.speed + state.acceleration * time / 2) * time;
  state.speed += state.acceleration * time;
  state.begin = std::max(now, state.begin);
  return state;
}

double PtzAxis::position(double now) const {
  return std::clamp(state_at(now).position, mechanics_.least, mechanics_.most);
}

double PtzAxis::rests_from() const { return legs_[used_ - 1].begin; }

// The present leg ends after `duration`; until then it has this acceleration.
void PtzAxis::add_leg(double duration, double acceleration) {
  if (duration <= 0) return;
  legs_[used_ - 1].acceleration = acceleration;
  legs_[used_] = state_at(legs_[used_ - 1].begin + duration);
  legs_[used_].acceleration = 0;
  ++used_;
}

void PtzAxis::rest_at(double target) {
  legs_[used_ - 1].position = std::clamp(target, mechanics_.least, mechanics_.most);
  legs_[used_ - 1].speed = 0;
}

void PtzAxis::run(double now, double speed) {
  if (speed != 0) return go_to(now, speed > 0 ? mechanics_.most : mechanics_.least, std::abs(speed));
  Leg state = state_at(now);
  state.acceleration = 0;
  legs_[0] = state;
  used_ = 1;
  add_leg(std::abs(state.speed) / mechanics_.acceleration, -std::copysign(mechanics_.acceleration, state.speed));
  rest_at(legs_[used_ - 1].position);
}

// The quickest motion there: pull in the direction of the target as seen from where braking at once would end, run at
// the greatest speed where there is room for it, brake.
void PtzAxis::go_to(double now, double target, double speed) {
  target = std::clamp(target, mechanics_.least, mechanics_.most);
  const double pull = mechanics_.acceleration;
  const double greatest = std::min(speed, 1.0) * mechanics_.full_speed;
  Leg state = state_at(now);
  state.acceleration = 0;
  legs_[0] = state;
  used_ = 1;
  const double stands_at = state.position + state.speed * std::abs(state.speed) / (2 * pull);
  const double direction = target < stands_at ? -1 : 1;
  const double begin = direction * state.speed;  // from here on all speeds count in that direction
  const double way = direction * (target - state.position);
  const double peak = std::min(std::sqrt(std::max(pull * way + begin * begin / 2, 0.0)), greatest);
  const double ramp = std::abs(peak - begin) / pull;
  const double left = way - (begin + peak) / 2 * ramp - peak * peak / (2 * pull);
  add_leg(ramp, direction * std::copysign(pull, peak - begin));
  add_leg(peak > 0 ? left / peak : 0, 0);
  add_leg(peak / pull, -direction * pull);
  rest_at(target);
}

}  // namespace vexa::camera

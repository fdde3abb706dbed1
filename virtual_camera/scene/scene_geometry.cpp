// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/scene_geometry.h"

#include <algorithm>
#include <cmath>

namespace vexa::camera {
namespace {

constexpr double kCircle = 360;
constexpr double kNarrowest = 0.1;  // degrees that a picture spans at least
constexpr double kPictureUnits = 10000;

double finite_or_zero(double value) { return std::isfinite(value) ? value : 0; }

// From 0 to below 360; a remainder just below 0 would come out as 360.
double whole_turn(double degrees) {
  const double rest = std::fmod(degrees, kCircle);
  const double turned = rest < 0 ? rest + kCircle : rest;
  return turned < kCircle ? turned : 0;
}

}  // namespace

double turn_between(double from, double to) { return whole_turn(to - from + kCircle / 2) - kCircle / 2; }

Projection::Projection(const View& view)
    : pan_(finite_or_zero(view.pose.pan)),
      tilt_(std::clamp(finite_or_zero(view.pose.tilt), -kCircle, kCircle)),
      scale_(view.size.width / std::clamp(finite_or_zero(view.pose.horizontal_angle), kNarrowest, kCircle)),
      middle_column_(view.size.width / 2.0),
      middle_row_(view.size.height / 2.0) {
  if (view.rotated) scale_ = -scale_;
}

double Projection::column(double bearing) const { return middle_column_ + scale_ * turn_between(pan_, bearing); }

double Projection::row(double elevation) const { return middle_row_ - scale_ * (elevation - tilt_); }

double Projection::bearing(double column) const { return whole_turn(pan_ + (column - middle_column_) / scale_); }

double Projection::elevation(double row) const { return tilt_ - (row - middle_row_) / scale_; }

PictureBox box_of(const Intruder& intruder, const View& view) {
  const Projection projection(view);
  const double half_width = intruder.width() / 2 * projection.pixels_per_degree();
  const double middle = projection.column(intruder.bearing);
  const auto [top, bottom] =
      std::minmax({projection.row(intruder.feet), projection.row(intruder.feet + intruder.height)});
  const double across = kPictureUnits / view.size.width;
  const double down = kPictureUnits / view.size.height;
  return {(middle - half_width) * across, top * down, (middle + half_width) * across, bottom * down};
}

Walk walk_through(const View& view, std::chrono::milliseconds duration) {
  constexpr double kHeight = 0.4;  // of the picture's height
  constexpr double kMargin = 0.2;  // between the feet and the edge below, as the scene stands
  const Projection projection(view);
  const double picture_height = view.size.height / projection.pixels_per_degree();
  const double centre = projection.elevation(view.size.height / 2.0);
  Walk walk;
  walk.duration = duration;
  walk.height = kHeight * picture_height;
  walk.feet = centre - (0.5 - kMargin) * picture_height;
  const double span = view.size.width / projection.pixels_per_degree();
  const double way = std::min(span + Intruder{0, 0, walk.height, 0}.width(), kCircle);
  const double direction = view.rotated ? -1 : 1;
  walk.from = projection.bearing(view.size.width / 2.0) - direction * way / 2;
  walk.turn = direction * way;
  return walk;
}

std::optional<Intruder> walker(const Walk& walk, std::chrono::milliseconds since_begin) {
  constexpr double kStep = 0.4;  // of the figure's height
  if (since_begin.count() < 0 || since_begin > walk.duration || walk.duration.count() <= 0) return std::nullopt;
  const double walked =
      walk.turn * static_cast<double>(since_begin.count()) / static_cast<double>(walk.duration.count());
  return Intruder{whole_turn(walk.from + walked), walk.feet, walk.height, std::abs(walked) / (kStep * walk.height)};
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
#include "host/words/ptz_scale.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

namespace vexa::host {
namespace {

constexpr double kHalfSpans = 2.0 * kLargestPosition;  // the driver's scale covers half the span
constexpr double kStatusAngle = 1000;                  // a status has pan and tilt in thousandths of a degree
constexpr double kViewAngle = 10000;                   // and viewing angles in ten-thousandths

std::optional<int> on_scale(double position) {
  const double nearest = std::round(position);
  if (!(nearest >= 0 && nearest <= kLargestPosition)) return std::nullopt;
  return static_cast<int>(nearest);
}

}  // namespace

double PtzAxis::degrees_at(int position) const {
  if (span == 0) return 0;
  const double units = position * double{1} * span / kHalfSpans + origin - offset;
  return units * angle_range / span;
}

std::optional<int> PtzAxis::position_at(double degrees) const {
  if (span == 0 || angle_range == 0) return std::nullopt;
  const double units = degrees * span / angle_range + offset;
  return on_scale((units - origin) * kHalfSpans / span);
}

std::string PtzAxis::range_text() const {
  const auto [least, most] = std::minmax({degrees_at(0), degrees_at(kLargestPosition)});
  return fmt::format("{:.4g} to {:.4g}", least, most);
}

PtzAxis pan_axis(const Profile& profile) {
  const SLibDFixedPanTiltInfo& info = profile.control.panTilt;
  return {info.panSpan, info.panAngleRange, info.panOrigin, 0};
}

PtzAxis tilt_axis(const Profile& profile) {
  const SLibDFixedPanTiltInfo& info = profile.control.panTilt;
  return {info.tiltSpan, info.tiltAngleRange, info.tiltOrigin, info.tiltOffset};
}

std::optional<int> zoom_position_at(double magnification, const Profile& profile) {
  const SLibDFixedZoomInfo& zoom = profile.control.zoom;
  const auto& ratios = profile.zoomRatios;
  if (zoom.maxPosition == zoom.minPosition) return std::nullopt;
  for (std::size_t i = 0; i + 1 < ratios.size(); ++i) {
    const SLibDZoomRatioInt& from = ratios[i];
    const SLibDZoomRatioInt& to = ratios[i + 1];
    if (!(magnification >= from.ratio && magnification <= to.ratio) || from.ratio == to.ratio) continue;
    const double way = (magnification - from.ratio) / (to.ratio - from.ratio);
    const double position = from.position + way * (to.position - from.position);
    return on_scale((position - zoom.minPosition) * kLargestPosition / (zoom.maxPosition - zoom.minPosition));
  }
  return std::nullopt;
}

std::string zoom_range_text(const Profile& profile) {
  if (profile.zoomRatios.empty()) return "not known";
  return fmt::format("{} to {}", profile.zoomRatios.front().ratio, profile.zoomRatios.back().ratio);
}

PtzView view_of(const SLibDPTZStatus& status, const Profile& profile) {
  PtzView view{status.panPosition / kStatusAngle,
               status.tiltPosition / kStatusAngle,
               status.horizontalAngle / kViewAngle,
               status.verticalAngle / kViewAngle,
               0,
               status.moving};
  if (view.horizontal_angle > 0)
    view.magnification = profile.control.panTilt.horizontalWideAngle / view.horizontal_angle;
  return view;
}

}  // namespace vexa::host

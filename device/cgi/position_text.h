// SPDX-License-Identifier: Apache-2.0
// A camera's position: the text in its pictures, positions as angles, viewing angles by zoom.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "vexa/common_types.h"
#include "vexa/ptz_info.h"

namespace vexa {

/// The contents of a position text, in the camera's units.
struct CameraPosition {
  bool pan_valid = false;
  bool tilt_valid = false;
  bool zoom_valid = false;
  std::int16_t pan = 0;
  std::int16_t tilt = 0;
  int zoom = 0;
  bool moving = false;
};

/// Reads "CamPos: " with three flags and three numbers, and "M" after them while the camera moves.
std::optional<CameraPosition> read_position_text(const std::string& text);

/// The angle from `offset` to `position` in thousandths of a degree, where `span` steps are `angle_range` degrees;
/// the position itself for a span of 0.
int axis_angle(int position, int span, int angle_range, std::int64_t offset);

struct ViewingAngles {
  int horizontal;
  int vertical;
};

/// The viewing angles at a zoom position, in ten-thousandths of a degree. Nullopt without zoom ratios, or when a
/// wide-end angle or a ratio that is needed is 0.
std::optional<ViewingAngles> viewing_angles(const std::vector<SLibDZoomRatioInt>& ratios,
                                            const SLibDFixedPanTiltInfo& camera, int zoom);

}  // namespace vexa

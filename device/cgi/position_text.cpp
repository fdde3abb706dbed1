// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/position_text.h"

#include <algorithm>
#include <cstdio>
#include <limits>
#include <string_view>

#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr std::string_view kPositionMark = "CamPos: ";
constexpr std::size_t kShortestText = 23;
constexpr char kValid = '1';
constexpr char kMoving = 'M';
constexpr std::int64_t kRatioUnit = 10000;

// Safe: a product that 64 bits cannot hold becomes their limit, whatever numbers a profile has.
std::int64_t times(std::int64_t a, std::int64_t b) {
  constexpr std::int64_t kMost = std::numeric_limits<std::int64_t>::max();
  std::int64_t product = 0;
  if (!__builtin_mul_overflow(a, b, &product) && product >= -kMost) return product;
  return (a < 0) == (b < 0) ? kMost : -kMost;
}

/// A ratio of 0 is not known.
std::optional<std::int64_t> unless_zero(std::int64_t ratio) {
  return ratio == 0 ? std::nullopt : std::optional<std::int64_t>(ratio);
}

/// The magnification at a zoom position in units of 1/10000; nullopt when a ratio that is needed is 0.
std::optional<std::int64_t> magnification(const std::vector<SLibDZoomRatioInt>& ratios, int zoom) {
  if (zoom <= ratios.front().position) return unless_zero(ratios.front().ratio * kRatioUnit);
  if (zoom >= ratios.back().position) return unless_zero(ratios.back().ratio * kRatioUnit);
  const auto above =
      std::find_if(ratios.begin(), ratios.end(), [zoom](const auto& entry) { return entry.position >= zoom; });
  const SLibDZoomRatioInt& high = *above;
  const SLibDZoomRatioInt& low = *(above - 1);
  if (low.ratio == 0 || high.ratio == 0) return std::nullopt;
  const std::int64_t rise = (static_cast<std::int64_t>(high.ratio) - low.ratio) * kRatioUnit;
  const std::int64_t way = static_cast<std::int64_t>(zoom) - low.position;
  const std::int64_t distance = static_cast<std::int64_t>(high.position) - low.position;
  return unless_zero(low.ratio * kRatioUnit + times(rise, way) / distance);
}

}  // namespace

std::optional<CameraPosition> read_position_text(const std::string& text) {
  if (text.size() < kShortestText || text.compare(0, kPositionMark.size(), kPositionMark) != 0) return std::nullopt;
  char flags[4] = {};
  unsigned pan = 0;
  unsigned tilt = 0;
  unsigned zoom = 0;
  // Kept: blanks, signs and short numbers are taken as scanf takes them; some cameras pad with blanks.
  const int read = std::sscanf(text.c_str() + kPositionMark.size(), "%3s%4x%4x%4x", flags, &pan, &tilt, &zoom);
  if (read != 4) return std::nullopt;
  CameraPosition position;
  position.pan_valid = flags[0] == kValid;
  position.tilt_valid = flags[1] == kValid;
  position.zoom_valid = flags[2] == kValid;
  position.pan = static_cast<std::int16_t>(static_cast<std::uint16_t>(pan));
  position.tilt = static_cast<std::int16_t>(static_cast<std::uint16_t>(tilt));
  position.zoom = static_cast<int>(zoom);
  position.moving = text.size() > kShortestText && text[kShortestText] == kMoving;
  return position;
}

int axis_angle(int position, int span, int angle_range, std::int64_t offset) {
  if (span == 0) return position;
  // Safe: limited so that its sign can be changed, as for a picture upside down.
  return std::max(clamp_to_int(times(times(position - offset, angle_range), 1000) / span),
                  -std::numeric_limits<int>::max());
}

std::optional<ViewingAngles> viewing_angles(const std::vector<SLibDZoomRatioInt>& ratios,
                                            const SLibDFixedPanTiltInfo& camera, int zoom) {
  const std::int64_t wide = camera.horizontalWideAngle;
  if (ratios.empty() || wide == 0 || camera.verticalWideAngle == 0) return std::nullopt;
  const std::optional<std::int64_t> ratio = magnification(ratios, zoom);
  if (!ratio) return std::nullopt;
  const std::int64_t horizontal = wide * kRatioUnit * kRatioUnit / *ratio;
  const std::int64_t vertical = times(horizontal, camera.verticalWideAngle) / wide;
  return ViewingAngles{clamp_to_int(horizontal), clamp_to_int(vertical)};
}

}  // namespace vexa

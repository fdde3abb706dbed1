// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/ptz_text.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <optional>
#include <string>

#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr int kHostScale = 10000;
constexpr int kContinuousDivisor = 100;
constexpr int kWholeZoomStep = 4096;

/// The value cut to 16 bits in two's complement and widened back with its sign.
int cut_to_16_bits(long long value) { return static_cast<std::int16_t>(static_cast<std::uint16_t>(value)); }

// Counted in 64 bits throughout, so that no profile can overflow a product.
long long share(long long amount, long long whole) { return amount * whole / kHostScale; }

/// Takes the piece before the next comma; `rest` is then what follows it, nullopt after the last piece.
std::string_view take_piece(std::optional<std::string_view>& rest) {
  if (!rest) return {};
  const std::string_view piece = text_before(*rest, ',');
  rest = text_after(*rest, ",");
  return piece;
}

}  // namespace

bool is_host_speed(int speed) { return speed >= -kHostScale && speed <= kHostScale; }

bool is_host_position(int position) { return position >= 0 && position <= kHostScale; }

bool has_size(const SLibDResolutionInfo& picture) { return picture.width > 0 && picture.height > 0; }

int continuous_speed(int speed) { return speed / kContinuousDivisor; }

int move_speed(int speed, int largest) {
  // Safe: limited so that its sign can be changed, also for a largest speed that no camera has.
  return held_between(share(std::abs(speed), largest), -std::numeric_limits<int>::max(),
                      std::numeric_limits<int>::max());
}

ELibDPanTiltDirection direction_of(int pan, int tilt, ELibDPanTiltDirection direction) {
  if (tilt > 0) {
    return pan < 0 ? LIBD_DIRECTION_UP_LEFT : pan == 0 ? LIBD_DIRECTION_UP : LIBD_DIRECTION_UP_RIGHT;
  }
  if (tilt < 0) {
    return pan < 0 ? LIBD_DIRECTION_DOWN_LEFT : pan == 0 ? LIBD_DIRECTION_DOWN : LIBD_DIRECTION_DOWN_RIGHT;
  }
  if (pan == 0) return direction;
  return pan < 0 ? LIBD_DIRECTION_LEFT : LIBD_DIRECTION_RIGHT;
}

int recall_speed(const SLibDFixedPanTiltInfo& camera) { return std::min(camera.panMaxSpeed, camera.tiltMaxSpeed); }

int larger_amount(int pan, int tilt) { return clamp_to_int(std::max(std::llabs(pan), std::llabs(tilt))); }

int held_between(long long value, int least, int most) {
  return static_cast<int>(std::min<long long>(std::max<long long>(value, least), most));
}

int share_between(int amount, int least, int most) {
  const long long way = static_cast<long long>(most) - least;
  return held_between(least + share(std::llabs(amount), way), least, most);
}

int axis_position(int position, int span, int origin) {
  return cut_to_16_bits(static_cast<long long>(position) * span / (2LL * kHostScale) + origin);
}

int zoom_step(int step) { return cut_to_16_bits(static_cast<long long>(step) * kWholeZoomStep / 100); }

int centre_offset(int coordinate, int size) { return held_between(share(coordinate, size), 0, size - 1) - size / 2; }

int area_extent(int extent, int size) { return held_between(share(extent, size), 0, size); }

std::vector<SLibDPresetInfo> unnamed_presets(int count) {
  std::vector<SLibDPresetInfo> presets;
  // Safe: a negative count becomes no size.
  if (count > 0) presets.resize(static_cast<std::size_t>(count));
  for (std::size_t i = 0; i < presets.size(); ++i) presets[i].index = static_cast<std::int32_t>(i);
  return presets;
}

bool name_presets(std::string_view list, std::vector<SLibDPresetInfo>& presets) {
  std::optional<std::string_view> rest = list;
  while (rest) {
    const std::string_view number = take_piece(rest);
    const std::string_view name = take_piece(rest);
    if (number.empty() || name.empty()) return false;
    const long long index = leading_int(std::string(number)) - 1LL;
    if (index < 0 || index >= static_cast<long long>(presets.size())) return false;
    SLibDPresetInfo& preset = presets[static_cast<std::size_t>(index)];
    preset.index = static_cast<std::int32_t>(index);
    preset.name = name;
  }
  return true;
}

}  // namespace vexa

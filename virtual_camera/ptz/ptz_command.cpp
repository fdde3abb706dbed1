// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/ptz/ptz_command.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

using Words = std::vector<std::string_view>;
using Order = std::optional<PtzOrder>;
constexpr double kOwnPace = 0.5;  // of moves that leave the speed to the camera

MotorOrder running(double speed) { return {MotorOrder::Kind::kRun, speed, 0}; }
MotorOrder going(int place, double speed = 1) { return {MotorOrder::Kind::kGoTo, speed, place}; }

// Four hexadecimal digits, or eight that widen a negative number of 16 bits.
std::optional<int> hex_number(std::string_view text) {
  const auto number = whole_number<std::uint32_t>(text, 16);
  if (!number) return std::nullopt;
  if (text.size() == 8 && *number >= 0xFFFF8000) return static_cast<int>(*number - 0xFFFF8000) - 0x8000;
  return text.size() == 4 ? std::optional<int>(static_cast<int>(*number)) : std::nullopt;
}

std::optional<int> signed_hex(std::string_view text) {
  const std::optional<int> number = hex_number(text);
  return number && *number > INT16_MAX ? *number - 0x10000 : number;
}

std::optional<int> held(std::optional<int> number, int end, int other_end) {
  const auto [least, most] = std::minmax(end, other_end);
  return number && *number >= least && *number <= most ? number : std::nullopt;
}

Order turn(int right, int up, const Words& words, const PtzProfile& profile, bool turned) {
  const int fastest = std::max(profile.pan.max_speed, profile.tilt.max_speed);
  const auto speed = words.size() == 2 ? number_within(words[1], 0, fastest) : std::nullopt;
  if (!speed) return std::nullopt;
  const auto share = [&](const TurnProfile& axis) {
    const double pace = *speed == 0 ? kOwnPace : std::min(1.0, static_cast<double>(*speed) / axis.max_speed);
    return (axis.span < 0) == turned ? pace : -pace;
  };
  PtzOrder order;
  order[PtzMotor::kPan] = running(right * share(profile.pan));
  order[PtzMotor::kTilt] = running(up * share(profile.tilt));
  return order;
}

Order run_lens(PtzMotor motor, int direction, const Words& words, const LensProfile& lens) {
  const auto speed = words.size() == 2 ? number_within(words[1], lens.min_speed, lens.max_speed) : std::nullopt;
  if (!speed) return std::nullopt;
  PtzOrder order;
  order[motor] = running(direction * static_cast<double>(*speed) / lens.max_speed);
  return order;
}

Order stop(const Words& words, const PtzProfile& profile) {
  if (words.size() != 2) return std::nullopt;
  PtzOrder order;
  if (words[1] == "motor") order[PtzMotor::kPan] = order[PtzMotor::kTilt] = running(0);
  if (words[1] == "zoom") order[PtzMotor::kZoom] = running(0);
  if (words[1] == "focus" && profile.focus) order[PtzMotor::kFocus] = running(0);
  const bool known = std::any_of(order.motors.begin(), order.motors.end(), [](const auto& told) { return !!told; });
  return known ? Order(order) : std::nullopt;
}

// "WORD,SPEED" or "stop,MOTOR".
Order move(std::string_view value, const PtzProfile& profile, const PtzPicture& picture) {
  constexpr struct {
    std::string_view word;
    int right;
    int up;
  } kDirections[] = {{"up-left", -1, 1}, {"up", 0, 1},          {"up-right", 1, 1}, {"left", -1, 0},
                     {"right", 1, 0},    {"down-left", -1, -1}, {"down", 0, -1},    {"down-right", 1, -1}};
  const Words words = comma_pieces(value);
  for (const auto& direction : kDirections) {
    if (words[0] == direction.word) return turn(direction.right, direction.up, words, profile, picture.turned);
  }
  if (words[0] == "stop") return stop(words, profile);
  if (words[0] == "tele") return run_lens(PtzMotor::kZoom, 1, words, profile.zoom);
  if (words[0] == "wide") return run_lens(PtzMotor::kZoom, -1, words, profile.zoom);
  if (words[0] == "near" && profile.focus) return run_lens(PtzMotor::kFocus, 1, words, *profile.focus);
  if (words[0] == "far" && profile.focus) return run_lens(PtzMotor::kFocus, -1, words, *profile.focus);
  return std::nullopt;
}

// "PAN,TILT,ZOOM" in hundredths of the full speeds; an empty place leaves its motor alone.
Order continuous(std::string_view value, const PtzProfile& profile, const PtzPicture& picture) {
  constexpr int kFull = 100;
  const Words words = comma_pieces(value);
  if (!profile.continuous || words.size() != 3) return std::nullopt;
  const bool backwards[] = {(profile.pan.span < 0) != picture.turned, (profile.tilt.span < 0) != picture.turned, false};
  PtzOrder order;
  bool told = false;
  for (std::size_t i = 0; i < words.size(); ++i) {
    if (words[i].empty()) continue;
    const std::optional<int> speed = number_within(words[i], -kFull, kFull);
    if (!speed) return std::nullopt;
    order.motors[i] = running(static_cast<double>(backwards[i] ? -*speed : *speed) / kFull);
    told = true;
  }
  return told ? Order(order) : std::nullopt;
}

Order absolute_turn(std::string_view value, const PtzProfile& profile) {
  const Words words = comma_pieces(value);
  if (words.size() != 3) return std::nullopt;
  const auto pan = held(signed_hex(words[0]), profile.pan.origin, profile.pan.end());
  const auto tilt = held(signed_hex(words[1]), profile.tilt.origin, profile.tilt.end());
  const auto speed = number_within(words[2], 1, profile.shared_speed());
  if (!pan || !tilt || !speed) return std::nullopt;
  PtzOrder order;
  order[PtzMotor::kPan] = going(*pan, static_cast<double>(*speed) / profile.pan.max_speed);
  order[PtzMotor::kTilt] = going(*tilt, static_cast<double>(*speed) / profile.tilt.max_speed);
  return order;
}

Order absolute_lens(PtzMotor motor, std::string_view value, const LensProfile& lens) {
  const auto place = held(hex_number(value), lens.min_position, lens.max_position);
  if (!place) return std::nullopt;
  PtzOrder order;
  order[motor] = going(*place);
  return order;
}

// In 4096ths of the zoom's range.
Order relative_zoom(std::string_view value) {
  constexpr int kWhole = 4096;
  const auto step = held(signed_hex(value), -kWhole, kWhole);
  if (!step) return std::nullopt;
  PtzOrder order;
  order.zoom_by = static_cast<double>(*step) / kWhole;
  return order;
}

// "X,Y,WIDTH,HEIGHT,image1" in pixels, the first two from the picture's centre to the area's.
Order area(std::string_view value, const PtzPicture& picture) {
  const Words words = comma_pieces(value);
  const PictureSize size = picture.size;
  if (words.size() != 5 || words[4] != "image1" || size.width <= 0 || size.height <= 0) return std::nullopt;
  const auto right = number_within(words[0], -(size.width / 2), size.width / 2);
  const auto down = number_within(words[1], -(size.height / 2), size.height / 2);
  const auto width = number_within(words[2], 0, size.width);
  const auto height = number_within(words[3], 0, size.height);
  if (!right || !down || !width || !height) return std::nullopt;
  const double side = picture.turned ? -1 : 1;
  PictureArea shown;
  shown.right = side * *right / size.width;
  shown.down = side * *down / size.height;
  shown.size = std::max(static_cast<double>(*width) / size.width, static_cast<double>(*height) / size.height);
  PtzOrder order;
  order.area = shown;
  return order;
}

}  // namespace

std::vector<std::string_view> comma_pieces(std::string_view text) {
  std::vector<std::string_view> pieces;
  while (true) {
    const std::size_t comma = text.find(',');
    pieces.push_back(text.substr(0, comma));
    if (comma == std::string_view::npos) return pieces;
    text.remove_prefix(comma + 1);
  }
}

std::optional<int> number_within(std::string_view text, int least, int most) {
  return held(whole_number(text), least, most);
}

std::optional<PtzOrder> ptz_order(std::string_view key, std::string_view value, const PtzProfile& profile,
                                  const PtzPicture& picture) {
  if (key == "Move") return move(value, profile, picture);
  if (key == "ContinuousPanTiltZoom") return continuous(value, profile, picture);
  if (key == "AbsolutePanTilt") return absolute_turn(value, profile);
  if (key == "AbsoluteZoom") return absolute_lens(PtzMotor::kZoom, value, profile.zoom);
  if (key == "RelativeZoom") return relative_zoom(value);
  if (key == "AreaZoom") return area(value, picture);
  if (key == "AbsoluteFocus" && profile.focus) return absolute_lens(PtzMotor::kFocus, value, *profile.focus);
  return std::nullopt;
}

}  // namespace vexa::camera

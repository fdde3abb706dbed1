// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/detection_windows.h"

#include <fmt/format.h>

#include <algorithm>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/ptz/ptz_command.h"
#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

constexpr double kWholeSide = 10000;
constexpr PictureBox kWholePicture{0, 0, kWholeSide, kWholeSide};

// As many numbers as there are places, separated by commas.
template <std::size_t kPlaces>
std::optional<std::array<int, kPlaces>> numbers_of(const std::optional<std::string>& text) {
  if (!text) return std::nullopt;
  const std::vector<std::string_view> pieces = comma_pieces(*text);
  if (pieces.size() != kPlaces) return std::nullopt;
  std::array<int, kPlaces> numbers{};
  for (std::size_t i = 0; i < kPlaces; ++i) {
    const std::optional<int> number = whole_number(pieces[i]);
    if (!number) return std::nullopt;
    numbers[i] = *number;
  }
  return numbers;
}

// Reads the keys of one detection number, written by hosts with two digits and known with one as well.
class NumberedKeys {
 public:
  NumberedKeys(const SettingsStore& settings, int number) : settings_(settings), number_(number) {}

  [[nodiscard]] std::optional<std::string> get(const std::string& name) const {
    const auto value = settings_.get("objectdetection", fmt::format("Od{:02}{}", number_, name));
    return value ? value : settings_.get("objectdetection", fmt::format("Od{}{}", number_, name));
  }

 private:
  const SettingsStore& settings_;
  int number_;
};

// Nullopt for a window that was never set. One without a readable area is off.
std::optional<DetectionWindow> window_of(const NumberedKeys& keys, std::size_t place) {
  const std::string name = fmt::format("Win{}", place + 1);
  const auto state = keys.get(name);
  if (!state) return std::nullopt;
  const auto corners = numbers_of<4>(keys.get(name + "Area"));
  if (!corners) return DetectionWindow{};
  const auto [x1, y1, x2, y2] = *corners;
  const auto [left, right] = std::minmax(x1, x2);
  const auto [top, bottom] = std::minmax(y1, y2);
  return DetectionWindow{
      *state == "on",
      keys.get(name + "Mode") == "mask",
      {static_cast<double>(left), static_cast<double>(top), static_cast<double>(right), static_cast<double>(bottom)}};
}

DetectionWindow quarter(std::size_t place) {
  constexpr double kQuarter = kWholeSide / kDetectionWindows;
  const auto before = static_cast<double>(place);
  return {true, false, {before * kQuarter, 0, (before + 1) * kQuarter, kWholeSide}};
}

PictureBox common_part(const PictureBox& a, const PictureBox& b) {
  return {std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right), std::min(a.bottom, b.bottom)};
}

bool has_room(const PictureBox& box) { return box.left < box.right && box.top < box.bottom; }

bool holds_point(const PictureBox& box, double x, double y) {
  return box.left <= x && x < box.right && box.top <= y && y < box.bottom;
}

// Whether any part of a box is under no mask: masks have straight edges, so that where one point between two
// neighbouring edges is free, all are.
bool peeps_out(const PictureBox& box, const std::vector<PictureBox>& masks) {
  std::vector<double> columns = {box.left};
  std::vector<double> rows = {box.top};
  for (const PictureBox& mask : masks) {
    columns.push_back(std::clamp(mask.right, box.left, box.right));
    rows.push_back(std::clamp(mask.bottom, box.top, box.bottom));
  }
  const auto hidden = [&](double x, double y) {
    return std::any_of(masks.begin(), masks.end(), [&](const PictureBox& mask) { return holds_point(mask, x, y); });
  };
  for (const double x : columns) {
    for (const double y : rows) {
      if (holds_point(box, x, y) && !hidden(x, y)) return true;
    }
  }
  return false;
}

bool within_limits(double side, double least, double most) { return side >= least && (most <= 0 || side <= most); }

}  // namespace

DetectionSetting whole_picture() {
  DetectionSetting setting;
  setting.windows[0] = {true, false, kWholePicture};
  return setting;
}

DetectionSetting detection_setting(const SettingsStore& settings, int number, PictureSize size) {
  DetectionSetting setting;
  const NumberedKeys keys(settings, number);
  bool any = false;
  for (std::size_t i = 0; i < kDetectionWindows; ++i) {
    const auto window = window_of(keys, i);
    any = any || window;
    if (window) setting.windows[i] = *window;
  }
  for (std::size_t i = 0; !any && i < kDetectionWindows; ++i) setting.windows[i] = quarter(i);
  const double across = kWholeSide / size.width;
  const double down = kWholeSide / size.height;
  if (const auto least = numbers_of<2>(keys.get("MinObjectSize"))) {
    setting.least_width = (*least)[0] * across;
    setting.least_height = (*least)[1] * down;
  }
  if (const auto most = numbers_of<2>(keys.get("MaxObjectSize"))) {
    setting.most_width = (*most)[0] * across;
    setting.most_height = (*most)[1] * down;
  }
  return setting;
}

std::array<bool, kDetectionWindows> windows_with(const PictureBox& figure, const DetectionSetting& setting) {
  std::array<bool, kDetectionWindows> seen{};
  if (!within_limits(figure.right - figure.left, setting.least_width, setting.most_width)) return seen;
  if (!within_limits(figure.bottom - figure.top, setting.least_height, setting.most_height)) return seen;
  std::vector<PictureBox> masks;
  for (const DetectionWindow& window : setting.windows) {
    if (window.on && window.mask) masks.push_back(window.area);
  }
  const PictureBox visible = common_part(figure, kWholePicture);
  for (std::size_t i = 0; i < kDetectionWindows; ++i) {
    const DetectionWindow& window = setting.windows[i];
    const PictureBox part = common_part(visible, window.area);
    seen[i] = window.on && !window.mask && has_room(part) && peeps_out(part, masks);
  }
  return seen;
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
#include "host/picture/picture.h"

#include <algorithm>
#include <array>
#include <type_traits>

namespace vexa::host {
namespace {

using Colour = std::array<std::uint8_t, 3>;

constexpr std::size_t kWindowCount = std::extent_v<decltype(SLibDDetectionParam::windows)>;
constexpr std::array<Colour, kWindowCount> kColours{{{255, 64, 64}, {64, 255, 64}, {64, 160, 255}, {255, 224, 32}}};
constexpr Colour kDigitColour{0, 0, 0};

constexpr int kDigitWidth = 5;
constexpr int kDigitHeight = 7;
// 1 to 4, a row a number, its leftmost pixel the highest of five bits.
constexpr std::array<std::array<unsigned, kDigitHeight>, kWindowCount> kDigits{
    {{0x04, 0x0c, 0x04, 0x04, 0x04, 0x04, 0x0e},
     {0x0e, 0x11, 0x01, 0x02, 0x04, 0x08, 0x1f},
     {0x1f, 0x02, 0x04, 0x02, 0x01, 0x11, 0x0e},
     {0x02, 0x06, 0x0a, 0x12, 0x1f, 0x02, 0x02}}};

// Pixels, both corners within.
struct Box {
  int left;
  int top;
  int right;
  int bottom;
};

void paint(Picture& picture, int x, int y, const Colour& colour) {
  if (x < 0 || y < 0 || x >= picture.width || y >= picture.height) return;
  const auto place = std::size_t{3} * (static_cast<std::size_t>(y) * static_cast<std::size_t>(picture.width) +
                                       static_cast<std::size_t>(x));
  std::copy(colour.begin(), colour.end(), picture.rgb.begin() + static_cast<std::ptrdiff_t>(place));
}

void fill(Picture& picture, const Box& box, const Colour& colour) {
  for (int y = box.top; y <= box.bottom; ++y) {
    for (int x = box.left; x <= box.right; ++x) paint(picture, x, y, colour);
  }
}

int pixel_at(std::int32_t share, int size) {
  constexpr std::int64_t kWhole = 10000;
  const std::int64_t pixel = std::clamp<std::int64_t>(share, 0, kWhole) * size / kWhole;
  return static_cast<int>(std::min<std::int64_t>(pixel, size - 1));
}

Box box_of(const std::vector<SLibDCommonPosition>& area, const Picture& picture) {
  const auto [left, right] = std::minmax({pixel_at(area[0].x, picture.width), pixel_at(area[1].x, picture.width)});
  const auto [top, bottom] = std::minmax({pixel_at(area[0].y, picture.height), pixel_at(area[1].y, picture.height)});
  return {left, top, right, bottom};
}

void draw_frame(Picture& picture, const Box& box, int thickness, const Colour& colour) {
  const int most = thickness - 1;
  fill(picture, {box.left, box.top, box.right, std::min(box.top + most, box.bottom)}, colour);
  fill(picture, {box.left, std::max(box.bottom - most, box.top), box.right, box.bottom}, colour);
  fill(picture, {box.left, box.top, std::min(box.left + most, box.right), box.bottom}, colour);
  fill(picture, {std::max(box.right - most, box.left), box.top, box.right, box.bottom}, colour);
}

void draw_cross(Picture& picture, const Box& box, int thickness, const Colour& colour) {
  const int width = box.right - box.left;
  const int height = box.bottom - box.top;
  const int steps = std::max({width, height, 1});
  for (int step = 0; step <= steps; ++step) {
    const int x = static_cast<int>(std::int64_t{width} * step / steps);
    const int y = static_cast<int>(std::int64_t{height} * step / steps);
    for (const int top : {box.top + y, box.bottom - y}) {
      fill(picture, {box.left + x, top, box.left + x + thickness - 1, top}, colour);
    }
  }
}

// A digit of black on a patch of the window's colour, `scale` pixels a dot.
void draw_digit(Picture& picture, const Box& box, std::size_t window, int scale) {
  fill(picture, {box.left, box.top, box.left + (kDigitWidth + 2) * scale - 1, box.top + (kDigitHeight + 2) * scale - 1},
       kColours[window]);
  for (int row = 0; row < kDigitHeight; ++row) {
    for (int column = 0; column < kDigitWidth; ++column) {
      const unsigned bit = 1U << (kDigitWidth - 1 - column);
      if ((kDigits[window][static_cast<std::size_t>(row)] & bit) == 0) continue;
      const int x = box.left + (column + 1) * scale;
      const int y = box.top + (row + 1) * scale;
      fill(picture, {x, y, x + scale - 1, y + scale - 1}, kDigitColour);
    }
  }
}

}  // namespace

void draw_windows(Picture& picture, const SLibDDetectionParam& setting) {
  constexpr int kPictureHeightOfADot = 240;
  const int scale = std::max(1, picture.height / kPictureHeightOfADot);
  if (picture.width < 1 || picture.height < 1) return;
  for (std::size_t i = 0; i < kWindowCount; ++i) {
    const SLibDDetectionWindow& window = setting.windows[i];
    if (window.area.size() != 2) continue;
    if (window.area[0].x == window.area[1].x || window.area[0].y == window.area[1].y) continue;
    const Box box = box_of(window.area, picture);
    const int thin = std::max(1, scale / 2);
    draw_frame(picture, box, window.enabled == 1 ? 2 * scale : thin, kColours[i]);
    if (window.mode > 0) draw_cross(picture, box, thin, kColours[i]);
    draw_digit(picture, box, i, scale);
  }
}

}  // namespace vexa::host

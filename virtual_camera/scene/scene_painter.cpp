// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/scene_painter.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstring>

namespace vexa::camera {
namespace {

struct Glyph {
  char letter;
  std::array<std::uint8_t, kLetterHeight> rows;  // five dots each, the left one in bit 4
};

constexpr Glyph kGlyphs[] = {
    {'0', {0b01110, 0b10001, 0b10011, 0b10101, 0b11001, 0b10001, 0b01110}},
    {'1', {0b00100, 0b01100, 0b00100, 0b00100, 0b00100, 0b00100, 0b01110}},
    {'2', {0b01110, 0b10001, 0b00001, 0b00010, 0b00100, 0b01000, 0b11111}},
    {'3', {0b11111, 0b00010, 0b00100, 0b00010, 0b00001, 0b10001, 0b01110}},
    {'4', {0b00010, 0b00110, 0b01010, 0b10010, 0b11111, 0b00010, 0b00010}},
    {'5', {0b11111, 0b10000, 0b11110, 0b00001, 0b00001, 0b10001, 0b01110}},
    {'6', {0b00110, 0b01000, 0b10000, 0b11110, 0b10001, 0b10001, 0b01110}},
    {'7', {0b11111, 0b00001, 0b00010, 0b00100, 0b01000, 0b01000, 0b01000}},
    {'8', {0b01110, 0b10001, 0b10001, 0b01110, 0b10001, 0b10001, 0b01110}},
    {'9', {0b01110, 0b10001, 0b10001, 0b01111, 0b00001, 0b00010, 0b01100}},
    {'E', {0b11111, 0b10000, 0b10000, 0b11110, 0b10000, 0b10000, 0b11111}},
    {'N', {0b10001, 0b11001, 0b10101, 0b10101, 0b10101, 0b10011, 0b10001}},
    {'S', {0b01111, 0b10000, 0b10000, 0b01110, 0b00001, 0b00001, 0b11110}},
    {'W', {0b10001, 0b10001, 0b10001, 0b10101, 0b10101, 0b10101, 0b01010}},
    {'-', {0b00000, 0b00000, 0b00000, 0b11111, 0b00000, 0b00000, 0b00000}},
    {'.', {0b00000, 0b00000, 0b00000, 0b00000, 0b00000, 0b01100, 0b01100}},
    {':', {0b00000, 0b01100, 0b01100, 0b00000, 0b01100, 0b01100, 0b00000}},
};

const Glyph* glyph_of(char letter) {
  const auto* found =
      std::find_if(std::begin(kGlyphs), std::end(kGlyphs), [&](const Glyph& glyph) { return glyph.letter == letter; });
  return found == std::end(kGlyphs) ? nullptr : found;
}

// Nothing of it may lie outside the plane.
void fill_plane(std::uint8_t* plane, int pitch, Area area, std::uint8_t value) {
  for (int row = area.top; row < area.top + area.height; ++row) {
    const auto offset =
        static_cast<std::size_t>(row) * static_cast<std::size_t>(pitch) + static_cast<std::size_t>(area.left);
    std::memset(plane + offset, value, static_cast<std::size_t>(area.width));
  }
}

}  // namespace

void ScenePainter::fill(Area area, Colour colour) {
  const int left = std::max(area.left, 0);
  const int top = std::max(area.top, 0);
  const int width = std::min(area.left + area.width, picture_.width()) - left;
  const int height = std::min(area.top + area.height, picture_.height()) - top;
  if (width <= 0 || height <= 0) return;
  const Area bright = rotated_ ? Area{picture_.width() - left - width, picture_.height() - top - height, width, height}
                               : Area{left, top, width, height};
  fill_plane(picture_.y(), picture_.width(), bright, colour.y);
  const int column = bright.left / 2;
  const int row = bright.top / 2;
  const Area coloured{column, row, (bright.left + width + 1) / 2 - column, (bright.top + height + 1) / 2 - row};
  fill_plane(picture_.u(), picture_.width() / 2, coloured, colour.u);
  fill_plane(picture_.v(), picture_.width() / 2, coloured, colour.v);
}

void ScenePainter::write(std::string_view text, int left, int top, int dot, Colour colour) {
  constexpr int kDots = kLetterPitch - 1;
  for (const char letter : text) {
    const Glyph* glyph = glyph_of(letter);
    for (int place = 0; glyph != nullptr && place < kDots * kLetterHeight; ++place) {
      const int row = place / kDots;
      const int column = place % kDots;
      const bool set = (glyph->rows[static_cast<std::size_t>(row)] >> (kDots - 1 - column) & 1) != 0;
      if (set) fill({left + column * dot, top + row * dot, dot, dot}, colour);
    }
    left += kLetterPitch * dot;
  }
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/drawn_video.h"

namespace vexa::camera {

SquareColour square_colour(std::uint32_t column, std::uint32_t row) {
  constexpr int kBrightness[] = {60, 95, 130, 165, 200};
  constexpr SquareColour kTints[] = {{0, 128, 128}, {0, 108, 148}, {0, 148, 108}, {0, 116, 116}};
  const std::uint32_t x = column / kPatchSide;
  const std::uint32_t y = row / kPatchSide;
  SquareColour colour = kTints[(x + 2 * y) % 4];
  colour.y = kBrightness[(x * 7 + y * 13) % 5];
  return colour;
}

std::uint32_t changed_square(const SquareGrid& grid, std::uint64_t index) {
  return static_cast<std::uint32_t>(index * 11 % grid.size());
}

SquareColour changed_colour(std::uint64_t index) {
  constexpr int kDark = 32;
  constexpr int kBright = 224;
  return {index % 2 == 0 ? kBright : kDark, 128, 128};
}

}  // namespace vexa::camera

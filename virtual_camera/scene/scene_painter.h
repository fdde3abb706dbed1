// SPDX-License-Identifier: Apache-2.0
// Rectangles and letters in a picture, clipped at its edges.
#ifndef VIRTUAL_CAMERA_SCENE_SCENE_PAINTER_H_
#define VIRTUAL_CAMERA_SCENE_SCENE_PAINTER_H_

#include <cstdint>
#include <string_view>

#include "virtual_camera/codec/i420_picture.h"

namespace vexa::camera {

// Pixels; the origin is the upper left corner of the picture as it is drawn upright.
struct Area {
  int left = 0;
  int top = 0;
  int width = 0;
  int height = 0;
};

// Letters are 5 dots wide and 7 high, each followed by a gap of one dot.
inline constexpr int kLetterPitch = 6;
inline constexpr int kLetterHeight = 7;

// Draws on a picture of the caller's, on its thread. Rotated, it draws everything where it is in the picture turned by
// 180 degrees. Never draws outside the picture.
class ScenePainter {
 public:
  ScenePainter(I420Picture& picture, bool rotated) : picture_(picture), rotated_(rotated) {}

  void fill(Area area, Colour colour);
  // Digits, the letters E N S W, '-', '.' and ':'; others leave their place empty. `dot` is in pixels.
  void write(std::string_view text, int left, int top, int dot, Colour colour);

 private:
  I420Picture& picture_;
  bool rotated_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_SCENE_PAINTER_H_

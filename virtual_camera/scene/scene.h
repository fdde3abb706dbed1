// SPDX-License-Identifier: Apache-2.0
// What a camera sees: a panorama with a compass scale, the marks of its presets, a clock, and what happens there.
#ifndef VIRTUAL_CAMERA_SCENE_SCENE_H_
#define VIRTUAL_CAMERA_SCENE_SCENE_H_

#include <chrono>
#include <optional>
#include <vector>

#include "virtual_camera/codec/i420_picture.h"
#include "virtual_camera/scene/scene_geometry.h"

namespace vexa::camera {

struct SceneMoment {
  std::chrono::milliseconds clock{0};  // since midnight, as the picture's clock shows it
  std::vector<PresetMark> presets;
  std::optional<Intruder> intruder;
  bool covered = false;  // the lens: the picture shows the clock alone
};

// The clock of a moment, in UTC.
[[nodiscard]] std::chrono::milliseconds clock_of(std::chrono::system_clock::time_point now);

// Colours by which what a picture shows can be told apart; no other part of it has them.
inline constexpr Colour kNorthPost{81, 90, 240};    // red, as high as the picture
inline constexpr Colour kOtherPost{200, 128, 128};  // east, south and west
inline constexpr Colour kScale{235, 128, 128};
inline constexpr Colour kFlag{170, 40, 150};  // yellow; its pole stands left of it, on the preset's place
inline constexpr Colour kFigure{40, 180, 90};

// Draws the view at this moment; the same view and moment give the same picture. The clock stands upright in a rotated
// picture too. Any thread; a picture belongs to one thread at a time.
void render(const View& view, const SceneMoment& moment, I420Picture& picture);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_SCENE_H_

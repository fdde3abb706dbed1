// SPDX-License-Identifier: Apache-2.0
// The areas of the picture in which a camera watches for movement, and who is seen in them.
#ifndef VIRTUAL_CAMERA_SCENE_DETECTION_WINDOWS_H_
#define VIRTUAL_CAMERA_SCENE_DETECTION_WINDOWS_H_

#include <array>
#include <cstddef>

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/scene/scene_geometry.h"

namespace vexa::camera {

inline constexpr std::size_t kDetectionWindows = 4;

struct DetectionWindow {
  bool on = false;
  bool mask = false;  // what happens here is seen by no window
  PictureBox area;
};

struct DetectionSetting {
  std::array<DetectionWindow, kDetectionWindows> windows;
  // Of a figure that is reported, in the units of areas; a largest of 0: none is too large.
  double least_width = 0;
  double least_height = 0;
  double most_width = 0;
  double most_height = 0;
};

// The setting that watches the present view ("Od99..."), or that of a preset, counted from 1. Of a camera without
// settings for windows the four quarters of the picture from left to right. Hosts give figures' sizes in the pixels of
// a picture of this size.
[[nodiscard]] DetectionSetting detection_setting(const SettingsStore& settings, int number, PictureSize size);
inline constexpr int kPresentView = 99;
// Of cameras that report no windows: the whole picture counts as the first.
[[nodiscard]] DetectionSetting whole_picture();

// Which windows a figure is seen in; only the part of it inside the picture counts.
[[nodiscard]] std::array<bool, kDetectionWindows> windows_with(const PictureBox& figure,
                                                               const DetectionSetting& setting);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_DETECTION_WINDOWS_H_

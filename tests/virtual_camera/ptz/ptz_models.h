// SPDX-License-Identifier: Apache-2.0
// Moving camera models of tests.
#ifndef TESTS_VIRTUAL_CAMERA_PTZ_MODELS_H_
#define TESTS_VIRTUAL_CAMERA_PTZ_MODELS_H_

#include "virtual_camera/model/camera_profile.h"

namespace vexa::camera {

// Full circle and a quarter upwards in 160ths of a degree, as real ones count; ten seconds from end to end on every
// axis.
inline PtzProfile dome() {
  PtzProfile profile;
  profile.pan = {24, 115200, 720, -28800, 58, 0, {10000, 1000}};
  profile.tilt = {20, 33600, 210, -2400, 34, 0, {10000, 1000}};
  profile.zoom = {1, 8, 0, 16000, {10000, 1000}};
  profile.ratios = {{1, 0}, {2, 4000}, {10, 16000}};
  profile.focus = LensProfile{2, 8, 4096, 61440, {10000, 1000}};
  profile.continuous = true;
  profile.presets = 16;
  profile.tours = 2;
  profile.shadow_tours = 2;
  return profile;
}

}  // namespace vexa::camera

#endif  // TESTS_VIRTUAL_CAMERA_PTZ_MODELS_H_

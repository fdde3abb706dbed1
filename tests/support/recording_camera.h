// SPDX-License-Identifier: Apache-2.0
// A virtual camera that records on its card while its network is away.
#pragma once

#include "virtual_camera/virtual_camera.h"

namespace vexa_test {

/// With a card, and reports of its clock beside each picture.
inline vexa::camera::CameraOptions with_card() {
  vexa::camera::CameraOptions options;
  options.card_bytes = 64U << 20U;
  options.sender_reports.every = 1;
  return options;
}

/// It watches an address that is never there.
inline void record_while_away(vexa::camera::SettingsStore& settings) {
  settings.set("edgestorage", "Edgestorage", "on");
  settings.set("edgestorage", "EsRec1", "image1,off");
  settings.set("edgestorage", "EsAlmRec1Time", "0,0");
  settings.set("edgestorage", "EsAlmRec1WatchAddress", "10.0.0.1");
}

}  // namespace vexa_test

// How hosts have set one video stream.
#ifndef VIRTUAL_CAMERA_MODEL_STREAM_SETTINGS_H_
#define VIRTUAL_CAMERA_MODEL_STREAM_SETTINGS_H_

#include <optional>

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/values/codec.h"

namespace vexa::camera {

struct StreamSettings {
  std::optional<Codec> codec;  // nullopt: the stream is switched off
  int width = 0;
  int height = 0;
  int frame_rate = 0;
  int bit_rate = 0;  // kbit/s
  int quality = 0;   // JPEG's
};

// The settings of stream `number`, counted from 1; nullopt when the camera has no such stream.
[[nodiscard]] std::optional<StreamSettings> stream_settings(const SettingsStore& settings, int number);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_STREAM_SETTINGS_H_

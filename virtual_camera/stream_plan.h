// What the camera's video streams send under its present settings.
#ifndef VIRTUAL_CAMERA_STREAM_PLAN_H_
#define VIRTUAL_CAMERA_STREAM_PLAN_H_

#include <memory>
#include <optional>
#include <string>

#include "virtual_camera/options.h"
#include "virtual_camera/settings_store.h"

namespace vexa::camera {

// How one video stream is set.
struct StreamSettings {
  std::string codec;  // the camera's word; "off"
  int width = 0;
  int height = 0;
  int frame_rate = 0;
  int bit_rate = 0;  // kbit/s
  int quality = 0;   // JPEG's
};

// The settings of stream `number`, counted from 1; nothing when the camera has no such stream.
[[nodiscard]] std::optional<StreamSettings> stream_settings(const SettingsStore& settings, int number);

struct StreamPlan {
  std::shared_ptr<const PacketisedClip> clip;  // null: the session opens but carries no picture
  double frames_per_second = 0;
};

// What a session on stream `number` sends: the clip that the options name, or, of a camera with a profile and no clip,
// pictures drawn as the stream is set. Nothing for a stream that such a camera lacks, has switched off, or has set to a
// codec without pictures here.
[[nodiscard]] std::optional<StreamPlan> plan_stream(const CameraOptions& options, const SettingsStore& settings,
                                                    int number);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_STREAM_PLAN_H_

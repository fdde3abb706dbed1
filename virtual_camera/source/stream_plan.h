// What the camera's video streams send under its present settings.
#ifndef VIRTUAL_CAMERA_SOURCE_STREAM_PLAN_H_
#define VIRTUAL_CAMERA_SOURCE_STREAM_PLAN_H_

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/source/picture_source.h"

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

// The camera's word of a codec; nothing for "off".
[[nodiscard]] std::optional<ImageKind> codec_kind(std::string_view word);

struct StreamPlan {
  std::unique_ptr<PictureSource> source;  // null: the session opens but carries no picture
};

// What a session on stream `number` sends: the clip that the options name, or, of a camera with a profile and no clip,
// pictures made as the stream is set, drawn or of the scene. The state outlives the source, here and below. Nothing for
// a stream that such a camera lacks, has switched off, or has set to what RTP cannot carry.
[[nodiscard]] std::optional<StreamPlan> plan_stream(CameraState& state, int number);

// What "/imageN" sends: the images that the options name, or, of a camera with a profile and none, pictures made as
// stream `number` is set. Null where there is no such stream.
[[nodiscard]] std::unique_ptr<PictureSource> plan_images(CameraState& state, int number);

// What a picture carries as its user data when it leaves in this moment; empty: nothing.
[[nodiscard]] std::string present_user_data(const CameraState& state);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_STREAM_PLAN_H_

// Streams that show the scene before the camera.
#ifndef VIRTUAL_CAMERA_SOURCE_RENDERED_VIDEO_H_
#define VIRTUAL_CAMERA_SOURCE_RENDERED_VIDEO_H_

#include <memory>

#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/source/picture_source.h"
#include "virtual_camera/source/stream_plan.h"

namespace vexa::camera {

// Pictures of stream `number` as it is set; all who watch it share one encoder, and those who began before it was set
// otherwise keep theirs. Null where this build has no encoder for it. The state outlives the source.
[[nodiscard]] std::unique_ptr<PictureSource> watch_scene(CameraState& state, int number, const StreamSettings& stream);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_RENDERED_VIDEO_H_

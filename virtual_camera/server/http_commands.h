// The HTTP commands of a running camera.
#ifndef VIRTUAL_CAMERA_SERVER_HTTP_COMMANDS_H_
#define VIRTUAL_CAMERA_SERVER_HTTP_COMMANDS_H_

#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/wire/answer.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

// Obeys the command of a request whose credentials are right; 404 for a path that is no command. On the loop's thread.
[[nodiscard]] Answer obey_command(const RequestHead& head, CameraState& state);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_HTTP_COMMANDS_H_

// The HTTP commands that read and change settings: one request head in, one answer out.
#ifndef VIRTUAL_CAMERA_MODEL_CGI_H_
#define VIRTUAL_CAMERA_MODEL_CGI_H_

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/wire/answer.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

// "/command/inquiry.cgi?inq=NAME" reads a section, "/command/NAME.cgi?KEY=VALUE&..." changes one; 400 for what
// the camera does not take.
[[nodiscard]] Answer answer_command(const RequestHead& request, SettingsStore& settings);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_CGI_H_

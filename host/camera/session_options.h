// SPDX-License-Identifier: Apache-2.0
// A camera of the command line as a session's options.
#ifndef HOST_CAMERA_SESSION_OPTIONS_H_
#define HOST_CAMERA_SESSION_OPTIONS_H_

#include "host/camera/camera_options.h"
#include "vexa/session.h"

namespace vexa::host {

[[nodiscard]] SessionOptions session_options(const ChosenCamera& camera, const CameraOptions& options, int stream);

// Of a group that does all its work where the host calls Process().
[[nodiscard]] SessionGroupOptions without_threads();
// When a group opens no session.
[[nodiscard]] Problem no_session();

}  // namespace vexa::host

#endif  // HOST_CAMERA_SESSION_OPTIONS_H_

// SPDX-License-Identifier: Apache-2.0
// The session of one camera, on the command's own thread.
#ifndef HOST_CAMERA_ONE_SESSION_H_
#define HOST_CAMERA_ONE_SESSION_H_

#include <functional>
#include <optional>
#include <string>

#include "host/camera/camera_options.h"
#include "host/console/terminal.h"
#include "vexa/session.h"

namespace vexa::host {

// What a command does with one camera that it stays connected to.
struct SessionWork {
  SessionCallbacks callbacks;  // without `state`
  // Whether it is done. Asked ten times a second, and after each turn of the session.
  std::function<bool()> is_done;
};

// Keeps a session of the camera that the options name, until its work is done, Ctrl-C or a refusal that no attempt
// follows. Outages are reported on standard error. `session` and the terminal outlive it. The problem that ended it,
// where it was not done.
[[nodiscard]] std::optional<Problem> work_by_session(const SessionOptions& session, const SessionWork& work,
                                                     Terminal& terminal);

// The one camera that the options name, for a session of such streams (StreamBits).
[[nodiscard]] Result<SessionOptions> session_of(const CameraOptions& options, const std::optional<std::string>& profile,
                                                int stream, std::uint32_t streams);

}  // namespace vexa::host

#endif  // HOST_CAMERA_ONE_SESSION_H_

// SPDX-License-Identifier: Apache-2.0
// The action of vexactl ptz that shows a camera's position.
#ifndef HOST_COMMANDS_PTZ_WATCH_H_
#define HOST_COMMANDS_PTZ_WATCH_H_

#include <memory>

#include "host/commands/action_group.h"

namespace vexa::host {

std::unique_ptr<CameraAction> make_ptz_watch_action();

}  // namespace vexa::host

#endif  // HOST_COMMANDS_PTZ_WATCH_H_

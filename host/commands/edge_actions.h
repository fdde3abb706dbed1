// SPDX-License-Identifier: Apache-2.0
// The actions of vexactl edge that play recordings.
#ifndef HOST_COMMANDS_EDGE_ACTIONS_H_
#define HOST_COMMANDS_EDGE_ACTIONS_H_

#include <memory>
#include <string>

#include "host/commands/action_group.h"
#include "host/words/stored_recordings.h"

namespace vexa::host {

[[nodiscard]] std::unique_ptr<CameraAction> make_play_recording_action();
[[nodiscard]] std::unique_ptr<CameraAction> make_get_recording_action();
[[nodiscard]] std::unique_ptr<CameraAction> make_backfill_action();

// What the card holds, as the camera lists it: from the oldest on.
[[nodiscard]] Result<StoredRecordings> list_recordings(const ModelCamera& camera);
[[nodiscard]] Result<SLibDEdgeStorageRecord> find_recording(const ModelCamera& camera, const std::string& name);

}  // namespace vexa::host

#endif  // HOST_COMMANDS_EDGE_ACTIONS_H_

// SPDX-License-Identifier: Apache-2.0
// Pictures of the moments of alarms.
#ifndef HOST_COMMANDS_ALARM_SNAPSHOTS_H_
#define HOST_COMMANDS_ALARM_SNAPSHOTS_H_

#include <atomic>
#include <optional>
#include <string>
#include <thread>

#include "host/camera/live_pictures.h"
#include "host/camera/model_camera.h"

namespace vexa::host {

// Plays a camera's video beside its alarms, on a thread of its own, so that the newest picture is ready. Owned by the
// watch; writes files on the caller's thread.
class AlarmSnapshots {
 public:
  // Pictures go into `folder`, which exists.
  explicit AlarmSnapshots(std::string folder) : folder_(std::move(folder)) {}
  ~AlarmSnapshots();
  AlarmSnapshots(const AlarmSnapshots&) = delete;
  AlarmSnapshots& operator=(const AlarmSnapshots&) = delete;

  // Returns once there is a picture. `camera` outlives this.
  [[nodiscard]] std::optional<Problem> start(const ModelCamera& camera);

  // Writes the newest picture as "FOLDER/MOMENT-KIND-NUMBER.jpg".
  [[nodiscard]] std::optional<Problem> take(const SLibDPinInfo& pin, const std::string& moment);

 private:
  void play();

  const std::string folder_;
  std::optional<LivePictures> pictures_;
  std::atomic<bool> over_{false};
  std::atomic<bool> silent_{false};
  std::thread player_;
};

// Finds early why pictures could not be written there.
[[nodiscard]] std::optional<Problem> check_snapshot_folder(const std::string& folder);

}  // namespace vexa::host

#endif  // HOST_COMMANDS_ALARM_SNAPSHOTS_H_

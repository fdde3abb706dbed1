// SPDX-License-Identifier: Apache-2.0
// What vexactl doctor finds out about a camera by the driver: identity, inquiries, streams, losses, clock, card.
#ifndef HOST_CAMERA_CAMERA_CHECKS_H_
#define HOST_CAMERA_CAMERA_CHECKS_H_

#include <chrono>
#include <string>
#include <vector>

#include "host/camera/live_camera.h"
#include "host/doctor/check.h"
#include "vexa/models.h"

namespace vexa::host {

// Owned by the command, on its thread. Changes no setting of the camera. Every wait for the camera has the
// connection's time-out; a check makes at most four.
class CameraChecks {
 public:
  explicit CameraChecks(const CameraConnection& connection) : connection_(connection) {}

  // User name and password. Whether later checks are worth while: usable().
  [[nodiscard]] Check credentials();
  // The system inquiry: model and software.
  [[nodiscard]] Check system();
  // Which installed profile fits the model, and whether the streams are set to what it offers.
  [[nodiscard]] Check profile();
  // Every inquiry that the driver knows, a check each.
  [[nodiscard]] std::vector<Check> inquiries();
  // Each stream over each transport: the time to the first key picture.
  [[nodiscard]] std::vector<Check> streams();
  // Losses and jitter of stream 1 over so many seconds, and after it the camera's clock.
  [[nodiscard]] std::vector<Check> reception(double seconds);
  [[nodiscard]] Check card();

  [[nodiscard]] bool usable() const { return usable_; }
  // A profile for the camera as it answers, as JSON that the reader of profiles takes; or why there is none.
  [[nodiscard]] Result<std::string> proposed_profile();

 private:
  [[nodiscard]] Check stream(int number, VideoTransport transport);
  [[nodiscard]] std::vector<SLibDCameraInfo> reported_streams();

  const CameraConnection connection_;
  bool usable_ = false;
  SLibDSystemInfo system_;
};

}  // namespace vexa::host

#endif  // HOST_CAMERA_CAMERA_CHECKS_H_

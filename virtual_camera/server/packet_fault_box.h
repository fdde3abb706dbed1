// SPDX-License-Identifier: Apache-2.0
// The packet faults of the sessions to come.
#ifndef VIRTUAL_CAMERA_SERVER_PACKET_FAULT_BOX_H_
#define VIRTUAL_CAMERA_SERVER_PACKET_FAULT_BOX_H_

#include <mutex>
#include <utility>

#include "virtual_camera/values/faults.h"

namespace vexa::camera {

// Sessions copy the faults when they begin; a change does not reach those that run. Thread-safe, as tests change them
// while the camera runs.
class PacketFaultBox {
 public:
  explicit PacketFaultBox(PacketFaults faults) : faults_(std::move(faults)) {}

  void set(PacketFaults faults) {
    const std::lock_guard<std::mutex> lock(mutex_);
    faults_ = std::move(faults);
  }
  [[nodiscard]] PacketFaults get() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return faults_;
  }

 private:
  mutable std::mutex mutex_;
  PacketFaults faults_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_PACKET_FAULT_BOX_H_

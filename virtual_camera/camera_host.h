// SPDX-License-Identifier: Apache-2.0
// Many cameras in one process.
#ifndef VIRTUAL_CAMERA_CAMERA_HOST_H_
#define VIRTUAL_CAMERA_CAMERA_HOST_H_

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {

// The address `steps` after this one, counted as a 32-bit number; empty when there is none or the text is no address.
[[nodiscard]] std::string address_after(const std::string& address, std::size_t steps);

// The cameras share their threads and one copy of the clip. Camera i has the options' address plus i, the options' seed
// plus i, and its own serial number and MAC address in its settings.
class CameraHost {
 public:
  CameraHost(const CameraOptions& options, std::size_t cameras, std::size_t threads = 1);
  // Cameras that each have options of their own, address and seed included.
  explicit CameraHost(std::vector<CameraOptions> cameras, std::size_t threads = 1);
  ~CameraHost();
  CameraHost(const CameraHost&) = delete;
  CameraHost& operator=(const CameraHost&) = delete;

  // Starts all cameras, or none; then error() has the reason.
  [[nodiscard]] bool start();
  void stop();

  [[nodiscard]] const std::string& error() const { return error_; }
  [[nodiscard]] std::size_t size() const { return cameras_.size(); }
  [[nodiscard]] VirtualCamera& camera(std::size_t index) { return *cameras_[index]; }

 private:
  std::vector<std::shared_ptr<EventLoop>> loops_;
  std::vector<std::unique_ptr<VirtualCamera>> cameras_;
  std::string error_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CAMERA_HOST_H_

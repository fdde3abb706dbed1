// SPDX-License-Identifier: Apache-2.0
// Virtual cameras with names of their own in one process, and the port that controls them while they run.
#ifndef VIRTUAL_CAMERA_FLEET_FLEET_H_
#define VIRTUAL_CAMERA_FLEET_FLEET_H_

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/camera_host.h"
#include "virtual_camera/fleet/fleet_file.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

class ControlPort;
class EventLoop;

// Owned by the program or a test. Operations from one thread; the control port answers on a thread of its own.
class Fleet {
 public:
  Fleet(std::vector<FleetCamera> cameras, std::size_t threads = 1);
  ~Fleet();
  Fleet(const Fleet&) = delete;
  Fleet& operator=(const Fleet&) = delete;

  // Starts all cameras, or none; then error() has the reason. With a number, the control port too; 0 takes any free
  // one.
  [[nodiscard]] bool start(std::optional<std::uint16_t> control_port = std::nullopt);
  void stop();

  [[nodiscard]] const std::string& error() const { return error_; }
  [[nodiscard]] std::size_t size() const { return cameras_.size(); }
  [[nodiscard]] const FleetCamera& entry(std::size_t index) const { return cameras_[index]; }
  [[nodiscard]] VirtualCamera& camera(std::size_t index) { return host_.camera(index); }
  [[nodiscard]] std::uint16_t control_port() const;  // valid after start(); 0 without one

  // Writes the file of cameras that vexactl takes, and beside it a file of credentials for each user and password that
  // cameras expect, readable by the owner alone: NAME.N.cred. After start(). Empty on success, else what went wrong.
  [[nodiscard]] std::string write_cameras_file(const std::string& path);

  // The whole answer of the control port.
  [[nodiscard]] std::string answer(const RequestHead& request);
  // All cameras as they are now, as JSON.
  [[nodiscard]] std::string state();

 private:
  [[nodiscard]] std::string_view obey(std::string_view name, std::string_view path, std::string_view query);

  std::vector<FleetCamera> cameras_;
  CameraHost host_;
  std::unique_ptr<EventLoop> control_loop_;
  std::shared_ptr<ControlPort> control_;
  std::string error_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_FLEET_FLEET_H_

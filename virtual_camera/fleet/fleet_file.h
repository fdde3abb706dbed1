// SPDX-License-Identifier: Apache-2.0
// A file of virtual cameras: {"cameras": [{"name": "gate", "profile": "VX-2000", "count": 2, ...}]}
#ifndef VIRTUAL_CAMERA_FLEET_FLEET_FILE_H_
#define VIRTUAL_CAMERA_FLEET_FLEET_FILE_H_

#include <cstddef>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "virtual_camera/values/options.h"

namespace vexa::camera {

constexpr std::size_t kMostCameras = 1000;

// One camera of a fleet.
struct FleetCamera {
  std::string name;     // 1 to 64 of a-z, A-Z, 0-9, "-" and "_", not "all"; unique, whatever the case
  std::string profile;  // as given; empty: none
  CameraOptions options;
  std::vector<std::pair<std::string, std::pair<std::string, std::string>>> settings;  // section, key, value
  bool plugged = true;  // false: its network cable is pulled when it starts
};

using FleetResult = std::variant<std::vector<FleetCamera>, std::string>;

// The cameras of a file, or why it is refused: "FILE:LINE: KEY: TEXT". What a camera does not state is as in `common`,
// and its address follows that of the camera before it, the first having that of `common`. Passwords are not repeated.
[[nodiscard]] FleetResult load_fleet(const std::string& path, const CameraOptions& common);
// The same of a text.
[[nodiscard]] FleetResult parse_fleet(std::string_view text, const std::string& file, const CameraOptions& common);
// So many cameras, of the profile of `common`, or else of the installed profiles in turn.
[[nodiscard]] FleetResult make_fleet(std::size_t cameras, const CameraOptions& common);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_FLEET_FLEET_FILE_H_

// SPDX-License-Identifier: Apache-2.0
// The page in a browser that controls a fleet.
#ifndef VIRTUAL_CAMERA_FLEET_CONTROL_PAGE_H_
#define VIRTUAL_CAMERA_FLEET_CONTROL_PAGE_H_

#include <string_view>

namespace vexa::camera {

struct ControlFile {
  std::string_view path;
  std::string_view type;
  std::string_view text;
};

// The file at a path; null when there is none. `accept` as the request has it: the page itself is for browsers only.
[[nodiscard]] const ControlFile* find_control_file(std::string_view path, std::string_view accept);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_FLEET_CONTROL_PAGE_H_

// SPDX-License-Identifier: Apache-2.0
// The camera's address, as given on the command line.
#ifndef HOST_ACCESS_CAMERA_ADDRESS_H_
#define HOST_ACCESS_CAMERA_ADDRESS_H_

#include <optional>
#include <string>
#include <string_view>

#include "host/base/problem.h"

namespace vexa::host {

struct CameraAddress {
  std::string host;
  int port = 80;  // the camera's HTTP port
};

// Reads "HOST" or "HOST:PORT". The text of a refusal never repeats what was given: it may hold a password.
[[nodiscard]] Result<CameraAddress> parse_camera_address(std::string_view text);

[[nodiscard]] std::string to_string(const CameraAddress& address);

// Resolves the host as the driver will, so that a misspelt name is reported as one.
[[nodiscard]] std::optional<Problem> check_name(const CameraAddress& address);

}  // namespace vexa::host

#endif  // HOST_ACCESS_CAMERA_ADDRESS_H_

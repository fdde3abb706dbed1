// SPDX-License-Identifier: Apache-2.0
// What vexactl doctor finds out about the way to a camera, without the driver: name, route, ports, first answers.
#ifndef HOST_DOCTOR_NETWORK_CHECKS_H_
#define HOST_DOCTOR_NETWORK_CHECKS_H_

#include <chrono>

#include "host/access/camera_address.h"
#include "host/doctor/check.h"

namespace vexa::host {

// Each returns within the limit.
[[nodiscard]] Check check_camera_name(const CameraAddress& address, std::chrono::milliseconds limit);
// Which of this machine's interfaces leads to the camera. Sends nothing.
[[nodiscard]] Check check_route(const CameraAddress& address, std::chrono::milliseconds limit);
// Whether a connection to the port is taken.
[[nodiscard]] Check check_port(const char* name, const CameraAddress& address, std::chrono::milliseconds limit);
// What the camera answers to a request without credentials.
[[nodiscard]] Check check_http(const CameraAddress& address, std::chrono::milliseconds limit);
// Whether its RTSP side offers the request that keeps sessions alive.
[[nodiscard]] Check check_keep_alive(const CameraAddress& rtsp, std::chrono::milliseconds limit);

}  // namespace vexa::host

#endif  // HOST_DOCTOR_NETWORK_CHECKS_H_

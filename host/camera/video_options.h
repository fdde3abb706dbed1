// SPDX-License-Identifier: Apache-2.0
// The options that choose a camera's video stream and its transport.
#ifndef HOST_CAMERA_VIDEO_OPTIONS_H_
#define HOST_CAMERA_VIDEO_OPTIONS_H_

#include <optional>
#include <string>

#include "host/camera/live_camera.h"

namespace CLI {
class App;
}

namespace vexa::host {

struct VideoOptions {
  int stream = 1;
  std::string transport = "udp";
};

void add_video_options(CLI::App& command, VideoOptions& options);

// A mistake in them.
[[nodiscard]] std::optional<Problem> check_video_options(const VideoOptions& options);

// Of options that have been checked.
[[nodiscard]] VideoTransport transport_of(const VideoOptions& options);

}  // namespace vexa::host

#endif  // HOST_CAMERA_VIDEO_OPTIONS_H_

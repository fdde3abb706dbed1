// SPDX-License-Identifier: Apache-2.0
#include "host/camera/video_options.h"

#include <CLI/CLI.hpp>

#include "host/camera/camera_options.h"

namespace vexa::host {
namespace {

constexpr char kUdpWord[] = "udp";
constexpr char kHttpWord[] = "http";

}  // namespace

void add_video_options(CLI::App& command, VideoOptions& options) {
  add_stream_option(command, options.stream);
  command
      .add_option("--transport", options.transport, "udp: RTP in datagrams; http: the camera's image stream over HTTP")
      ->type_name("HOW")
      ->capture_default_str();
}

std::optional<Problem> check_video_options(const VideoOptions& options) {
  if (auto problem = check_stream(options.stream)) return problem;
  if (options.transport != kUdpWord && options.transport != kHttpWord) {
    return usage("--transport is neither udp nor http", "udp when not given.");
  }
  return std::nullopt;
}

VideoTransport transport_of(const VideoOptions& options) {
  return options.transport == kHttpWord ? VideoTransport::kHttp : VideoTransport::kUdp;
}

}  // namespace vexa::host

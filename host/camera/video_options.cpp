#include "host/camera/video_options.h"

#include <fmt/format.h>

namespace vexa::host {
namespace {

constexpr int kMostVideoStreams = 16;
constexpr char kUdpWord[] = "udp";
constexpr char kHttpWord[] = "http";

}  // namespace

void add_video_options(CLI::App& command, VideoOptions& options) {
  command.add_option("--stream", options.stream, "which of the camera's video streams")
      ->type_name("N")
      ->capture_default_str();
  command
      .add_option("--transport", options.transport, "udp: RTP in datagrams; http: the camera's image stream over HTTP")
      ->type_name("HOW")
      ->capture_default_str();
}

std::optional<Problem> check_video_options(const VideoOptions& options) {
  if (options.stream < 1 || options.stream > kMostVideoStreams) {
    return usage(fmt::format("--stream is not a number from 1 to {}", kMostVideoStreams),
                 "1 is the camera's first stream.");
  }
  if (options.transport != kUdpWord && options.transport != kHttpWord) {
    return usage("--transport is neither udp nor http", "udp when not given.");
  }
  return std::nullopt;
}

VideoTransport transport_of(const VideoOptions& options) {
  return options.transport == kHttpWord ? VideoTransport::kHttp : VideoTransport::kUdp;
}

}  // namespace vexa::host

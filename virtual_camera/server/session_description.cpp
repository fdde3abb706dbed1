// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/session_description.h"

#include <fmt/format.h>

#include <string_view>

#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

// ";profile-level-id=...;sprop-parameter-sets=..." (RFC 6184, 8.1).
std::string parameter_sets(const SourceFormat& format) {
  const std::string& sequence = format.sequence_parameters;
  if (sequence.size() < 4 || format.picture_parameters.empty()) return {};
  std::string level;
  for (std::size_t i = 1; i < 4; ++i) level += fmt::format("{:02x}", static_cast<unsigned char>(sequence[i]));
  return fmt::format(";profile-level-id={};sprop-parameter-sets={},{}", level, base64_text(sequence),
                     base64_text(format.picture_parameters));
}

// The lines that describe the codec (RFC 6184, 8.2; RFC 3016, 5.2; RFC 2435).
std::string format_lines(const CameraOptions& options, Codec codec, std::string_view sets) {
  const auto type = payload_type_of(options, codec);
  switch (codec) {
    case Codec::kJpeg:
      return fmt::format("a=rtpmap:{} JPEG/{}\r\n", type, options.clock_rate);
    case Codec::kMpeg4:
      return fmt::format("a=rtpmap:{0} MP4V-ES/{1}\r\na=fmtp:{0} profile-level-id=1\r\n", type, options.clock_rate);
    case Codec::kH264:
      break;
  }
  return fmt::format("a=rtpmap:{0} H264/{1}\r\na=fmtp:{0} packetization-mode=1{2}\r\n", type, options.clock_rate, sets);
}

std::string description(const CameraOptions& options, Codec codec, std::string_view sets) {
  const std::string range = options.range_clock.empty() ? "" : fmt::format("a=range:clock={}\r\n", options.range_clock);
  return fmt::format(
      "v=0\r\n"
      "o=- 1 1 IN IP4 {0}\r\n"
      "s=video\r\n"
      "t=0 0\r\n"
      "{1}"
      "m=video 0 RTP/AVP {2}\r\n"
      "{3}"
      "a=control:video\r\n",
      options.address, range, payload_type_of(options, codec), format_lines(options, codec, sets));
}

}  // namespace

std::string describe_session(const CameraOptions& options, const SourceFormat& format, std::size_t limit) {
  std::string text = description(options, format.codec, parameter_sets(format));
  return text.size() <= limit ? text : description(options, format.codec, "");
}

}  // namespace vexa::camera

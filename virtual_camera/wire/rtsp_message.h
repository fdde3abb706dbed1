// SPDX-License-Identifier: Apache-2.0
// RTSP (RFC 2326) texts: what the camera reads from requests and how its answers look.
#ifndef VIRTUAL_CAMERA_WIRE_RTSP_MESSAGE_H_
#define VIRTUAL_CAMERA_WIRE_RTSP_MESSAGE_H_

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/wire/message.h"

namespace vexa::camera {

// Hosts read an answer in one piece of at most 1023 bytes, some in half of that; so no answer is longer than this.
constexpr std::size_t kMaxRtspAnswer = 500;

// Bytes of the first request: its head, its body, and empty lines right after it; 0 when more must come.
[[nodiscard]] std::size_t rtsp_request_size(std::string_view received);

// The CSeq of a request, when it is a plain number.
[[nodiscard]] std::optional<std::uint32_t> sequence_of(const RequestHead& request);
// The session a request names; 0 when it names none or no number.
[[nodiscard]] std::uint32_t session_of(const RequestHead& request);
// How a host wants its packets: in datagrams, or between the answers on the RTSP connection (RFC 2326, 10.12).
struct AskedTransport {
  enum class Kind { kNone, kUdp, kInterleaved };

  Kind kind = Kind::kNone;
  // The client's ports, or the channels; the second is the one after the first unless named.
  std::uint16_t first = 0;
  std::uint16_t second = 0;
};
// The first alternative of a Transport field that the camera can serve. Channels that are not named are 0 and 1.
[[nodiscard]] AskedTransport asked_transport(std::string_view transport);

// Bytes of the packets a host put before its next request, such as reports of what it received; 0 when there is none,
// or the first is not yet whole.
[[nodiscard]] std::size_t leading_packets_size(std::string_view received);

enum class VideoUrl { kNone, kStream, kTrack };
// What "/media/video1" and "/media/video1/video" name.
[[nodiscard]] VideoUrl classify_url(std::string_view path);
// The number of the video stream that such a path names; 0 when it names none.
[[nodiscard]] int video_number(std::string_view path);

// What "/media/NAME" and "/media/NAME/video" name where NAME is that of a recording.
struct RecordingUrl {
  VideoUrl kind = VideoUrl::kNone;
  std::string_view name;
};
[[nodiscard]] RecordingUrl recording_url(std::string_view path);
// The Scale of a request (RFC 2326, 12.34); 1 when it names none.
[[nodiscard]] int scale_of(const RequestHead& request);

// `status` as in "454 Session Not Found"; `fields` are whole lines; no CSeq line for a request without one.
struct RtspAnswer {
  std::string_view status;
  std::optional<std::uint32_t> sequence;
  std::string_view fields;
  std::string_view body;
};
[[nodiscard]] Answer rtsp_answer(const RtspAnswer& answer);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_WIRE_RTSP_MESSAGE_H_

// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/wire/rtsp_message.h"

#include <fmt/format.h>

#include <algorithm>
#include <limits>
#include <utility>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

constexpr std::string_view kVideoStem = "/media/video";

bool all_digits(std::string_view text) {
  return !text.empty() && text.find_first_not_of("0123456789") == std::string_view::npos;
}

// The numbers after a name of a Transport field, such as "client_port=5000-5001".
std::optional<std::pair<std::uint16_t, std::uint16_t>> number_pair(std::string_view alternative,
                                                                   std::string_view name) {
  const std::size_t found = alternative.find(name);
  if (found == std::string_view::npos) return std::nullopt;
  const std::string_view text = alternative.substr(found + name.size());
  const auto first = leading_number<std::uint16_t>(text);
  if (!first) return std::nullopt;
  const auto next = static_cast<std::uint16_t>(*first + 1);
  const std::size_t dash = std::min(text.find('-'), text.find(';'));
  if (dash == std::string_view::npos || text[dash] != '-') return std::pair(*first, next);
  return std::pair(*first, leading_number<std::uint16_t>(text.substr(dash + 1)).value_or(next));
}

// One alternative of a Transport field.
AskedTransport parse_alternative(std::string_view text) {
  using Kind = AskedTransport::Kind;
  constexpr std::uint16_t kMostChannel = 255;
  if (text.find("multicast") != std::string_view::npos) return {};
  if (text.starts_with("RTP/AVP;") || text.starts_with("RTP/AVP/UDP;")) {
    const auto ports = number_pair(text, "client_port=");
    return ports && ports->first != 0 ? AskedTransport{Kind::kUdp, ports->first, ports->second} : AskedTransport{};
  }
  if (text != "RTP/AVP/TCP" && !text.starts_with("RTP/AVP/TCP;")) return {};
  constexpr std::string_view kChannels = "interleaved=";
  if (text.find(kChannels) == std::string_view::npos) return {Kind::kInterleaved, 0, 1};
  const auto channels = number_pair(text, kChannels);
  if (!channels || channels->first > kMostChannel || channels->second > kMostChannel) return {};
  return {Kind::kInterleaved, channels->first, channels->second};
}

std::size_t body_size(const RequestHead& head) {
  const std::string_view length = head.field("Content-Length");
  if (length.empty()) return 0;
  // A length that is no number counts as endless, which the limit on requests then refuses.
  constexpr std::uint32_t kEndless = std::numeric_limits<std::uint32_t>::max();
  return all_digits(length) ? leading_number<std::uint32_t>(length).value_or(kEndless) : kEndless;
}

}  // namespace

std::size_t rtsp_request_size(std::string_view received) {
  std::size_t size = head_size(received);
  if (size == 0) return 0;
  const std::optional<RequestHead> head = parse_head(received.substr(0, size));
  if (head) {
    const std::size_t body = body_size(*head);
    if (body > received.size() - size) return 0;
    size += body;
  }
  while (received.substr(size).starts_with("\r\n")) size += 2;
  return size;
}

std::optional<std::uint32_t> sequence_of(const RequestHead& request) {
  const std::string_view text = request.field("CSeq");
  return all_digits(text) ? leading_number<std::uint32_t>(text) : std::nullopt;
}

std::uint32_t session_of(const RequestHead& request) {
  const std::string_view text = request.field("Session");
  const std::string_view number = text.substr(0, std::min(text.find(';'), text.size()));
  return all_digits(number) ? leading_number<std::uint32_t>(number).value_or(0) : 0;
}

AskedTransport asked_transport(std::string_view transport) {
  while (!transport.empty()) {
    const std::size_t end = std::min(transport.find(','), transport.size());
    const AskedTransport asked = parse_alternative(transport.substr(0, end));
    if (asked.kind != AskedTransport::Kind::kNone) return asked;
    transport.remove_prefix(std::min(end + 1, transport.size()));
  }
  return {};
}

std::size_t leading_packets_size(std::string_view received) {
  constexpr std::size_t kPrefix = 4;
  std::size_t size = 0;
  while (true) {
    const std::string_view packet = received.substr(size);
    if (packet.size() < kPrefix || packet[0] != '$') return size;
    const auto length =
        static_cast<std::size_t>(static_cast<unsigned char>(packet[2]) << 8U | static_cast<unsigned char>(packet[3]));
    if (packet.size() - kPrefix < length) return size;
    size += kPrefix + length;
  }
}

VideoUrl classify_url(std::string_view path) {
  if (!path.starts_with(kVideoStem)) return VideoUrl::kNone;
  path.remove_prefix(kVideoStem.size());
  const std::size_t slash = std::min(path.find('/'), path.size());
  if (!all_digits(path.substr(0, slash))) return VideoUrl::kNone;
  const std::string_view rest = path.substr(slash);
  if (rest.empty() || rest == "/") return VideoUrl::kStream;
  return rest == "/video" ? VideoUrl::kTrack : VideoUrl::kNone;
}

int video_number(std::string_view path) {
  if (classify_url(path) == VideoUrl::kNone) return 0;
  path.remove_prefix(kVideoStem.size());
  return leading_number<int>(path).value_or(0);
}

RecordingUrl recording_url(std::string_view path) {
  constexpr std::string_view kStem = "/media/";
  constexpr std::string_view kTrackName = "/video";
  if (!path.starts_with(kStem) || classify_url(path) != VideoUrl::kNone) return {};
  path.remove_prefix(kStem.size());
  const bool track = path.ends_with(kTrackName);
  if (track) path.remove_suffix(kTrackName.size());
  if (path.empty() || path.find('/') != std::string_view::npos) return {};
  return {track ? VideoUrl::kTrack : VideoUrl::kStream, path};
}

int scale_of(const RequestHead& request) {
  const int scale = leading_number<int>(request.field("Scale")).value_or(1);
  return scale == 0 ? 1 : scale;
}

Answer rtsp_answer(const RtspAnswer& answer) {
  const std::string sequence = answer.sequence ? fmt::format("CSeq: {}\r\n", *answer.sequence) : "";
  const std::string content =
      answer.body.empty() ? ""
                          : fmt::format("Content-Type: application/sdp\r\nContent-Length: {}\r\n", answer.body.size());
  return {leading_number<int>(answer.status).value_or(0),
          fmt::format("RTSP/1.0 {}\r\n{}{}{}\r\n{}", answer.status, sequence, answer.fields, content, answer.body)};
}

}  // namespace vexa::camera

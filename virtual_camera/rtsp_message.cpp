#include "virtual_camera/rtsp_message.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <limits>

namespace vexa::camera {
namespace {

constexpr std::string_view kVideoStem = "/media/video";

// The digits at the start of a text as a number; nothing when there are none or it is out of range.
template <typename Number>
std::optional<Number> leading_number(std::string_view text) {
  Number number{};
  const auto result = std::from_chars(text.data(), text.data() + text.size(), number);
  if (result.ec != std::errc{}) return std::nullopt;
  return number;
}

bool all_digits(std::string_view text) {
  return !text.empty() && text.find_first_not_of("0123456789") == std::string_view::npos;
}

// The alternative of a Transport field that the camera can serve.
std::string_view usable_alternative(std::string_view transport) {
  while (!transport.empty()) {
    const std::size_t end = std::min(transport.find(','), transport.size());
    const std::string_view alternative = transport.substr(0, end);
    const bool udp = alternative.starts_with("RTP/AVP;") || alternative.starts_with("RTP/AVP/UDP;");
    if (udp && alternative.find("multicast") == std::string_view::npos) return alternative;
    transport.remove_prefix(std::min(end + 1, transport.size()));
  }
  return {};
}

std::string_view port_text(std::string_view transport) {
  constexpr std::string_view kName = "client_port=";
  const std::string_view alternative = usable_alternative(transport);
  const std::size_t found = alternative.find(kName);
  return found == std::string_view::npos ? std::string_view() : alternative.substr(found + kName.size());
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

std::uint16_t client_port_of(std::string_view transport) {
  return leading_number<std::uint16_t>(port_text(transport)).value_or(0);
}

std::uint16_t second_client_port_of(std::string_view transport) {
  const std::string_view text = port_text(transport);
  const std::uint16_t next = static_cast<std::uint16_t>(client_port_of(transport) + 1);
  const std::size_t dash = std::min(text.find('-'), text.find(';'));
  if (dash == std::string_view::npos || text[dash] != '-') return next;
  return leading_number<std::uint16_t>(text.substr(dash + 1)).value_or(next);
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

Answer rtsp_answer(const RtspAnswer& answer) {
  const std::string sequence = answer.sequence ? fmt::format("CSeq: {}\r\n", *answer.sequence) : "";
  const std::string content =
      answer.body.empty() ? ""
                          : fmt::format("Content-Type: application/sdp\r\nContent-Length: {}\r\n", answer.body.size());
  return {leading_number<int>(answer.status).value_or(0),
          fmt::format("RTSP/1.0 {}\r\n{}{}{}\r\n{}", answer.status, sequence, answer.fields, content, answer.body)};
}

}  // namespace vexa::camera

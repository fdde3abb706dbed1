// SPDX-License-Identifier: Apache-2.0
// What the virtual camera reads from a host: HTTP and RTSP requests, their fields and queries, reports between
// requests.
#include <string>

#include "fuzz/check.h"
#include "virtual_camera/wire/message.h"
#include "virtual_camera/wire/rtsp_message.h"

namespace {

using vexa_fuzz::check;
namespace camera = vexa::camera;

void read_fields(const camera::RequestHead& head) {
  static_cast<void>(camera::sequence_of(head));
  static_cast<void>(camera::session_of(head));
  static_cast<void>(camera::scale_of(head));
  const auto transport = camera::asked_transport(head.field("Transport"));
  check(transport.kind != camera::AskedTransport::Kind::kInterleaved || transport.first <= 255);
  check(camera::credentials_match(head.field("Authorization"), "", ""));
  check(head.path.find('?') == std::string::npos);
  for (const auto& [key, value] : camera::query_pairs(head.query)) {
    check(!key.empty() && (key + value).find('&') == std::string::npos);
  }
  if (camera::video_number(head.path) != 0) check(camera::classify_url(head.path) != camera::VideoUrl::kNone);
  check(camera::recording_url(head.path).name.size() <= head.path.size());
}

void write_answer(std::string_view text) {
  const std::string status = "200 OK";
  const camera::Answer answer = camera::rtsp_answer({status, 7, "", text});
  check(answer.bytes.size() >= text.size() || answer.bytes.size() <= camera::kMaxRtspAnswer);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(vexa_fuzz::text_of(data, size));
  const std::size_t head = camera::head_size(text);
  check(head <= size);
  check(camera::rtsp_request_size(text) <= size && camera::leading_packets_size(text) <= size);
  if (const auto parsed = camera::parse_head(text.substr(0, head == 0 ? size : head))) read_fields(*parsed);
  const std::string escaped = camera::percent_encoded_for_list(text);
  const auto plain = camera::percent_decoded(escaped);
  check(plain && *plain == text);
  static_cast<void>(camera::percent_decoded(text));
  write_answer(text);
  return 0;
}

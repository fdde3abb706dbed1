// SPDX-License-Identifier: Apache-2.0
// HTTP (RFC 1945) as the camera reads and writes it: request heads, answers, Basic credentials, percent-encoded texts
// (RFC 3986, 2.1).
#ifndef VIRTUAL_CAMERA_WIRE_MESSAGE_H_
#define VIRTUAL_CAMERA_WIRE_MESSAGE_H_

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace vexa::camera {

struct RequestHead {
  std::string method;
  std::string target;   // as sent: "/command/..." or with scheme and authority before it
  std::string path;     // of the target, without the query
  std::string query;    // after the "?"
  std::string version;  // "HTTP/1.0", "RTSP/1.0"
  std::vector<std::pair<std::string, std::string>> fields;

  // The value of a field, whatever the case of its name; empty when absent.
  [[nodiscard]] std::string_view field(std::string_view name) const;
};

// Bytes up to and including the empty line that ends the head; 0 when it has not come yet. Empty lines before the
// request line belong to the head.
[[nodiscard]] std::size_t head_size(std::string_view received);

// Nothing when the text is no request head.
[[nodiscard]] std::optional<RequestHead> parse_head(std::string_view head);

// "K=V&K=V" as pairs, undecoded; what has no key or no "=" is left out.
[[nodiscard]] std::vector<std::pair<std::string, std::string>> query_pairs(std::string_view query);

struct Answer {
  int status = 0;
  std::string bytes;
};

// `status` as in "404 Not Found".
[[nodiscard]] Answer http_answer(std::string_view status, std::string_view body);

// The command was obeyed.
[[nodiscard]] Answer no_content();

// The bytes of a percent-encoded text; nullopt when it is no such text.
[[nodiscard]] std::optional<std::string> percent_decoded(std::string_view text);
// The text with its "%", ",", "&" and control characters percent-encoded, so that a list can hold it.
[[nodiscard]] std::string percent_encoded_for_list(std::string_view text);

[[nodiscard]] std::string base64_text(std::string_view bytes);

// Whether an Authorization header value lets its sender in. Empty user and password let everyone in.
[[nodiscard]] bool credentials_match(std::string_view authorization, std::string_view user, std::string_view password);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_WIRE_MESSAGE_H_

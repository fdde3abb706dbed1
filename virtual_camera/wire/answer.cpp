#include "virtual_camera/wire/answer.h"

#include <fmt/format.h>

#include <charconv>

namespace vexa::camera {

Answer http_answer(std::string_view status, std::string_view body) {
  Answer answer;
  std::from_chars(status.data(), status.data() + status.size(), answer.status);
  const std::string_view challenge = answer.status == 401 ? "WWW-Authenticate: Basic realm=\"camera\"\r\n" : "";
  answer.bytes = fmt::format("HTTP/1.0 {}\r\n{}Content-Type: text/plain\r\nContent-Length: {}\r\n\r\n{}", status,
                             challenge, body.size(), body);
  return answer;
}

Answer no_content() { return {204, "HTTP/1.0 204 No Content\r\n\r\n"}; }

}  // namespace vexa::camera

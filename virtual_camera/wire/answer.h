// What the camera answers to a request, and the HTTP answers (RFC 1945) that its commands share.
#ifndef VIRTUAL_CAMERA_WIRE_ANSWER_H_
#define VIRTUAL_CAMERA_WIRE_ANSWER_H_

#include <string>
#include <string_view>

namespace vexa::camera {

struct Answer {
  int status = 0;
  std::string bytes;
};

// `status` as in "404 Not Found".
[[nodiscard]] Answer http_answer(std::string_view status, std::string_view body);

// The command was obeyed.
[[nodiscard]] Answer no_content();

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_WIRE_ANSWER_H_

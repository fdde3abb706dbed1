// The camera's HTTP commands: one request head in, one answer out.
#ifndef VIRTUAL_CAMERA_MODEL_CGI_H_
#define VIRTUAL_CAMERA_MODEL_CGI_H_

#include <string>
#include <string_view>

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

struct Answer {
  int status = 0;
  std::string bytes;
};

// `status` as in "404 Not Found".
[[nodiscard]] Answer http_answer(std::string_view status, std::string_view body);

// A command taken.
[[nodiscard]] Answer no_content();

// "/command/inquiry.cgi?inq=NAME" reads a section, "/command/NAME.cgi?KEY=VALUE&..." changes one; 400 for what
// the camera does not take.
[[nodiscard]] Answer answer_command(const RequestHead& request, SettingsStore& settings);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_CGI_H_

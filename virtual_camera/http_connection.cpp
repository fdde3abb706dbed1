#include "virtual_camera/http_connection.h"

#include <optional>

#include "virtual_camera/credentials.h"
#include "virtual_camera/message.h"

namespace vexa::camera {

std::size_t HttpConnection::request_size(std::string_view received) const { return head_size(received); }

Answer HttpConnection::answer(const std::string& request) {
  const std::optional<RequestHead> head = parse_head(request);
  if (!head) return http_answer("400 Bad Request", "");
  const CameraOptions& options = state().options;
  if (!credentials_match(head->field("Authorization"), options.user, options.password)) {
    return http_answer("401 Unauthorized", "");
  }
  return answer_command(*head, state().settings);
}

Answer HttpConnection::refuse(const std::string&, std::string_view status) const { return http_answer(status, ""); }

}  // namespace vexa::camera

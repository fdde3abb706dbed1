// HTTP Basic credentials, as both of the camera's servers check them.
#ifndef VIRTUAL_CAMERA_WIRE_CREDENTIALS_H_
#define VIRTUAL_CAMERA_WIRE_CREDENTIALS_H_

#include <string>
#include <string_view>

namespace vexa::camera {

[[nodiscard]] std::string base64_text(std::string_view bytes);

// Whether an Authorization header value lets its sender in. Empty user and password let everyone in.
[[nodiscard]] bool credentials_match(std::string_view authorization, std::string_view user, std::string_view password);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_WIRE_CREDENTIALS_H_

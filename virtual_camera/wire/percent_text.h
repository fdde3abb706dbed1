// Percent-encoded texts in commands and answers (RFC 3986, 2.1).
#ifndef VIRTUAL_CAMERA_WIRE_PERCENT_TEXT_H_
#define VIRTUAL_CAMERA_WIRE_PERCENT_TEXT_H_

#include <optional>
#include <string>
#include <string_view>

namespace vexa::camera {

// The bytes of a percent-encoded text; none when it is no such text.
[[nodiscard]] std::optional<std::string> percent_decoded(std::string_view text);
// The text with its "%", ",", "&" and control characters percent-encoded, so that a list can hold it.
[[nodiscard]] std::string percent_encoded_for_list(std::string_view text);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_WIRE_PERCENT_TEXT_H_

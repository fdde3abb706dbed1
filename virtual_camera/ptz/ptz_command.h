// SPDX-License-Identifier: Apache-2.0
// The commands that move a camera, read from the texts of requests.
#ifndef VIRTUAL_CAMERA_PTZ_PTZ_COMMAND_H_
#define VIRTUAL_CAMERA_PTZ_PTZ_COMMAND_H_

#include <optional>
#include <string_view>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/ptz/ptz_mechanism.h"

namespace vexa::camera {

// The picture that hosts see: of the first stream, by which they point.
struct PtzPicture {
  PictureSize size;
  bool turned = false;  // by 180 degrees
};

// The motors' order in "KEY=VALUE" of "/command/ptzf.cgi"; none for what the model lacks or for values out of
// range. Directions and areas are those of the picture; positions stay the motors' when it is turned.
[[nodiscard]] std::optional<PtzOrder> ptz_order(std::string_view key, std::string_view value, const PtzProfile& profile,
                                                const PtzPicture& picture);

// The pieces between commas, empty ones too.
[[nodiscard]] std::vector<std::string_view> comma_pieces(std::string_view text);
// A decimal number from `least` to `most` and no other text.
[[nodiscard]] std::optional<int> number_within(std::string_view text, int least, int most);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PTZ_PTZ_COMMAND_H_

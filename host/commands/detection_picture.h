// SPDX-License-Identifier: Apache-2.0
// The picture that a camera sends now, with its detection windows drawn on it.
#ifndef HOST_COMMANDS_DETECTION_PICTURE_H_
#define HOST_COMMANDS_DETECTION_PICTURE_H_

#include <optional>
#include <string>

#include "host/camera/model_camera.h"

namespace vexa::host {

// Finds early why a picture could not be written to `file`.
[[nodiscard]] std::optional<Problem> check_picture_file(const std::string& file);

[[nodiscard]] std::optional<Problem> draw_detection(const ModelCamera& camera, const SLibDDetectionParam& setting,
                                                    const std::string& file);

}  // namespace vexa::host

#endif  // HOST_COMMANDS_DETECTION_PICTURE_H_

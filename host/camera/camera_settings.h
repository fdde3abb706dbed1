// SPDX-License-Identifier: Apache-2.0
// A camera's settings as a whole: read, shown, changed.
#ifndef HOST_CAMERA_CAMERA_SETTINGS_H_
#define HOST_CAMERA_CAMERA_SETTINGS_H_

#include <nlohmann/json_fwd.hpp>
#include <optional>
#include <string>

#include "host/camera/model_camera.h"
#include "host/words/setting_words.h"

namespace vexa::host {

// A member for each setting, in the words that `set` takes; null for what the camera does not report.
[[nodiscard]] Result<nlohmann::ordered_json> read_settings(const ModelCamera& camera);

// The name of a setting and its value in two columns; "-" for null.
[[nodiscard]] std::string settings_table(const nlohmann::ordered_json& settings);

// Makes the changes, the video stream's first and in one request. Those made before a failure stay.
[[nodiscard]] std::optional<Problem> change_settings(const ModelCamera& camera, const SettingChanges& changes);

}  // namespace vexa::host

#endif  // HOST_CAMERA_CAMERA_SETTINGS_H_

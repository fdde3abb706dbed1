#include "virtual_camera/camera_state.h"

#include <variant>

#include "virtual_camera/camera_profile.h"
#include "virtual_camera/setting_rules.h"

namespace vexa::camera {

void CameraState::take_profile() {
  if (!options.profile && !options.profile_path.empty()) {
    auto loaded = load_camera_profile(options.profile_path);
    if (const auto* error = std::get_if<std::string>(&loaded)) {
      profile_error = *error;
      return;
    }
    options.profile = std::make_shared<const SettingRules>(std::get<CameraProfile>(std::move(loaded)));
  }
  if (options.profile) settings.obey(options.profile);
}

}  // namespace vexa::camera

#include "virtual_camera/server/camera_state.h"

#include <variant>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/model/setting_rules.h"
#include "virtual_camera/source/stream_plan.h"

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
  if (!options.profile) return;
  settings.obey(options.profile);
  const CameraProfile& model = options.profile->profile();
  alarms.rearrange({model.alarm_inputs, model.video_detection, model.tampering_detection, model.audio_detection});
  if (!model.ptz) return;
  ptz = std::make_unique<PtzHead>(*model.ptz, std::chrono::steady_clock::now(), options.speed * options.ptz_speed);
  pose = [this](PtzHead::Time now) { return ptz->pose(ptz_picture().turned, now); };
}

PtzPicture CameraState::ptz_picture() const {
  PtzPicture picture;
  if (const auto stream = stream_settings(settings, 1)) picture.size = {stream->width, stream->height};
  picture.turned = settings.get("camera", "Eflip") == "on";
  return picture;
}

void CameraState::report_presets() {
  if (!settings.answer("presetposition")) return;
  settings.erase("presetposition", "PresetName");
  for (const auto& [key, value] : ptz->preset_settings(std::chrono::steady_clock::now())) {
    settings.set("presetposition", key, value);
  }
}

void CameraState::report_contacts() {
  if (!settings.answer("sensor")) return;
  const std::vector<int> contacts = alarms.contacts();
  for (std::size_t i = 0; i < contacts.size(); ++i) {
    settings.set("sensor", "Sensor" + std::to_string(i + 1), std::to_string(contacts[i]));
  }
}

void CameraState::report_card() {
  if (!settings.answer("a-slot") || options.card_bytes == 0) return;
  settings.set("a-slot", "ASlot", card.space_text());
}

void CameraState::switch_detectors() {
  alarms.switch_detectors(settings.get("system", "TamperingFunc") == "on",
                          settings.get("audiodetection", "ADFunc") == "on");
}

}  // namespace vexa::camera

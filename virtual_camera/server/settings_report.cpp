#include "virtual_camera/server/settings_report.h"

#include <chrono>
#include <cstddef>
#include <string>
#include <vector>

#include "virtual_camera/model/stream_settings.h"

namespace vexa::camera {

void report_contacts(const AlarmScene& alarms, SettingsStore& settings) {
  if (!settings.answer("sensor")) return;
  const std::vector<int> contacts = alarms.contacts();
  for (std::size_t i = 0; i < contacts.size(); ++i) {
    settings.set("sensor", "Sensor" + std::to_string(i + 1), std::to_string(contacts[i]));
  }
}

void report_card(const Card& card, SettingsStore& settings) {
  if (!settings.answer("a-slot")) return;
  settings.set("a-slot", "ASlot", card.space_text());
}

void report_presets(PtzHead& ptz, SettingsStore& settings) {
  if (!settings.answer("presetposition")) return;
  settings.erase("presetposition", "PresetName");
  for (const auto& [key, value] : ptz.preset_settings(std::chrono::steady_clock::now())) {
    settings.set("presetposition", key, value);
  }
}

void switch_detectors(const SettingsStore& settings, AlarmScene& alarms) {
  alarms.switch_detectors(settings.get("system", "TamperingFunc") == "on",
                          settings.get("audiodetection", "ADFunc") == "on");
}

PtzPicture pointed_picture(const SettingsStore& settings) {
  PtzPicture picture;
  if (const auto stream = stream_settings(settings, 1)) picture.size = {stream->width, stream->height};
  picture.turned = settings.get("camera", "Eflip") == "on";
  return picture;
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
// Commands of pages and hosts that a virtual camera obeys: settings, motors, presets and tours, recordings. Each line
// of the input is the target of a request; the first byte chooses the camera's model.
#include <array>
#include <memory>
#include <string>

#include "fuzz/check.h"
#include "virtual_camera/card/card.h"
#include "virtual_camera/model/setting_rules.h"
#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/ptz/preset_section.h"
#include "virtual_camera/ptz/ptz_command.h"
#include "virtual_camera/wire/message.h"

namespace {

using vexa_fuzz::check;
namespace camera = vexa::camera;

constexpr std::array kModels = {"LMX-P200", "LMX-C100", "LMX-M300", "LMX-H100"};
constexpr std::uint64_t kCardSize = 1 << 20;

std::shared_ptr<const camera::SettingRules> rules_of(std::size_t model) {
  const std::string file = std::string(VEXA_SOURCE_DIR) + "/models/profiles/" + kModels[model] + ".json";
  auto profile = camera::load_camera_profile(file);
  check(std::holds_alternative<camera::CameraProfile>(profile));
  return std::make_shared<const camera::SettingRules>(std::get<camera::CameraProfile>(std::move(profile)));
}

const std::shared_ptr<const camera::SettingRules>& rules(std::size_t model) {
  static std::array<std::shared_ptr<const camera::SettingRules>, kModels.size()> known;
  if (!known[model]) known[model] = rules_of(model);
  return known[model];
}

/// A camera without a network.
struct Camera {
  explicit Camera(const std::shared_ptr<const camera::SettingRules>& model) : rules(model) {
    settings.obey(model);
    if (rules->profile().ptz) presets.emplace(*rules->profile().ptz);
    recording = card.begin({});
    card.finish();
  }

  void take(const camera::RequestHead& head) {
    check(camera::answer_command(head, settings).status >= 200);
    if (const auto answer = camera::answer_card(head, card)) check(answer->status >= 200);
    const auto pairs = camera::query_pairs(head.query);
    if (!presets) return;
    for (const auto& [key, value] : pairs) {
      static_cast<void>(camera::ptz_order(key, value, *rules->profile().ptz, {{640, 480}, false}));
    }
    const auto before = presets->answer();
    if (!presets->set_tours(pairs)) check(presets->answer() == before);
  }

  std::shared_ptr<const camera::SettingRules> rules;
  camera::SettingsStore settings;
  std::optional<camera::PresetSection> presets;
  camera::Card card{kCardSize};
  std::string recording;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  Camera camera(rules(data[0] % kModels.size()));
  std::string_view lines = vexa_fuzz::text_of(data + 1, size - 1);
  while (!lines.empty()) {
    const std::size_t end = std::min(lines.find('\n'), lines.size());
    const auto head = camera::parse_head("GET " + std::string(lines.substr(0, end)) + " HTTP/1.0\r\n\r\n");
    if (head) camera.take(*head);
    lines.remove_prefix(std::min(end + 1, lines.size()));
  }
  for (int stream = 1; stream <= 3; ++stream) static_cast<void>(camera::stream_settings(camera.settings, stream));
  return 0;
}

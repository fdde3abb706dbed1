// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/http_commands.h"

#include <chrono>
#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/card/card.h"
#include "virtual_camera/model/settings_store.h"

namespace vexa::camera {
namespace {

// nullopt: the request is left to the settings.
using Handler = std::optional<Answer> (*)(const RequestHead& head, CameraState& state);

std::optional<Answer> inquire(const RequestHead& head, CameraState& state) {
  if (head.query == "inq=sensor") report_contacts(state.alarms, state.settings);
  if (head.query == "inq=a-slot" && state.options.card_bytes > 0) report_card(state.card, state.settings);
  if (head.query == "inq=presetposition" && state.ptz) report_presets(*state.ptz, state.settings);
  return std::nullopt;
}

// A camera without a slot has no such section.
std::optional<Answer> use_card(const RequestHead& head, CameraState& state) {
  return state.settings.answer("a-slot") ? answer_card(head, state.card) : std::nullopt;
}

Answer obeyed(bool done) { return done ? no_content() : http_answer("400 Bad Request", ""); }

std::optional<Answer> move(const RequestHead& head, CameraState& state) {
  if (!state.ptz || head.method != "GET") return std::nullopt;
  const auto now = std::chrono::steady_clock::now();
  return obeyed(state.ptz->move(query_pairs(head.query), pointed_picture(state.settings), now));
}

std::optional<Answer> set_presets(const RequestHead& head, CameraState& state) {
  if (!state.ptz || head.method != "GET") return std::nullopt;
  return obeyed(state.ptz->command_presets(query_pairs(head.query), std::chrono::steady_clock::now()));
}

constexpr struct {
  std::string_view path;
  Handler handle;
} kRoutes[] = {{"/command/inquiry.cgi", inquire},
               {"/command/search", use_card},
               {"/command/edgestorage.cgi", use_card},
               {"/command/ptzf.cgi", move},
               {"/command/presetposition.cgi", set_presets}};

Answer obey_setting(const RequestHead& head, CameraState& state) {
  Answer answer = answer_command(head, state.settings);
  if (answer.status != 204) return answer;
  if (state.requests.settings_changed) state.requests.settings_changed();
  switch_detectors(state.settings, state.alarms);
  if (head.path == "/command/system.cgi" && head.query == "TamperingStatusClear=on") state.alarms.clear_tampering();
  return answer;
}

}  // namespace

Answer obey_command(const RequestHead& head, CameraState& state) {
  for (const auto& route : kRoutes) {
    if (route.path != head.path) continue;
    if (std::optional<Answer> answer = route.handle(head, state)) return *std::move(answer);
  }
  return obey_setting(head, state);
}

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

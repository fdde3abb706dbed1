#include "virtual_camera/server/http_commands.h"

#include <chrono>
#include <optional>
#include <string_view>

#include "virtual_camera/card/card_cgi.h"
#include "virtual_camera/model/cgi.h"
#include "virtual_camera/server/settings_report.h"

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

}  // namespace vexa::camera

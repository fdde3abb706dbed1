// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/camera_control.h"

#include <cstdint>
#include <utility>
#include <vector>

#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/server/control_port.h"
#include "virtual_camera/server/rtsp_session.h"
#include "virtual_camera/values/fault_words.h"
#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

constexpr std::string_view kDone = "204 No Content";
constexpr std::string_view kCannot = "400 Bad Request";
constexpr std::string_view kUnknown = "404 Not Found";
constexpr std::string_view kRequestFaults = "/faults/request/";

constexpr std::string_view kList =
    "/contact/1/close, /contact/1/open           a contact closes or opens\n"
    "/lens/cover, /lens/free                     somebody covers the lens\n"
    "/noise/on, /noise/off                       it becomes loud, or quiet\n"
    "/motion/2/50                                something moves in window 2; 0: no longer\n"
    "/walk, /walk/SECONDS                        an intruder walks through the picture\n"
    "/network/unplug, /network/plug              the network cable\n"
    "/reboot, /reboot/SECONDS                    the camera reboots, and is back after 5 seconds or so many\n"
    "/clock/SECONDS                              the camera's clock shows this time, in seconds since 1970 UTC\n"
    "/faults/packets?loss=0.01&reorder=0.1       these faults of RTP packets and no others, from now on\n"
    "/faults/request/slow-answer?match=PLAY&value=500\n"
    "                                            a fault of requests that contain \"PLAY\" (PLAY%232: of the second)\n"
    "/faults/clear                               neither faults of packets nor of requests any more\n";

std::vector<std::string_view> steps_of(std::string_view path) {
  std::vector<std::string_view> steps;
  while (path.starts_with('/')) {
    path.remove_prefix(1);
    steps.push_back(path.substr(0, path.find('/')));
    path.remove_prefix(steps.back().size());
  }
  return steps;
}

struct Switch {
  std::string_view name;
  AlarmEvent::Kind kind;
  std::string_view on;
  std::string_view off;
};

constexpr Switch kContact{"contact", AlarmEvent::Kind::kContact, "close", "open"};
constexpr Switch kSwitches[] = {{"lens", AlarmEvent::Kind::kLens, "cover", "free"},
                                {"noise", AlarmEvent::Kind::kNoise, "on", "off"}};

std::optional<AlarmEvent> switched(const Switch& by, std::string_view word, int number) {
  if (word != by.on && word != by.off) return std::nullopt;
  return AlarmEvent{by.kind, number, word == by.on ? 1 : 0};
}

std::optional<AlarmEvent> event_of(const std::vector<std::string_view>& steps) {
  for (const Switch& by : kSwitches) {
    if (steps.size() == 2 && steps[0] == by.name) return switched(by, steps[1], 1);
  }
  if (steps.size() != 3) return std::nullopt;
  const std::optional<int> number = whole_number(steps[1]);
  if (!number) return std::nullopt;
  if (steps[0] == kContact.name) return switched(kContact, steps[2], *number);
  const std::optional<int> value = whole_number(steps[2]);
  if (steps[0] != "motion" || !value) return std::nullopt;
  return AlarmEvent{AlarmEvent::Kind::kMotion, *number, *value};
}

// "/WORD", or "/WORD/SECONDS" with 1 to 3600 seconds.
std::optional<std::chrono::seconds> seconds_of(std::string_view path, std::string_view word, int usual) {
  constexpr int kLongest = 3600;
  const std::vector<std::string_view> steps = steps_of(path);
  if (steps.empty() || steps.size() > 2 || steps[0] != word) return std::nullopt;
  if (steps.size() == 1) return std::chrono::seconds(usual);
  const std::optional<int> seconds = whole_number(steps[1]);
  if (!seconds || *seconds < 1 || *seconds > kLongest) return std::nullopt;
  return std::chrono::seconds(*seconds);
}

// "/clock/SECONDS", as far as the texts of a card's recordings can express it.
std::optional<std::chrono::system_clock::time_point> time_of(std::string_view path) {
  constexpr std::int64_t kLatest = 4102444800;  // the year 2100
  constexpr std::string_view kClock = "/clock/";
  if (!path.starts_with(kClock)) return std::nullopt;
  const std::optional<std::int64_t> seconds = whole_number<std::int64_t>(path.substr(kClock.size()));
  if (!seconds || *seconds < 0 || *seconds > kLatest) return std::nullopt;
  return std::chrono::system_clock::time_point(std::chrono::seconds(*seconds));
}

}  // namespace

std::optional<AlarmEvent> control_event(std::string_view path) { return event_of(steps_of(path)); }

std::optional<std::chrono::seconds> control_walk(std::string_view path) { return seconds_of(path, "walk", 10); }

std::optional<std::chrono::seconds> control_reboot(std::string_view path) { return seconds_of(path, "reboot", 5); }

std::string_view control_list() { return kList; }

CameraControl::CameraControl(std::shared_ptr<CameraState> state)
    : state_(std::move(state)), watch_(std::make_shared<IntruderWatch>(state_)) {}

void CameraControl::stop() { watch_->stop(); }

bool CameraControl::change_packet_faults(std::string_view query) {
  PacketFaults faults;
  faults.sequence_restarts = state_->options.packet_faults.sequence_restarts;
  faults.timestamp_restarts = state_->options.packet_faults.timestamp_restarts;
  for (const auto& [word, value] : query_pairs(query)) {
    if (!set_packet_fault(faults, word, value)) return false;
  }
  state_->packet_faults.set(faults);
  for (const auto& [number, session] : state_->sessions) session->change_faults(faults);
  return true;
}

bool CameraControl::add_request_fault(std::string_view word, std::string_view query) {
  std::optional<std::string> match = std::string();
  std::optional<std::string> value = std::string();
  for (const auto& [key, text] : query_pairs(query)) {
    if (key != "match" && key != "value") return false;
    (key == "match" ? match : value) = percent_decoded(text);
  }
  std::optional<RequestFault> fault = match && value ? request_fault(word, *match, *value) : std::nullopt;
  return fault && state_->request_faults.add(*std::move(fault));
}

void CameraControl::clear_faults() {
  state_->request_faults.clear();
  (void)change_packet_faults({});
}

std::string_view CameraControl::obey(std::string_view path, std::string_view query) {
  if (path == "/network/unplug" || path == "/network/plug") {
    if (state_->requests.set_network) state_->requests.set_network(path == "/network/plug");
    return kDone;
  }
  if (const auto away = control_reboot(path)) {
    if (state_->requests.reboot) state_->requests.reboot(*away);
    return kDone;
  }
  if (const auto time = control_walk(path)) {
    const std::chrono::duration<double, std::milli> at_pace = *time / state_->options.speed;
    watch_->walk(std::chrono::duration_cast<std::chrono::milliseconds>(at_pace));
    return kDone;
  }
  if (const auto time = time_of(path)) {
    state_->set_clock(*time);
    return kDone;
  }
  if (path == "/faults/clear") {
    clear_faults();
    return kDone;
  }
  if (path == "/faults/packets") return change_packet_faults(query) ? kDone : kCannot;
  if (path.starts_with(kRequestFaults)) {
    return add_request_fault(path.substr(kRequestFaults.size()), query) ? kDone : kCannot;
  }
  const auto event = control_event(path);
  if (!event) return kUnknown;
  return state_->alarms.happen(*event) ? kDone : kCannot;
}

std::string CameraControl::answer(const RequestHead& request) {
  if (request.path == "/") return control_answer("200 OK", "text/plain", kList);
  return control_answer(obey(request.path, request.query));
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
#include "host/words/alarm_words.h"

#include <fmt/format.h>

#include <nlohmann/json.hpp>

namespace vexa::host {

using Json = nlohmann::ordered_json;

std::string kind_of(const SLibDPinInfo& pin) {
  switch (pin.type) {
    case PIN_TYPE_ALARM_OUTPUT:
      return "output";
    case PIN_TYPE_DETECTION:
      return "motion";
    case PIN_TYPE_TAMPERING:
      return "tampering";
    case PIN_TYPE_AUDIO_DETECTION:
      return "audio";
    default:
      return "input";
  }
}

std::vector<SLibDPinInfo> PinStates::changed(const std::vector<SLibDPinInfo>& pins) {
  std::vector<SLibDPinInfo> result;
  for (const SLibDPinInfo& pin : pins) {
    int& state = states_[{pin.type, pin.number}];
    if (state == pin.state) continue;
    state = pin.state;
    result.push_back(pin);
  }
  return result;
}

std::string alarm_line(const SLibDPinInfo& pin, const std::string& moment, WatchFormat format) {
  const char* state = pin.state != 0 ? "active" : "inactive";
  if (format == WatchFormat::kText)
    return fmt::format("{}  {:>2}  {:<9}  {}\n", moment, pin.number, kind_of(pin), state);
  return Json{{"time", moment}, {"pin", pin.number}, {"kind", kind_of(pin)}, {"state", state}}.dump() + "\n";
}

std::string metadata_line(const SLibDRawMDFrameInfo& frame, const std::string& moment, WatchFormat format) {
  if (format == WatchFormat::kText) {
    return fmt::format("{}   -  metadata   {} {} {} {}\n", moment, frame.window1, frame.window2, frame.window3,
                       frame.window4);
  }
  const Json windows = Json::array({frame.window1, frame.window2, frame.window3, frame.window4});
  return Json{{"time", moment}, {"kind", "metadata"}, {"windows", windows}}.dump() + "\n";
}

}  // namespace vexa::host

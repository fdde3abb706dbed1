// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/alarm_text.h"

#include "runtime/base/text.h"
#include "transport/wire/http_answer.h"

namespace vexa {
namespace {

constexpr std::int64_t kLongestTampering = 59;  // seconds

constexpr Word<bool> kDetectorWords[] = {{true, "on"}, {false, "off"}};

std::int64_t seconds_between(std::time_t earlier, std::time_t later) {
  return std::int64_t{later} - std::int64_t{earlier};
}

}  // namespace

SLibDPinInfo pin_of(std::int32_t number, ELibDPinType type, bool enabled) {
  SLibDPinInfo pin;
  pin.number = number;
  pin.type = type;
  pin.enabled = enabled;
  return pin;
}

void append_pins(const SLibDFixedIoBoxInfo& fixed, std::vector<SLibDPinInfo>& pins) {
  for (std::int32_t number = 1; number <= fixed.inputCount; ++number) {
    pins.push_back(pin_of(number, PIN_TYPE_SENSOR_INPUT));
  }
  for (std::int32_t number = 1; number <= fixed.outputCount; ++number) {
    pins.push_back(pin_of(number, PIN_TYPE_ALARM_OUTPUT));
  }
}

std::int32_t first_detector_number(const SLibDFixedIoBoxInfo& fixed) {
  return fixed.inputCount < 0 ? 1 : fixed.inputCount + 1;
}

bool detector_enabled(std::string_view answer, std::string_view key) {
  return value_of(kDetectorWords, cgi_value(answer, key).value_or("")).value_or(true);
}

std::optional<std::int32_t> tamper_level_of(std::string_view answer) {
  const auto word = cgi_value(answer, "TamperingLevel=");
  if (!word) return std::nullopt;
  const auto level = value_of(kTamperWords, *word);
  return level ? static_cast<std::int32_t>(*level) : 0;
}

std::vector<SLibDPinInfo> sensor_pins(std::string_view answer) {
  std::vector<SLibDPinInfo> pins;
  while (auto text = text_after(answer, "Sensor")) {
    answer = *text;
    const auto number = take_int(*text);
    if (!number || !text->starts_with('=')) continue;
    text->remove_prefix(1);
    const auto state = take_int(*text);
    if (!state) continue;
    pins.push_back(pin_of(*number, PIN_TYPE_SENSOR_INPUT));
    pins.back().state = *state;
  }
  return pins;
}

bool tampering_is_due(std::int32_t state, std::time_t now, std::time_t& since) {
  if (state == 0) since = 0;
  if (state != 1) return false;
  if (since == 0) since = now;
  return seconds_between(since, now) > kLongestTampering;
}

}  // namespace vexa

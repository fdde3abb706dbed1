// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/input_part.h"

#include <cstddef>
#include <iterator>
#include <optional>

#include "device/cgi/alarm_text.h"
#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr std::size_t kAfterSensor = 10;
constexpr std::size_t kAfterFlag = 6;
constexpr std::size_t kAfterWindow = 9;
constexpr std::size_t kAfterTampering = 12;

/// Walks through a part as its items are looked for, one kind after the other.
class InputPartReader {
 public:
  InputPartReader(std::string_view part, MotionReport motion) : part_(part), motion_(motion) {}

  PinMasks read() {
    read_sensors();
    for (const ELibDPinType detector : kDetectorOrder) read_detector(detector);
    return pins_;
  }

 private:
  void read_sensors();
  void read_detector(ELibDPinType detector);
  void read_motion_flag();
  void read_motion_windows();
  void read_tampering();
  void read_audio();

  std::optional<std::string_view> find(std::string_view key);
  void step_past(std::size_t length) { search_ = match_ + length; }
  void report(std::int64_t bit);
  void report_motion() { report(motion_.motion_detection ? 0 : number_); }

  std::string_view part_;
  MotionReport motion_;
  PinMasks pins_;
  std::size_t search_ = 0;   ///< where the next item is looked for
  std::size_t match_ = 0;    ///< where the last one was found
  std::int64_t number_ = 0;  ///< of the last sensor, one more with a tampering item
  int value_ = 0;            ///< of the last item; one kind hands it on to the next
};

/// What follows the next `key`, whose place is remembered.
std::optional<std::string_view> InputPartReader::find(std::string_view key) {
  const std::size_t at = part_.find(key, search_);
  if (at == std::string_view::npos) return std::nullopt;
  match_ = at;
  return part_.substr(at + key.size());
}

/// Sets the bit as present and puts the value there. A bit that the masks do not have is passed over.
void InputPartReader::report(std::int64_t bit) {
  constexpr std::int64_t kBits = 32;
  if (bit < 0 || bit >= kBits) return;
  pins_.present |= std::uint32_t{1} << bit;
  pins_.state |= static_cast<std::uint32_t>(value_) << bit;
}

/// Takes "=NUMBER" from the front of `text`.
std::optional<int> take_value(std::string_view& text) {
  if (!text.starts_with('=')) return std::nullopt;
  text.remove_prefix(1);
  return take_int(text);
}

void InputPartReader::read_sensors() {
  while (auto text = find("Sensor")) {
    step_past(kAfterSensor);
    // Kept: a sensor's number counts as soon as it is read, with no value after it and beyond the bits as well.
    const auto number = take_int(*text);
    if (!number) continue;
    number_ = *number;
    const auto value = take_value(*text);
    if (!value) continue;
    value_ = *value;
    report(number_ - 1);
  }
  search_ = match_;
}

void InputPartReader::read_detector(ELibDPinType detector) {
  if (detector == PIN_TYPE_TAMPERING) return read_tampering();
  if (detector == PIN_TYPE_AUDIO_DETECTION) return read_audio();
  motion_.one_flag ? read_motion_flag() : read_motion_windows();
}

void InputPartReader::read_motion_flag() {
  auto text = find("VMF");
  if (!text) return;
  step_past(kAfterFlag);
  const auto value = take_value(*text);
  if (!value) return;
  value_ = *value;
  report_motion();
}

void InputPartReader::read_motion_windows() {
  bool any = false;
  while (auto text = find(motion_.motion_detection ? "MdWin" : "OdWin")) {
    step_past(kAfterWindow);
    const auto window = take_int(*text);
    int reported = 0;
    bool has_value = false;
    if (window) {
      if (const auto value = take_value(*text)) {
        reported = *value;
        has_value = any = true;
      }
    }
    // Kept: the last sensor's value goes in, so without window 1 it is what the other windows are compared with.
    if ((window == 1 && has_value) || reported > value_) value_ = reported;
  }
  if (any) report_motion();
}

void InputPartReader::read_tampering() {
  auto text = find("Tampering");
  if (!text) return;
  step_past(kAfterTampering);
  // Kept: the bits that follow move up although the item may have no value.
  ++number_;
  const auto value = take_value(*text);
  if (!value) return;
  value_ = *value;
  report(number_);
}

void InputPartReader::read_audio() {
  auto text = find("Audio");
  if (!text) return;
  const auto value = take_value(*text);
  if (!value) return;
  value_ = *value;
  report(number_ + 1);
}

/// Hands out the types of the pins after the inputs: each detector that the camera has once, in order.
class DetectorTypes {
 public:
  explicit DetectorTypes(const SLibDFixedIoBoxInfo& fixed) : fixed_(fixed) {}

  ELibDPinType next() {
    for (; next_ < std::size(kDetectorOrder); ++next_) {
      const ELibDPinType type = kDetectorOrder[next_];
      // Kept: all further pins are audio, or inputs of a camera without it.
      if (type == PIN_TYPE_AUDIO_DETECTION) return fixed_.audioDetection ? type : PIN_TYPE_SENSOR_INPUT;
      if (type == PIN_TYPE_DETECTION ? fixed_.videoDetection : fixed_.tamperingDetection) {
        ++next_;
        return type;
      }
    }
    return PIN_TYPE_SENSOR_INPUT;
  }

 private:
  const SLibDFixedIoBoxInfo& fixed_;
  std::size_t next_ = 0;
};

void take_window(std::string_view body, std::string_view key, std::int32_t& value) {
  auto text = text_after(body, key);
  if (!text) return;
  if (const auto number = take_int(*text)) value = *number;
}

}  // namespace

PinMasks parse_input_part(std::string_view part, MotionReport motion) { return InputPartReader(part, motion).read(); }

void take_status_pins(PinMasks masks, const SLibDFixedIoBoxInfo& fixed, std::vector<SLibDPinInfo>& pins) {
  pins.clear();
  DetectorTypes detectors(fixed);
  for (int bit = 0; bit < static_cast<int>(kMostStatusPins); ++bit) {
    if ((masks.present >> bit & 1) == 0) continue;
    const std::int32_t number = bit + 1;
    pins.push_back(pin_of(number, number > fixed.inputCount ? detectors.next() : PIN_TYPE_SENSOR_INPUT));
    pins.back().state = static_cast<std::int32_t>(masks.state >> bit & 1);
  }
}

void take_metadata(std::string_view body, SLibDRawMDFrameInfo& frame) {
  const std::string_view text = before_nul(body);
  take_window(text, "Window1=", frame.window1);
  take_window(text, "Window2=", frame.window2);
  take_window(text, "Window3=", frame.window3);
  take_window(text, "Window4=", frame.window4);
}

}  // namespace vexa

#include "transport/wire/input_part.h"

#include <cstddef>
#include <optional>

#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr std::size_t kBehindSensor = 10;
constexpr std::size_t kBehindFlag = 6;
constexpr std::size_t kBehindWindow = 9;
constexpr std::size_t kBehindTampering = 12;

/// Walks through a part as its items are looked for, one kind after the other.
class InputPartReader {
 public:
  InputPartReader(std::string_view part, MotionReport motion) : part_(part), motion_(motion) {}

  InputBits read() {
    read_sensors();
    motion_.one_flag ? read_motion_flag() : read_motion_windows();
    read_tampering();
    read_audio();
    return bits_;
  }

 private:
  void read_sensors();
  void read_motion_flag();
  void read_motion_windows();
  void read_tampering();
  void read_audio();

  std::optional<std::string_view> find(std::string_view key);
  void step_behind(std::size_t length) { search_ = match_ + length; }
  void report(std::int64_t bit);
  void report_motion() { report(motion_.motion_detection ? 0 : number_); }

  std::string_view part_;
  MotionReport motion_;
  InputBits bits_;
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
  bits_.present |= std::uint32_t{1} << bit;
  bits_.state |= static_cast<std::uint32_t>(value_) << bit;
}

/// Takes "=NUMBER" from the front of `text`.
std::optional<int> take_value(std::string_view& text) {
  if (!text.starts_with('=')) return std::nullopt;
  text.remove_prefix(1);
  return take_int(text);
}

void InputPartReader::read_sensors() {
  while (auto text = find("Sensor")) {
    step_behind(kBehindSensor);
    // Kept: a sensor's number counts as soon as it is read, with no value behind it and beyond the bits as well.
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

void InputPartReader::read_motion_flag() {
  auto text = find("VMF");
  if (!text) return;
  step_behind(kBehindFlag);
  const auto value = take_value(*text);
  if (!value) return;
  value_ = *value;
  report_motion();
}

void InputPartReader::read_motion_windows() {
  bool any = false;
  while (auto text = find(motion_.motion_detection ? "MdWin" : "OdWin")) {
    step_behind(kBehindWindow);
    const auto window = take_int(*text);
    const auto value = window ? take_value(*text) : std::nullopt;
    any = any || value;
    // Kept: the last sensor's value goes in, so without window 1 it is what the other windows are compared with.
    if (window == 1 && value) {
      value_ = *value;
    } else if (value.value_or(0) > value_) {
      value_ = value.value_or(0);
    }
  }
  if (any) report_motion();
}

void InputPartReader::read_tampering() {
  auto text = find("Tampering");
  if (!text) return;
  step_behind(kBehindTampering);
  // Kept: the bits behind it move up although the item may have no value.
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

}  // namespace

InputBits parse_input_part(std::string_view part, MotionReport motion) { return InputPartReader(part, motion).read(); }

}  // namespace vexa

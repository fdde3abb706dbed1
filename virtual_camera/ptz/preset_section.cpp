// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/ptz/preset_section.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

#include "virtual_camera/ptz/ptz_command.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

constexpr std::string_view kTourLetters = "ABCDE";
constexpr int kLongestTime = 9999999;  // seconds
constexpr std::string_view kCameraStem = "Tour";
constexpr std::string_view kShadowStem = "STour";

std::string_view on_or_off(bool on) { return on ? "on" : "off"; }

bool take_switch(bool& target, std::string_view value) {
  if (value != "on" && value != "off") return false;
  target = value == "on";
  return true;
}

// Resuming that is off keeps no time; switched on without one it has the usual.
bool take_resume(int& target, std::string_view value) {
  constexpr int kUsual = 30;
  bool on = false;
  if (!take_switch(on, value)) return false;
  if (!on) target = 0;
  if (on && target == 0) target = kUsual;
  return true;
}

bool take_number(int& target, std::string_view value, int most) {
  const std::optional<int> number = number_within(value, 1, most);
  if (number) target = *number;
  return number.has_value();
}

// The keys that both kinds of tours have for all of them; none for another key.
std::optional<bool> take_common(TourSwitch& target, std::string_view key, std::string_view value) {
  if (key.empty()) return take_switch(target.on, value);
  if (key == "Resume") return take_resume(target.resume, value);
  if (key == "RsmTime") return take_number(target.resume, value, kLongestTime);
  return std::nullopt;
}

// The number in the list, from 0, of the tour that a key's letter names; none for what is no letter.
std::optional<std::size_t> letter_at(std::string_view key) {
  const std::size_t at = key.empty() ? std::string_view::npos : kTourLetters.find(key.front());
  return at == std::string_view::npos ? std::nullopt : std::optional<std::size_t>(at);
}

std::string names_of(const std::map<int, Preset>& presets) {
  std::string list;
  for (const auto& [number, preset] : presets) {
    list += fmt::format("{}{},{}", list.empty() ? "" : ",", number, percent_encoded_for_list(preset.name));
  }
  return list;
}

void add_common(PresetSection::Pairs& pairs, std::string_view stem, const TourSwitch& common) {
  pairs.emplace_back(stem, on_or_off(common.on));
  pairs.emplace_back(fmt::format("{}Resume", stem), on_or_off(common.resume != 0));
  if (common.resume != 0) pairs.emplace_back(fmt::format("{}RsmTime", stem), fmt::format("{}", common.resume));
}

template <typename Tour>
const Tour* running_tour(const TourSwitch& common, const std::vector<Tour>& tours) {
  const auto found = std::find_if(tours.begin(), tours.end(), [](const Tour& tour) { return tour.on; });
  return common.on && found != tours.end() ? &*found : nullptr;
}

}  // namespace

PresetSection::PresetSection(const PtzProfile& profile)
    : camera_tours(static_cast<std::size_t>(profile.tours)),
      shadow_tours(static_cast<std::size_t>(profile.shadow_tours)),
      preset_count_(profile.presets),
      fastest_(profile.shared_speed()) {
  for (CameraTour& tour : camera_tours) tour.speed = fastest_;
}

bool PresetSection::set_camera_tour(CameraTour& tour, std::string_view key, const std::string& value) const {
  if (key.empty()) return take_switch(tour.on, value);
  if (key == "Staytime") return take_number(tour.stay, value, kLongestTime);
  if (key == "Speed") return take_number(tour.speed, value, fastest_);
  if (key == "Period") return value == "always";
  if (key != "Sequence") return false;
  tour.sequence.clear();
  for (const std::string_view piece : comma_pieces(value)) {
    const std::optional<int> number = number_within(piece, 1, preset_count_);
    if (!number) return false;
    tour.sequence.push_back(*number);
  }
  return tour.sequence.size() > 1;
}

bool PresetSection::set(std::string_view key, const std::string& value) {
  const bool shadow = key.starts_with(kShadowStem);
  if (!shadow && !key.starts_with(kCameraStem)) return false;
  if (shadow ? shadow_tours.empty() : camera_tours.empty()) return false;
  key.remove_prefix(shadow ? kShadowStem.size() : kCameraStem.size());
  if (const auto taken = take_common(shadow ? shadow_switch : camera_switch, key, value)) return *taken;
  const std::optional<std::size_t> at = letter_at(key);
  if (!at) return false;
  key.remove_prefix(1);
  if (!shadow) return *at < camera_tours.size() && set_camera_tour(camera_tours[*at], key, value);
  // Hosts switch off four shadow tours, however many there are.
  if (*at >= shadow_tours.size()) return key.empty() && value == "off";
  return key.empty() ? take_switch(shadow_tours[*at].on, value) : key == "Period" && value == "always";
}

bool PresetSection::at_most_one_on() const {
  const auto is_on = [](const auto& tour) { return tour.on; };
  return std::count_if(camera_tours.begin(), camera_tours.end(), is_on) <= 1 &&
         std::count_if(shadow_tours.begin(), shadow_tours.end(), is_on) <= 1;
}

bool PresetSection::set_tours(const Pairs& settings) {
  PresetSection after = *this;
  for (const auto& [key, value] : settings) {
    if (!after.set(key, value)) return false;
    if (key == kCameraStem && after.camera_switch.on) after.shadow_switch.on = false;
    if (key == kShadowStem && after.shadow_switch.on) after.camera_switch.on = false;
  }
  if (settings.empty() || !after.at_most_one_on()) return false;
  *this = std::move(after);
  return true;
}

PresetSection::Pairs PresetSection::answer() const {
  Pairs pairs = {{"PresetNum", fmt::format("{}", presets.size())}};
  if (!presets.empty()) pairs.emplace_back("PresetName", names_of(presets));
  if (!camera_tours.empty()) add_common(pairs, kCameraStem, camera_switch);
  for (std::size_t i = 0; i < camera_tours.size(); ++i) {
    const CameraTour& tour = camera_tours[i];
    const auto key = [letter = kTourLetters[i]](const char* name) { return fmt::format("Tour{}{}", letter, name); };
    pairs.emplace_back(key(""), on_or_off(tour.on));
    pairs.emplace_back(key("Sequence"), fmt::format("{}", fmt::join(tour.sequence, ",")));
    pairs.emplace_back(key("Staytime"), fmt::format("{}", tour.stay));
    pairs.emplace_back(key("Period"), "always");
    pairs.emplace_back(key("Speed"), fmt::format("{}", tour.speed));
  }
  if (shadow_tours.empty()) return pairs;
  add_common(pairs, kShadowStem, shadow_switch);
  pairs.emplace_back("STourMaxRecordTime", fmt::format("{}", kLongestRecording));
  for (std::size_t i = 0; i < shadow_tours.size(); ++i) {
    const ShadowTour& tour = shadow_tours[i];
    const auto key = [letter = kTourLetters[i]](const char* name) { return fmt::format("STour{}{}", letter, name); };
    pairs.emplace_back(key(""), on_or_off(tour.on));
    pairs.emplace_back(key("Period"), "always");
    if (tour.length > 0)
      pairs.emplace_back(key("RecordedTime"), fmt::format("{}", std::lround(std::ceil(tour.length))));
  }
  return pairs;
}

const CameraTour* PresetSection::camera_tour() const { return running_tour(camera_switch, camera_tours); }

const ShadowTour* PresetSection::shadow_tour() const { return running_tour(shadow_switch, shadow_tours); }

void PresetSection::end_tours() { camera_switch.on = shadow_switch.on = false; }

ShadowTour* PresetSection::shadow_tour_of(std::string_view letter) {
  const std::optional<std::size_t> at = letter.size() == 1 ? letter_at(letter) : std::nullopt;
  return at && *at < shadow_tours.size() ? &shadow_tours[*at] : nullptr;
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/alarm_scene.h"

#include <fmt/format.h>

#include <algorithm>
#include <utility>

namespace vexa::camera {

void AlarmScene::rearrange(AlarmLayout layout) {
  const std::lock_guard<std::mutex> lock(mutex_);
  layout_ = std::move(layout);
  contacts_.assign(layout_.inputs < 0 ? 0 : static_cast<std::size_t>(layout_.inputs), 0);
}

std::string AlarmScene::listen(Listener listener) {
  const std::lock_guard<std::mutex> lock(mutex_);
  listener_ = std::move(listener);
  return part_locked();
}

template <typename Value>
void AlarmScene::change(Value& value, Value next) {
  if (std::exchange(value, next) != next && listener_) listener_(part_locked());
}

bool AlarmScene::happen(const AlarmEvent& event) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto place = static_cast<std::size_t>(event.number) - 1;
  switch (event.kind) {
    case AlarmEvent::Kind::kContact:
      if (place >= contacts_.size()) return false;
      change(contacts_[place], event.value != 0 ? 1 : 0);
      return true;
    case AlarmEvent::Kind::kMotion:
      if (place >= motion_.size()) return false;
      change(motion_[place], event.value);
      return true;
    case AlarmEvent::Kind::kLens:
      covered_ = event.value != 0;
      change(tampered_, covered_);
      return true;
    case AlarmEvent::Kind::kNoise:
      change(noise_, event.value != 0);
      return true;
  }
  return false;
}

void AlarmScene::switch_detectors(bool tampering, bool audio) {
  const std::lock_guard<std::mutex> lock(mutex_);
  change(tampering_on_, tampering);
  change(audio_on_, audio);
}

void AlarmScene::clear_tampering() {
  const std::lock_guard<std::mutex> lock(mutex_);
  change(tampered_, false);
}

bool AlarmScene::lens_covered() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return covered_;
}

std::string AlarmScene::detection() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return layout_.detection;
}

std::string AlarmScene::metadata_part() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  const std::string text =
      fmt::format("Window1={}&Window2={}&Window3={}&Window4={}", motion_[0], motion_[1], motion_[2], motion_[3]);
  return fmt::format("--metadata\r\nContent-Type: text/plain\r\n\r\n{:<64.64}", text);
}

std::vector<int> AlarmScene::contacts() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return contacts_;
}

std::string AlarmScene::part_locked() const {
  std::string items;
  const auto add = [&items](const std::string& key, bool on) {
    items += fmt::format("{}{}={}", items.empty() ? "" : "&", key, on ? 1 : 0);
  };
  for (std::size_t i = 0; i < contacts_.size(); ++i) add(fmt::format("Sensor{}", i + 1), contacts_[i] != 0);
  const bool moves = std::any_of(motion_.begin(), motion_.end(), [](int value) { return value != 0; });
  if (layout_.detection == "lod") add("VMF", moves);
  if (layout_.detection == "object" || layout_.detection == "motion") {
    const char* key = layout_.detection == "object" ? "OdWin" : "MdWin";
    for (std::size_t i = 0; i < kWindows; ++i) add(fmt::format("{}{}", key, i + 1), motion_[i] != 0);
  }
  if (layout_.tampering) add("Tampering", tampered_ && tampering_on_);
  if (layout_.audio) add("Audio", noise_ && audio_on_);
  return "--alarm\r\n" + items + "\r\n\r\n";
}

}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
// What a camera keeps of presets, camera tours and shadow tours, and how its commands and inquiries write it.
#ifndef VIRTUAL_CAMERA_PTZ_PRESET_SECTION_H_
#define VIRTUAL_CAMERA_PTZ_PRESET_SECTION_H_

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/ptz/ptz_mechanism.h"

namespace vexa::camera {

constexpr int kLongestRecording = 60;            // seconds of a shadow tour
constexpr std::size_t kLongestPresetName = 128;  // bytes

struct Preset {
  std::string name;  // bytes as they were meant, decoded
  PtzPlace place{};
};

struct CameraTour {
  bool on = false;
  std::vector<int> sequence;  // numbers of presets
  int stay = 10;              // seconds
  int speed = 1;
};

// A movement under the orders of a host, in seconds from its beginning.
struct ShadowTour {
  bool on = false;
  PtzPlace start{};
  std::vector<std::pair<double, PtzOrder>> orders;
  double length = 0;  // 0: nothing recorded
};

// Of one kind of tour, all of them: whether they run, and after how many seconds they go on once a host has moved the
// camera; 0: never.
struct TourSwitch {
  bool on = false;
  int resume = 0;
};

// The stored presets and tours of one camera. Owned by its PtzHead, whose lock guards it. Moves no motor.
class PresetSection {
 public:
  using Pairs = std::vector<std::pair<std::string, std::string>>;  // key and value

  explicit PresetSection(const PtzProfile& profile);

  // Takes the settings of tours that a command names, all of them or none: false. Of both kinds of tours one runs: the
  // kind switched on last.
  [[nodiscard]] bool set_tours(const Pairs& settings);
  // The answer to the inquiry.
  [[nodiscard]] Pairs answer() const;

  // The tour that is to run; null when there is none.
  [[nodiscard]] const CameraTour* camera_tour() const;
  [[nodiscard]] const ShadowTour* shadow_tour() const;
  // Both kinds are off.
  void end_tours();

  [[nodiscard]] ShadowTour* shadow_tour_of(std::string_view letter);  // null: the model lacks it

  std::map<int, Preset> presets;
  TourSwitch camera_switch;
  TourSwitch shadow_switch;
  std::vector<CameraTour> camera_tours;
  std::vector<ShadowTour> shadow_tours;

 private:
  [[nodiscard]] bool set(std::string_view key, const std::string& value);
  [[nodiscard]] bool set_camera_tour(CameraTour& tour, std::string_view key, const std::string& value) const;
  [[nodiscard]] bool at_most_one_on() const;

  int preset_count_;
  int fastest_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PTZ_PRESET_SECTION_H_

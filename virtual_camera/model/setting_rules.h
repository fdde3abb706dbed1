// SPDX-License-Identifier: Apache-2.0
// Which settings a camera of a profile has, and which values they take.
#ifndef VIRTUAL_CAMERA_MODEL_SETTING_RULES_H_
#define VIRTUAL_CAMERA_MODEL_SETTING_RULES_H_

#include <map>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "virtual_camera/model/camera_profile.h"

namespace vexa::camera {

// The values that a model's commands take; the settings store asks it before it changes a key. Immutable, shared; any
// thread.
class SettingRules {
 public:
  using Pairs = std::vector<std::pair<std::string, std::string>>;  // key and value

  explicit SettingRules(CameraProfile profile);
  SettingRules(const SettingRules&) = delete;
  SettingRules& operator=(const SettingRules&) = delete;

  [[nodiscard]] const CameraProfile& profile() const { return profile_; }
  // The sections whose keys and values are bound, with their settings as the camera leaves the factory.
  [[nodiscard]] std::map<std::string, Pairs> factory() const;
  // Sections that other cameras have and this one lacks.
  [[nodiscard]] const std::vector<std::string>& lacking() const { return lacking_; }
  // Makes the changes of one command in a section's settings. The camera takes all of them or none: false. Where a
  // change of the capture size, the largest size or solid PTZ leaves a stream too large, it takes its codec's largest
  // size that fits.
  [[nodiscard]] bool change(std::string_view section, const Pairs& changes, Pairs& settings) const;

 private:
  // The values that a key takes: one of the words, or a number from `least` to `most`; with neither, it never changes.
  struct Values {
    std::vector<std::string> words;
    int least = 1;
    int most = 0;
  };
  struct Section {
    Pairs factory;
    std::map<std::string, Values, std::less<>> values;
  };

  void add(Section& section, const std::string& key, const std::string& factory, Values values);
  void add_choice(Section& section, const std::string& key, const std::vector<std::string>& words);
  void add_switch(Section& section, const std::string& key, bool present);
  void add_streams();
  void add_video();
  void add_image();
  void add_exposure();
  void add_system();
  void add_card();
  void find_lacking();
  [[nodiscard]] bool allow(std::string_view section, std::string_view key, std::string_view value) const;
  void shrink(const Pairs& changes, Pairs& settings, std::size_t number) const;
  [[nodiscard]] bool stream_agrees(const Pairs& settings, std::size_t number) const;
  [[nodiscard]] bool size_agrees(const Pairs& settings, const OfferedCodec& codec, PictureSize size) const;

  CameraProfile profile_;
  std::map<std::string, Section, std::less<>> bound_;
  Section& camera_ = bound_["camera"];
  Section& system_ = bound_["system"];
  std::vector<std::string> lacking_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_SETTING_RULES_H_

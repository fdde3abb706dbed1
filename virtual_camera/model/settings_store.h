// SPDX-License-Identifier: Apache-2.0
// The camera's settings: sections of key=value pairs, read by inquiries and changed by commands.
#ifndef VIRTUAL_CAMERA_MODEL_SETTINGS_STORE_H_
#define VIRTUAL_CAMERA_MODEL_SETTINGS_STORE_H_

#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "virtual_camera/values/codec.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

class SettingRules;

// The settings of one camera. Owned by its state; thread-safe. Values are kept as they came, without decoding; keys
// keep the order in which they were first set.
class SettingsStore {
 public:
  SettingsStore();  // with a plausible camera's defaults

  [[nodiscard]] std::optional<std::string> get(std::string_view section, std::string_view key) const;
  void set(std::string_view section, std::string_view key, std::string_view value);
  void erase(std::string_view section, std::string_view key);
  void erase_section(std::string_view section);
  // Replaces a section's inquiry answer by this text, whatever values its keys have; the keys cannot be brought back.
  void set_answer(std::string_view section, std::optional<std::string> text);

  // "key=value&key=value" in order; none when there is no such section.
  [[nodiscard]] std::optional<std::string> answer(std::string_view section) const;
  // Applies the pairs of a command's query ("K=V&K=V") to a section. False, and no key changed, where the rules that
  // the store obeys forbid it.
  [[nodiscard]] bool apply(std::string_view section, std::string_view query);
  // Has, from now on, the settings and the rules of a camera model. Without rules every command is taken.
  void obey(std::shared_ptr<const SettingRules> rules);

 private:
  struct Section {
    std::vector<std::pair<std::string, std::string>> pairs;
    std::optional<std::string> whole_answer;
  };

  void set_locked(Section& section, std::string_view key, std::string_view value);
  [[nodiscard]] const Section* find_locked(std::string_view section) const;

  mutable std::mutex mutex_;
  std::map<std::string, Section, std::less<>> sections_;
  std::shared_ptr<const SettingRules> rules_;
};

// How hosts have set one video stream.
struct StreamSettings {
  std::optional<Codec> codec;  // nullopt: the stream is switched off
  int width = 0;
  int height = 0;
  int frame_rate = 0;
  int bit_rate = 0;  // kbit/s
  int quality = 0;   // JPEG's
};

// The settings of stream `number`, counted from 1; nullopt when the camera has no such stream.
[[nodiscard]] std::optional<StreamSettings> stream_settings(const SettingsStore& settings, int number);

// "/command/inquiry.cgi?inq=NAME" reads a section, "/command/NAME.cgi?KEY=VALUE&..." changes one; 400 for what
// the camera does not take.
[[nodiscard]] Answer answer_command(const RequestHead& request, SettingsStore& settings);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_SETTINGS_STORE_H_
